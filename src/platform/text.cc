#include "platform/text.h"

#include <cstdint>

namespace platform {
namespace {

constexpr char32_t kReplacement = 0xFFFD;

bool IsContinuation(unsigned char c) { return (c & 0xC0) == 0x80; }

// U+FFFD itself, sent as such, is valid.
bool IsEncodedReplacement(std::string_view bytes, size_t from, size_t to) {
  return bytes.substr(from, to - from) == "\xEF\xBF\xBD";
}

// Decodes one UTF-8 sequence at bytes[i]; advances i past what was consumed.
// Overlong forms, surrogates and values past U+10FFFF decode as U+FFFD.
char32_t DecodeOne(std::string_view bytes, size_t& i) {
  const unsigned char lead = bytes[i++];
  if (lead < 0x80) return lead;
  int extra;
  char32_t cp;
  char32_t min;
  if ((lead & 0xE0) == 0xC0) { extra = 1; cp = lead & 0x1F; min = 0x80; }
  else if ((lead & 0xF0) == 0xE0) { extra = 2; cp = lead & 0x0F; min = 0x800; }
  else if ((lead & 0xF8) == 0xF0) { extra = 3; cp = lead & 0x07; min = 0x10000; }
  else return kReplacement;
  for (int k = 0; k < extra; ++k) {
    if (i >= bytes.size() || !IsContinuation(bytes[i])) return kReplacement;
    cp = (cp << 6) | (bytes[i++] & 0x3F);
  }
  if (cp < min || cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF)) return kReplacement;
  return cp;
}

void AppendUtf8(std::string& out, char32_t cp) {
  if (cp > 0x10FFFF || (cp >= 0xD800 && cp <= 0xDFFF)) cp = kReplacement;
  if (cp < 0x80) {
    out += static_cast<char>(cp);
  } else if (cp < 0x800) {
    out += static_cast<char>(0xC0 | (cp >> 6));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  } else if (cp < 0x10000) {
    out += static_cast<char>(0xE0 | (cp >> 12));
    out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  } else {
    out += static_cast<char>(0xF0 | (cp >> 18));
    out += static_cast<char>(0x80 | ((cp >> 12) & 0x3F));
    out += static_cast<char>(0x80 | ((cp >> 6) & 0x3F));
    out += static_cast<char>(0x80 | (cp & 0x3F));
  }
}

}  // namespace

std::wstring Utf8ToWide(std::string_view bytes) {
  std::wstring out;
  out.reserve(bytes.size());
  for (size_t i = 0; i < bytes.size();) out += static_cast<wchar_t>(DecodeOne(bytes, i));
  return out;
}

std::string ValidUtf8(std::string bytes) {
  size_t valid = 0;  // the bytes before it decode to themselves
  for (size_t next = 0; valid < bytes.size(); valid = next) {
    if (DecodeOne(bytes, next) == kReplacement && !IsEncodedReplacement(bytes, valid, next)) break;
  }
  if (valid == bytes.size()) return bytes;
  std::string out(bytes, 0, valid);
  for (size_t i = valid; i < bytes.size();) AppendUtf8(out, DecodeOne(bytes, i));
  return out;
}

std::string WideToUtf8(std::wstring_view wide) {
  std::string out;
  out.reserve(wide.size());
  for (wchar_t c : wide) AppendUtf8(out, static_cast<char32_t>(static_cast<uint32_t>(c)));
  return out;
}

}  // namespace platform
