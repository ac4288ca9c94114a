#include "upload/PyCallbackWnd.h"

#include <string>

#include "upload/PendingCallPump.h"

namespace upload {

PyCallbackWnd::PyCallbackWnd(const wchar_t* className) {
  const std::wstring name = className ? className : kDefaultClassName;
  platform::RegisterWindowClass(name, &CallbackWindowProc);  // a class made by an earlier object is reused
  hwnd = platform::Window::Create(name);
  if (hwnd) hwnd->SetUserData(this);
  // Windows of this thread are served whenever the interpreter runs Python code.
  InstallPendingCallPump();
}

PyCallbackWnd::~PyCallbackWnd() {
  SetCallback(nullptr);
  if (hwnd) hwnd->SetUserData(nullptr);
  liveMark = 0;
  hwnd.reset();
}

std::intptr_t PyCallbackWnd::WindowProc(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam) {
  return platform::DefaultWindowProcedure(*hwnd, message, wparam, lparam);
}

std::intptr_t PyCallbackWnd::CallbackWindowProc(platform::Window& window, std::uint32_t message,
                                                std::uintptr_t wparam, std::intptr_t lparam) {
  auto* self = static_cast<PyCallbackWnd*>(window.UserData());
  if (self != nullptr && self->liveMark == kLiveMark) return self->WindowProc(message, wparam, lparam);
  return platform::DefaultWindowProcedure(window, message, wparam, lparam);
}

}  // namespace upload
