#include "diag/trace.h"

#include <gtest/gtest.h>

#include <cstdlib>
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

TEST(TraceLine, WideAndNarrowArgumentsFollowTheWindowsConvention) {
  TraceCapture capture(1);
  TraceSetPrefix("Unit");
  TraceMessage(L"KRV version = %s; host %S; %d%%", L"5.0 \u00E4", "n\xC3\xA4", 7);
  EXPECT_EQ(capture.Text(), L"[Unit]KRV version = 5.0 \u00E4; host n\u00E4; 7%\n");
}

}  // namespace
