#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <string>

#include "platform/file.h"
#include "platform/text.h"
#include "platform/win_error.h"
#include "support/temp_folder.h"

namespace {

class LocalFile : public test_support::TempFolderTest {
 protected:
  // The full path of a file in the folder, made with `bytes` unless they are absent.
  static std::wstring PathOf(const std::string& name, const char* bytes = nullptr) {
    const std::filesystem::path path = std::filesystem::current_path() / std::filesystem::u8path(name);
    if (bytes) std::ofstream(path, std::ios::binary) << bytes;
    return text::Utf8ToWide(path.u8string());
  }
};

TEST_F(LocalFile, OpensAWidePathStoredAsUtf8AndReadsItToTheEnd) {
  const std::wstring path = PathOf("\xE4\xB8\xAD\xE6\x96\x87.bin", "0123456789");
  file::File source;
  ASSERT_EQ(source.Open(path), win::kOk);
  std::uint64_t size = 0;
  ASSERT_EQ(source.Size(&size), win::kOk);
  EXPECT_EQ(size, 10u);
  char buffer[16];
  std::size_t count = 0;
  ASSERT_EQ(source.Read(buffer, 4, &count), win::kOk);
  EXPECT_EQ(std::string(buffer, count), "0123");
  ASSERT_EQ(source.Read(buffer, sizeof buffer, &count), win::kOk);
  EXPECT_EQ(std::string(buffer, count), "456789");
  ASSERT_EQ(source.Read(buffer, sizeof buffer, &count), win::kOk);
  EXPECT_EQ(count, 0u);
  EXPECT_TRUE(file::IsRegularFile(path));
}

// Only a regular file is read: a FIFO or device fails as a missing file does.
TEST_F(LocalFile, FailuresToOpenCarryTheWindowsStatus) {
  const std::wstring plain = PathOf("plain", "x");
  const std::wstring fifo = PathOf("fifo");
  ASSERT_EQ(::mkfifo(text::WideToUtf8(fifo).c_str(), 0600), 0);
  // Held open for writing, so that an open() that waits for a writer cannot hang the test.
  const int writer = ::open(text::WideToUtf8(fifo).c_str(), O_RDWR | O_NONBLOCK);
  ASSERT_GE(writer, 0);
  struct Case {
    std::wstring path;
    std::uint32_t status;
  };
  for (const Case& c : {Case{PathOf("missing"), 0x80070002u}, Case{plain + L"/below", 0x80070003u},
                        Case{PathOf(""), 0x80070005u}, Case{fifo, 0x80070002u},
                        Case{L"/dev/zero", 0x80070002u},
                        Case{std::wstring(L"a\0b", 3), 0x8007007Bu}}) {
    file::File source;
    EXPECT_EQ(static_cast<std::uint32_t>(source.Open(c.path)), c.status)
        << text::WideToUtf8(c.path);
    EXPECT_FALSE(source.is_open());
    EXPECT_FALSE(file::IsRegularFile(c.path));
  }
  ::close(writer);
}

}  // namespace
