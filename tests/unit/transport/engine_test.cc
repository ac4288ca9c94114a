#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "support/recording_listener.h"
#include "support/temp_folder.h"
#include "transport/ChunkPause.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/UploadStatus.h"
#include "transport/Uploader.h"
#include "transport/fake_server.h"

namespace {

using test_support::FakeServer;
using test_support::MakeFile;
using test_support::MakeSparseFile;
using test_support::RecordingListener;

constexpr std::uint32_t KiB = 1024;
constexpr std::uint32_t MiB = 1024 * KiB;
constexpr std::size_t kHeaderSizeBelow = 1024;  // pieces this small are part headers

class UploadEngine : public test_support::TempFolderTest {
 protected:
  win::Status Upload() {
    UploadEnvironment environment = server_.Environment();
    environment.pauseAfterChunkMs = pauseMs_;
    Uploader uploader(&listener_, &request_, &result_, std::move(environment));
    const win::Status status = uploader.Upload();
    reply_ = uploader.reply;
    return status;
  }

  // The sizes of the file-data writes, in order.
  std::vector<std::size_t> ChunkSizes() const {
    std::vector<std::size_t> sizes;
    for (const std::string& piece : server_.writes) {
      if (piece.size() >= kHeaderSizeBelow) sizes.push_back(piece.size());
    }
    return sizes;
  }

  // The write of each data piece takes the next of these times.
  void ScriptWriteTimes(std::vector<std::uint32_t> times) {
    server_.writeMs = [times, next = std::size_t{0}](std::size_t bytes) mutable {
      return bytes < kHeaderSizeBelow || next >= times.size() ? 0u : times[next++];
    };
  }

  UploadRequest request_;
  UploadResult result_;
  RecordingListener listener_;
  FakeServer server_;
  std::string reply_;
  std::uint32_t pauseMs_ = ChunkPause::kDefaultMs;
};

TEST_F(UploadEngine, FastWritesGrowTheChunkToSixteenMebibytesWhereItStays) {
  std::vector<std::size_t> expected;
  std::uintmax_t size = 0;
  for (std::uint32_t chunk = 32 * KiB; chunk <= 16 * MiB; chunk *= 2) expected.push_back(chunk);
  expected.insert(expected.end(), {16 * MiB, 16 * MiB});
  for (const std::size_t chunk : expected) size += chunk;
  request_.AddFile(L"f", MakeSparseFile(L"big", size).c_str());
  ASSERT_EQ(Upload(), win::kOk);
  EXPECT_EQ(ChunkSizes(), expected);
  EXPECT_EQ(server_.Body().size(), server_.announced);
}

TEST_F(UploadEngine, SlowWritesHalveTheChunkDownToItsFloor) {
  ScriptWriteTimes({100, 100, 2000, 1251, 2000, 800, 1250, 500, 499});
  const std::vector<std::size_t> expected = {32 * KiB, 64 * KiB, 128 * KiB, 64 * KiB, 32 * KiB,
                                             32 * KiB, 32 * KiB, 32 * KiB, 32 * KiB, 64 * KiB};
  std::uintmax_t size = 0;
  for (const std::size_t chunk : expected) size += chunk;
  request_.AddFile(L"f", MakeSparseFile(L"f", size).c_str());
  ASSERT_EQ(Upload(), win::kOk);
  EXPECT_EQ(ChunkSizes(), expected);
}

// Three chunks written in 300 ms each from t = 1000 ms, each followed by the pause.
struct PauseCase {
  std::uint32_t pauseMs;
  // Reports after a chunk, then the final one, which repeats the last estimates.
  std::vector<std::string> laterProgress;
};
void PrintTo(const PauseCase& c, std::ostream* out) { *out << c.pauseMs << " ms"; }

class PauseAfterChunk : public UploadEngine, public ::testing::WithParamInterface<PauseCase> {
 protected:
  void SetUp() override {
    UploadEngine::SetUp();
    pauseMs_ = GetParam().pauseMs;
    ScriptWriteTimes({300, 300, 300});
    request_.AddFile(L"f", MakeSparseFile(L"f", 224 * KiB).c_str());
  }
};

// Only the write times size the chunks; a report goes out only when the
// half-second number has changed, so the pause moves the reports.
TEST_P(PauseAfterChunk, ChunksFollowTheWritesAndReportsTheHalfSecond) {
  ASSERT_EQ(Upload(), win::kOk);
  const std::uint32_t pause = GetParam().pauseMs;
  EXPECT_EQ(ChunkSizes(), (std::vector<std::size_t>{32 * KiB, 64 * KiB, 128 * KiB}));
  EXPECT_EQ(server_.sleeps, (std::vector<std::uint32_t>{pause, pause, pause}));
  std::vector<std::string> expected = {"FileBegin f",
                                       "FileProgress f 0 229376 40 0 229376 40 5600"};
  for (const std::string& values : GetParam().laterProgress) {
    expected.push_back("FileProgress f " + values);
  }
  expected.push_back("FileComplete f 0x00000000");
  EXPECT_EQ(listener_.events, expected);
  EXPECT_TRUE(server_.ended);
}

// The third poll comes after the second chunk: no third chunk is read or written.
TEST_P(PauseAfterChunk, CancelStopsBehindTheChunkJustWritten) {
  listener_.cancelAt = [](int poll) { return poll == 3; };
  EXPECT_EQ(Upload(), UPLOAD_E_CANCELLED);
  EXPECT_EQ(ChunkSizes(), (std::vector<std::size_t>{32 * KiB, 64 * KiB}));
  EXPECT_EQ(server_.sleeps.size(), 2u);
  EXPECT_EQ(listener_.events.back(), "FileComplete f 0x80040301");
  EXPECT_FALSE(server_.ended);
}

INSTANTIATE_TEST_SUITE_P(
    Pauses, PauseAfterChunk,
    ::testing::Values(PauseCase{0,
                                {"98304 229376 1 98304 229376 1 98304",
                                 "229376 229376 1 229376 229376 1 98304"}},
                      PauseCase{50,
                                {"98304 229376 1 98304 229376 1 98304",
                                 "229376 229376 0 229376 229376 0 114688",
                                 "229376 229376 0 229376 229376 0 114688"}},
                      PauseCase{1000,
                                {"32768 229376 12 32768 229376 12 16384",
                                 "98304 229376 6 98304 229376 6 19660",
                                 "229376 229376 0 229376 229376 0 32768",
                                 "229376 229376 0 229376 229376 0 32768"}}),
    [](const ::testing::TestParamInfo<PauseCase>& info) {
      return std::to_string(info.param.pauseMs) + "ms";
    });

TEST_F(UploadEngine, TheLastMeasuredSpeedStartsTheNextFileAndTheNextUpload) {
  ScriptWriteTimes({300, 300, 300});
  request_.AddFile(L"f", MakeSparseFile(L"f", 224 * KiB).c_str());
  request_.AddFile(L"g", MakeFile(L"g", "12").c_str());
  ASSERT_EQ(Upload(), win::kOk);
  EXPECT_EQ(listener_.Only("FileProgress g").at(0),
            "FileProgress g 0 2 0 229376 229378 2 114688");
  request_.ClearFiles();
  request_.AddFile(L"g", L"g");
  listener_.events.clear();
  ASSERT_EQ(Upload(), win::kOk);
  EXPECT_EQ(listener_.Only("FileProgress g").at(0), "FileProgress g 0 2 0 0 2 0 114688");
}

TEST_F(UploadEngine, AnEmptyFileReportsTwiceAndKeepsTheSpeed) {
  request_.AddFile(L"e", MakeFile(L"e", "").c_str());
  ASSERT_EQ(Upload(), win::kOk);
  EXPECT_EQ(listener_.events, (std::vector<std::string>{
                                  "FileBegin e",
                                  "FileProgress e 0 0 0 0 0 0 5600",
                                  "FileProgress e 0 0 0 0 0 0 5600",
                                  "FileComplete e 0x00000000",
                              }));
  EXPECT_EQ(request_.rateEstimate, 5600u);
}

TEST_F(UploadEngine, AZeroSpeedGivesNoTimeLeftInsteadOfTrapping) {
  request_.rateEstimate = 0;
  ScriptWriteTimes({2000});
  request_.AddFile(L"f", MakeFile(L"f", std::string(KiB, 'x')).c_str());
  ASSERT_EQ(Upload(), win::kOk);
  EXPECT_EQ(listener_.Only("FileProgress"), (std::vector<std::string>{
                                                 "FileProgress f 0 1024 0 0 1024 0 0",
                                                 "FileProgress f 1024 1024 0 1024 1024 0 256",
                                                 "FileProgress f 1024 1024 0 1024 1024 0 256",
                                             }));
}

TEST_F(UploadEngine, CancelAtTheFirstPollWritesNoFileData) {
  listener_.cancelAt = [](int poll) { return poll == 1; };
  request_.AddField("title", "t");
  request_.AddFile(L"f", MakeFile(L"f", "DATA").c_str());
  EXPECT_EQ(Upload(), UPLOAD_E_CANCELLED);
  EXPECT_EQ(result_.hr, UPLOAD_E_CANCELLED);
  EXPECT_EQ(listener_.events, (std::vector<std::string>{
                                  "FileBegin f",
                                  "FileProgress f 0 4 0 0 4 0 5600",
                                  "FileComplete f 0x80040301",
                              }));
  EXPECT_EQ(server_.Body().find("DATA"), std::string::npos);
  EXPECT_FALSE(server_.ended);
  EXPECT_EQ(result_.httpStatus, 0xFFFFFFFFu);
}

TEST_F(UploadEngine, CancelAfterTheLastChunkOfTheLastFileSkipsTheClosingDelimiter) {
  listener_.cancelAt = [](int poll) { return poll == 4; };
  request_.AddFile(L"a", MakeFile(L"a", "first").c_str());
  request_.AddFile(L"b", MakeFile(L"b", "second").c_str());
  EXPECT_EQ(Upload(), UPLOAD_E_CANCELLED);
  EXPECT_EQ(listener_.Only("FileComplete"),
            (std::vector<std::string>{"FileComplete a 0x00000000", "FileComplete b 0x80040301"}));
  const std::string body = server_.Body();
  EXPECT_EQ(body.substr(body.size() - 6), "second");
  EXPECT_FALSE(server_.ended);
}

TEST_F(UploadEngine, AnUploadWithoutFilesCannotBeCancelled) {
  listener_.cancelAt = [](int) { return true; };
  request_.AddField("title", "t");
  EXPECT_EQ(Upload(), win::kOk);
  EXPECT_EQ(listener_.polls, 0);
  EXPECT_TRUE(server_.ended);
}

TEST_F(UploadEngine, AMissingSecondFileStopsAfterItsHeaderWithoutNamingIt) {
  request_.AddFile(L"a", MakeFile(L"a", "first").c_str());
  request_.AddFile(L"b", L"missing.jpg");
  EXPECT_EQ(static_cast<std::uint32_t>(Upload()), 0x80070002u);
  EXPECT_EQ(listener_.Only("FileComplete"),
            (std::vector<std::string>{"FileComplete a 0x00000000"}));
  for (const std::string& event : listener_.events) {
    EXPECT_EQ(event.find("missing"), std::string::npos) << event;
  }
  const std::string body = server_.Body();
  EXPECT_EQ(body.substr(body.size() - 4), "\r\n\r\n");
  EXPECT_NE(body.find("filename=\"missing.jpg\""), std::string::npos);
  EXPECT_FALSE(server_.ended);
}

TEST_F(UploadEngine, FilesOrBodiesOfFourGibibytesAreRefusedBeforeAnythingIsSent) {
  constexpr std::uintmax_t kFourGiB = std::uintmax_t{4} * 1024 * MiB;
  for (const std::vector<std::uintmax_t>& sizes :
       {std::vector<std::uintmax_t>{kFourGiB}, {kFourGiB / 2, kFourGiB / 2},
        {kFourGiB - 100}}) {
    server_ = FakeServer();
    request_.ClearFiles();
    for (std::size_t i = 0; i < sizes.size(); ++i) {
      const std::wstring name = L"huge" + std::to_wstring(i);
      request_.AddFile(L"f", MakeSparseFile(name, sizes[i]).c_str());
    }
    EXPECT_EQ(static_cast<std::uint32_t>(Upload()), 0x800700DFu);
    EXPECT_FALSE(server_.started);
    EXPECT_TRUE(server_.writes.empty());
    EXPECT_TRUE(listener_.events.empty());
  }
}

TEST_F(UploadEngine, AFileThatChangesSizeAfterMeasuringFailsWithoutAWrongBody) {
  for (const bool grow : {true, false}) {
    SCOPED_TRACE(grow ? "grows" : "shrinks");
    server_ = FakeServer();
    listener_.events.clear();
    request_.ClearFiles();
    request_.AddFile(L"f", MakeFile(L"f", std::string(100 * KiB, 'x')).c_str());
    server_.onStart = [grow] {
      if (grow) {
        std::ofstream(test_support::Native(L"f"), std::ios::app) << "more";
      } else {
        std::filesystem::resize_file(test_support::Native(L"f"), 50 * KiB);
      }
    };
    EXPECT_EQ(static_cast<std::uint32_t>(Upload()), 0x800703EEu);
    EXPECT_EQ(listener_.Only("FileComplete").back(), "FileComplete f 0x800703EE");
    EXPECT_LE(server_.Body().size(), server_.announced);
    EXPECT_EQ(server_.Body().find("more"), std::string::npos);
    EXPECT_FALSE(server_.ended);
  }
}

TEST_F(UploadEngine, AFailedStartIsTheResultAndNothingIsWritten) {
  server_.startStatus = win::StatusFromWin32(win::kErrorInternetCannotConnect);
  request_.AddField("title", "t");
  EXPECT_EQ(static_cast<std::uint32_t>(Upload()), 0x80072EFDu);
  EXPECT_EQ(static_cast<std::uint32_t>(result_.hr), 0x80072EFDu);
  EXPECT_TRUE(server_.writes.empty());
}

TEST_F(UploadEngine, StatusAndReplyAreKeptWhateverTheStatus) {
  server_.httpStatus = 404;
  server_.reply = "<uploadTemplate><error>no</error></uploadTemplate>";
  EXPECT_EQ(Upload(), win::kOk);
  EXPECT_EQ(result_.httpStatus, 404u);
  EXPECT_EQ(reply_, server_.reply);
}

}  // namespace
