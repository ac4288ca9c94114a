#include <gtest/gtest.h>

#include <functional>
#include <regex>
#include <string>
#include <vector>

#include "support/recording_listener.h"
#include "support/temp_folder.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"
#include "transport/fake_server.h"

namespace {

using test_support::FakeServer;
using test_support::MakeFile;
using test_support::RecordingListener;

const std::string kBoundary = "---------------------------0029482318BE";

// Replaces each "{B}" with the boundary.
std::string WithBoundary(std::string pattern, const std::string& boundary) {
  for (std::size_t at; (at = pattern.find("{B}")) != std::string::npos;) {
    pattern.replace(at, 3, boundary);
  }
  return pattern;
}

class MultipartBody : public test_support::TempFolderTest {
 protected:
  // Posts the request through the fake and returns the body it wrote.
  std::string Post() {
    Uploader uploader(&listener_, &request_, &result_, server_.Environment());
    EXPECT_EQ(uploader.Upload(), win::kOk);
    return server_.Body();
  }

  UploadRequest request_;
  UploadResult result_;
  RecordingListener listener_;
  FakeServer server_;
};

TEST_F(MultipartBody, WorkedExampleIsByteExact) {
  request_.AddField("title", "Sunset");
  request_.AddFile(L"PIPfile", MakeFile(L"C:\\p.xml", "0123456789").c_str());
  Uploader measuring(nullptr, &request_, &result_, server_.Environment());
  std::uint64_t total = 0;
  std::vector<std::uint64_t> sizes;
  EXPECT_EQ(measuring.FieldPartLength(kBoundary, "title", "Sunset"), 99u);
  EXPECT_EQ(measuring.ComputeContentLength(kBoundary, &total, &sizes), 310u);
  EXPECT_EQ(total, 10u);

  const std::string body = Post();
  const std::string b = server_.Boundary();
  EXPECT_EQ(server_.headers.at(0), "Content-Type: multipart/form-data; boundary=" + b);
  EXPECT_EQ(server_.announced, 310u);
  EXPECT_EQ(body, WithBoundary("--{B}\r\n"
                               "Content-Disposition: form-data; name=\"title\"\r\n"
                               "\r\n"
                               "Sunset\r\n"
                               "--{B}\r\n"
                               "Content-Disposition: form-data; name=\"PIPfile\"; "
                               "filename=\"C:\\p.xml\"\r\n"
                               "Content-Type: application/octet-stream\r\n"
                               "\r\n"
                               "0123456789\r\n"
                               "--{B}--\r\n",
                               b));
}

TEST_F(MultipartBody, BoundaryIsFreshlyDrawnForEveryUpload) {
  const std::regex form("-{27}[0-9A-F]{12}");
  Uploader uploader(nullptr, &request_, &result_, server_.Environment());
  const std::string first = uploader.MakeBoundary();
  const std::string second = uploader.MakeBoundary();
  EXPECT_TRUE(std::regex_match(first, form)) << first;
  EXPECT_TRUE(std::regex_match(second, form)) << second;
  EXPECT_NE(first, second);
}

struct BodyCase {
  const char* name;
  std::function<void(UploadRequest&)> fill;
  std::uint32_t length;       // announced, which the body must match
  std::string expectedBody;   // "{B}" stands for the boundary; empty: not checked whole
  std::vector<std::string> contains;
};

void PrintTo(const BodyCase& c, std::ostream* out) { *out << c.name; }

class BodyShapes : public MultipartBody, public ::testing::WithParamInterface<BodyCase> {};

TEST_P(BodyShapes, AnnouncedLengthMatchesTheBodyWritten) {
  GetParam().fill(request_);
  const std::string body = Post();
  const std::string b = server_.Boundary();
  EXPECT_EQ(server_.announced, GetParam().length);
  EXPECT_EQ(body.size(), server_.announced);
  if (!GetParam().expectedBody.empty()) {
    EXPECT_EQ(body, WithBoundary(GetParam().expectedBody, b));
  }
  for (const std::string& part : GetParam().contains) {
    EXPECT_NE(body.find(WithBoundary(part, b)), std::string::npos) << part;
  }
}

constexpr const char* kFileHead = "Content-Type: application/octet-stream\r\n\r\n";

INSTANTIATE_TEST_SUITE_P(
    Cases, BodyShapes,
    ::testing::Values(
        BodyCase{"NothingButTheClosingDelimiter", [](UploadRequest&) {}, 45, "--{B}--\r\n", {}},
        BodyCase{"EmptyValue", [](UploadRequest& r) { r.AddField("tags", nullptr); },
                 39 + 4 + 49 + 45,
                 "--{B}\r\nContent-Disposition: form-data; name=\"tags\"\r\n\r\n\r\n--{B}--\r\n",
                 {}},
        BodyCase{"EmptyFile",
                 [](UploadRequest& r) {
                   r.AddFile(L"f", MakeFile(L"e", "").c_str());
                 },
                 1 + 1 + 24 + 117 + 45, "",
                 {std::string("filename=\"e\"\r\n") + kFileHead + "\r\n--{B}--"}},
        BodyCase{"NonAsciiPathInUtf8",
                 [](UploadRequest& r) {
                   r.AddFile(L"f",
                             MakeFile(L"\u4E2D\u6587", "ab").c_str());
                 },
                 1 + 6 + 24 + 2 + 117 + 45, "",
                 {"filename=\"\xE4\xB8\xAD\xE6\x96\x87\"\r\n"}},
        BodyCase{"QuoteAndLineBreaksInPathEscaped",
                 [](UploadRequest& r) {
                   r.AddFile(L"f",
                             MakeFile(L"a\"b\r\nc", "x").c_str());
                 },
                 1 + 12 + 24 + 1 + 117 + 45, "", {"filename=\"a%22b%0D%0Ac\"\r\n"}},
        BodyCase{"FieldsFirstInByteOrder",
                 [](UploadRequest& r) {
                   r.AddFile(L"f", MakeFile(L"p", "1").c_str());
                   for (const char* name : {"title", "category", "AP", "Version"}) {
                     r.AddField(name, "v");
                   }
                 },
                 4 * 88 + 5 + 7 + 8 + 2 + 4 + 1 + 1 + 24 + 1 + 117 + 45,
                 "--{B}\r\nContent-Disposition: form-data; name=\"AP\"\r\n\r\nv\r\n"
                 "--{B}\r\nContent-Disposition: form-data; name=\"Version\"\r\n\r\nv\r\n"
                 "--{B}\r\nContent-Disposition: form-data; name=\"category\"\r\n\r\nv\r\n"
                 "--{B}\r\nContent-Disposition: form-data; name=\"title\"\r\n\r\nv\r\n"
                 "--{B}\r\nContent-Disposition: form-data; name=\"f\"; filename=\"p\"\r\n"
                 "Content-Type: application/octet-stream\r\n\r\n1\r\n--{B}--\r\n",
                 {}},
        BodyCase{"SameFileTwiceIsTwoParts",
                 [](UploadRequest& r) {
                   const std::wstring path = MakeFile(L"p", "12");
                   r.AddFile(L"a", path.c_str());
                   r.AddFile(L"a", path.c_str());
                 },
                 2 * (1 + 1 + 24 + 2 + 117) + 45,
                 "--{B}\r\nContent-Disposition: form-data; name=\"a\"; filename=\"p\"\r\n"
                 "Content-Type: application/octet-stream\r\n\r\n12\r\n"
                 "--{B}\r\nContent-Disposition: form-data; name=\"a\"; filename=\"p\"\r\n"
                 "Content-Type: application/octet-stream\r\n\r\n12\r\n--{B}--\r\n",
                 {}}),
    [](const auto& info) { return std::string(info.param.name); });

}  // namespace
