#include "diag/trace.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <optional>
#include <string>

#include "support/trace_capture.h"

namespace {

using test_support::TraceCapture;

// Runs `lines` in a fresh process (the switch and prefix start as at load) with the
// switch on, and tells whether the trace output is then `expected`.
#define EXPECT_FRESH_PROCESS_WRITES(lines, expected)                        \
  EXPECT_EXIT(                                                             \
      {                                                                    \
        bool asExpected;                                                   \
        {                                                                  \
          TraceCapture capture(1);                                         \
          lines;                                                           \
          asExpected = capture.Bytes() == (expected);                      \
        }                                                                  \
        std::exit(asExpected ? 0 : 1);                                     \
      },                                                                   \
      ::testing::ExitedWithCode(0), "")

TEST(TraceAtLoad, IsOffUntilAComponentReadsTheSwitch) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");  // a new process, not a copy of this one
  EXPECT_FRESH_PROCESS_WRITES(TraceMessage(L"early"), "");
  EXPECT_FRESH_PROCESS_WRITES((TraceSetPrefix("Unit"), TraceMessage(L"late")), "[Unit]late\n");
}

struct SwitchCase {
  std::optional<std::uint32_t> dumpMsg;  // empty: the value is missing
  bool writes;
};

class TraceSwitch : public ::testing::TestWithParam<SwitchCase> {};

TEST_P(TraceSwitch, IsReadWhenAComponentSetsThePrefix) {
  TraceCapture capture(GetParam().dumpMsg);
  TraceSetPrefix("Unit");
  TraceMessage(L"hello %d", 5);
  EXPECT_EQ(capture.Bytes(), GetParam().writes ? "[Unit]hello 5\n" : "");
}

INSTANTIATE_TEST_SUITE_P(Values, TraceSwitch,
                         ::testing::Values(SwitchCase{std::nullopt, false}, SwitchCase{0u, false},
                                           SwitchCase{1u, true}, SwitchCase{0xFFFFFFFFu, true},
                                           SwitchCase{2u, true}));

TEST(TraceSwitchState, KeyThatCannotBeOpenedKeepsThePreviousStateAndPrefix) {
  TraceCapture capture(1);
  TraceSetPrefix("First");
  capture.RemoveKey();
  TraceSetPrefix("Second");
  TraceMessage(L"still on");
  capture.SetSwitch(0);
  TraceSetPrefix("Third");
  capture.RemoveKey();
  TraceSetPrefix("Fourth");
  TraceMessage(L"still off");
  EXPECT_EQ(capture.Bytes(), "[First]still on\n");
}

TEST(TraceSwitchState, MissingHiveFileKeepsThePreviousState) {
  TraceCapture capture(1);
  TraceSetPrefix("Unit");
  {
    test_support::ScopedEnv noHive(registry::kHivePathVariable, "/nonexistent/hive.reg");
    TraceSetPrefix("Other");
  }
  TraceMessage(L"on");
  EXPECT_EQ(capture.Bytes(), "[Unit]on\n");
}

struct PrefixCase {
  const char* name;
  const char* line;  // what "x" is written as after "Before" and then `name`
};

class TracePrefix : public ::testing::TestWithParam<PrefixCase> {};

TEST_P(TracePrefix, IsTheLatestNameInBracketsCutToTwentyNineCharacters) {
  TraceCapture capture(1);
  TraceSetPrefix("Before");
  TraceSetPrefix(GetParam().name);
  TraceMessage(L"x");
  EXPECT_EQ(capture.Bytes(), GetParam().line);
}

INSTANTIATE_TEST_SUITE_P(
    Names, TracePrefix,
    ::testing::Values(PrefixCase{"OBLoginData", "[OBLoginData]x\n"},
                      PrefixCase{"", "[]x\n"},
                      PrefixCase{nullptr, "[Before]x\n"},
                      PrefixCase{"ABCDEFGHIJKLMNOPQRSTUVWXYZ012", "[ABCDEFGHIJKLMNOPQRSTUVWXYZ01x\n"},
                      PrefixCase{"ABCDEFGHIJKLMNOPQRSTUVWXYZ0123", "[Before]x\n"},
                      PrefixCase{"ABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789", "[Before]x\n"}));

TEST(TracePrefixScope, BelongsToTheProcessNotToTheComponent) {
  TraceCapture capture(1);
  TraceSetPrefix("OBLoginData");
  TraceMessage(L"one");
  TraceSetPrefix("PyPresetUploader");
  TraceMessage(L"two");  // written on behalf of the session, under the newer prefix
  EXPECT_EQ(capture.Bytes(), "[OBLoginData]one\n[PyPresetUploader]two\n");
}

TEST(TraceLine, LongTextIsCutAtItsLimit) {
  TraceCapture capture(1);
  TraceSetPrefix("Unit");
  TraceMessage(L"%s", std::wstring(1500, L'a').c_str());
  EXPECT_EQ(capture.Bytes(), "[Unit]" + std::string(kTraceTextLimit, 'a') + "\n");
}

TEST(TraceLine, WideAndNarrowArgumentsFollowTheWindowsConvention) {
  TraceCapture capture(1);
  TraceSetPrefix("Unit");
  TraceMessage(L"KRV version = %s; host %S; %d%%", L"5.0 \u00E4", "n\xC3\xA4", 7);
  EXPECT_EQ(capture.Text(), L"[Unit]KRV version = 5.0 \u00E4; host n\u00E4; 7%\n");
}

TEST(TraceLine, NothingIsWrittenWhileTheSwitchIsOff) {
  TraceCapture capture(0);
  TraceSetPrefix("Unit");
  TraceMessage(L"%s", L"secret");
  TraceMessage(L"plain");
  EXPECT_EQ(capture.Bytes(), "");
}

}  // namespace
