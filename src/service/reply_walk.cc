#include "service/reply_walk.h"

#include "platform/ascii.h"

std::vector<xml::Node> ChildrenNamed(const xml::Node& parent, std::wstring_view name) {
  std::vector<xml::Node> matches;
  for (const xml::Node& child : parent.Children()) {
    if (child.type() != xml::NodeType::kComment && ascii::EqualIgnoringCase(child.Name(), name)) matches.push_back(child);
  }
  return matches;
}
