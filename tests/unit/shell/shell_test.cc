#include "platform/shell.h"

#include <dirent.h>
#include <stdlib.h>
#include <sys/stat.h>
#include <unistd.h>

#include <gtest/gtest.h>

#include <chrono>
#include <filesystem>
#include <fstream>
#include <optional>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "support/temp_folder.h"
#include "support/trace_capture.h"

namespace {

using Argv = std::vector<std::string>;

constexpr auto kPatience = std::chrono::seconds(20);  // only bounds a hang
constexpr auto kPoll = std::chrono::milliseconds(10);

// Writes its arguments, NUL-separated, to "<its own path>.out" in one rename.
constexpr char kRecorder[] =
    "#!/bin/sh\nprintf '%s\\0' \"$@\" > \"$0.tmp\" && mv \"$0.tmp\" \"$0.out\"\n";

// A temporary working folder with recorder scripts in bin/, which alone is on
// PATH besides the system folders; BROWSER is unset.
class LinkOpening : public test_support::TempFolderTest {
 protected:
  void SetUp() override {
    TempFolderTest::SetUp();
    dir_ = std::filesystem::current_path().string();
    std::filesystem::create_directory("bin");
    path_.emplace("PATH", dir_ + "/bin:/usr/bin:/bin");
  }

  // A recorder script on PATH under this name; returns its full path.
  std::string Recorder(const std::string& name) {
    const std::string path = dir_ + "/bin/" + name;
    std::ofstream(path) << kRecorder;
    chmod(path.c_str(), 0700);
    return path;
  }

  // The arguments the recorder at `path` was started with (waits for them).
  static Argv RecordedArgs(const std::string& path) {
    const auto deadline = std::chrono::steady_clock::now() + kPatience;
    while (access((path + ".out").c_str(), F_OK) != 0) {
      if (std::chrono::steady_clock::now() > deadline) return {"<not started>"};
      std::this_thread::sleep_for(kPoll);
    }
    std::ifstream in(path + ".out");
    std::stringstream content;
    content << in.rdbuf();
    Argv args;
    std::string arg;
    while (std::getline(content, arg, '\0')) args.push_back(arg);
    return args;
  }

  std::string dir_;
  std::optional<test_support::ScopedEnv> path_;
  test_support::ScopedEnv browser_{"BROWSER", std::nullopt};
};

struct BrowserCase {
  const char* what;
  std::string browser;  // "R" stands for the recorder's path
  Argv expected;        // "L" stands for the link
};

void PrintTo(const BrowserCase& c, std::ostream* os) { *os << c.what; }

class BrowserCommands : public LinkOpening, public ::testing::WithParamInterface<BrowserCase> {};

std::string Substitute(std::string text, const std::string& from, const std::string& to) {
  for (size_t at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size())) {
    text.replace(at, from.size(), to);
  }
  return text;
}

TEST_P(BrowserCommands, StartTheFirstCommandThatCanRunWithTheLink) {
  const std::string recorder = Recorder("recorder");
  const std::string link = "http://www.orbishare.com/first?a=1&b=%41 'x' $(touch y);z";
  setenv("BROWSER", Substitute(GetParam().browser, "R", recorder).c_str(), 1);
  ASSERT_TRUE(shell::OpenLink(std::wstring(link.begin(), link.end())));
  Argv expected;
  for (const std::string& arg : GetParam().expected) expected.push_back(Substitute(arg, "L", link));
  EXPECT_EQ(RecordedArgs(recorder), expected);
  EXPECT_NE(access("y", F_OK), 0) << "a shell read the link";
}

INSTANTIATE_TEST_SUITE_P(
    Cases, BrowserCommands,
    ::testing::Values(BrowserCase{"link appended", "R", {"L"}},
                      BrowserCase{"found on PATH", "recorder --new-tab", {"--new-tab", "L"}},
                      BrowserCase{"placeholder replaced", "R --url=%s -x", {"--url=L", "-x"}},
                      BrowserCase{"percent kept", "R 100%% %s", {"100%", "L"}},
                      BrowserCase{"first that runs wins", "no-such-browser %s::R", {"L"}}));

TEST_F(LinkOpening, FallsBackToXdgOpen) {
  const std::string opener = Recorder("xdg-open");
  ASSERT_TRUE(shell::OpenLink(L"HTTPS://www.orbishare.com/\u00E4"));
  EXPECT_EQ(RecordedArgs(opener), Argv{"HTTPS://www.orbishare.com/\xC3\xA4"});
}

TEST_F(LinkOpening, RefusesLinksThatAreNotWebLinks) {
  const std::string opener = Recorder("xdg-open");
  for (const wchar_t* link : {L"file:///etc/passwd", L"javascript:alert(1)", L"ftp://h/x",
                              L"mailto:a@b", L"", L"http://", L"-http://h", L"httpx://h",
                              L"http://h/\na", L"http://h/\x7F"}) {
    EXPECT_FALSE(shell::OpenLink(link)) << link;
  }
  EXPECT_NE(access((opener + ".out").c_str(), F_OK), 0);
}

TEST_F(LinkOpening, ReportsWhenNoHandlerCanStart) {
  setenv("BROWSER", "no-such-browser:also-missing %s", 1);
  EXPECT_FALSE(shell::OpenLink(L"http://www.orbishare.com/"));
}

// Children of this process, running or zombie (from /proc/<pid>/stat).
int ChildProcesses() {
  int children = 0;
  DIR* proc = opendir("/proc");
  while (dirent* entry = readdir(proc)) {
    std::ifstream stat(std::string("/proc/") + entry->d_name + "/stat");
    std::string line;
    if (!std::getline(stat, line)) continue;
    std::istringstream fields(line.substr(line.rfind(')') + 2));
    char state = 0;
    int parent = 0;
    fields >> state >> parent;
    children += parent == getpid();
  }
  closedir(proc);
  return children;
}

// A started handler ends on its own; only one never reaped stays (as a zombie).
TEST_F(LinkOpening, LeavesNoZombieBehind) {
  const std::string opener = Recorder("xdg-open");
  ASSERT_TRUE(shell::OpenLink(L"http://www.orbishare.com/"));
  RecordedArgs(opener);
  const auto deadline = std::chrono::steady_clock::now() + kPatience;
  while (ChildProcesses() > 0 && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(kPoll);
  }
  EXPECT_EQ(ChildProcesses(), 0);
}

}  // namespace
