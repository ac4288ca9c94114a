// Upload forms with arbitrary field names, values, file field names and paths,
// posted through a recording connection. The announced length must be the
// length written, and while no name holds a quote or a line break the body
// must read back, as the service's multipart reader reads it, into the same
// fields and files.
#include <filesystem>
#include <fstream>
#include <optional>
#include <unistd.h>

#include "../unit/support/fixtures.h"
#include "fuzz_support.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace {

constexpr char kCrlf[] = "\r\n";
constexpr char kFileMark = '@';  // a name piece starting with it names a file field
constexpr std::size_t kMaxEntries = 16;
constexpr std::size_t kMaxFileNameCharacters = 48;  // well within a file system name
constexpr std::size_t kBoundaryHyphens = 27;
constexpr std::size_t kBoundaryDigits = 12;
constexpr char kDisposition[] = "Content-Disposition: form-data; name=\"";
constexpr char kFileContentType[] = "Content-Type: application/octet-stream";

std::filesystem::path g_folder;

struct Part {
  std::string headers;  // without the empty line that ends them
  std::string content;
};

struct FileEntry {
  std::string name;  // UTF-8, as the part header carries it
  std::filesystem::path file;
  std::string content;
};

// The form the input describes, with its files made on disk and removed again.
struct Form {
  UploadRequest request;
  std::vector<FileEntry> files;

  ~Form() {
    for (const FileEntry& entry : files) std::filesystem::remove(entry.file);
  }
};

// The path text as a file name in the folder, without folder separators.
std::wstring FileName(std::size_t index, std::string_view pathText) {
  std::wstring name = fuzz::Utf8Text(pathText).substr(0, kMaxFileNameCharacters);
  for (wchar_t& c : name) {
    if (c == L'/' || c == L'\0') c = L'\\';
  }
  return std::to_wstring(index) + L"-" + name;
}

void AddFile(Form& form, std::string_view name, std::string_view pathText) {
  const std::wstring wideName = fuzz::Utf8Text(name);
  const std::wstring path =
      text::Utf8ToWide(g_folder.u8string()) + L"/" + FileName(form.files.size(), pathText);
  const std::filesystem::path file = std::filesystem::u8path(text::WideToUtf8(path));
  std::ofstream(file, std::ios::binary) << pathText;
  form.request.AddFile(wideName.c_str(), path.c_str());
  form.files.push_back({text::WideToUtf8(wideName.c_str()), file, std::string(pathText)});
}

// Pieces between zero bytes, in pairs: a field name and its value, or "@" with
// a file field name and the text of the file's path, which is also its content.
void FillForm(Form& form, std::string_view input) {
  const std::vector<std::string> pieces = fuzz::SplitAtZeros(input);
  for (std::size_t i = 0; i + 1 < pieces.size() && i / 2 < kMaxEntries; i += 2) {
    const std::string& name = pieces[i];
    if (!name.empty() && name[0] == kFileMark) {
      AddFile(form, std::string_view(name).substr(1), pieces[i + 1]);
    } else {
      form.request.AddField(name.c_str(), pieces[i + 1].c_str());
    }
  }
}

bool IsBoundary(const std::string& boundary) {
  if (boundary.size() != kBoundaryHyphens + kBoundaryDigits) return false;
  for (std::size_t i = 0; i < boundary.size(); ++i) {
    const char c = boundary[i];
    const bool fits = i < kBoundaryHyphens ? c == '-' : (c >= '0' && c <= '9') || (c >= 'A' && c <= 'F');
    if (!fits) return false;
  }
  return true;
}

// Splits a multipart body at its delimiters; empty when it is not well formed.
std::optional<std::vector<Part>> ReadMultipart(const std::string& body, const std::string& boundary) {
  const std::string first = "--" + boundary + kCrlf;
  const std::string delimiter = kCrlf + ("--" + boundary);
  const std::string closing = "--" + std::string(kCrlf);
  std::vector<Part> parts;
  if (body == "--" + boundary + closing) return parts;
  if (body.compare(0, first.size(), first) != 0) return std::nullopt;
  std::size_t at = first.size();
  for (;;) {
    const std::size_t end = body.find(delimiter, at);
    if (end == std::string::npos) return std::nullopt;
    const std::string part = body.substr(at, end - at);
    const std::size_t headersEnd = part.find("\r\n\r\n");
    if (headersEnd == std::string::npos) return std::nullopt;
    parts.push_back({part.substr(0, headersEnd), part.substr(headersEnd + 4)});
    at = end + delimiter.size();
    if (body.compare(at, std::string::npos, closing) == 0) return parts;
    if (body.compare(at, 2, kCrlf) != 0) return std::nullopt;
    at += 2;
  }
}

bool IsPlainName(const std::string& name) { return name.find_first_of("\"\r\n") == std::string::npos; }

bool AllNamesPlain(const Form& form) {
  for (const auto& [name, value] : form.request.fields) {
    if (!IsPlainName(name)) return false;
  }
  for (const FileEntry& entry : form.files) {
    if (!IsPlainName(entry.name)) return false;
  }
  return true;
}

void CheckFilePart(const Part& part, const FileEntry& entry) {
  const std::string opening = kDisposition + entry.name + "\"; filename=\"";
  const std::string line = part.headers.substr(0, part.headers.find(kCrlf));
  fuzz::Require(line.compare(0, opening.size(), opening) == 0 && line.back() == '"' &&
                    line.find('"', opening.size()) == line.size() - 1,
                "a file part names its field and holds its file name in one quoted string");
  fuzz::Require(part.headers.substr(line.size()) == kCrlf + std::string(kFileContentType),
                "a file part's header ends with its content type");
  fuzz::Require(part.content == entry.content, "a file part carries the file's bytes");
}

void CheckReadBack(const Form& form, const std::string& body, const std::string& boundary) {
  const auto parts = ReadMultipart(body, boundary);
  fuzz::Require(parts.has_value(), "the body is well-formed multipart");
  fuzz::Require(parts->size() == form.request.fields.size() + form.files.size(),
                "the body holds a part per field and per file");
  auto part = parts->begin();
  for (const auto& [name, value] : form.request.fields) {
    fuzz::Require(part->headers == kDisposition + name + "\"", "a field part names its field");
    fuzz::Require(part->content == value, "a field part carries the field's value");
    ++part;
  }
  for (const FileEntry& entry : form.files) CheckFilePart(*part++, entry);
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  g_folder = std::filesystem::temp_directory_path() / ("fuzz_multipart_" + std::to_string(::getpid()));
  std::filesystem::create_directories(g_folder);
  std::atexit([] { std::filesystem::remove_all(g_folder); });
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Form form;
  FillForm(form, fuzz::Bytes(data, size));
  test_support::FakeServer server;
  test_support::RecordingListener<UploadProgress> listener;
  UploadResult result;
  Uploader uploader(&listener, &form.request, &result, server.Environment());
  fuzz::Require(uploader.Upload() == win::kOk, "a form of readable files uploads");

  const std::string body = server.Body();
  fuzz::Require(server.announced == body.size(), "the announced length is the length written");
  const std::string boundary = server.Boundary();
  fuzz::Require(IsBoundary(boundary), "the boundary has its fixed form");
  if (AllNamesPlain(form)) CheckReadBack(form, body, boundary);
  return 0;
}
