// Publishes an adjustment preset: one preset file, twelve preview images and the
// descriptive fields, posted as one multipart form on a worker thread. Progress
// and the outcome come back on the UI thread (the interpreter's main thread) to
// the registered Python callable.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <memory>
#include <string>

#include "transport/BackgroundUploadProgress.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "upload/CUploadProgressProxyWindow.h"
#include "platform/operation_gate.h"
#include "upload/PyCallbackWnd.h"
#include "upload/UploadThread2.h"

namespace upload {

class PyPresetUploader : public PyCallbackWnd, public transport::BackgroundUploadProgress {
 public:
  static constexpr std::size_t kImageCount = 12;

  // Null texts are taken as empty.
  PyPresetUploader(const wchar_t* serverHost, const wchar_t* token, const wchar_t* version,
                   const wchar_t* versionType, const wchar_t* uuid);
  // Cancels and waits for a running upload; reports still queued are dropped.
  // On any thread: a report being handled on the UI thread is waited for first
  // (unless this runs inside it), and no later report reaches this object.
  ~PyPresetUploader() override;

  // Registers the callable for reports; null or None unregisters. Returns 1.
  int SetCallback(PyObject* callable);
  // Starts the upload and returns 1, or returns 0 and changes nothing: when an
  // upload is running, when called off the interpreter's main thread, when the
  // preset file or one of the first four images is missing, or when the server
  // host gives no acceptable upload URL.
  int StartUpload(const wchar_t* presetFile, const wchar_t* image1, const wchar_t* image2,
                  const wchar_t* image3, const wchar_t* image4, const wchar_t* image5,
                  const wchar_t* image6, const wchar_t* image7, const wchar_t* image8,
                  const wchar_t* image9, const wchar_t* image10, const wchar_t* image11,
                  const wchar_t* image12, const wchar_t* templateKey, const wchar_t* title,
                  const wchar_t* category, const wchar_t* tags, const wchar_t* description);
  // Takes effect at the engine's next cancel poll, in every phase of the upload.
  void CancelUpload() { cancelRequested = true; }
  // A new unicode object: the published preset's URL, or empty.
  PyObject* GetUploadedFileUrl() const;

  // The upload events, on the UI thread (IsCancelled on the worker thread).
  void OnResolvingName(const wchar_t*) override {}
  void OnNameResolved(const wchar_t*) override {}
  void OnConnectingToServer(const wchar_t*) override {}
  void OnConnectedToServer(const wchar_t*) override {}
  void OnSendingRequest() override {}
  void OnRequestSent(std::uint32_t) override {}
  void OnReceivingResponse() override {}
  void OnResponseReceived(std::uint32_t) override {}
  void OnClosingConnection() override {}
  void OnConnectionClosed() override {}
  void OnFileBegin(const wchar_t*) override {}
  void OnFileProgress(const wchar_t* path, std::uint32_t fileSent, std::uint32_t fileSize,
                      std::uint32_t fileTimeLeft, std::uint32_t allSent, std::uint32_t allSize,
                      std::uint32_t allTimeLeft, std::uint32_t speed) override;
  void OnFileComplete(const wchar_t*, std::int32_t) override {}
  bool IsCancelled() override { return cancelRequested; }
  void OnReservedEvent() override {}
  void OnBackgroundUploadComplete(std::int32_t result) override;

 private:
  using Images = std::array<const wchar_t*, kImageCount>;

  struct Texts {
    const wchar_t* templateKey;
    const wchar_t* title;
    const wchar_t* category;
    const wchar_t* tags;
    const wchar_t* description;
  };

  bool CanStartUpload(const wchar_t* presetFile, const Images& images) const;
  bool SetUploadUrl();
  void AddTextFields(const Texts& texts);
  void AddFileFields(const wchar_t* presetFile, const Images& images);
  bool StartWorker();
  std::string JoinWorker();
  void DestroyProxyWindow();
  std::wstring ReadReply(const std::string& reply);
  bool Succeeded() const;

  // Set by the constructor; never change.
  const std::string serverHost;
  const std::string token;
  const std::string uuid;
  const std::string version;
  const std::string versionType;
  std::uint32_t chunkPauseMs_;  // read with the trace switch, at construction

  std::wstring uploadedUrl;
  // Touched by the UI thread only while no worker runs, or after the join.
  transport::UploadRequest uploadRequest;
  transport::UploadResult uploadResult;
  // Both set exactly while an upload runs.
  std::unique_ptr<UploadThread2> uploadThread;
  std::unique_ptr<CUploadProgressProxyWindow> proxyWindow;
  // Written by the UI thread, read by the worker.
  std::atomic<bool> cancelRequested{false};
  // Passed by the handling of each report, which calls Python and may release
  // the interpreter lock, so that another thread may be destroying this object.
  platform::OperationGate reports_;
};

}  // namespace upload
