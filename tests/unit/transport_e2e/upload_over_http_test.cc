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
    return done.get();
  }

  static UploadEnvironment Environment(const LoopbackServer& server) {
    UploadEnvironment environment = UploadEnvironment::Platform();
    environment.openConnection = HttpUploadConnection::Opener(server.port());
    return environment;
  }

  UploadRequest request_;
  UploadResult result_;
  RecordingListener listener_;
};

TEST_F(UploadOverHttp, AServerHangingUpMidBodyFailsTheUploadWithoutHanging) {
  ScriptedReply hangUp;
  hangUp.hangUpAfterBodyBytes = 64 * 1024;
  LoopbackServer server({hangUp});
  request_.AddFile(L"f", MakeFile(L"f", std::string(32 * MiB, 'x')).c_str());
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

}  // namespace
