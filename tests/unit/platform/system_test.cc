// The stand-ins for the operating system's services: the large buffer, links
// handed to a browser, the debug output and the debug trace with its
// process-wide switch and prefix.
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <algorithm>
#include <cstring>
#include <fstream>
#include <iterator>
#include <set>
#include <sstream>

#include "diag/trace.h"
#include "fixtures.h"
#include "platform/debug_output.h"
#include "platform/large_buffer.h"
#include "platform/registry.h"
#include "platform/shell.h"

namespace {

using namespace test_support;
using Argv = std::vector<std::string>;
constexpr auto kPatience = std::chrono::seconds(20);  // only bounds a hang

std::string ReadFile(const std::filesystem::path& path) {
  std::ifstream in(path, std::ios::binary);
  return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

// A hive file holding the trace switch, and the trace lines captured in a file.
class Trace : public TempFolderTest {
 protected:
  void SetUp() override {
    TempFolderTest::SetUp();
    hive_.emplace(platform::kHivePathVariable, (folder_ / "hive.reg").string());
    output_.emplace(platform::kDebugOutputPathVariable, (folder_ / "out.log").string());
    SetSwitch(1);
  }
  static void SetSwitch(int dumpMsg) {
    std::ofstream("hive.reg") << "REGEDIT4\r\n\r\n[HKEY_LOCAL_MACHINE\\SOFTWARE\\Quillmark\\"
                                 "Lumivanta]\r\n\"DumpMsg\"=dword:" << dumpMsg << "\r\n";
  }
  std::optional<ScopedEnv> hive_, output_;
};

// The mapping is trimmed to an aligned range: a wrong trim would leave part of
// a buffer unmapped (a crash when written) or let two buffers overlap.
TEST(LargeBuffer, EveryByteIsWritableAndBuffersDoNotOverlap) {
  for (const std::size_t size : {std::size_t{1}, std::size_t{2} << 20, (std::size_t{16} << 20) + 1}) {
    platform::LargeBuffer first(size), second(size);
    ASSERT_TRUE(first.data() && second.data());
    std::memset(first.data(), 'a', size);
    std::memset(second.data(), 'b', size);
    EXPECT_EQ(std::count(first.data(), first.data() + size, 'a'), static_cast<long>(size));
  }
}

// Recorder scripts in bin/, alone on PATH besides the system folders, write
// their arguments NUL-separated to "<their path>.out".
class Links : public TempFolderTest {
 protected:
  void SetUp() override {
    TempFolderTest::SetUp();
    std::filesystem::create_directory("bin");
    path_.emplace("PATH", (folder_ / "bin").string() + ":/usr/bin:/bin");
  }
  std::string Recorder(const std::string& name) {
    const std::string path = (folder_ / "bin" / name).string();
    std::ofstream(path) << "#!/bin/sh\nprintf '%s\\0' \"$@\" > \"$0.tmp\" && mv \"$0.tmp\" \"$0.out\"\n";
    ::chmod(path.c_str(), 0700);
    return path;
  }
  static Argv RecordedArgs(const std::string& path) {
    const auto deadline = std::chrono::steady_clock::now() + kPatience;
    while (!std::filesystem::exists(path + ".out")) {
      if (std::chrono::steady_clock::now() > deadline) return {"<not started>"};
      std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    std::istringstream content(ReadFile(path + ".out"));
    Argv args;
    for (std::string arg; std::getline(content, arg, '\0');) args.push_back(arg);
    return args;
  }
  std::optional<ScopedEnv> path_;
  ScopedEnv browser_{"BROWSER", std::nullopt};
};

TEST_F(Links, TheFirstBrowserCommandThatRunsGetsTheLinkAndNoShellReadsIt) {
  const std::string recorder = Recorder("recorder");
  const std::string link = "http://www.orbishare.com/first?a=1&b=%41 'x' $(touch y);z";
  for (const auto& [browser, expected] : std::vector<std::pair<std::string, Argv>>{
           {recorder, {link}}, {"recorder --new-tab", {"--new-tab", link}},
           {"recorder --url=%s -x", {"--url=" + link, "-x"}}, {"recorder 100%% %s", {"100%", link}},
           {"no-such-browser %s::recorder", {link}}}) {
    std::filesystem::remove(recorder + ".out");
    ScopedEnv env("BROWSER", browser);
    ASSERT_TRUE(platform::OpenLink(std::wstring(link.begin(), link.end())));
    EXPECT_EQ(RecordedArgs(recorder), expected) << browser;
  }
  EXPECT_FALSE(std::filesystem::exists("y")) << "a shell read the link";
}

TEST_F(Links, OnlyWebLinksGoToXdgOpenWhichIsReapedAndNoHandlerIsAFailure) {
  const std::string opener = Recorder("xdg-open");
  for (const wchar_t* link : {L"file:///etc/passwd", L"javascript:alert(1)", L"ftp://h/x", L"", L"http://",
                              L"-http://h", L"httpx://h", L"http://h/\na", L"http://h/\x7F"}) {
    EXPECT_FALSE(platform::OpenLink(link)) << link;
  }
  EXPECT_FALSE(std::filesystem::exists(opener + ".out"));
  ASSERT_TRUE(platform::OpenLink(L"HTTPS://www.orbishare.com/\u00E4"));
  EXPECT_EQ(RecordedArgs(opener), Argv{"HTTPS://www.orbishare.com/\xC3\xA4"});
  // Until no child is left, running or ended but not reaped.
  const auto deadline = std::chrono::steady_clock::now() + kPatience;
  siginfo_t child{};
  int children;
  while ((children = ::waitid(P_ALL, 0, &child, WEXITED | WNOHANG | WNOWAIT)) == 0 &&
         std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(10));
  }
  EXPECT_EQ(children, -1) << "a zombie is left";
  std::filesystem::remove(opener);
  ScopedEnv none("BROWSER", std::string("no-such-browser:also-missing %s"));
  EXPECT_FALSE(platform::OpenLink(L"http://www.orbishare.com/"));
}

// Lines from many threads stay whole; each is appended in UTF-8.
TEST_F(Trace, DebugOutputLinesStayWholeFromManyThreads) {
  std::vector<std::thread> writers;
  for (int t = 0; t < 4; ++t) {
    writers.emplace_back([t] {
      for (int i = 0; i < 200; ++i) {
        platform::WriteDebugOutput(std::to_wstring(t * 1000 + i) + std::wstring(300, L'\u00E4') + L"\n");
      }
    });
  }
  for (auto& w : writers) w.join();
  std::string utf8;
  for (int i = 0; i < 300; ++i) utf8 += "\xC3\xA4";
  std::istringstream lines(ReadFile("out.log"));
  std::set<std::string> seen;
  for (std::string line; std::getline(lines, line); seen.insert(line)) {
    ASSERT_EQ(line.substr(line.size() - 600), utf8);
  }
  EXPECT_EQ(seen.size(), 800u);
}

TEST_F(Trace, AMissingHiveKeepsTheStateAndLongNamesKeepThePrefix) {
  diag::TraceSetPrefix("First");
  std::filesystem::remove("hive.reg");
  diag::TraceSetPrefix("Second");
  diag::TraceMessage(L"still on");
  SetSwitch(1);
  // With its brackets, a name of 29 characters is cut to 29; a longer one is not taken.
  for (const char* name : {"", static_cast<const char*>(nullptr), "ABCDEFGHIJKLMNOPQRSTUVWXYZ012",
                           "ABCDEFGHIJKLMNOPQRSTUVWXYZ0123"}) {
    diag::TraceSetPrefix(name);
    diag::TraceMessage(L"x");
  }
  diag::TraceMessage(L"KRV version = %s; host %S; %d%%", L"5.0 \u00E4", "n\xC3\xA4", 7);
  SetSwitch(0);
  diag::TraceSetPrefix("Third");
  std::filesystem::remove("hive.reg");
  diag::TraceSetPrefix("Fourth");
  diag::TraceMessage(L"still off");
  EXPECT_EQ(ReadFile("out.log"), "[First]still on\n[]x\n[]x\n[ABCDEFGHIJKLMNOPQRSTUVWXYZ01x\n"
                             "[ABCDEFGHIJKLMNOPQRSTUVWXYZ01x\n"
                             "[ABCDEFGHIJKLMNOPQRSTUVWXYZ01KRV version = 5.0 \xC3\xA4; host n\xC3\xA4; 7%\n");
}

}  // namespace
