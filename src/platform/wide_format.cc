#include "platform/wide_format.h"

#include <locale.h>
#include <wchar.h>

#include <algorithm>
#include <cwchar>
#include <string_view>

namespace platform {
namespace {

constexpr std::wstring_view kFlagsAndWidth = L"-+ #0'*.0123456789";
constexpr std::wstring_view kLengthModifiers = L"hlLqjztw";
constexpr std::wstring_view kTextConversions = L"sScC";

bool IsWideText(std::wstring_view modifiers, wchar_t conversion) {
  if (modifiers.find(L'h') != std::wstring_view::npos) return false;
  if (modifiers.find_first_of(L"lw") != std::wstring_view::npos) return true;
  return conversion == L's' || conversion == L'c';
}

wchar_t Lower(wchar_t conversion) { return conversion == L'S' ? L's' : conversion == L'C' ? L'c' : conversion; }

// Makes narrow arguments decode as UTF-8 on this thread for the guard's lifetime.
class Utf8TextScope {
 public:
  Utf8TextScope() {
    static const locale_t utf8 = newlocale(LC_CTYPE_MASK, "C.UTF-8", static_cast<locale_t>(0));
    if (utf8) previous_ = uselocale(utf8);
  }
  ~Utf8TextScope() {
    if (previous_) uselocale(previous_);
  }
  Utf8TextScope(const Utf8TextScope&) = delete;
  Utf8TextScope& operator=(const Utf8TextScope&) = delete;

 private:
  locale_t previous_ = static_cast<locale_t>(0);
};

}  // namespace

std::wstring TranslateFormat(const wchar_t* format) {
  std::wstring out;
  std::wstring_view rest = format ? format : L"";
  while (!rest.empty()) {
    const auto percent = rest.find(L'%');
    out.append(rest.substr(0, percent));
    if (percent == std::wstring_view::npos) break;
    rest.remove_prefix(percent + 1);
    out.push_back(L'%');
    if (!rest.empty() && rest.front() == L'%') {
      out.push_back(L'%');
      rest.remove_prefix(1);
      continue;
    }
    const auto widthEnd = std::min(rest.find_first_not_of(kFlagsAndWidth), rest.size());
    out.append(rest.substr(0, widthEnd));
    rest.remove_prefix(widthEnd);
    const auto modifiersEnd = std::min(rest.find_first_not_of(kLengthModifiers), rest.size());
    const std::wstring_view modifiers = rest.substr(0, modifiersEnd);
    rest.remove_prefix(modifiersEnd);
    if (rest.empty()) {
      out.append(modifiers);
      break;
    }
    const wchar_t conversion = rest.front();
    rest.remove_prefix(1);
    if (kTextConversions.find(conversion) != std::wstring_view::npos) {
      if (IsWideText(modifiers, conversion)) out.push_back(L'l');
      out.push_back(Lower(conversion));
    } else {
      out.append(modifiers);
      out.push_back(conversion);
    }
  }
  return out;
}

std::size_t FormatCut(wchar_t* buffer, std::size_t capacity, const wchar_t* format, std::va_list args) {
  if (capacity == 0) return 0;
  std::wmemset(buffer, 0, capacity);
  const std::wstring translated = TranslateFormat(format);
  {
    Utf8TextScope utf8;
    // A text that does not fit makes glibc report failure after writing what fits.
    std::vswprintf(buffer, capacity, translated.c_str(), args);
  }
  const std::size_t length = ::wcsnlen(buffer, capacity - 1);
  buffer[length] = L'\0';
  return length;
}

}  // namespace platform
