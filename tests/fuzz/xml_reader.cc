// Service replies as the XML reader takes them: the lookups by path the
// operations make, the child walk and attribute reads. Nothing may throw or
// crash, and every element reached by the walk is found again by its path.
#include <cwctype>

#include "fuzz_support.h"
#include "platform/xml.h"
#include "service/exchange.h"
#include "service/reply_walk.h"

namespace {

// Paths and names the service's replies are read with, and malformed paths.
constexpr const char* kPaths[] = {
    "info/tokenid", "info/firstloginUrl", "INFO/SignUp", "uploadTemplate/templateUrl",
    "uploadTemplate/error", "info", "a//b", "/info", "info/", "",
};
constexpr const char* kAttributes[] = {"id", "ID", "name", ""};
constexpr const wchar_t* kChildNames[] = {L"categories", L"category", L"PIP", L"url"};

// Walks deeper than this are left out, so that the walk itself stays shallow.
constexpr int kMaxWalkDepth = 200;
// Nesting deeper than a recursive reader's stack can follow (it failed near
// 50000). Checked once per run: a seed this large would slow every input.
constexpr std::size_t kDeepNesting = 100000;

std::wstring SwapCase(const std::wstring& name) {
  std::wstring swapped = name;
  for (wchar_t& c : swapped) {
    if (c < 0x80) c = std::iswupper(c) ? std::towlower(c) : std::towupper(c);
  }
  return swapped;
}

// Element names fold ASCII letters only, as the service's names are ASCII.
std::wstring Fold(const std::wstring& name) {
  std::wstring folded = name;
  for (wchar_t& c : folded) {
    if (c < 0x80) c = std::towlower(c);
  }
  return folded;
}

void ReadElement(const xml::Node& element) {
  for (const char* attribute : kAttributes) element.Attribute(attribute);
  for (const wchar_t* name : kChildNames) ChildrenNamed(element, name);
}

// The children named like an element in any letter case are exactly the
// element children whose names fold to the same.
void CheckChildWalk(const xml::Node& parent, const std::vector<xml::Node>& children) {
  for (const xml::Node& child : children) {
    if (child.type() != xml::NodeType::kElement) continue;
    const std::wstring folded = Fold(child.Name());
    std::size_t alike = 0;
    for (const xml::Node& other : children) {
      alike += other.type() == xml::NodeType::kElement && Fold(other.Name()) == folded;
    }
    fuzz::Require(ChildrenNamed(parent, SwapCase(child.Name())).size() == alike,
                  "a child walk finds the elements of a name in any letter case");
  }
}

void Walk(const xml::Document& document, const xml::Node& node, const std::string& path,
          int depth) {
  if (depth > kMaxWalkDepth) return;
  node.type();
  node.Name();
  const std::vector<xml::Node> children = node.Children();
  CheckChildWalk(node, children);
  for (const xml::Node& child : children) {
    if (child.type() != xml::NodeType::kElement) {
      child.Name();
      child.Text();
      continue;
    }
    ReadElement(child);
    const std::string childPath =
        (path.empty() ? "" : path + "/") + text::WideToUtf8(child.Name());
    fuzz::Require(document.NodeText(childPath).found(), "an element is found by its path");
    Walk(document, child, childPath, depth + 1);
  }
}

std::string Repeat(const std::string& text, std::size_t times) {
  std::string repeated;
  repeated.reserve(text.size() * times);
  for (std::size_t i = 0; i < times; ++i) repeated += text;
  return repeated;
}

void CheckDeepReply() {
  const std::string reply = "<info><tokenid>" + Repeat("<a>", kDeepNesting) + "x" +
                            Repeat("</a>", kDeepNesting) + "</tokenid></info>";
  const xml::Document document(service::DecodeUtf8Reply(reply));
  fuzz::Require(document.NodeText("info/tokenid").text == L"x",
                "a deeply nested reply is read to its innermost text");
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
  CheckDeepReply();
  return 0;
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const xml::Document document(service::DecodeUtf8Reply(std::string(fuzz::Bytes(data, size))));
  for (const char* path : kPaths) document.NodeText(path);
  document.Top().Text();
  Walk(document, document.Top(), "", 0);
  return 0;
}
