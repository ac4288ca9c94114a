// Every time limit of an HTTP exchange, in one place. The reachability probe keeps
// its own 5.5 s (service/reachability.cc) and is given none of the exchange limits.
#pragma once

#include <chrono>

namespace platform::http {

// To connect (name resolution included).
inline constexpr std::chrono::seconds kConnectLimit{60};
// A transfer that moves no byte (below 1 byte a second) for this long is given up;
// a body waiting for its next piece is exempt.
inline constexpr std::chrono::seconds kStallLimit{60};
// An exchange whose body is known whole (a service request): from its start to
// the last byte of the reply.
inline constexpr std::chrono::seconds kExchangeLimit{30};
// An exchange whose body is written piece by piece (the upload): from the last
// body byte to the last byte of the reply.
inline constexpr std::chrono::seconds kReplyLimit{30};
// The longest a running transfer waits before it looks again at whether it is
// to stop, so that a cancel needs no wake-up to be seen promptly.
inline constexpr std::chrono::milliseconds kStopPollInterval{50};

}  // namespace platform::http
