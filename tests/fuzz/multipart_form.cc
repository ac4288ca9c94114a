// Upload forms with any field names, values, file field names and paths,
// posted through a recording connection. The announced length must be the
// length written, and while no name holds a quote or a line break the body
// must read back, as a multipart reader splits it, into the same fields and files.
#include <unistd.h>

#include <regex>

#include "../unit/support/fixtures.h"
#include "fuzz_support.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace {

std::filesystem::path g_folder;

// Pieces between zero bytes, in pairs: a field name and its value, or "@" with
// a file field name and the text of the file's path, which is also its content.
// Gives the parts expected: the fields in byte order of their names, then the files.
std::vector<std::string> FillForm(UploadRequest& request, std::string_view input, bool* plain) {
  std::vector<std::string> pieces;
  for (std::size_t zero; (zero = input.find('\0')) != std::string_view::npos; input.remove_prefix(zero + 1)) {
    pieces.emplace_back(input.substr(0, zero));
  }
  std::vector<std::string> files;
  *plain = true;
  for (std::size_t i = 0; i + 1 < pieces.size() && i < 32; i += 2) {
    std::string name = pieces[i];
    const bool isFile = !name.empty() && name[0] == '@';
    if (isFile) name = text::WideToUtf8(fuzz::Utf8Text(name.substr(1)).c_str());
    *plain = *plain && name.find_first_of("\"\r\n") == std::string::npos;
    if (!isFile) {
      request.AddField(name.c_str(), pieces[i + 1].c_str());
      continue;
    }
    std::wstring file = fuzz::Utf8Text(pieces[i + 1]).substr(0, 48);
    for (wchar_t& c : file) c = c == L'/' || c == L'\0' ? L'\\' : c;
    const std::wstring path = text::Utf8ToWide(g_folder.u8string()) + L"/" + std::to_wstring(i) + L"-" + file;
    std::ofstream(test_support::Native(path), std::ios::binary) << pieces[i + 1];
    request.AddFile(fuzz::Utf8Text(name).c_str(), path.c_str());
    files.push_back("Content-Disposition: form-data; name=\"" + name + "\"; filename=\"\x01" +
                    "\r\nContent-Type: application/octet-stream\r\n\r\n" + pieces[i + 1]);
  }
  std::vector<std::string> parts;
  for (const auto& [name, value] : request.fields) {
    parts.push_back("Content-Disposition: form-data; name=\"" + name + "\"\r\n\r\n" + value);
  }
  parts.insert(parts.end(), files.begin(), files.end());
  return parts;
}

// The parts between the delimiters, with a file name replaced by "\x01".
std::vector<std::string> ReadParts(const std::string& body, const std::string& boundary) {
  const std::string delimiter = "--" + boundary;
  fuzz::Require(body.compare(0, delimiter.size(), delimiter) == 0 &&
                    body.size() >= delimiter.size() + 4 &&
                    body.compare(body.size() - delimiter.size() - 4, std::string::npos, delimiter + "--\r\n") == 0,
                "the body opens with a delimiter and ends with the closing one");
  std::vector<std::string> parts;
  for (std::size_t at = delimiter.size() + 2, end; at < body.size() - 4; at = end + delimiter.size() + 4) {
    end = body.find("\r\n" + delimiter, at);
    std::string part = body.substr(at, end - at);
    const std::size_t name = part.find("\"; filename=\"");
    if (name != std::string::npos && name < part.find("\r\n")) {
      part.replace(name + 13, part.find("\"\r\n", name + 13) - name - 13 + 1, "\x01");
    }
    parts.push_back(part);
  }
  return parts;
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  g_folder = std::filesystem::temp_directory_path() / ("fuzz_multipart_" + std::to_string(::getpid()));
  std::filesystem::create_directories(g_folder);
  std::atexit([] { std::filesystem::remove_all(g_folder); });
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  UploadRequest request;
  bool plain = true;
  const std::vector<std::string> parts = FillForm(request, fuzz::Bytes(data, size), &plain);
  test_support::FakeServer server;
  test_support::RecordingListener<UploadProgress> listener;
  UploadResult result;
  Uploader uploader(&listener, &request, &result, server.Environment());
  fuzz::Require(uploader.Upload() == win::kOk, "a form of readable files uploads");
  for (const auto& entry : std::filesystem::directory_iterator(g_folder)) std::filesystem::remove(entry);
  const std::string body = server.Body();
  fuzz::Require(server.announced == body.size(), "the announced length is the length written");
  fuzz::Require(std::regex_match(server.Boundary(), std::regex("-{27}[0-9A-F]{12}")), "the boundary has its form");
  if (plain) fuzz::Require(ReadParts(body, server.Boundary()) == parts, "the body reads back into the form");
  return 0;
}
