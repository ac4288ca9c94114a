#include <gtest/gtest.h>

#include <optional>
#include <string>

#include "transport/ChunkPause.h"

namespace {

struct PauseText {
  const char* text;
  std::optional<std::uint32_t> ms;
};

TEST(ChunkPauseSetting, OnlyDecimalMillisecondsUpToOneSecondAreTaken) {
  const PauseText cases[] = {
      {"0", 0},       {"50", 50},        {"1000", 1000},    {"0007", 7},
      {"", {}},       {"1001", {}},      {"-1", {}},        {"+5", {}},
      {" 5", {}},     {"5 ", {}},        {"5ms", {}},       {"0x10", {}},
      {"1e3", {}},    {"2.5", {}},       {"4294967346", {}}, {"99999999999999999999", {}},
  };
  for (const PauseText& c : cases) {
    EXPECT_EQ(ChunkPause::Parse(c.text), c.ms) << '"' << c.text << '"';
  }
}

}  // namespace
