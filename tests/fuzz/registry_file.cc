// Hive files in the registry editor's export format, as the debug-trace switch
// is read from them: any bytes, UTF-8 or UTF-16 with its byte order mark.
#include "fuzz_support.h"
#include "platform/registry.h"

namespace {

constexpr const wchar_t* kKey = L"SOFTWARE\\Quillmark\\Lumivanta";
constexpr const wchar_t* kKeyOtherCase = L"software\\QUILLMARK\\lumivanta";
constexpr const wchar_t* kValue = L"DumpMsg";
constexpr const wchar_t* kValueOtherCase = L"dUMPmSG";
constexpr const wchar_t* kDefaultValue = L"";

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view hive = fuzz::Bytes(data, size);
  const auto key = registry::Key::OpenInHiveFile(hive, kKey);
  const auto sameKey = registry::Key::OpenInHiveFile(hive, kKeyOtherCase);
  fuzz::Require(key.has_value() == sameKey.has_value(), "key names ignore letter case");
  if (!key) return 0;
  fuzz::Require(key->ReadNumber(kValue) == sameKey->ReadNumber(kValue),
                "a key reads the same whatever the case of its name");
  fuzz::Require(key->ReadNumber(kValue) == key->ReadNumber(kValueOtherCase),
                "value names ignore letter case");
  key->ReadNumber(kDefaultValue);
  return 0;
}
