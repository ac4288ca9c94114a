// Operations given a null text (which the module's Unicode arguments never pass)
// answer None at once and send nothing.
#include "service/OBLoginData.h"

#include <gtest/gtest.h>

#include <string>

#include "support/embedded_python.h"
#include "support/trace_capture.h"

namespace {

using test_support::TraceCapture;

// Takes the new reference a result is.
bool IsNone(PyObject* result) {
  const bool none = result == Py_None;
  Py_XDECREF(result);
  return none;
}

constexpr wchar_t kVersionLines[] = L"[OBLoginData]KRV version = 5.0\n[OBLoginData]KRV versionType = \n";

TEST(AbsentArguments, RelatedVideoWithAnyTextMissingWritesItsLineAndReturnsNone) {
  TraceCapture capture(1);
  OBLoginData session(L"5.0", L"", L"");
  session.SetLoginTokenID(L"token");
  EXPECT_TRUE(IsNone(session.SetRelateVideo(nullptr, L"site", L"a=1")));
  EXPECT_TRUE(IsNone(session.SetRelateVideo(L"v", nullptr, L"a=1")));
  EXPECT_TRUE(IsNone(session.SetRelateVideo(L"v", L"site", nullptr)));
  const std::wstring line = L"[OBLoginData]SetRelateVideo wszVideoURL|wszWebsite|wszVideoInfo fail\n";
  EXPECT_EQ(capture.Text(), kVersionLines + line + line + line);
}

TEST(AbsentArguments, EffectLookupWithoutGuidReturnsNoneAndLooksNothingUp) {
  TraceCapture capture(1);
  OBLoginData session(L"5.0", L"", L"");
  EXPECT_TRUE(IsNone(session.GetEffectByGUID(nullptr)));
  EXPECT_EQ(capture.Text(), kVersionLines);
  EXPECT_EQ(session.m_szChkServerUrl[0], '\0');  // no discovery probe either
}

}  // namespace
