#include <gtest/gtest.h>

#include <chrono>
#include <future>
#include <string>
#include <thread>

#include "platform/http_probe.h"
#include "support/loopback_server.h"

namespace {

using test_support::HttpReply;
using test_support::LoopbackServer;

constexpr const char* kAgent = "Microsoft Internet Explorer";
constexpr auto kCancelBound = std::chrono::milliseconds(100);

std::string UrlOf(std::uint16_t port) { return "http://127.0.0.1:" + std::to_string(port); }

class ReachabilityProbe : public ::testing::Test {
 protected:
  void SetUp() override { test_support::BypassProxies(); }
};

TEST_F(ReachabilityProbe, AnyAnswerCountsAsReachable) {
  LoopbackServer server({{{HttpReply(404, "not here")}}});
  http::Probe probe(kAgent);
  EXPECT_TRUE(probe.Open(UrlOf(server.port())));
  EXPECT_EQ(server.Request(0).substr(0, 16), "GET / HTTP/1.1\r\n");
  EXPECT_NE(server.Request(0).find("\r\nUser-Agent: Microsoft Internet Explorer\r\n"),
            std::string::npos);
}

TEST_F(ReachabilityProbe, NoServerIsUnreachable) {
  http::Probe probe(kAgent);
  EXPECT_FALSE(probe.Open(UrlOf(LoopbackServer::ClosedPort())));
}

// The other side gives up on a server that never answers: closing either handle
// ends the blocked call promptly, and every handle closes once whoever comes first.
TEST_F(ReachabilityProbe, ClosingAHandleEndsABlockedOpenPromptly) {
  for (const bool closeConnectionFirst : {true, false}) {
    SCOPED_TRACE(closeConnectionFirst ? "connection first" : "session first");
    test_support::ScriptedReply silent;
    silent.silent = true;
    LoopbackServer server({silent});
    http::Probe probe(kAgent);
    auto opened = std::async(std::launch::async, [&] { return probe.Open(UrlOf(server.port())); });
    ASSERT_EQ(opened.wait_for(std::chrono::milliseconds(300)), std::future_status::timeout);
    const auto closedAt = std::chrono::steady_clock::now();
    (closeConnectionFirst ? probe.connection() : probe.session()).Close();
    ASSERT_EQ(opened.wait_for(std::chrono::seconds(10)), std::future_status::ready);
    EXPECT_LT(std::chrono::steady_clock::now() - closedAt, kCancelBound);
    EXPECT_FALSE(opened.get());
    probe.connection().Close();
    probe.session().Close();
    probe.session().Close();
    EXPECT_FALSE(probe.connection().is_open());
    EXPECT_FALSE(probe.session().is_open());
  }
}

TEST_F(ReachabilityProbe, AProbeClosedBeforeItOpensDoesNotConnect) {
  LoopbackServer server({{{HttpReply(200, "")}}});
  http::Probe probe(kAgent);
  probe.session().Close();
  EXPECT_FALSE(probe.Open(UrlOf(server.port())));
  EXPECT_TRUE(probe.connection().is_open());
}

}  // namespace
