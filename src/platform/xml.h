// XML documents read from the service's replies: load wide text, look a node up
// by a path of element names, walk children, read attributes. Only the five
// predefined entities and character references are expanded; a document type
// declaration is skipped, never processed. Nothing here throws.
#pragma once

#include <cstddef>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

namespace pugi {
class xml_document;
struct xml_node_struct;
}  // namespace pugi

namespace platform::xml {

// DOM node type numbers, so that callers can name them as the service's DOM does.
enum class NodeType {
  kElement = 1,
  kText = 3,
  kCData = 4,
  kProcessingInstruction = 7,  // the XML declaration too, named "xml"
  kComment = 8,
  kDocument = 9,
  kOther = 0,
};

// The outcome of a path lookup: the query itself failed (a malformed path), no
// node matched, or a node matched and `text` holds its text.
struct Lookup {
  enum class Outcome { kFailed, kAbsent, kFound };
  Outcome outcome = Outcome::kAbsent;
  std::wstring text;

  bool failed() const { return outcome == Outcome::kFailed; }
  bool found() const { return outcome == Outcome::kFound; }
};

// A node of a Document; valid while the document lives. A default Node is null.
class Node {
 public:
  Node() = default;
  explicit operator bool() const { return node_ != nullptr; }

  NodeType type() const;
  // Element or processing-instruction name; "#text", "#cdata-section",
  // "#comment" or "#document" for the others, as the DOM names them.
  std::wstring Name() const;
  // The concatenated text and CDATA of the node and all its descendants.
  std::wstring Text() const;
  // The value of the attribute with exactly this name; empty when there is none.
  std::wstring Attribute(std::string_view name) const;
  // Children in document order: elements, text, comments, processing instructions.
  std::vector<Node> Children() const;

 private:
  friend class Document;
  explicit Node(pugi::xml_node_struct* node) : node_(node) {}
  pugi::xml_node_struct* node_ = nullptr;
};

class Document {
 public:
  // An empty document: every lookup finds nothing, the top has no children.
  Document();
  // Loads `text` up to its first NUL. Text that is not one well-formed element
  // (with comments and processing instructions around it) leaves the document empty.
  explicit Document(std::wstring_view text);
  // The same for UTF-8 text, which the document keeps and reads in place, so
  // that a large reply is never copied. Text that could make a tree of more
  // than kMaxTreeBytes is refused unread and leaves the document empty too.
  explicit Document(std::string utf8);
  ~Document();
  Document(Document&&) noexcept;
  Document& operator=(Document&&) noexcept;

  bool empty() const;
  // Looks up "root/child/..." (names compare exactly; the first match in
  // document order wins) and reads the node's text.
  Lookup NodeText(std::string_view path) const;
  // The document node, whose children are the top level of the text.
  Node Top() const;

 private:
  std::unique_ptr<std::string> text_;  // the nodes' names and values point into it
  std::unique_ptr<pugi::xml_document> document_;
};

// The most memory a document's tree may take, beside its text: four times the
// largest reply, so that reading one takes a few times its size at most.
inline constexpr std::size_t kMaxTreeBytes = 64u << 20;

}  // namespace platform::xml
