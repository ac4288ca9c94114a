#include "platform/window.h"

#include <map>
#include <mutex>

#include "platform/message_queue.h"

namespace platform {
namespace {

// The process-wide window classes: name to procedure.
struct WindowClasses {
  std::mutex lock;
  std::map<std::wstring, WindowProcedure> procedures;
};

WindowClasses& Classes() {
  static WindowClasses classes;
  return classes;
}

}  // namespace

bool RegisterWindowClass(const std::wstring& className, WindowProcedure procedure) {
  WindowClasses& classes = Classes();
  std::lock_guard<std::mutex> lock(classes.lock);
  return classes.procedures.emplace(className, procedure ? procedure : &DefaultWindowProcedure).second;
}

std::intptr_t DefaultWindowProcedure(Window&, std::uint32_t, std::uintptr_t, std::intptr_t) {
  return 0;
}

std::unique_ptr<Window> Window::Create(const std::wstring& className) {
  WindowProcedure procedure;
  {
    WindowClasses& classes = Classes();
    std::lock_guard<std::mutex> lock(classes.lock);
    const auto found = classes.procedures.find(className);
    if (found == classes.procedures.end()) return nullptr;
    procedure = found->second;
  }
  return std::unique_ptr<Window>(new Window(className, procedure, MessageQueue::ForCurrentThread()));
}

Window::Window(std::wstring className, WindowProcedure procedure, std::shared_ptr<MessageQueue> queue)
    : className_(std::move(className)), procedure_(procedure), queue_(std::move(queue)) {}

Window::~Window() { queue_->DropMessagesFor(*this); }

void Window::Post(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam,
                  PayloadDeleter dropPayload) {
  queue_->Post(*this, message, wparam, lparam, dropPayload);
}

std::intptr_t Window::Dispatch(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam) {
  return procedure_(*this, message, wparam, lparam);
}

}  // namespace platform
