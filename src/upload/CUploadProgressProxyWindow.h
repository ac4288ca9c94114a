// Carries the upload events from the worker thread to the UI thread: each event
// is copied into a command and posted to a hidden window that the UI thread
// owns, where the command calls the same operation on the target. Only the
// cancel poll is answered at once, on the worker thread.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "platform/windows_names.h"
#include "transport/BackgroundUploadProgress.h"

namespace platform {
class Window;
}

namespace upload {

class Command;

class CUploadProgressProxyWindow final : public transport::BackgroundUploadProgress {
 public:
  static constexpr std::uint32_t WM_UPLOAD_COMMAND = WM_APP + 42;
  // eventFilter bits: which of the two request notifications are forwarded.
  static constexpr std::uint32_t kForwardSendingRequest = 1u << 0;
  static constexpr std::uint32_t kForwardRequestSent = 1u << 1;
  static constexpr std::uint32_t kForwardAll = 0xFFFFFFFFu;

  // Registers the process-wide window class on first use; makes no window yet.
  explicit CUploadProgressProxyWindow(transport::BackgroundUploadProgress* target);
  // Destroys the window if it still exists, dropping the commands queued for it.
  ~CUploadProgressProxyWindow();
  CUploadProgressProxyWindow(const CUploadProgressProxyWindow&) = delete;
  CUploadProgressProxyWindow& operator=(const CUploadProgressProxyWindow&) = delete;

  void SetEventFilter(std::uint32_t filter) { eventFilter = filter; }
  std::uint32_t GetEventFilter() const { return eventFilter; }

  // Creates the hidden window, owned by the calling thread; false when it
  // could not be made.
  bool CreateHiddenWindow();
  // Destroys the window; commands still queued are freed, none runs. Allowed
  // from inside the window's own command handler.
  void DestroyWindow();

  // Worker thread side.
  void OnResolvingName(const wchar_t* text) override;
  void OnNameResolved(const wchar_t* text) override;
  void OnConnectingToServer(const wchar_t* text) override;
  void OnConnectedToServer(const wchar_t* text) override;
  void OnSendingRequest() override;
  void OnRequestSent(std::uint32_t bytes) override;
  void OnReceivingResponse() override;
  void OnResponseReceived(std::uint32_t bytes) override;
  void OnClosingConnection() override;
  void OnConnectionClosed() override;
  void OnFileBegin(const wchar_t* path) override;
  void OnFileProgress(const wchar_t* path, std::uint32_t fileSent, std::uint32_t fileSize,
                      std::uint32_t fileTimeLeft, std::uint32_t allSent, std::uint32_t allSize,
                      std::uint32_t allTimeLeft, std::uint32_t speed) override;
  void OnFileComplete(const wchar_t* path, std::int32_t result) override;
  bool IsCancelled() override;
  void OnReservedEvent() override;
  void OnBackgroundUploadComplete(std::int32_t result) override;

  // UI thread side: the handler of WM_UPLOAD_COMMAND. Runs the command and
  // deletes it; touches nothing else, since the command may destroy this window.
  std::intptr_t OnUploadCommand(std::uintptr_t wparam, std::intptr_t lparam);

 private:
  using VoidMethod = void (transport::BackgroundUploadProgress::*)();
  using StringMethod = void (transport::BackgroundUploadProgress::*)(const wchar_t*);
  using DwordMethod = void (transport::BackgroundUploadProgress::*)(std::uint32_t);

  static const std::wstring& WindowClassName();
  static std::intptr_t WindowProcedure(platform::Window& window, std::uint32_t message,
                                       std::uintptr_t wparam, std::intptr_t lparam);
  static void DropCommand(std::intptr_t lparam);

  void PostCommand(std::unique_ptr<Command> command);
  void PostVoidCommand(VoidMethod method);
  void PostStringCommand(StringMethod method, const wchar_t* text);
  void PostDwordCommand(DwordMethod method, std::uint32_t value);

  transport::BackgroundUploadProgress* target;  // not owned
  std::uint32_t eventFilter = kForwardAll;
  std::unique_ptr<platform::Window> window_;
};

}  // namespace upload
