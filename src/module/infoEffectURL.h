// A record of three wide strings that the Python side may create and fill.
#pragma once

#include <string>

class infoEffectURL {
 public:
  infoEffectURL(const std::wstring& effect, const std::wstring& tag, const std::wstring& url)
      : strEffect(effect), strTag(tag), strURL(url) {}

  std::wstring strEffect;
  std::wstring strTag;
  std::wstring strURL;
};
