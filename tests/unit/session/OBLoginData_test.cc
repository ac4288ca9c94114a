#include "service/OBLoginData.h"

#include <gtest/gtest.h>

#include <atomic>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "support/embedded_python.h"
#include "support/python_objects.h"
#include "support/trace_capture.h"

namespace {

using test_support::PyRef;
using test_support::ScopedEnv;
using test_support::TraceCapture;

std::wstring UnicodeText(PyObject* object) {
  PyRef held(object);
  EXPECT_TRUE(object != nullptr && PyUnicode_CheckExact(object));
  if (object == nullptr || !PyUnicode_Check(object)) return L"<not unicode>";
  return std::wstring(reinterpret_cast<const wchar_t*>(PyUnicode_AS_UNICODE(object)), PyUnicode_GET_SIZE(object));
}

TEST(NewSession, StartsEmptyWithItsProbeStateCleared) {
  OBLoginData session(L"5.0", L"Retail", L"machine-1");
  EXPECT_EQ(UnicodeText(session.GetUserName()), L"");
  EXPECT_EQ(UnicodeText(session.GetServerUrl()), L"");
  EXPECT_EQ(UnicodeText(session.GetLoginTokenID()), L"");
  EXPECT_EQ(session.GetCategoryCount(), 0);
  EXPECT_EQ(session.m_hInternet, nullptr);
  EXPECT_EQ(session.m_hConnect, nullptr);
  EXPECT_EQ(session.m_hRequest, nullptr);
  EXPECT_EQ(session.m_bServerReachable, 0);
  EXPECT_EQ(std::string(session.m_szChkServerUrl, kMaxPath), std::string(kMaxPath, '\0'));
}

TEST(NewSession, NullArgumentsAreEmptyTexts) {
  TraceCapture capture(1);
  OBLoginData session(nullptr, nullptr, nullptr);
  EXPECT_EQ(capture.Bytes(), "[OBLoginData]KRV version = \n[OBLoginData]KRV versionType = \n");
}

TEST(NewSession, WritesItsVersionTraceLinesWhenTheSwitchIsOn) {
  TraceCapture capture(1);
  OBLoginData session(L"5.0 \u00E4", L"Retail", L"machine-1");
  EXPECT_EQ(capture.Text(), L"[OBLoginData]KRV version = 5.0 \u00E4\n[OBLoginData]KRV versionType = Retail\n");
  capture.ExpectAbsent(L"machine-1");
}

TEST(NewSession, WritesNothingWhenTheSwitchIsOff) {
  TraceCapture capture(0);
  OBLoginData session(L"5.0", L"Retail", L"machine-1");
  EXPECT_EQ(capture.Bytes(), "");
}

TEST(SessionAccessors, ReturnTheMembersAsUnicodeWithEveryCharacter) {
  OBLoginData session(L"5.0", L"", L"");
  const std::wstring name(L"m\u00E4mber\0tail\U0001F600", 13);
  session.SetUserName(name);
  session.SetLoginTokenID(L"tok");
  EXPECT_EQ(UnicodeText(session.GetUserName()), name);
  EXPECT_EQ(UnicodeText(session.GetLoginTokenID()), L"tok");
}

TEST(SessionToken, AReaderRacingAWriterSeesTheOldOrTheNewTokenNeverAMixture) {
  OBLoginData session(L"5.0", L"", L"");
  const std::wstring tokens[] = {std::wstring(200, L'A'), std::wstring(7, L'b')};
  session.SetLoginTokenID(tokens[0]);
  std::atomic<bool> stop{false};
  std::atomic<long> torn{0};
  std::vector<std::thread> readers;
  for (int r = 0; r < 3; ++r) {
    readers.emplace_back([&] {
      while (!stop) {
        const std::wstring seen = session.GetToken();
        if (seen != tokens[0] && seen != tokens[1]) ++torn;
      }
    });
  }
  for (int i = 0; i < 200000; ++i) session.SetLoginTokenID(tokens[i % 2]);
  stop = true;
  for (auto& reader : readers) reader.join();
  EXPECT_EQ(torn, 0);
}

struct HostCase {
  const char* variable;
  std::optional<std::string> value;
  std::wstring ServiceHosts::*member;
  std::wstring expected;
};

class ServiceHostSettings : public ::testing::TestWithParam<HostCase> {};

TEST_P(ServiceHostSettings, AreCompiledDefaultsUnlessTheEnvironmentNamesOthers) {
  ScopedEnv env(GetParam().variable, GetParam().value);
  EXPECT_EQ(ServiceHosts::FromEnvironment().*(GetParam().member), GetParam().expected);
}

INSTANTIATE_TEST_SUITE_P(
    Hosts, ServiceHostSettings,
    ::testing::Values(
        HostCase{ServiceHosts::kDefaultHostVariable, std::nullopt, &ServiceHosts::defaultHost, L"www.orbishare.com"},
        HostCase{ServiceHosts::kDefaultHostVariable, "", &ServiceHosts::defaultHost, L"www.orbishare.com"},
        HostCase{ServiceHosts::kDefaultHostVariable, "local.test", &ServiceHosts::defaultHost, L"local.test"},
        HostCase{ServiceHosts::kStagingHostVariable, std::nullopt, &ServiceHosts::stagingHost,
                 L"staging.orbishare.com"},
        HostCase{ServiceHosts::kStagingHostVariable, "stage.test", &ServiceHosts::stagingHost, L"stage.test"},
        HostCase{ServiceHosts::kDetectionHostVariable, std::nullopt, &ServiceHosts::detectionHost,
                 L"detect.orbishare.com"},
        HostCase{ServiceHosts::kDetectionHostVariable, "detect.test", &ServiceHosts::detectionHost,
                 L"detect.test"}));

}  // namespace
