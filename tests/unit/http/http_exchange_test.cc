#include <gtest/gtest.h>

#include <string>

#include "platform/http.h"
#include "support/loopback_server.h"

namespace {

using test_support::HttpReply;
using test_support::LoopbackServer;
using test_support::ScriptedReply;

constexpr const char* kLoopback = "127.0.0.1";

class HttpExchange : public ::testing::Test {
 protected:
  void SetUp() override { test_support::BypassProxies(); }
};

// A session, connection and request to the loopback server on `port`, used as the request->
struct LoopbackRequest {
  LoopbackRequest(std::uint16_t port, const char* verb, const char* path, const char* agent = "")
      : session(agent), connection(session, kLoopback, port, http::Scheme::kHttp),
        request(connection, verb, path) {}

  http::Request* operator->() { return &request; }

  http::Session session;
  http::Connection connection;
  http::Request request;
};

TEST_F(HttpExchange, PostSendsTheHeaderBlockAndBodyExactly) {
  LoopbackServer server({{{HttpReply(200, "<info/>")}}});
  LoopbackRequest request(server.port(), "POST", "/servlet/memLogin");
  ASSERT_EQ(request->AddHeaders("User-Agent: Lumivanta\nContent-Type: "
                                "application/x-www-form-urlencoded"),
            win::kOk);
  ASSERT_EQ(request->Send("user=a&pwd=b%25"), win::kOk);
  EXPECT_EQ(server.Request(0),
            "POST /servlet/memLogin HTTP/1.1\r\n"
            "Host: 127.0.0.1:" + std::to_string(server.port()) + "\r\n"
            "User-Agent: Lumivanta\r\n"
            "Content-Type: application/x-www-form-urlencoded\r\n"
            "Content-Length: 15\r\n"
            "\r\n"
            "user=a&pwd=b%25");
  EXPECT_EQ(request->status_code(), 200u);
  EXPECT_EQ(request->body(), "<info/>");
}

TEST_F(HttpExchange, GetCarriesTheSessionAgentAndARootedPath) {
  LoopbackServer server({{{HttpReply(200, "")}}});
  LoopbackRequest request(server.port(), "GET", "observer.jsp?a=1&b=2", "Agent/1");
  ASSERT_EQ(request->Send(""), win::kOk);
  EXPECT_EQ(server.Request(0),
            "GET /observer.jsp?a=1&b=2 HTTP/1.1\r\n"
            "Host: 127.0.0.1:" + std::to_string(server.port()) + "\r\n"
            "User-Agent: Agent/1\r\n"
            "\r\n");
}

struct ReplyCase {
  const char* name;
  ScriptedReply reply;
  std::uint32_t status;
  std::string body;
  std::string contentLength;
};

class ReplyReading : public HttpExchange, public ::testing::WithParamInterface<ReplyCase> {};

TEST_P(ReplyReading, ReadsTheWholeBodyAsAnnounced) {
  LoopbackServer server({GetParam().reply});
  LoopbackRequest request(server.port(), "POST", "/servlet/getPresetCategory");
  ASSERT_EQ(request->Send(""), win::kOk);
  EXPECT_EQ(request->status_code(), GetParam().status);
  EXPECT_EQ(request->body(), GetParam().body);
  EXPECT_EQ(request->HeaderValue("content-length"), GetParam().contentLength);
}

const std::string kTwenty = "0123456789abcdefghij";

INSTANTIATE_TEST_SUITE_P(
    Replies, ReplyReading,
    ::testing::Values(
        ReplyCase{"LengthShorterThanBody",
                  {{"HTTP/1.1 200 OK\r\nContent-Length: 10\r\n\r\n" + kTwenty}},
                  200, "0123456789", "10"},
        ReplyCase{"Chunked",
                  {{"HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\n"
                    "5\r\nhello\r\n6\r\n world\r\n0\r\n\r\n"}},
                  200, "hello world", ""},
        ReplyCase{"EndedByClose", {{"HTTP/1.1 200 OK\r\nConnection: close\r\n\r\n" + kTwenty}},
                  200, kTwenty, ""},
        ReplyCase{"InSeveralPiecesWithPauses",
                  {{"HTTP/1.1 404 Not Found\r\nContent-", "Length: 20\r\n\r\n01234",
                    "56789abcde", "fghij"},
                   100},
                  404, kTwenty, "20"},
        ReplyCase{"InterimHeadForgotten",
                  {{"HTTP/1.1 100 Continue\r\n\r\n", HttpReply(500, "<x/>")}},
                  500, "<x/>", "4"}),
    [](const auto& info) { return std::string(info.param.name); });

TEST_F(HttpExchange, ReplyGrowingPastTheBoundIsRefused) {
  const std::string body(http::kMaxReplyBytes + 1, 'x');
  LoopbackServer server({{{"HTTP/1.1 200 OK\r\nConnection: close\r\n\r\n", body}}});
  LoopbackRequest request(server.port(), "GET", "/");
  EXPECT_TRUE(win::Failed(request->Send("")));
  EXPECT_LE(request->body().size(), http::kMaxReplyBytes);
}

TEST_F(HttpExchange, ReplyOfExactlyTheBoundIsRead) {
  const std::string body(http::kMaxReplyBytes, 'x');
  LoopbackServer server({{{HttpReply(200, body)}}});
  LoopbackRequest request(server.port(), "GET", "/");
  EXPECT_EQ(request->Send(""), win::kOk);
  EXPECT_EQ(request->body().size(), http::kMaxReplyBytes);
}

TEST_F(HttpExchange, UnreachableServerIsReportedAsCannotConnect) {
  LoopbackRequest request(LoopbackServer::ClosedPort(), "POST", "/x");
  EXPECT_EQ(request->Send("a"), win::StatusFromWin32(win::kErrorInternetCannotConnect));
  EXPECT_EQ(request->status_code(), 0u);
}

TEST_F(HttpExchange, WritingPastTheAnnouncedLengthIsRefused) {
  LoopbackServer server({{{HttpReply(200, "")}}});
  LoopbackRequest request(server.port(), "POST", "/x");
  ASSERT_EQ(request->Start(4), win::kOk);
  EXPECT_EQ(request->Write("abc"), win::kOk);
  EXPECT_TRUE(win::Failed(request->Write("de")));
  EXPECT_EQ(request->Write("d"), win::kOk);
  EXPECT_EQ(request->End(), win::kOk);
  EXPECT_EQ(server.Request(0).substr(server.Request(0).size() - 4), "abcd");
}

}  // namespace
