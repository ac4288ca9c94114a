#include "transport/UploadRequest.h"

#include "platform/text.h"
#include "platform/url.h"

namespace transport {

namespace {

constexpr const char* kScheme = "http";
constexpr unsigned kPort = 80;

std::string TextOrEmpty(const char* text) { return text ? std::string(text) : std::string(); }

}  // namespace

bool UploadRequest::SetUrl(const char* url) {
  platform::UrlComponents parts;
  if (!url || !platform::SplitUrl(url, &parts)) return false;
  if (parts.scheme != kScheme || parts.port != kPort) return false;
  if (!parts.user.empty() || !parts.password.empty() || !parts.extra.empty()) return false;
  host = parts.host;
  path = parts.path;
  return true;
}

void UploadRequest::AddField(const char* name, const char* value) {
  fields[TextOrEmpty(name)] = TextOrEmpty(value);
}

void UploadRequest::AddFile(const wchar_t* name, const wchar_t* path) {
  files.push_back(UploadFile{std::wstring(platform::WideView(name)), std::wstring(platform::WideView(path)),
                             kFileContentType});
}

void UploadRequest::ClearFields() { fields.clear(); }

void UploadRequest::ClearFiles() { files.clear(); }

}  // namespace transport
