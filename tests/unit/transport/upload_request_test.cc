#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "transport/UploadRequest.h"
#include "transport/WideToUtf8.h"

namespace {

TEST(UploadForm, FieldsAreUniqueAndHeldInUnsignedByteOrder) {
  UploadRequest request;
  for (const char* name : {"title", "category", "AP", "\xC3\xA9t\xC3\xA9", "Version"}) {
    request.AddField(name, "x");
  }
  request.AddField("title", "first");
  request.AddField("title", "second");
  request.AddField("tags", nullptr);
  std::vector<std::string> names;
  for (const auto& [name, value] : request.FieldsSnapshot()) names.push_back(name);
  EXPECT_EQ(names, (std::vector<std::string>{"AP", "Version", "category", "tags", "title",
                                             "\xC3\xA9t\xC3\xA9"}));
  EXPECT_EQ(request.fields.at("title"), "second");
  EXPECT_EQ(request.fields.at("tags"), "");
}

TEST(UploadForm, FilesKeepTheirOrderAndRepeatsWhileClearingKeepsTheSpeed) {
  UploadRequest request;
  request.AddFile(L"PIPfile", L"a.xml");
  request.AddFile(L"PIPimg_1", L"b.jpg");
  request.AddFile(L"PIPfile", L"a.xml");
  const std::vector<UploadFile> files = request.FilesSnapshot();
  ASSERT_EQ(files.size(), 3u);
  EXPECT_EQ(files[1].name, L"PIPimg_1");
  EXPECT_EQ(files[2].path, L"a.xml");
  EXPECT_EQ(files[2].contentType, L"application/octet-stream");
  request.rateEstimate = 77;
  request.ClearFields();
  request.ClearFiles();
  EXPECT_TRUE(request.files.empty());
  EXPECT_EQ(request.rateEstimate, 77u);
}

struct UrlCase {
  std::string url;
  bool accepted;
  std::string host;
  std::string path;
};

void PrintTo(const UrlCase& c, std::ostream* out) { *out << c.url.substr(0, 60); }

class UploadUrl : public ::testing::TestWithParam<UrlCase> {};

TEST_P(UploadUrl, AcceptsOnlyPlainHttpOnPort80WithoutExtras) {
  UploadRequest request;
  ASSERT_TRUE(request.SetUrl("http://before/was"));
  EXPECT_EQ(request.SetUrl(GetParam().url.c_str()), GetParam().accepted);
  EXPECT_EQ(request.host, GetParam().accepted ? GetParam().host : "before");
  EXPECT_EQ(request.path, GetParam().accepted ? GetParam().path : "/was");
}

const std::string k259(259, 'a');
const std::string k260(260, 'a');

INSTANTIATE_TEST_SUITE_P(
    Forms, UploadUrl,
    ::testing::Values(
        UrlCase{"http://ob.example.com/servlet/uploadTemplate", true, "ob.example.com",
                "/servlet/uploadTemplate"},
        UrlCase{"http://ob.example.com:80/servlet/uploadTemplate", true, "ob.example.com",
                "/servlet/uploadTemplate"},
        UrlCase{"http://ob.example.com", true, "ob.example.com", "/"},
        UrlCase{"http://h/a/../b%20c", true, "h", "/a/../b%20c"},
        UrlCase{"http://" + k259 + "/p", true, k259, "/p"},
        UrlCase{"http://h/" + k259.substr(1), true, "h", "/" + k259.substr(1)},
        UrlCase{"http://" + k260 + "/p", false, "", ""},
        UrlCase{"http://h/" + k259, false, "", ""},
        UrlCase{"https://h/p", false, "", ""},
        UrlCase{"HTTP://h/p", false, "", ""},
        UrlCase{"ftp://h/p", false, "", ""},
        UrlCase{"http://h:8080/p", false, "", ""},
        UrlCase{"http://h:443/p", false, "", ""},
        UrlCase{"http://user@h/p", false, "", ""},
        UrlCase{"http://user:pw@h/p", false, "", ""},
        UrlCase{"http://:pw@h/p", false, "", ""},
        UrlCase{"http://h/p?id=1", false, "", ""},
        UrlCase{"http://h/p?", false, "", ""},
        UrlCase{"http://h/p#top", false, "", ""},
        UrlCase{"http:///p", false, "", ""},
        UrlCase{"http:h/p", false, "", ""},
        UrlCase{"//h/p", false, "", ""},
        UrlCase{"h/p", false, "", ""},
        UrlCase{"", false, "", ""},
        UrlCase{"http://h/a b", false, "", ""},
        UrlCase{"http://h/a\r\nX: y", false, "", ""}));

TEST(UploadUrl, NullIsRefused) {
  UploadRequest request;
  EXPECT_FALSE(request.SetUrl(nullptr));
}

TEST(FieldText, WideTextBecomesAnOwnedUtf8Copy) {
  char* out = nullptr;
  ASSERT_TRUE(WideToUtf8(L"", &out));
  std::unique_ptr<char[]> empty(out);
  EXPECT_STREQ(empty.get(), "");
  ASSERT_TRUE(WideToUtf8(L"Caf\u00E9 \u4E2D", &out));
  std::unique_ptr<char[]> text(out);
  EXPECT_STREQ(text.get(), "Caf\xC3\xA9 \xE4\xB8\xAD");
  char sentinel = 0;
  out = &sentinel;
  EXPECT_FALSE(WideToUtf8(nullptr, &out));
  EXPECT_EQ(out, &sentinel);
}

}  // namespace
