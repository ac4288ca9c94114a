// The form an upload posts: where it goes, its text fields and file fields, and
// the upload speed learned so far, which carries over from file to file.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "transport/UploadFile.h"

namespace transport {

class UploadRequest {
 public:
  // Bytes per half-second assumed before anything has been measured.
  static constexpr std::uint32_t kInitialRateEstimate = 5600;
  static constexpr const wchar_t* kFileContentType = L"application/octet-stream";

  // Accepts only "http://host[:80]/path" without credentials, query or fragment;
  // false leaves host and path as they were.
  bool SetUrl(const char* url);
  // Sets the field (replacing an earlier value); a null value is stored empty.
  void AddField(const char* name, const char* value);
  void AddFile(const wchar_t* name, const wchar_t* path);
  void ClearFields();
  void ClearFiles();

  std::string host;
  std::string path;
  std::vector<UploadFile> files;
  // std::string orders names by unsigned byte value, as the wire order requires.
  std::map<std::string, std::string> fields;
  std::uint32_t rateEstimate = kInitialRateEstimate;
};

}  // namespace transport
