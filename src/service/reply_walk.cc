#include "service/reply_walk.h"

#include <algorithm>
#include <string>

namespace {

wchar_t AsciiLower(wchar_t c) { return c >= L'A' && c <= L'Z' ? c - L'A' + L'a' : c; }

bool EqualIgnoringCase(std::wstring_view a, std::wstring_view b) {
  return a.size() == b.size() &&
         std::equal(a.begin(), a.end(), b.begin(), [](wchar_t x, wchar_t y) { return AsciiLower(x) == AsciiLower(y); });
}

}  // namespace

std::vector<xml::Node> ChildrenNamed(const xml::Node& parent, std::wstring_view name) {
  std::vector<xml::Node> matches;
  for (const xml::Node& child : parent.Children()) {
    if (child.type() != xml::NodeType::kComment && EqualIgnoringCase(child.Name(), name)) matches.push_back(child);
  }
  return matches;
}
