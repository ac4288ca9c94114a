// The upload engine over a real HTTP connection: the connection notifications.
// What the service receives is checked against the reference service
// (test_upload, test_faults_upload).
#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <future>
#include <string>
#include <vector>

#include "support/loopback_server.h"
#include "support/recording_listener.h"
#include "transport/HttpUploadConnection.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace {

using test_support::HttpReply;

constexpr auto kNoHang = std::chrono::seconds(120);

TEST(UploadOverHttp, ConnectionNotificationsArriveInTheirOrder) {
  test_support::BypassProxies();
  test_support::LoopbackServer server({{{HttpReply(200, "ok")}}});
  UploadRequest request;
  request.host = "127.0.0.1";
  request.path = "/servlet/uploadTemplate";
  request.AddField("title", "t");
  UploadResult result;
  test_support::RecordingListener listener;
  UploadEnvironment environment = UploadEnvironment::Platform();
  environment.openConnection = HttpUploadConnection::Opener(server.port());
  Uploader uploader(&listener, &request, &result, environment);
  // On a thread of its own, as the product runs it.
  auto done = std::async(std::launch::async, [&] { return uploader.Upload(); });
  if (done.wait_for(kNoHang) != std::future_status::ready) std::abort();
  ASSERT_EQ(done.get(), win::kOk);

  const std::string bodyBytes = std::to_string(server.Request(0).size());
  const std::string replyHead = std::to_string(HttpReply(200, "ok").size() - 2);
  EXPECT_EQ(listener.events, (std::vector<std::string>{
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

}  // namespace
