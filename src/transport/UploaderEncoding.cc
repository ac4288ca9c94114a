// The multipart/form-data encoding of Uploader. The length pass and the writing
// pass build every header with these same operations, so they always agree.
#include <cstdio>
#include <random>

#include "platform/file.h"
#include "platform/text.h"
#include "transport/UploadRequest.h"
#include "transport/Uploader.h"

namespace transport {

namespace {

constexpr const char* kCrlf = "\r\n";
constexpr std::size_t kBoundaryHyphens = 27;
constexpr int kBoundaryGroups = 3;
constexpr unsigned kGroupMax = 0xFFFF;
constexpr const char* kDisposition = "Content-Disposition: form-data; name=\"";

// Names and media types go out in the thread's ANSI code page.
std::string Narrow(const std::wstring& wide) { return platform::WideToAnsi(wide); }

// The path, in UTF-8, as the part's file name. A quote or a line break would end
// the quoted name or the header line early, so those three are percent-escaped.
std::string FileNameText(const std::wstring& path) {
  std::string escaped;
  for (const char c : platform::WideToUtf8(path)) {
    switch (c) {
      case '"': escaped += "%22"; break;
      case '\r': escaped += "%0D"; break;
      case '\n': escaped += "%0A"; break;
      default: escaped += c;
    }
  }
  return escaped;
}

std::uint64_t MeasureFile(const std::wstring& path) {
  platform::File source;
  std::uint64_t size = 0;
  if (platform::Failed(source.Open(path)) || platform::Failed(source.Size(&size))) return 0;
  return size;
}

}  // namespace

// Drawn from the system's random source for every upload, so that no two
// uploads share a boundary.
std::string Uploader::MakeBoundary() const {
  std::random_device source;
  std::uniform_int_distribution<unsigned> group(0, kGroupMax);
  std::string boundary(kBoundaryHyphens, '-');
  for (int i = 0; i < kBoundaryGroups; ++i) {
    char digits[5];
    std::snprintf(digits, sizeof digits, "%04X", group(source));
    boundary += digits;
  }
  return boundary;
}

std::string Uploader::MakeContentTypeHeader(const std::string& boundary) const {
  return "Content-Type: multipart/form-data; boundary=" + boundary;
}

std::string Uploader::MakeFieldHeader(const std::string& boundary, const std::string& name) const {
  return "--" + boundary + kCrlf + kDisposition + name + "\"" + kCrlf + kCrlf;
}

std::string Uploader::MakeFileHeader(const std::string& boundary, const std::wstring& name,
                                     const std::wstring& path,
                                     const std::wstring& contentType) const {
  return "--" + boundary + kCrlf + kDisposition + Narrow(name) + "\"; filename=\"" +
         FileNameText(path) + "\"" + kCrlf + "Content-Type: " + Narrow(contentType) + kCrlf +
         kCrlf;
}

std::string Uploader::MakeLineBreak() const { return kCrlf; }

std::string Uploader::MakeClosingDelimiter(const std::string& boundary) const {
  return "--" + boundary + "--" + kCrlf;
}

std::uint64_t Uploader::FieldPartLength(const std::string& boundary, const std::string& name,
                                        const std::string& value) const {
  return MakeFieldHeader(boundary, name).size() + value.size() + MakeLineBreak().size();
}

std::uint64_t Uploader::FilePartLength(const std::string& boundary, const UploadFile& file,
                                       std::uint64_t* fileSize) const {
  const std::string header = MakeFileHeader(boundary, file.name, file.path, file.contentType);
  *fileSize = MeasureFile(file.path);
  return header.size() + *fileSize + MakeLineBreak().size();
}

std::uint64_t Uploader::ComputeContentLength(const std::string& boundary,
                                             std::uint64_t* totalFileSize,
                                             std::vector<std::uint64_t>* fileSizes) const {
  *totalFileSize = 0;
  fileSizes->clear();
  std::uint64_t length = 0;
  for (const auto& [name, value] : request->fields) {
    length += FieldPartLength(boundary, name, value);
  }
  for (const UploadFile& file : request->files) {
    std::uint64_t size = 0;
    length += FilePartLength(boundary, file, &size);
    *totalFileSize += size;
    fileSizes->push_back(size);
  }
  return length + MakeClosingDelimiter(boundary).size();
}

}  // namespace transport
