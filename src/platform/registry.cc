#include "platform/registry.h"

#include <cstdlib>

#include "platform/ascii.h"
#include "platform/file.h"
#include "platform/text.h"

namespace platform {
namespace {

constexpr std::wstring_view kLocalMachinePrefix = L"HKEY_LOCAL_MACHINE\\";
constexpr std::wstring_view kHeaders[] = {L"Windows Registry Editor Version 5.00", L"REGEDIT4"};
constexpr std::wstring_view kDwordTag = L"dword:";
constexpr std::wstring_view kHexTag = L"hex";
constexpr std::string_view kUtf16LeMark = "\xFF\xFE";
constexpr std::string_view kUtf8Mark = "\xEF\xBB\xBF";
constexpr wchar_t kReplacement = 0xFFFD;
constexpr std::size_t kNumberBytes = 4;
// A hive holding a few switches is a few hundred bytes; anything beyond this is not one.
constexpr std::size_t kHiveFileLimit = 1024 * 1024;

using Bytes = std::vector<std::uint8_t>;
using Values = std::map<std::wstring, Bytes>;

// Registry names ignore the case of ASCII letters.
std::wstring Fold(std::wstring_view name) { return platform::Lowered(name); }

bool StartsWith(std::wstring_view s, std::wstring_view prefix) {
  return s.substr(0, prefix.size()) == prefix;
}

bool IsHighSurrogate(char32_t u) { return u >= 0xD800 && u <= 0xDBFF; }
bool IsLowSurrogate(char32_t u) { return u >= 0xDC00 && u <= 0xDFFF; }

std::wstring DecodeUtf16Le(std::string_view bytes) {
  std::wstring out;
  const std::size_t units = bytes.size() / 2;
  auto unit = [&](std::size_t i) -> char32_t {
    return static_cast<std::uint8_t>(bytes[2 * i]) | (static_cast<std::uint8_t>(bytes[2 * i + 1]) << 8);
  };
  for (std::size_t i = 0; i < units; ++i) {
    const char32_t u = unit(i);
    if (IsHighSurrogate(u) && i + 1 < units && IsLowSurrogate(unit(i + 1))) {
      out.push_back(static_cast<wchar_t>(0x10000 + ((u - 0xD800) << 10) + (unit(++i) - 0xDC00)));
    } else {
      out.push_back(IsHighSurrogate(u) || IsLowSurrogate(u) ? kReplacement : static_cast<wchar_t>(u));
    }
  }
  return out;
}

void AppendUnit(Bytes& out, char32_t unit) {
  out.push_back(static_cast<std::uint8_t>(unit & 0xFF));
  out.push_back(static_cast<std::uint8_t>(unit >> 8));
}

// A string value as the registry stores it: UTF-16LE with its terminating zero.
Bytes EncodeUtf16Le(std::wstring_view text) {
  Bytes out;
  for (wchar_t c : text) {
    const char32_t cp = static_cast<char32_t>(c);
    if (cp > 0xFFFF) {
      AppendUnit(out, 0xD800 + ((cp - 0x10000) >> 10));
      AppendUnit(out, 0xDC00 + ((cp - 0x10000) & 0x3FF));
    } else {
      AppendUnit(out, cp);
    }
  }
  AppendUnit(out, 0);
  return out;
}

std::wstring DecodeFile(std::string_view bytes) {
  if (bytes.substr(0, kUtf16LeMark.size()) == kUtf16LeMark) {
    return DecodeUtf16Le(bytes.substr(kUtf16LeMark.size()));
  }
  if (bytes.substr(0, kUtf8Mark.size()) == kUtf8Mark) bytes.remove_prefix(kUtf8Mark.size());
  return platform::Utf8ToWide(bytes);
}

// Trimmed lines, with hex data continued over several lines ("\" at the end) joined.
std::vector<std::wstring> LogicalLines(std::wstring_view text) {
  std::vector<std::wstring> lines;
  bool continues = false;
  while (!text.empty()) {
    const auto end = text.find(L'\n');
    std::wstring_view line = platform::Trim(text.substr(0, end));
    text.remove_prefix(end == std::wstring_view::npos ? text.size() : end + 1);
    const bool continuesNext = !line.empty() && line.back() == L'\\';
    if (continuesNext) line.remove_suffix(1);
    if (continues) {
      lines.back().append(line);
    } else {
      lines.emplace_back(line);
    }
    continues = continuesNext;
  }
  return lines;
}

// A hexadecimal number of 1 to maxDigits digits, the whole of `digits`.
std::optional<std::uint32_t> ParseHex(std::wstring_view digits, std::size_t maxDigits) {
  if (digits.empty() || digits.size() > maxDigits) return std::nullopt;
  std::uint32_t value = 0;
  for (wchar_t c : digits) {
    const auto digit = platform::HexDigitValue(c);
    if (!digit) return std::nullopt;
    value = (value << 4) | *digit;
  }
  return value;
}

// A quoted name or string at the start of `rest` with its \\ and \" escapes;
// `rest` is advanced past the closing quote.
std::optional<std::wstring> ReadQuoted(std::wstring_view& rest) {
  if (rest.empty() || rest.front() != L'"') return std::nullopt;
  std::wstring out;
  for (std::size_t i = 1; i < rest.size(); ++i) {
    if (rest[i] == L'"') {
      rest.remove_prefix(i + 1);
      return out;
    }
    if (rest[i] == L'\\' && i + 1 < rest.size()) ++i;
    out.push_back(rest[i]);
  }
  return std::nullopt;
}

std::optional<Bytes> ParseDword(std::wstring_view digits) {
  const auto value = ParseHex(digits, 2 * kNumberBytes);
  if (!value) return std::nullopt;
  Bytes out;
  for (std::size_t i = 0; i < kNumberBytes; ++i) out.push_back(static_cast<std::uint8_t>(*value >> (8 * i)));
  return out;
}

// "hex:01,02" or "hex(7):01,02"; the part after "hex".
std::optional<Bytes> ParseHexList(std::wstring_view rest) {
  if (!rest.empty() && rest.front() == L'(') {
    const auto close = rest.find(L')');
    if (close == std::wstring_view::npos || !ParseHex(rest.substr(1, close - 1), 2 * kNumberBytes)) {
      return std::nullopt;
    }
    rest.remove_prefix(close + 1);
  }
  if (rest.empty() || rest.front() != L':') return std::nullopt;
  rest.remove_prefix(1);
  Bytes out;
  while (!platform::Trim(rest).empty()) {
    const auto comma = rest.find(L',');
    const auto byte = ParseHex(platform::Trim(rest.substr(0, comma)), 2);
    if (!byte) return std::nullopt;
    out.push_back(static_cast<std::uint8_t>(*byte));
    rest.remove_prefix(comma == std::wstring_view::npos ? rest.size() : comma + 1);
  }
  return out;
}

std::optional<Bytes> ParseData(std::wstring_view data) {
  if (StartsWith(data, L"\"")) {
    const auto text = ReadQuoted(data);
    if (!text || !platform::Trim(data).empty()) return std::nullopt;
    return EncodeUtf16Le(*text);
  }
  const std::wstring folded = Fold(data);
  if (StartsWith(folded, kDwordTag)) return ParseDword(platform::Trim(data.substr(kDwordTag.size())));
  if (StartsWith(folded, kHexTag)) return ParseHexList(data.substr(kHexTag.size()));
  return std::nullopt;
}

// "Name"=data, @=data (the default value) or "Name"=- (removes the value).
// Lines that cannot be read are skipped, as the registry editor does.
void ApplyValueLine(std::wstring_view line, Values& values) {
  std::optional<std::wstring> name;
  if (StartsWith(line, L"@")) {
    name.emplace();
    line.remove_prefix(1);
  } else {
    name = ReadQuoted(line);
  }
  line = platform::Trim(line);
  if (!name || line.empty() || line.front() != L'=') return;
  const std::wstring_view data = platform::Trim(line.substr(1));
  if (data == L"-") {
    values.erase(Fold(*name));
  } else if (auto bytes = ParseData(data)) {
    values[Fold(*name)] = std::move(*bytes);
  }
}

bool IsHeader(std::wstring_view line) {
  for (std::wstring_view header : kHeaders) {
    if (line == header) return true;
  }
  return false;
}

// The folded key path of a "[...]" line; empty for a "[-...]" (deletion) line.
std::wstring SectionKey(std::wstring_view line) {
  line.remove_prefix(1);
  const auto close = line.rfind(L']');
  if (close == std::wstring_view::npos || StartsWith(line, L"-")) return {};
  return Fold(platform::Trim(line.substr(0, close)));
}

}  // namespace

std::string HivePath() {
  const char* path = std::getenv(kHivePathVariable);
  return path && *path ? path : kDefaultHivePath;
}

std::optional<RegistryKey> RegistryKey::OpenLocalMachine(std::wstring_view subkey) {
  const auto bytes = platform::ReadSmallFile(HivePath(), kHiveFileLimit);
  if (!bytes) return std::nullopt;
  return OpenInHiveFile(*bytes, subkey);
}

std::optional<RegistryKey> RegistryKey::OpenInHiveFile(std::string_view fileBytes, std::wstring_view subkey) {
  const std::vector<std::wstring> lines = LogicalLines(DecodeFile(fileBytes));
  auto line = lines.begin();
  while (line != lines.end() && line->empty()) ++line;
  if (line == lines.end() || !IsHeader(*line)) return std::nullopt;

  const std::wstring wanted = Fold(std::wstring(kLocalMachinePrefix).append(subkey));
  const std::wstring descendantPrefix = wanted + L"\\";
  RegistryKey key;
  bool exists = false;  // a section of the key itself or of one of its subkeys
  bool inKey = false;
  for (++line; line != lines.end(); ++line) {
    if (line->empty() || line->front() == L';') continue;
    if (line->front() == L'[') {
      const std::wstring section = SectionKey(*line);
      inKey = !section.empty() && section == wanted;
      exists = exists || inKey || StartsWith(section, descendantPrefix);
    } else if (inKey) {
      ApplyValueLine(*line, key.values_);
    }
  }
  if (!exists) return std::nullopt;
  return key;
}

std::optional<std::uint32_t> RegistryKey::ReadNumber(std::wstring_view name) const {
  const auto found = values_.find(Fold(name));
  if (found == values_.end()) return std::nullopt;
  std::uint32_t number = 0;
  const Bytes& data = found->second;
  for (std::size_t i = 0; i < kNumberBytes && i < data.size(); ++i) number |= std::uint32_t{data[i]} << (8 * i);
  return number;
}

}  // namespace platform
