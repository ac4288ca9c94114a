// The upload engine over a real HTTP connection to the reference service, on a
// thread of its own as the product runs it: the connection notifications.
// What the service receives is checked by the Python upload suite.
#include <gtest/gtest.h>

#include <future>

#include "support/fixtures.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"

namespace {

TEST(UploadOverHttp, ConnectionNotificationsArriveInTheirOrder) {
  UploadRequest request;
  ASSERT_TRUE(request.SetUrl("http://api.orbishare.com/servlet/uploadTemplate"));
  request.AddField("title", "t");
  UploadResult result;
  test_support::RecordingListener<UploadProgress> listener;
  Uploader uploader(&listener, &request, &result);
  auto done = std::async(std::launch::async, [&] { return uploader.Upload(); });
  if (done.wait_for(std::chrono::seconds(60)) != std::future_status::ready) std::abort();
  ASSERT_EQ(done.get(), win::kOk);
  std::vector<std::string> kinds;
  for (const std::string& event : listener.events) kinds.push_back(event.substr(0, event.find(' ')));
  EXPECT_EQ(kinds, (std::vector<std::string>{"ResolvingName", "NameResolved", "ConnectingToServer",
                                             "ConnectedToServer", "SendingRequest", "RequestSent",
                                             "ReceivingResponse", "ResponseReceived", "ClosingConnection",
                                             "ConnectionClosed"}));
  EXPECT_EQ(std::vector<std::string>(listener.events.begin(), listener.events.begin() + 4),
            (std::vector<std::string>{"ResolvingName api.orbishare.com", "NameResolved 127.0.0.5",
                                      "ConnectingToServer 127.0.0.5", "ConnectedToServer 127.0.0.5"}));
  EXPECT_NE(listener.events[5], "RequestSent 0");
}

}  // namespace
