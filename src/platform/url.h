// Splitting an absolute URL into its components, each as written in the URL.
#pragma once

#include <string>
#include <string_view>

namespace platform {

// Every component must fit the system's 260-byte buffers, terminator included.
constexpr std::size_t kUrlComponentCapacity = 260;

struct UrlComponents {
  std::string scheme;    // as written, case kept
  std::string host;
  std::string user;
  std::string password;
  unsigned port = 0;     // written out, or the scheme's default
  std::string path;      // "/" when the URL names none
  std::string extra;     // query and fragment with their leading "?" or "#"
};

// False when the URL cannot be parsed or a component does not fit its buffer.
bool SplitUrl(std::string_view text, UrlComponents* components);

}  // namespace platform
