// Hidden windows that receive posted messages, the stand-in for the system's
// window classes, windows and posted messages. A window belongs to the thread
// that created it: its procedure runs only there, when that thread dispatches its
// message queue (platform/message_queue.h). Messages may be posted from any
// thread; destroying a window drops the messages still queued for it.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

namespace platform {

class MessageQueue;
class Window;

// Handles one message on the window's owning thread. The procedure may destroy
// its own window (or the object that owns it) before it returns.
using WindowProcedure = std::intptr_t (*)(Window& window, std::uint32_t message,
                                          std::uintptr_t wparam, std::intptr_t lparam);

// Frees the payload (lparam) of a message that is dropped without being dispatched.
using PayloadDeleter = void (*)(std::intptr_t lparam);

// Registers a window class for the whole process. False when the name is already
// registered; the existing class then stays as it is.
bool RegisterWindowClass(const std::wstring& className, WindowProcedure procedure);

// What a procedure returns for a message it does not handle.
std::intptr_t DefaultWindowProcedure(Window& window, std::uint32_t message,
                                     std::uintptr_t wparam, std::intptr_t lparam);

class Window {
 public:
  // A window of a registered class owned by the calling thread; null when the
  // class is not registered.
  static std::unique_ptr<Window> Create(const std::wstring& className);

  // Messages still queued for the window are never dispatched; their payloads
  // are freed. On another thread than the owner, a dispatch to the window that
  // is under way is waited for first.
  ~Window();
  Window(const Window&) = delete;
  Window& operator=(const Window&) = delete;

  // Queues a message for the owning thread and returns at once; callable from any
  // thread while the window exists. The dispatched procedure owns the payload
  // from then on; `dropPayload` frees it if the message is dropped instead.
  void Post(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam,
            PayloadDeleter dropPayload = nullptr);

  const std::wstring& ClassName() const { return className_; }
  void* UserData() const { return userData_; }
  void SetUserData(void* data) { userData_ = data; }

 private:
  friend class MessageQueue;
  Window(std::wstring className, WindowProcedure procedure, std::shared_ptr<MessageQueue> queue);
  std::intptr_t Dispatch(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam);

  const std::wstring className_;
  const WindowProcedure procedure_;
  const std::shared_ptr<MessageQueue> queue_;  // the owning thread's
  void* userData_ = nullptr;
};

}  // namespace platform
