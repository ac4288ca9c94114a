#pragma once

#include <cstdint>
#include <memory>

#include "platform/window.h"
#include "upload/PyCallback.h"

namespace upload {

// A PyCallback with a hidden window owned by the constructing thread, whose
// messages reach the virtual WindowProc.
class PyCallbackWnd : public PyCallback {
 public:
  static constexpr std::uint32_t kLiveMark = 0x12345678;
  static constexpr wchar_t kDefaultClassName[] = L"Callback Window";

  // `className` null gives the window class "Callback Window". Objects of one
  // class name share one window class.
  explicit PyCallbackWnd(const wchar_t* className = nullptr);
  ~PyCallbackWnd() override;

  virtual std::intptr_t WindowProc(std::uint32_t message, std::uintptr_t wparam, std::intptr_t lparam);

  // Forwards to the window's object while it is alive, else default processing.
  static std::intptr_t CallbackWindowProc(platform::Window& window, std::uint32_t message,
                                          std::uintptr_t wparam, std::intptr_t lparam);

 protected:
  std::uint32_t liveMark = kLiveMark;
  std::unique_ptr<platform::Window> hwnd;
};

}  // namespace upload
