#include "platform/debug_output.h"

#include <gtest/gtest.h>

#include <set>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "support/trace_capture.h"

namespace {

TEST(DebugOutput, AppendsUtf8LinesToTheNamedFile) {
  test_support::TempFile file("out.log");
  file.Write("earlier\n");
  test_support::ScopedEnv env(debug_output::kOutputPathVariable, file.path());
  debug_output::Write(L"caf\u00E9 \U0001F600\n");
  debug_output::Write(L"second\n");
  EXPECT_EQ(file.Read(), "earlier\ncaf\xC3\xA9 \xF0\x9F\x98\x80\nsecond\n");
}

TEST(DebugOutput, LinesFromManyThreadsStayWhole) {
  test_support::TempFile file("out.log");
  test_support::ScopedEnv env(debug_output::kOutputPathVariable, file.path());
  constexpr int kThreads = 4;
  constexpr int kLines = 200;
  const std::wstring filler(300, L'x');
  std::vector<std::thread> writers;
  for (int t = 0; t < kThreads; ++t) {
    writers.emplace_back([&, t] {
      for (int i = 0; i < kLines; ++i) {
        debug_output::Write(std::to_wstring(t) + L":" + std::to_wstring(i) + L":" + filler + L"\n");
      }
    });
  }
  for (auto& w : writers) w.join();

  std::istringstream lines(file.Read());
  std::set<std::string> seen;
  for (std::string line; std::getline(lines, line);) {
    ASSERT_EQ(line.substr(line.size() - 301), ":" + std::string(300, 'x')) << line.substr(0, 20);
    seen.insert(line.substr(0, line.size() - 301));
  }
  EXPECT_EQ(seen.size(), static_cast<std::size_t>(kThreads * kLines));
}

}  // namespace
