// One file field of an upload form.
#pragma once

#include <string>

namespace transport {

struct UploadFile {
  std::wstring name;         // form field name of the part
  std::wstring path;         // local path; also sent as the part's file name
  std::wstring contentType;  // media type of the part
};

}  // namespace transport
