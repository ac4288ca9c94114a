#include "platform/shell.h"

#include <signal.h>
#include <spawn.h>
#include <sys/types.h>
#include <sys/wait.h>

#include <cstdlib>
#include <string>
#include <thread>
#include <vector>

#include "platform/ascii.h"
#include "platform/text.h"

extern char** environ;

namespace platform {
namespace {

constexpr std::string_view kSchemes[] = {"http://", "https://"};
constexpr char kFallbackOpener[] = "xdg-open";

bool IsWebLink(std::string_view link) {
  for (char c : link) {
    if (static_cast<unsigned char>(c) < 0x20 || c == 0x7F) return false;
  }
  for (std::string_view scheme : kSchemes) {
    if (link.size() > scheme.size() && platform::StartsWithIgnoringCase(link, scheme)) return true;
  }
  return false;
}

std::vector<std::string> Split(std::string_view text, std::string_view separators) {
  std::vector<std::string> parts;
  size_t start = 0;
  while (start <= text.size()) {
    size_t end = text.find_first_of(separators, start);
    if (end == std::string_view::npos) end = text.size();
    if (end > start) parts.emplace_back(text.substr(start, end - start));
    start = end + 1;
  }
  return parts;
}

// Expands "%s" to the link and "%%" to "%" in one word; notes whether "%s" was there.
std::string ExpandWord(const std::string& word, const std::string& link, bool& used_link) {
  std::string out;
  for (size_t i = 0; i < word.size(); ++i) {
    if (word[i] == '%' && i + 1 < word.size() && (word[i + 1] == 's' || word[i + 1] == '%')) {
      used_link |= word[i + 1] == 's';
      out += word[i + 1] == 's' ? link : "%";
      ++i;
    } else {
      out += word[i];
    }
  }
  return out;
}

std::vector<std::string> CommandLine(const std::string& command, const std::string& link) {
  std::vector<std::string> argv;
  bool used_link = false;
  for (const std::string& word : Split(command, " \t")) {
    argv.push_back(ExpandWord(word, link, used_link));
  }
  if (!argv.empty() && !used_link) argv.push_back(link);
  return argv;
}

// Spawn attributes that give the handler default signal handling and an empty
// signal mask, whatever the embedding process (an interpreter) has set.
class SpawnAttributes {
 public:
  SpawnAttributes() {
    posix_spawnattr_init(&attributes_);
    sigset_t all, none;
    sigfillset(&all);
    sigemptyset(&none);
    posix_spawnattr_setsigdefault(&attributes_, &all);
    posix_spawnattr_setsigmask(&attributes_, &none);
    posix_spawnattr_setflags(&attributes_, POSIX_SPAWN_SETSIGDEF | POSIX_SPAWN_SETSIGMASK);
  }
  ~SpawnAttributes() { posix_spawnattr_destroy(&attributes_); }
  SpawnAttributes(const SpawnAttributes&) = delete;
  SpawnAttributes& operator=(const SpawnAttributes&) = delete;

  const posix_spawnattr_t* get() const { return &attributes_; }

 private:
  posix_spawnattr_t attributes_;
};

// Starts argv[0] found on PATH; a thread reaps it when it ends.
bool Spawn(const std::vector<std::string>& argv) {
  if (argv.empty()) return false;
  std::vector<char*> pointers;
  for (const std::string& word : argv) pointers.push_back(const_cast<char*>(word.c_str()));
  pointers.push_back(nullptr);
  const SpawnAttributes attributes;
  pid_t pid = 0;
  if (posix_spawnp(&pid, pointers[0], nullptr, attributes.get(), pointers.data(), environ) != 0) {
    return false;
  }
  std::thread([pid] { waitpid(pid, nullptr, 0); }).detach();
  return true;
}

}  // namespace

bool OpenLink(std::wstring_view wide_link) {
  const std::string link = platform::WideToUtf8(wide_link);
  if (!IsWebLink(link)) return false;
  if (const char* browsers = std::getenv("BROWSER")) {
    for (const std::string& command : Split(browsers, ":")) {
      if (Spawn(CommandLine(command, link))) return true;
    }
  }
  return Spawn({kFallbackOpener, link});
}

}  // namespace platform
