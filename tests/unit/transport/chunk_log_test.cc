#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

#include "support/recording_listener.h"
#include "support/temp_folder.h"
#include "transport/ChunkLog.h"
#include "transport/UploadRequest.h"
#include "transport/UploadResult.h"
#include "transport/Uploader.h"
#include "transport/fake_server.h"

namespace {

using test_support::MakeSparseFile;

constexpr char kLogName[] = "chunks.log";

class ChunkLogTest : public test_support::TempFolderTest {
 protected:
  void TearDown() override {
    ::unsetenv(ChunkLog::kPathVariable);
    TempFolderTest::TearDown();
  }

  void UploadFileOf(std::uintmax_t size) {
    UploadRequest request;
    UploadResult result;
    test_support::RecordingListener listener;
    test_support::FakeServer server;
    request.AddFile(L"f", MakeSparseFile(L"f", size).c_str());
    Uploader uploader(&listener, &request, &result, server.Environment());
    ASSERT_EQ(uploader.Upload(), win::kOk);
  }

  // The byte counts of the lines, in order; each line must also carry a time.
  static std::vector<std::size_t> LoggedBytes() {
    std::vector<std::size_t> bytes;
    std::ifstream log(kLogName);
    std::size_t count = 0;
    long long micros = -1;
    while (log >> count >> micros) {
      EXPECT_GE(micros, 0);
      bytes.push_back(count);
    }
    return bytes;
  }
};

TEST_F(ChunkLogTest, EachChunkAppendsItsBytesAndWriteTime) {
  ::setenv(ChunkLog::kPathVariable, kLogName, 1);
  UploadFileOf(0);
  UploadFileOf(32 * 1024 + 64 * 1024 + 10);
  UploadFileOf(100);
  EXPECT_EQ(LoggedBytes(), (std::vector<std::size_t>{32 * 1024, 64 * 1024, 10, 100}));
}

TEST_F(ChunkLogTest, WithoutTheVariableNothingIsWritten) {
  UploadFileOf(100);
  EXPECT_FALSE(std::filesystem::exists(kLogName));
}

}  // namespace
