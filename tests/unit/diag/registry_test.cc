#include "platform/registry.h"

#include <gtest/gtest.h>

#include <cctype>
#include <optional>
#include <string>

#include "support/trace_capture.h"

namespace {

constexpr wchar_t kSubkey[] = L"SOFTWARE\\Quillmark\\Lumivanta";
const std::string kHeader = "Windows Registry Editor Version 5.00\r\n\r\n";
const std::string kSection = "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\r\n";

std::string Utf16LeWithMark(const std::string& ascii) {
  std::string out = "\xFF\xFE";
  for (char c : ascii) {
    out.push_back(c);
    out.push_back('\0');
  }
  return out;
}

struct NumberCase {
  const char* what;
  std::string file;
  std::optional<std::uint32_t> number;  // empty: the value is missing
};

class RegistryNumber : public ::testing::TestWithParam<NumberCase> {};

TEST_P(RegistryNumber, ReadsTheValueAsAThirtyTwoBitNumber) {
  const auto key = registry::Key::OpenInHiveFile(GetParam().file, kSubkey);
  ASSERT_TRUE(key.has_value());
  EXPECT_EQ(key->ReadNumber(L"DumpMsg"), GetParam().number);
}

INSTANTIATE_TEST_SUITE_P(
    Values, RegistryNumber,
    ::testing::Values(
        NumberCase{"dword", kHeader + kSection + "\"DumpMsg\"=dword:00000001\r\n", 1},
        NumberCase{"names ignore case", kHeader + "[hkey_local_machine\\software\\QUILLMARK\\lumivanta]\n"
                                                  "\"dumpmsg\"=DWORD:0000002A\n", 42},
        // A string is stored as UTF-16LE with its terminator: "1" is 31 00 00 00.
        NumberCase{"string", kHeader + kSection + "\"DumpMsg\"=\"1\"\r\n", 0x31},
        NumberCase{"short hex is zero-padded", kHeader + kSection + "\"DumpMsg\"=hex:01,02\r\n", 0x0201},
        NumberCase{"long hex gives its first four bytes",
                   kHeader + kSection + "\"DumpMsg\"=hex(b):01,00,00,00,ff,ff\r\n", 1},
        NumberCase{"empty hex", kHeader + kSection + "\"DumpMsg\"=hex:\r\n", 0},
        NumberCase{"hex continued over lines",
                   kHeader + kSection + "\"DumpMsg\"=hex(4):05,\\\r\n  00,00,00\r\n", 5},
        NumberCase{"later line wins", kHeader + kSection + "\"DumpMsg\"=dword:1\n\"DumpMsg\"=dword:2\n", 2},
        NumberCase{"removed value", kHeader + kSection + "\"DumpMsg\"=dword:1\n\"DumpMsg\"=-\n", std::nullopt},
        NumberCase{"unreadable data is skipped", kHeader + kSection + "\"DumpMsg\"=dword:xyz\n", std::nullopt},
        NumberCase{"comments and other keys", kHeader + "; note\n[HKEY_LOCAL_MACHINE\\SOFTWARE\\Other]\n"
                                                        "\"DumpMsg\"=dword:7\n" + kSection + "; \"DumpMsg\"=dword:1\n",
                   std::nullopt},
        NumberCase{"old editor header", "REGEDIT4\n\n" + kSection + "\"DumpMsg\"=dword:00000003\n", 3},
        NumberCase{"UTF-8 byte order mark", "\xEF\xBB\xBF" + kHeader + kSection + "\"DumpMsg\"=dword:4\n", 4},
        NumberCase{"UTF-16LE as the registry editor writes it",
                   Utf16LeWithMark(kHeader + kSection + "\"DumpMsg\"=dword:00000009\r\n"), 9}),
    [](const auto& info) {
      std::string name;
      for (const char* c = info.param.what; *c; ++c) name += std::isalnum(static_cast<unsigned char>(*c)) ? *c : '_';
      return name;
    });

struct OpenCase {
  const char* what;
  std::string file;
  bool opens;
};

class RegistryKeyOpening : public ::testing::TestWithParam<OpenCase> {};

TEST_P(RegistryKeyOpening, OpensOnlyKeysTheHiveHolds) {
  EXPECT_EQ(registry::Key::OpenInHiveFile(GetParam().file, kSubkey).has_value(), GetParam().opens)
      << GetParam().what;
}

INSTANTIATE_TEST_SUITE_P(
    Files, RegistryKeyOpening,
    ::testing::Values(OpenCase{"section of the key", kHeader + kSection, true},
                      OpenCase{"only a subkey's section", kHeader + "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\"
                                                                    "Lumivanta\\Sub]\n", true},
                      OpenCase{"no section", kHeader + "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark]\n", false},
                      OpenCase{"a longer sibling name", kHeader + "[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\"
                                                                  "LumivantaX]\n", false},
                      OpenCase{"another hive", kHeader + "[HKEY_CURRENT_USER\\SOFTWARE\\Quillmark\\Lumivanta]\n",
                               false},
                      OpenCase{"deleted key", kHeader + "[-HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\Lumivanta]\n",
                               false},
                      OpenCase{"no header", kSection + "\"DumpMsg\"=dword:1\n", false},
                      OpenCase{"empty file", "", false}));

TEST(RegistryHiveFile, IsNamedByTheEnvironmentElseTheDefaultPath) {
  {
    test_support::ScopedEnv unset(registry::kHivePathVariable, std::nullopt);
    EXPECT_EQ(registry::HivePath(), registry::kDefaultHivePath);
  }
  test_support::TempFile hive("hive.reg");
  test_support::ScopedEnv env(registry::kHivePathVariable, hive.path());
  EXPECT_EQ(registry::HivePath(), hive.path());
  EXPECT_FALSE(registry::Key::OpenLocalMachine(kSubkey).has_value()) << "no file yet";
  hive.Write(kHeader + kSection + "\"DumpMsg\"=dword:00000005\n");
  const auto key = registry::Key::OpenLocalMachine(kSubkey);
  ASSERT_TRUE(key.has_value());
  EXPECT_EQ(key->ReadNumber(L"DumpMsg"), 5u);
}

}  // namespace
