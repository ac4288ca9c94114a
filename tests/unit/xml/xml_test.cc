#include "platform/xml.h"

#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <utility>
#include <vector>

namespace {

using Outcome = xml::Lookup::Outcome;

struct LookupCase {
  const char* what;
  std::wstring text;
  const char* path;
  Outcome outcome;
  std::wstring found;
};

void PrintTo(const LookupCase& c, std::ostream* os) { *os << c.what; }

class PathLookup : public ::testing::TestWithParam<LookupCase> {};

TEST_P(PathLookup, FindsTheFirstMatchingNodeAndItsText) {
  const LookupCase& c = GetParam();
  const xml::Lookup lookup = xml::Document(c.text).NodeText(c.path);
  EXPECT_EQ(lookup.outcome, c.outcome) << c.what;
  EXPECT_EQ(lookup.text, c.found) << c.what;
}

const LookupCase kLookups[] = {
    {"plain", L"<info><tokenid>T1</tokenid></info>", "info/tokenid", Outcome::kFound, L"T1"},
    {"root name is case-sensitive", L"<INFO><tokenid>T1</tokenid></INFO>", "info/tokenid",
     Outcome::kAbsent, L""},
    {"child name is case-sensitive", L"<info><TokenID>T1</TokenID></info>", "info/tokenid",
     Outcome::kAbsent, L""},
    {"first of two", L"<info><a>1</a><a>2</a></info>", "info/a", Outcome::kFound, L"1"},
    {"first in document order across branches", L"<a><b/><b><c>x</c></b></a>", "a/b/c",
     Outcome::kFound, L"x"},
    {"root alone", L"<a>x<b>y</b></a>", "a", Outcome::kFound, L"xy"},
    {"descendants and CDATA concatenated",
     L"<a><b>x<i>y<!--no-->z</i><![CDATA[<w>]]></b></a>", "a/b", Outcome::kFound, L"xyz<w>"},
    {"empty element", L"<a><b/></a>", "a/b", Outcome::kFound, L""},
    {"predefined entities and references",
     L"<a>&lt;&gt;&amp;&quot;&apos;&#228;&#x4E2D;</a>", "a", Outcome::kFound,
     L"<>&\"'\u00E4\u4E2D"},
    {"declared entity not expanded",
     L"<!DOCTYPE a [<!ENTITY e \"boom\">]><a>&e;</a>", "a", Outcome::kFound, L"&e;"},
    {"declaration and comments around the root",
     L"<?xml version=\"1.0\" encoding=\"UTF-8\"?><!--c--><a>x</a><!--d-->", "a",
     Outcome::kFound, L"x"},
    {"characters beyond the BMP", L"<a>\U0001F600\u00E4</a>", "a", Outcome::kFound,
     L"\U0001F600\u00E4"},
    {"non-ASCII names", L"<info><\u540D>v</\u540D></info>", "info/\xE5\x90\x8D",
     Outcome::kFound, L"v"},
    {"text ends at its terminator", std::wstring(L"<a>x</a>\0<b/>", 13), "a",
     Outcome::kFound, L"x"},
    {"terminator inside the root", std::wstring(L"<a>x\0</a>", 9), "a", Outcome::kAbsent, L""},
    {"malformed", L"<a><b>x</a>", "a/b", Outcome::kAbsent, L""},
    {"two roots", L"<a>x</a><a>y</a>", "a", Outcome::kAbsent, L""},
    {"text beside the root", L"junk<a>x</a>", "a", Outcome::kAbsent, L""},
    {"empty text", L"", "a", Outcome::kAbsent, L""},
    {"empty path", L"<a>x</a>", "", Outcome::kFailed, L""},
    {"empty step", L"<a><b>x</b></a>", "a//b", Outcome::kFailed, L""},
    {"leading slash", L"<a>x</a>", "/a", Outcome::kFailed, L""},
};

INSTANTIATE_TEST_SUITE_P(Cases, PathLookup, ::testing::ValuesIn(kLookups));

std::vector<std::pair<xml::NodeType, std::wstring>> Walk(const xml::Node& node) {
  std::vector<std::pair<xml::NodeType, std::wstring>> seen;
  for (const xml::Node& child : node.Children()) seen.emplace_back(child.type(), child.Name());
  return seen;
}

TEST(ChildWalk, SeesEveryKindOfNodeInDocumentOrder) {
  const xml::Document document(
      L"<?xml version=\"1.0\"?><!--c--><?app go?><pip><!--d--><pipURL>x%2Fy</pipURL>"
      L"t<![CDATA[u]]></pip>");
  using xml::NodeType;
  EXPECT_EQ(document.Top().type(), NodeType::kDocument);
  const auto top = Walk(document.Top());
  ASSERT_EQ(top.size(), 4u);
  EXPECT_EQ(top[0], std::make_pair(NodeType::kProcessingInstruction, std::wstring(L"xml")));
  EXPECT_EQ(top[1], std::make_pair(NodeType::kComment, std::wstring(L"#comment")));
  EXPECT_EQ(top[2], std::make_pair(NodeType::kProcessingInstruction, std::wstring(L"app")));
  EXPECT_EQ(top[3], std::make_pair(NodeType::kElement, std::wstring(L"pip")));

  const xml::Node pip = document.Top().Children()[3];
  const decltype(top) expected = {{NodeType::kComment, L"#comment"},
                                  {NodeType::kElement, L"pipURL"},
                                  {NodeType::kText, L"#text"},
                                  {NodeType::kCData, L"#cdata-section"}};
  EXPECT_EQ(Walk(pip), expected);
  EXPECT_EQ(pip.Children()[1].Text(), L"x%2Fy");
}

TEST(Attributes, MatchTheExactNameOnly) {
  const xml::Document document(
      L"<categories><category categoryid=\"3\" CategoryID=\"9\" n=\"&amp;\u00E4\">"
      L"Portrait</category></categories>");
  const xml::Node category = document.Top().Children()[0].Children()[0];
  EXPECT_EQ(category.Attribute("categoryid"), L"3");
  EXPECT_EQ(category.Attribute("CategoryID"), L"9");
  EXPECT_EQ(category.Attribute("CATEGORYID"), L"");
  EXPECT_EQ(category.Attribute("n"), L"&\u00E4");
  EXPECT_EQ(category.Text(), L"Portrait");
}

TEST(EmptyDocument, HasNoChildrenAndFindsNothing) {
  for (const xml::Document& document : {xml::Document(), xml::Document(L"<a><b></a>")}) {
    EXPECT_TRUE(document.empty());
    EXPECT_TRUE(document.Top().Children().empty());
    EXPECT_EQ(document.NodeText("a").outcome, Outcome::kAbsent);
  }
  EXPECT_FALSE(xml::Document(L"<a/>").empty());
}

TEST(ReadInPlace, AMovedDocumentStillReadsItsText) {
  xml::Document first(std::string("<a>x</a>"));  // short enough to live inside a string object
  const xml::Document moved(std::move(first));
  first = xml::Document(std::string("<b>y</b>"));  // takes the first one's place
  EXPECT_EQ(moved.NodeText("a").text, L"x");
}

TEST(TreeBound, TextThatCouldMakeATreeTooLargeIsRefusedUnread) {
  const auto elements = [](std::size_t count) {
    std::string text = "<a>";
    for (std::size_t i = 0; i < count; ++i) text += "<b/>";
    return xml::Document(text + "</a>");
  };
  // A node record takes 64 bytes: a quarter of the bound's count is read, the
  // whole count is not.
  const std::size_t records = xml::kMaxTreeBytes / 64;
  EXPECT_FALSE(elements(records / 4).empty());
  EXPECT_TRUE(elements(records).empty());
}

}  // namespace
