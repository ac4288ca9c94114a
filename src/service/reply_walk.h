// The child walk of the service's replies: element names compare ignoring letter
// case and comments are skipped, so "CATEGORIES" or "pip" are found as well.
#pragma once

#include <string_view>
#include <vector>

#include "platform/xml.h"

namespace service {

// The children of `parent` (the document's top or an element) whose name equals
// `name` ignoring ASCII letter case, in document order; comments are never matched.
std::vector<platform::xml::Node> ChildrenNamed(const platform::xml::Node& parent, std::wstring_view name);

}  // namespace service
