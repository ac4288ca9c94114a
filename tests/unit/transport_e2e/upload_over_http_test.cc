#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <future>
#include <string>
#include <vector>

#include "support/loopback_server.h"
#include "support/recording_listener.h"
#include "support/temp_folder.h"
#include "transport/HttpUploadConnection.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace {

using test_support::HttpReply;
using test_support::LoopbackServer;
using test_support::MakeFile;
using test_support::RecordingListener;
using test_support::ScriptedReply;

constexpr std::size_t MiB = 1024 * 1024;
constexpr auto kNoHang = std::chrono::seconds(120);

struct Part {
  std::string disposition;
  std::string contentType;
  std::string data;
};

struct ReceivedRequest {
  std::string head;
  std::string body;
  std::vector<Part> parts;
  bool wellFormed = false;
};

std::string HeaderOf(const std::string& head, const std::string& name) {
  const std::size_t at = head.find("\r\n" + name + ": ");
  if (at == std::string::npos) return {};
  const std::size_t start = at + name.size() + 4;
  return head.substr(start, head.find("\r\n", start) - start);
}

// Splits a multipart/form-data body at its boundary, strictly: every delimiter,
// line break and the closing delimiter must stand where the format puts them.
bool SplitParts(const std::string& body, const std::string& boundary, std::vector<Part>* parts) {
  const std::string delimiter = "--" + boundary;
  std::size_t at = 0;
  for (;;) {
    if (body.compare(at, delimiter.size(), delimiter) != 0) return false;
    at += delimiter.size();
    if (body.compare(at, 4, "--\r\n") == 0) return at + 4 == body.size();
    if (body.compare(at, 2, "\r\n") != 0) return false;
    const std::size_t headEnd = body.find("\r\n\r\n", at);
    const std::size_t dataEnd = body.find("\r\n" + delimiter, headEnd);
    if (headEnd == std::string::npos || dataEnd == std::string::npos) return false;
    const std::string head = "\r\n" + body.substr(at, headEnd - at) + "\r\n";
    parts->push_back(Part{HeaderOf(head, "Content-Disposition"), HeaderOf(head, "Content-Type"),
                          body.substr(headEnd + 4, dataEnd - headEnd - 4)});
    at = dataEnd + 2;
  }
}

ReceivedRequest Parse(const std::string& raw) {
  ReceivedRequest request;
  const std::size_t headEnd = raw.find("\r\n\r\n");
  request.head = raw.substr(0, headEnd + 2);
  request.body = raw.substr(headEnd + 4);
  const std::string type = HeaderOf(request.head, "Content-Type");
  const std::string marker = "multipart/form-data; boundary=";
  request.wellFormed = type.compare(0, marker.size(), marker) == 0 &&
                       SplitParts(request.body, type.substr(marker.size()), &request.parts);
  return request;
}

// Bytes that do not repeat within a part, so a lost or doubled piece shows.
std::string Pattern(std::size_t size) {
  std::string bytes(size, '\0');
  std::uint32_t state = 12345;
  for (char& c : bytes) {
    state = state * 1103515245u + 12345u;
    c = static_cast<char>(state >> 24);
  }
  return bytes;
}

class UploadOverHttp : public test_support::TempFolderTest {
 protected:
  void SetUp() override {
    TempFolderTest::SetUp();
    test_support::BypassProxies();
    request_.host = "127.0.0.1";
    request_.path = "/servlet/uploadTemplate";
  }

  // Runs the upload on a thread of its own, as the product does, and waits for it.
  win::Status Upload(const LoopbackServer& server) {
    Uploader uploader(&listener_, &request_, &result_, Environment(server));
    auto done = std::async(std::launch::async, [&] { return uploader.Upload(); });
    if (done.wait_for(kNoHang) != std::future_status::ready) std::abort();
    const win::Status status = done.get();
    reply_ = uploader.reply;
    return status;
  }

  static UploadEnvironment Environment(const LoopbackServer& server) {
    UploadEnvironment environment = UploadEnvironment::Platform();
    environment.openConnection = HttpUploadConnection::Opener(server.port());
    return environment;
  }

  UploadRequest request_;
  UploadResult result_;
  RecordingListener listener_;
  std::string reply_;
};

TEST_F(UploadOverHttp, AServerErrorIsNoUploadFailureAndItsReplyIsKept) {
  LoopbackServer server({{{HttpReply(500, "<uploadTemplate><e>busy</e></uploadTemplate>")}}});
  request_.AddField("title", "t");
  EXPECT_EQ(Upload(server), win::kOk);
  EXPECT_EQ(result_.hr, win::kOk);
  EXPECT_EQ(result_.httpStatus, 500u);
  EXPECT_EQ(reply_, "<uploadTemplate><e>busy</e></uploadTemplate>");
}

TEST_F(UploadOverHttp, TheServerReadsBackExactlyTheFieldsAndFilesSent) {
  const std::string big = Pattern(100 * MiB);
  request_.AddField("title", "Sunset \xE2\x98\x80");
  request_.AddField("tags", nullptr);
  request_.AddFile(L"PIPfile", MakeFile(L"empty.xml", "").c_str());
  request_.AddFile(L"PIPimg_1", MakeFile(L"\u4E2D.jpg", "1").c_str());
  request_.AddFile(L"PIPimg_2", MakeFile(L"big.bin", big).c_str());
  LoopbackServer server({{{HttpReply(200, "<uploadTemplate/>")}}});
  ASSERT_EQ(Upload(server), win::kOk);
  EXPECT_EQ(result_.httpStatus, 200u);

  const ReceivedRequest received = Parse(server.Request(0));
  EXPECT_EQ(received.head.substr(0, received.head.find("\r\n")),
            "POST /servlet/uploadTemplate HTTP/1.1");
  EXPECT_EQ(HeaderOf(received.head, "User-Agent"), "WinInetPost/0.0.4");
  EXPECT_EQ(HeaderOf(received.head, "Content-Length"), std::to_string(received.body.size()));
  ASSERT_TRUE(received.wellFormed);
  ASSERT_EQ(received.parts.size(), 5u);
  const std::string disposition = "form-data; name=";
  EXPECT_EQ(received.parts[0].disposition, disposition + "\"tags\"");
  EXPECT_EQ(received.parts[0].data, "");
  EXPECT_EQ(received.parts[1].disposition, disposition + "\"title\"");
  EXPECT_EQ(received.parts[1].data, "Sunset \xE2\x98\x80");
  EXPECT_EQ(received.parts[2].disposition, disposition + "\"PIPfile\"; filename=\"empty.xml\"");
  EXPECT_EQ(received.parts[2].contentType, "application/octet-stream");
  EXPECT_EQ(received.parts[2].data, "");
  EXPECT_EQ(received.parts[3].disposition,
            disposition + "\"PIPimg_1\"; filename=\"\xE4\xB8\xAD.jpg\"");
  EXPECT_EQ(received.parts[3].data, "1");
  EXPECT_EQ(received.parts[4].data.size(), big.size());
  EXPECT_TRUE(received.parts[4].data == big);
}

TEST_F(UploadOverHttp, AServerHangingUpMidBodyFailsTheUploadWithoutHanging) {
  ScriptedReply hangUp;
  hangUp.hangUpAfterBodyBytes = 64 * 1024;
  LoopbackServer server({hangUp});
  request_.AddFile(L"f", MakeFile(L"f", Pattern(32 * MiB)).c_str());
  const win::Status status = Upload(server);
  EXPECT_TRUE(win::Failed(status)) << std::hex << status;
  EXPECT_EQ(listener_.Only("FileComplete").size(), 1u);
  EXPECT_NE(listener_.Only("FileComplete").at(0), "FileComplete f 0x00000000");
  EXPECT_EQ(result_.httpStatus, 0xFFFFFFFFu);
}

TEST_F(UploadOverHttp, ConnectionNotificationsArriveInTheirOrder) {
  LoopbackServer server({{{HttpReply(200, "ok")}}});
  request_.AddField("title", "t");
  ASSERT_EQ(Upload(server), win::kOk);
  std::vector<std::string> connection;
  for (const std::string& event : listener_.events) {
    if (event.rfind("File", 0) != 0) connection.push_back(event);
  }
  const std::string head = server.Request(0).substr(0, server.Request(0).find("\r\n\r\n") + 4);
  const std::string bodyBytes = std::to_string(server.Request(0).size());
  const std::string replyHead = std::to_string(HttpReply(200, "ok").size() - 2);
  EXPECT_EQ(connection, (std::vector<std::string>{
                            "ResolvingName 127.0.0.1",
                            "NameResolved 127.0.0.1",
                            "ConnectingToServer 127.0.0.1",
                            "ConnectedToServer 127.0.0.1",
                            "SendingRequest",
                            "RequestSent " + bodyBytes,
                            "ReceivingResponse",
                            "ResponseReceived " + replyHead,
                            "ClosingConnection",
                            "ConnectionClosed",
                        }));
}

TEST_F(UploadOverHttp, TheSpeedLearnedByOneUploadStartsTheNext) {
  request_.AddFile(L"f", MakeFile(L"f", Pattern(64 * MiB)).c_str());
  LoopbackServer first({{{HttpReply(200, "")}}});
  ASSERT_EQ(Upload(first), win::kOk);
  const std::uint32_t learned = request_.rateEstimate;
  EXPECT_NE(learned, UploadRequest::kInitialRateEstimate);
  request_.ClearFiles();
  request_.AddFile(L"g", MakeFile(L"g", "12").c_str());
  listener_.events.clear();
  LoopbackServer second({{{HttpReply(200, "")}}});
  ASSERT_EQ(Upload(second), win::kOk);
  EXPECT_EQ(listener_.Only("FileProgress g").at(0),
            "FileProgress g 0 2 0 0 2 0 " + std::to_string(learned));
}

}  // namespace
