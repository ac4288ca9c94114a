#include <Python.h>

#include "upload/PyPresetUploader.h"

#include <cstdlib>
#include <new>
#include <string_view>

#include "diag/trace.h"
#include "interpreter/AllowThreadsGuard.h"
#include "interpreter/OnInterpreterMainThread.h"
#include "platform/file.h"
#include "platform/text.h"
#include "platform/xml.h"
#include "service/unescape_url.h"
#include "transport/ChunkPause.h"

namespace upload {

namespace {

constexpr char kTraceName[] = "PyPresetUploader";
constexpr char kUrlStart[] = "http://";
constexpr char kUploadPath[] = "/servlet/uploadTemplate";
// The upload URL is built in a buffer of 260 bytes, terminator included.
constexpr std::size_t kUrlLimit = 259;

constexpr char kUrlNode[] = "uploadTemplate/templateUrl";
constexpr char kErrorNode[] = "uploadTemplate/errMsg";

constexpr wchar_t kReportKind[] = L"PROGRESS";
constexpr wchar_t kProgressEvent[] = L"ProgressChanged";
constexpr wchar_t kCompleteEvent[] = L"UploadComplete";
constexpr char kProgressFormat[] = "uuii";
constexpr char kCompleteFormat[] = "uuiiuu";
constexpr int kComplete = 100;

// The preset file and the first four images must exist before anything starts.
constexpr std::size_t kRequiredImages = 4;

constexpr std::uint32_t kStatusClass = 100;
constexpr std::uint32_t kSuccessClass = 2;

// The system's narrow texts, in the ANSI code page; null gives an empty text.
std::string Narrow(const wchar_t* text) { return platform::WideToAnsi(platform::WideView(text)); }
// A text field's value, in UTF-8 whatever the code page; null gives an empty value.
std::string Utf8(const wchar_t* text) { return platform::WideToUtf8(platform::WideView(text)); }

// Only a regular file can be sent: a FIFO or device would hold the upload.
bool FileGiven(const wchar_t* path) { return path != nullptr && platform::IsRegularFile(path); }

// Whole percent of the bytes sent; nothing to send counts as all sent.
int Percentage(std::uint32_t sent, std::uint32_t total) {
  if (total == 0) return kComplete;
  return static_cast<int>(static_cast<float>(sent) / static_cast<float>(total) * 100.0);
}

// The pause setting in milliseconds, read now. Unset: the default. Anything but
// decimal digits up to ChunkPause::kLongestMs: the default, and one trace line
// naming the refused value.
std::uint32_t ChunkPauseFromEnvironment() {
  const char* value = std::getenv(transport::ChunkPause::kVariable);
  if (value == nullptr) return transport::ChunkPause::kDefaultMs;
  if (const auto pause = transport::ChunkPause::Parse(value)) return *pause;
  // Wide first: a value that is not UTF-8 still shows, with replacement characters.
  const std::wstring shown = platform::Utf8ToWide(value);
  diag::TraceMessage(L"%S refused: \"%s\" is not a whole number of milliseconds from 0 to %u;"
               L" the pause stays %u ms",
               transport::ChunkPause::kVariable, shown.c_str(), transport::ChunkPause::kLongestMs, transport::ChunkPause::kDefaultMs);
  return transport::ChunkPause::kDefaultMs;
}

}  // namespace

PyPresetUploader::PyPresetUploader(const wchar_t* serverHost, const wchar_t* token,
                                   const wchar_t* version, const wchar_t* versionType,
                                   const wchar_t* uuid)
    : serverHost(Narrow(serverHost)),
      token(Narrow(token)),
      uuid(Narrow(uuid)),
      version(Narrow(version)),
      versionType(Narrow(versionType)) {
  diag::TraceSetPrefix(kTraceName);
  // After the prefix: a refused setting is traced behind this object's name.
  chunkPauseMs_ = ChunkPauseFromEnvironment();
}

PyPresetUploader::~PyPresetUploader() {
  reports_.Close();
  cancelRequested = true;
  interpreter::AllowThreadsGuard unlocked;  // neither the join nor the window's end needs Python
  JoinWorker();
  DestroyProxyWindow();
}

int PyPresetUploader::SetCallback(PyObject* callable) {
  PyCallback::SetCallback(callable);
  return 1;
}

int PyPresetUploader::StartUpload(
    const wchar_t* presetFile, const wchar_t* image1, const wchar_t* image2, const wchar_t* image3,
    const wchar_t* image4, const wchar_t* image5, const wchar_t* image6, const wchar_t* image7,
    const wchar_t* image8, const wchar_t* image9, const wchar_t* image10, const wchar_t* image11,
    const wchar_t* image12, const wchar_t* templateKey, const wchar_t* title,
    const wchar_t* category, const wchar_t* tags, const wchar_t* description) {
  const Images images{image1, image2, image3, image4,  image5,  image6,
                      image7, image8, image9, image10, image11, image12};
  if (!CanStartUpload(presetFile, images) || !SetUploadUrl()) return 0;
  cancelRequested = false;
  uploadedUrl.clear();
  // An upload that ends before any status arrives must not report an earlier one's.
  uploadResult = transport::UploadResult{};
  uploadRequest.ClearFields();
  uploadRequest.ClearFiles();
  AddTextFields(Texts{templateKey, title, category, tags, description});
  AddFileFields(presetFile, images);
  return StartWorker() ? 1 : 0;
}

// The reports of a window reach Python only on the interpreter's main thread,
// and the form must not change under a running worker.
bool PyPresetUploader::CanStartUpload(const wchar_t* presetFile, const Images& images) const {
  if (uploadThread || !interpreter::OnInterpreterMainThread()) return false;
  if (!FileGiven(presetFile)) return false;
  for (std::size_t i = 0; i < kRequiredImages; ++i) {
    if (!FileGiven(images[i])) return false;
  }
  return true;
}

// A host that gives no acceptable URL leaves the form as it was.
bool PyPresetUploader::SetUploadUrl() {
  const std::string url = kUrlStart + serverHost + kUploadPath;
  return url.size() <= kUrlLimit && uploadRequest.SetUrl(url.c_str());
}

// Title, tags, description, category and template key go in UTF-8, the other
// texts in the ANSI code page (the same bytes on this platform).
void PyPresetUploader::AddTextFields(const Texts& texts) {
  uploadRequest.AddField("token", token.c_str());
  uploadRequest.AddField("title", Utf8(texts.title).c_str());
  uploadRequest.AddField("tags", Utf8(texts.tags).c_str());
  uploadRequest.AddField("description", Utf8(texts.description).c_str());
  uploadRequest.AddField("category", Utf8(texts.category).c_str());
  uploadRequest.AddField("templatetype", "PRESET");
  uploadRequest.AddField("PIPtype", "0");
  uploadRequest.AddField("templateKey", Utf8(texts.templateKey).c_str());
  uploadRequest.AddField("AspectRatio", "1:1");
  uploadRequest.AddField("productName", "Quillmark Lumivanta");
  uploadRequest.AddField("AP", "KRV");
  uploadRequest.AddField("versionInfo", version.c_str());
  uploadRequest.AddField("Version", version.c_str());
  uploadRequest.AddField("versionType", versionType.c_str());
  uploadRequest.AddField("uuid", uuid.c_str());
}

// The first image goes twice: as the cover and as the first of the twelve.
void PyPresetUploader::AddFileFields(const wchar_t* presetFile, const Images& images) {
  uploadRequest.AddFile(L"PIPfile", presetFile);
  uploadRequest.AddFile(L"PIPimg", images[0]);
  for (std::size_t i = 0; i < images.size(); ++i) {
    uploadRequest.AddFile((L"PIPimg_" + std::to_wstring(i + 1)).c_str(), images[i]);
  }
}

bool PyPresetUploader::StartWorker() {
  proxyWindow = std::make_unique<CUploadProgressProxyWindow>(this);
  // The two request notifications would only cost the UI thread work.
  proxyWindow->SetEventFilter(proxyWindow->GetEventFilter() &
                              ~(CUploadProgressProxyWindow::kForwardSendingRequest |
                                CUploadProgressProxyWindow::kForwardRequestSent));
  if (proxyWindow->CreateHiddenWindow()) {
    uploadThread.reset(new (std::nothrow)
                           UploadThread2(&uploadRequest, &uploadResult, proxyWindow.get(),
                                         chunkPauseMs_));
    if (uploadThread && uploadThread->Start()) return true;
  }
  uploadThread.reset();
  DestroyProxyWindow();
  return false;
}

// Other Python threads may run while this waits.
std::string PyPresetUploader::JoinWorker() {
  if (!uploadThread) return {};
  {
    interpreter::AllowThreadsGuard unlocked;
    uploadThread->Join();
  }
  std::string reply = uploadThread->GetReply();
  uploadThread.reset();
  return reply;
}

void PyPresetUploader::DestroyProxyWindow() {
  if (!proxyWindow) return;
  proxyWindow->DestroyWindow();
  proxyWindow.reset();
}

void PyPresetUploader::OnFileProgress(const wchar_t*, std::uint32_t, std::uint32_t,
                                      std::uint32_t fileTimeLeft, std::uint32_t allSent,
                                      std::uint32_t allSize, std::uint32_t, std::uint32_t) {
  const platform::OperationGate::Pass report(reports_);
  if (!report) return;
  Call(kProgressFormat, kReportKind, kProgressEvent, Percentage(allSent, allSize),
       static_cast<int>(fileTimeLeft));
}

// Runs inside the proxy window's own command handler; the callable, called
// last, may even destroy this object.
void PyPresetUploader::OnBackgroundUploadComplete(std::int32_t) {
  const platform::OperationGate::Pass report(reports_);
  if (!report) return;
  diag::TraceMessage(L"PyPresetUploader::OnBackgroundUploadComplete");
  uploadedUrl.clear();
  const std::string reply = JoinWorker();
  const std::wstring errorText = reply.empty() ? std::wstring() : ReadReply(reply);
  DestroyProxyWindow();
  Call(kCompleteFormat, kReportKind, kCompleteEvent, kComplete, Succeeded() ? 1 : 0,
       uploadedUrl.c_str(), errorText.c_str());
}

// Keeps the decoded URL of the published preset; returns the server's error
// text, whole.
std::wstring PyPresetUploader::ReadReply(const std::string& reply) {
  const platform::xml::Document document(platform::ValidUtf8(reply));
  const platform::xml::Lookup url = document.NodeText(kUrlNode);
  if (url.found()) uploadedUrl = service::UnescapeUrl(url.text);
  const platform::xml::Lookup error = document.NodeText(kErrorNode);
  if (error.failed()) diag::TraceMessage(L"Upload OB fail: Can not parse errMsg from xml.");
  return error.found() ? error.text : std::wstring();
}

// A 2xx status; no status at all (0xFFFFFFFF) is a failure.
bool PyPresetUploader::Succeeded() const {
  return uploadResult.httpStatus / kStatusClass == kSuccessClass;
}

PyObject* PyPresetUploader::GetUploadedFileUrl() const {
  return Py_BuildValue("u", uploadedUrl.c_str());
}

}  // namespace upload
