#include "transport/WideToUtf8.h"

#include <cstring>
#include <new>
#include <string>

#include "platform/text.h"

bool WideToUtf8(const wchar_t* text, char** out) {
  if (!text) return false;
  const std::string converted = text::WideToUtf8(text);
  char* copy = new (std::nothrow) char[converted.size() + 1];
  *out = copy;
  if (!copy) return false;
  std::memcpy(copy, converted.c_str(), converted.size() + 1);
  return true;
}
