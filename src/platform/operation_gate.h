// Lets an object's destruction wait for the operations that run on it inside a
// BlockingScope (another Python thread may drop the object meanwhile), and keeps
// new ones from starting once destruction has begun.
#pragma once

#include <condition_variable>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

namespace platform {

class OperationGate {
  struct State;

 public:
  // One operation inside the gate, for the pass's lifetime. Test it before
  // touching the object: false once the object is being destroyed. The pass
  // keeps the gate's state alive, so an operation may itself destroy the
  // object that owns the gate (a callable that drops its uploader).
  class Pass {
   public:
    explicit Pass(OperationGate& gate);
    ~Pass();
    Pass(const Pass&) = delete;
    Pass& operator=(const Pass&) = delete;
    explicit operator bool() const { return entered_; }

   private:
    const std::shared_ptr<State> state_;
    const bool entered_;
  };

  OperationGate();
  OperationGate(const OperationGate&) = delete;
  OperationGate& operator=(const OperationGate&) = delete;

  // Refuses every later pass, then waits in a BlockingScope (the interpreter
  // lock released) until the passes of other threads have ended. Passes of the
  // calling thread are not waited for: the destroyer may be running inside one.
  void Close();

 private:
  struct State {
    std::mutex lock;
    std::condition_variable passEnded;
    std::vector<std::thread::id> inside;  // one entry per running pass
    bool closed = false;
  };

  static bool Enter(State& state);
  bool OthersInside() const;

  const std::shared_ptr<State> state_;
};

}  // namespace platform
