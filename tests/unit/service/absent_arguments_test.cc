// Operations given a null text (which the module's Unicode arguments never pass)
// answer nothing at once and send nothing.
#include "service/OBLoginData.h"

#include <gtest/gtest.h>

#include <string>

#include "support/trace_capture.h"

namespace {

using test_support::TraceCapture;

constexpr wchar_t kVersionLines[] = L"[OBLoginData]KRV version = 5.0\n[OBLoginData]KRV versionType = \n";

TEST(AbsentArguments, RelatedVideoWithAnyTextMissingWritesItsLineAndReturnsNothing) {
  TraceCapture capture(1);
  OBLoginData session(L"5.0", L"", L"");
  session.SetLoginTokenID(L"token");
  EXPECT_FALSE(session.SetRelateVideo(nullptr, L"site", L"a=1"));
  EXPECT_FALSE(session.SetRelateVideo(L"v", nullptr, L"a=1"));
  EXPECT_FALSE(session.SetRelateVideo(L"v", L"site", nullptr));
  const std::wstring line = L"[OBLoginData]SetRelateVideo wszVideoURL|wszWebsite|wszVideoInfo fail\n";
  EXPECT_EQ(capture.Text(), kVersionLines + line + line + line);
}

TEST(AbsentArguments, EffectLookupWithoutGuidReturnsNothingAndLooksNothingUp) {
  TraceCapture capture(1);
  OBLoginData session(L"5.0", L"", L"");
  EXPECT_FALSE(session.GetEffectByGUID(nullptr));
  EXPECT_EQ(capture.Text(), kVersionLines);
  EXPECT_EQ(session.m_szChkServerUrl[0], '\0');  // no discovery probe either
}

}  // namespace
