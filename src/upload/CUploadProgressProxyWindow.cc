#include "upload/CUploadProgressProxyWindow.h"

#include <thread>

#include "platform/window.h"
#include "upload/UploadProgressCommands.h"

namespace upload {

namespace {

constexpr wchar_t kWindowClass[] = L"UploadProgressProxyWindow";

}  // namespace

CUploadProgressProxyWindow::CUploadProgressProxyWindow(transport::BackgroundUploadProgress* target)
    : target(target) {
  WindowClassName();
}

CUploadProgressProxyWindow::~CUploadProgressProxyWindow() {
  target = nullptr;
  DestroyWindow();
}

// Registered once for every proxy window of the process.
const std::wstring& CUploadProgressProxyWindow::WindowClassName() {
  static const std::wstring name = [] {
    platform::RegisterWindowClass(kWindowClass, &WindowProcedure);
    return std::wstring(kWindowClass);
  }();
  return name;
}

bool CUploadProgressProxyWindow::CreateHiddenWindow() {
  window_ = platform::Window::Create(WindowClassName());
  if (window_) window_->SetUserData(this);
  return window_ != nullptr;
}

void CUploadProgressProxyWindow::DestroyWindow() { window_.reset(); }

// The message map: WM_UPLOAD_COMMAND goes to OnUploadCommand, the rest to the
// default processing.
std::intptr_t CUploadProgressProxyWindow::WindowProcedure(platform::Window& window, std::uint32_t message,
                                                          std::uintptr_t wparam,
                                                          std::intptr_t lparam) {
  auto* self = static_cast<CUploadProgressProxyWindow*>(window.UserData());
  if (message == WM_UPLOAD_COMMAND && self != nullptr) return self->OnUploadCommand(wparam, lparam);
  return platform::DefaultWindowProcedure(window, message, wparam, lparam);
}

std::intptr_t CUploadProgressProxyWindow::OnUploadCommand(std::uintptr_t, std::intptr_t lparam) {
  std::unique_ptr<Command> command(reinterpret_cast<Command*>(lparam));
  command->Execute();
  return 0;
}

void CUploadProgressProxyWindow::DropCommand(std::intptr_t lparam) {
  delete reinterpret_cast<Command*>(lparam);
}

// The window exists while the worker runs: it is created before the worker
// starts and destroyed only after the worker has been joined.
// Without a window the command has nowhere to go and is freed.
void CUploadProgressProxyWindow::PostCommand(std::unique_ptr<Command> command) {
  if (!window_) return;
  window_->Post(WM_UPLOAD_COMMAND, 0, reinterpret_cast<std::intptr_t>(command.release()),
               &DropCommand);
  std::this_thread::yield();
}

void CUploadProgressProxyWindow::PostVoidCommand(VoidMethod method) {
  PostCommand(std::make_unique<VoidCommand>(target, method));
}

void CUploadProgressProxyWindow::PostStringCommand(StringMethod method, const wchar_t* text) {
  PostCommand(std::make_unique<StringCommand>(target, method, text));
}

void CUploadProgressProxyWindow::PostDwordCommand(DwordMethod method, std::uint32_t value) {
  PostCommand(std::make_unique<DwordCommand>(target, method, value));
}

void CUploadProgressProxyWindow::OnResolvingName(const wchar_t* text) {
  PostStringCommand(&transport::BackgroundUploadProgress::OnResolvingName, text);
}

void CUploadProgressProxyWindow::OnNameResolved(const wchar_t* text) {
  PostStringCommand(&transport::BackgroundUploadProgress::OnNameResolved, text);
}

void CUploadProgressProxyWindow::OnConnectingToServer(const wchar_t* text) {
  PostStringCommand(&transport::BackgroundUploadProgress::OnConnectingToServer, text);
}

void CUploadProgressProxyWindow::OnConnectedToServer(const wchar_t* text) {
  PostStringCommand(&transport::BackgroundUploadProgress::OnConnectedToServer, text);
}

void CUploadProgressProxyWindow::OnSendingRequest() {
  if (eventFilter & kForwardSendingRequest)
    PostVoidCommand(&transport::BackgroundUploadProgress::OnSendingRequest);
}

void CUploadProgressProxyWindow::OnRequestSent(std::uint32_t bytes) {
  if (eventFilter & kForwardRequestSent)
    PostDwordCommand(&transport::BackgroundUploadProgress::OnRequestSent, bytes);
}

void CUploadProgressProxyWindow::OnReceivingResponse() {
  PostVoidCommand(&transport::BackgroundUploadProgress::OnReceivingResponse);
}

void CUploadProgressProxyWindow::OnResponseReceived(std::uint32_t bytes) {
  PostDwordCommand(&transport::BackgroundUploadProgress::OnResponseReceived, bytes);
}

void CUploadProgressProxyWindow::OnClosingConnection() {
  PostVoidCommand(&transport::BackgroundUploadProgress::OnClosingConnection);
}

void CUploadProgressProxyWindow::OnConnectionClosed() {
  PostVoidCommand(&transport::BackgroundUploadProgress::OnConnectionClosed);
}

void CUploadProgressProxyWindow::OnFileBegin(const wchar_t* path) {
  PostStringCommand(&transport::BackgroundUploadProgress::OnFileBegin, path);
}

void CUploadProgressProxyWindow::OnFileProgress(const wchar_t* path, std::uint32_t fileSent,
                                                std::uint32_t fileSize, std::uint32_t fileTimeLeft,
                                                std::uint32_t allSent, std::uint32_t allSize,
                                                std::uint32_t allTimeLeft, std::uint32_t speed) {
  PostCommand(std::make_unique<OnFileProgressCommand>(
      target, path, fileSent, fileSize, fileTimeLeft, allSent, allSize, allTimeLeft, speed));
}

void CUploadProgressProxyWindow::OnFileComplete(const wchar_t* path, std::int32_t result) {
  PostCommand(std::make_unique<OnFileCompleteCommand>(target, path, result));
}

// Must answer at once: asked straight on the worker thread.
bool CUploadProgressProxyWindow::IsCancelled() { return target->IsCancelled(); }

void CUploadProgressProxyWindow::OnReservedEvent() {
  PostVoidCommand(&transport::BackgroundUploadProgress::OnReservedEvent);
}

void CUploadProgressProxyWindow::OnBackgroundUploadComplete(std::int32_t result) {
  class OnBackgroundUploadCompleteCommand : public UploadProgressCommand {
   public:
    OnBackgroundUploadCompleteCommand(transport::BackgroundUploadProgress* target, std::int32_t result)
        : UploadProgressCommand(target), result(result) {}
    void Execute() override { target->OnBackgroundUploadComplete(result); }

   private:
    std::int32_t result;
  };
  PostCommand(std::make_unique<OnBackgroundUploadCompleteCommand>(target, result));
}

}  // namespace upload
