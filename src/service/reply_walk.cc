#include "service/reply_walk.h"

#include "platform/ascii.h"

namespace service {

std::vector<platform::xml::Node> ChildrenNamed(const platform::xml::Node& parent, std::wstring_view name) {
  std::vector<platform::xml::Node> matches;
  for (const platform::xml::Node& child : parent.Children()) {
    if (child.type() != platform::xml::NodeType::kComment && platform::EqualIgnoringCase(child.Name(), name)) matches.push_back(child);
  }
  return matches;
}

}  // namespace service
