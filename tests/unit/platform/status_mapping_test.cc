#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <fstream>
#include <string>

#include "platform/file.h"
#include "platform/text.h"
#include "platform/win_error.h"

namespace {

TEST(StatusFromWin32, KeepsLowSixteenBitsOfPositiveCodesAndPassesTheRest) {
  struct Case {
    std::uint32_t code;
    std::uint32_t status;
  };
  for (const Case c : {Case{0, 0}, Case{2, 0x80070002u}, Case{223, 0x800700DFu},
                       Case{12029, 0x80072EFDu}, Case{0x12345, 0x80072345u},
                       Case{0x80004005u, 0x80004005u}}) {
    EXPECT_EQ(static_cast<std::uint32_t>(win::StatusFromWin32(c.code)), c.status) << c.code;
  }
}

class LocalFile : public ::testing::Test {
 protected:
  void SetUp() override {
    folder_ = std::filesystem::temp_directory_path() /
              ("file_test_" + std::to_string(::testing::UnitTest::GetInstance()->random_seed()) +
               "_" + ::testing::UnitTest::GetInstance()->current_test_info()->name());
    std::filesystem::create_directories(folder_);
  }
  void TearDown() override { std::filesystem::remove_all(folder_); }

  std::wstring Make(const std::string& name, const std::string& bytes) {
    const std::filesystem::path path = folder_ / std::filesystem::u8path(name);
    std::ofstream(path, std::ios::binary) << bytes;
    return text::Utf8ToWide(path.u8string());
  }
  std::wstring PathOf(const std::string& name) {
    return text::Utf8ToWide((folder_ / std::filesystem::u8path(name)).u8string());
  }

  std::filesystem::path folder_;
};

TEST_F(LocalFile, OpensAWidePathStoredAsUtf8AndReadsItToTheEnd) {
  const std::wstring path = Make("\xE4\xB8\xAD\xE6\x96\x87.bin", "0123456789");
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
  EXPECT_TRUE(file::PathExists(path));
}

TEST_F(LocalFile, FailuresToOpenCarryTheWindowsStatus) {
  const std::wstring plain = Make("plain", "x");
  struct Case {
    std::wstring path;
    std::uint32_t status;
  };
  for (const Case& c : {Case{PathOf("missing"), 0x80070002u}, Case{plain + L"/below", 0x80070003u},
                        Case{PathOf(""), 0x80070005u},
                        Case{std::wstring(L"a\0b", 3), 0x8007007Bu}}) {
    file::File source;
    EXPECT_EQ(static_cast<std::uint32_t>(source.Open(c.path)), c.status)
        << text::WideToUtf8(c.path);
    EXPECT_FALSE(source.is_open());
  }
  EXPECT_FALSE(file::PathExists(PathOf("missing")));
  EXPECT_TRUE(file::PathExists(PathOf("")));
}

}  // namespace
