#include "platform/xml.h"

#include <pugixml.hpp>

#include <algorithm>

#include "platform/ascii.h"
#include "platform/text.h"

namespace platform::xml {
namespace {

// Comments and processing instructions stay in the tree so that a child walk
// sees what the service sent; no DTD handling is asked for, so none happens.
// Parsing as a fragment keeps text beside the root, so that it can be refused.
constexpr unsigned kParseOptions = pugi::parse_default | pugi::parse_comments |
                                   pugi::parse_pi | pugi::parse_declaration |
                                   pugi::parse_fragment;

// pugixml's records on a 64-bit build: a node is eight words, an attribute five.
constexpr std::size_t kNodeRecordBytes = 64;
constexpr std::size_t kAttributeRecordBytes = 40;

// An upper bound of the tree that parsing `text` makes. Every node but a text
// starts with a '<' not followed by '/'; a text runs up to a '<' or the end;
// every attribute holds a '='.
std::size_t MostTreeBytes(std::string_view text) {
  std::size_t marks = 0, closings = 0, equals = 0;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (text[i] == '<') {
      ++marks;
      if (i + 1 < text.size() && text[i + 1] == '/') ++closings;
    } else if (text[i] == '=') {
      ++equals;
    }
  }
  const std::size_t nodes = (marks - closings) + (marks + 1);
  return nodes * kNodeRecordBytes + equals * kAttributeRecordBytes;
}

std::wstring Wide(const char* utf8) { return platform::Utf8ToWide(utf8); }

bool IsText(pugi::xml_node node) {
  return node.type() == pugi::node_pcdata || node.type() == pugi::node_cdata;
}

// Walks the subtree in document order without recursion: a reply may nest
// elements deeper than the stack could follow.
void AppendText(pugi::xml_node top, std::string& out) {
  pugi::xml_node node = top;
  for (;;) {
    if (IsText(node)) {
      out += node.value();
    } else if (pugi::xml_node child = node.first_child()) {
      node = child;
      continue;
    }
    while (node != top && !node.next_sibling()) node = node.parent();
    if (node == top) return;
    node = node.next_sibling();
  }
}

bool IsWellFormedDocument(const pugi::xml_document& document) {
  int elements = 0;
  for (pugi::xml_node child : document.children()) {
    switch (child.type()) {
      case pugi::node_element: ++elements; break;
      case pugi::node_comment:
      case pugi::node_pi:
      case pugi::node_declaration: break;
      default: return false;  // text beside the root element
    }
  }
  return elements == 1;
}

std::vector<std::string_view> SplitPath(std::string_view path) {
  std::vector<std::string_view> steps;
  size_t start = 0;
  for (;;) {
    const size_t slash = path.find('/', start);
    steps.push_back(path.substr(start, slash - start));
    if (slash == std::string_view::npos) return steps;
    start = slash + 1;
  }
}

// The first element in document order reached through `steps` below `node`.
pugi::xml_node FindFirst(pugi::xml_node node, const std::vector<std::string_view>& steps,
                         size_t step) {
  for (pugi::xml_node child : node.children()) {
    if (child.type() != pugi::node_element || steps[step] != child.name()) continue;
    if (step + 1 == steps.size()) return child;
    if (pugi::xml_node found = FindFirst(child, steps, step + 1)) return found;
  }
  return {};
}

}  // namespace

NodeType Node::type() const {
  switch (pugi::xml_node(node_).type()) {
    case pugi::node_element: return NodeType::kElement;
    case pugi::node_pcdata: return NodeType::kText;
    case pugi::node_cdata: return NodeType::kCData;
    case pugi::node_pi:
    case pugi::node_declaration: return NodeType::kProcessingInstruction;
    case pugi::node_comment: return NodeType::kComment;
    case pugi::node_document: return NodeType::kDocument;
    default: return NodeType::kOther;
  }
}

std::wstring Node::Name() const {
  switch (type()) {
    case NodeType::kText: return L"#text";
    case NodeType::kCData: return L"#cdata-section";
    case NodeType::kComment: return L"#comment";
    case NodeType::kDocument: return L"#document";
    default: return Wide(pugi::xml_node(node_).name());
  }
}

std::wstring Node::Text() const {
  std::string out;
  AppendText(pugi::xml_node(node_), out);
  return platform::Utf8ToWide(out);
}

std::wstring Node::Attribute(std::string_view name) const {
  for (pugi::xml_attribute attribute : pugi::xml_node(node_).attributes()) {
    if (name == attribute.name()) return Wide(attribute.value());
  }
  return {};
}

std::vector<Node> Node::Children() const {
  std::vector<Node> children;
  for (pugi::xml_node child : pugi::xml_node(node_).children()) {
    children.push_back(Node(child.internal_object()));
  }
  return children;
}

Document::Document() : document_(std::make_unique<pugi::xml_document>()) {}

Document::Document(std::wstring_view text)
    : Document(platform::WideToUtf8(platform::UpToNul(text))) {}

Document::Document(std::string utf8)
    : text_(std::make_unique<std::string>(std::move(utf8))),
      document_(std::make_unique<pugi::xml_document>()) {
  std::string& text = *text_;
  text.resize(platform::UpToNul(text).size());  // the reply text ends at its terminator
  if (MostTreeBytes(text) > kMaxTreeBytes) return;
  const pugi::xml_parse_result result = document_->load_buffer_inplace(
      text.data(), text.size(), kParseOptions, pugi::encoding_utf8);
  if (!result || !IsWellFormedDocument(*document_)) document_->reset();
}

Document::~Document() = default;
Document::Document(Document&&) noexcept = default;
Document& Document::operator=(Document&&) noexcept = default;

bool Document::empty() const { return !document_->first_child(); }

Lookup Document::NodeText(std::string_view path) const {
  const std::vector<std::string_view> steps = SplitPath(path);
  for (std::string_view step : steps) {
    if (step.empty()) return {Lookup::Outcome::kFailed, {}};
  }
  const pugi::xml_node found = FindFirst(*document_, steps, 0);
  if (!found) return {Lookup::Outcome::kAbsent, {}};
  return {Lookup::Outcome::kFound, Node(found.internal_object()).Text()};
}

Node Document::Top() const { return Node(document_->internal_object()); }

}  // namespace platform::xml
