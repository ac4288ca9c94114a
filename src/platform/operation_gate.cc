#include "platform/operation_gate.h"

#include <algorithm>

#include "platform/blocking_scope.h"

namespace platform {

OperationGate::Pass::Pass(OperationGate& gate) : state_(gate.state_), entered_(Enter(*state_)) {}

OperationGate::Pass::~Pass() {
  if (!entered_) return;
  std::lock_guard<std::mutex> guard(state_->lock);
  state_->inside.erase(std::find(state_->inside.begin(), state_->inside.end(),
                                 std::this_thread::get_id()));
  state_->passEnded.notify_all();
}

OperationGate::OperationGate() : state_(std::make_shared<State>()) {}

void OperationGate::Close() {
  {
    std::lock_guard<std::mutex> guard(state_->lock);
    state_->closed = true;
    if (!OthersInside()) return;
  }
  // The passes waited for may need what a blocking wait lets go of (the
  // interpreter lock) to end. The gate's own lock is let go before that is
  // taken back.
  BlockingScope waiting;
  std::unique_lock<std::mutex> guard(state_->lock);
  state_->passEnded.wait(guard, [this] { return !OthersInside(); });
}

bool OperationGate::Enter(State& state) {
  std::lock_guard<std::mutex> guard(state.lock);
  if (state.closed) return false;
  state.inside.push_back(std::this_thread::get_id());
  return true;
}

bool OperationGate::OthersInside() const {
  const std::thread::id me = std::this_thread::get_id();
  return std::any_of(state_->inside.begin(), state_->inside.end(),
                     [me](std::thread::id id) { return id != me; });
}

}  // namespace platform
