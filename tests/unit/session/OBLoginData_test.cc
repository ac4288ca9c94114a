#include "service/OBLoginData.h"

#include <gtest/gtest.h>

#include <atomic>
#include <optional>
#include <string>
#include <thread>
#include <vector>

#include "support/trace_capture.h"

namespace {

using test_support::ScopedEnv;
using test_support::TraceCapture;

TEST(NewSession, NullArgumentsAreEmptyTexts) {
  TraceCapture capture(1);
  OBLoginData session(nullptr, nullptr, nullptr);
  EXPECT_EQ(capture.Bytes(), "[OBLoginData]KRV version = \n[OBLoginData]KRV versionType = \n");
}

TEST(SessionAccessors, ReturnTheMembersWithEveryCharacter) {
  OBLoginData session(L"5.0", L"", L"");
  const std::wstring name(L"m\u00E4mber\0tail\U0001F600", 13);
  session.SetUserName(name);
  session.SetLoginTokenID(L"tok");
  EXPECT_EQ(session.GetUserName(), name);
  EXPECT_EQ(session.GetLoginTokenID(), L"tok");
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

// Each host is a compiled default that a non-empty environment variable replaces.
TEST(ServiceHostSettings, TheEnvironmentReplacesEachDefaultUnlessEmpty) {
  struct Case {
    const char* variable;
    std::wstring ServiceHosts::*member;
  };
  for (const Case& c : {Case{ServiceHosts::kDefaultHostVariable, &ServiceHosts::defaultHost},
                        Case{ServiceHosts::kStagingHostVariable, &ServiceHosts::stagingHost},
                        Case{ServiceHosts::kDetectionHostVariable, &ServiceHosts::detectionHost}}) {
    std::optional<ScopedEnv> env(std::in_place, c.variable, std::nullopt);
    const std::wstring compiled = ServiceHosts::FromEnvironment().*c.member;
    EXPECT_FALSE(compiled.empty()) << c.variable;
    env.emplace(c.variable, "");
    EXPECT_EQ(ServiceHosts::FromEnvironment().*c.member, compiled) << c.variable;
    env.emplace(c.variable, "host.test");
    EXPECT_EQ(ServiceHosts::FromEnvironment().*c.member, L"host.test") << c.variable;
  }
}

}  // namespace
