// Service replies as the XML reader takes them: the lookups by path the
// operations make, the child walk and attribute reads. Nothing may throw or
// crash, and every element the walk reaches is found again by its path.
#include <cstdio>
#include <cstdlib>

#include "platform/text.h"
#include "platform/xml.h"
#include "service/exchange.h"
#include "service/reply_walk.h"

namespace {

void Require(bool holds, const char* property) {
  if (!holds) std::fprintf(stderr, "property does not hold: %s\n", property), std::abort();
}

constexpr const char* kPaths[] = {"info/tokenid", "INFO/SignUp", "uploadTemplate/templateUrl", "info",
                                  "a//b", "/info", "info/", ""};
constexpr int kMaxWalkDepth = 200;  // the walk itself stays shallow

void Walk(const platform::xml::Document& document, const platform::xml::Node& node, const std::string& path, int depth) {
  if (depth > kMaxWalkDepth) return;
  for (const wchar_t* name : {L"categories", L"category", L"PIP"}) service::ChildrenNamed(node, name);
  for (const platform::xml::Node& child : node.Children()) {
    child.Text();
    if (child.type() != platform::xml::NodeType::kElement) continue;
    for (const char* attribute : {"categoryid", "id", ""}) child.Attribute(attribute);
    const std::string childPath = (path.empty() ? "" : path + "/") + platform::WideToUtf8(child.Name());
    Require(document.NodeText(childPath).found(), "an element is found by its path");
    Walk(document, child, childPath, depth + 1);
  }
}

}  // namespace

// Nesting deeper than a recursive reader's stack can follow, checked once per
// run: a seed this large would slow every input.
extern "C" int LLVMFuzzerInitialize(int*, char***) {
  std::string open, close;
  for (int i = 0; i < 100000; ++i) open += "<a>", close += "</a>";
  const platform::xml::Document deep(service::DecodeUtf8Reply("<info><tokenid>" + open + "x" + close + "</tokenid></info>"));
  Require(deep.NodeText("info/tokenid").text == L"x", "a deeply nested reply is read to its innermost text");
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const platform::xml::Document document(service::DecodeUtf8Reply(std::string(reinterpret_cast<const char*>(data), size)));
  for (const char* path : kPaths) document.NodeText(path);
  Walk(document, document.Top(), "", 0);
  return 0;
}
