#include "transport/wire/interleaved.h"

#include <gtest/gtest.h>

#include <vector>

namespace vexa {
namespace {

TEST(Interleaved, ReportsThePacketsLengthWhateverTheChannel) {
  using Prefix = std::vector<unsigned char>;
  EXPECT_EQ(interleaved_length(Prefix{'$', 0, 0x01, 0x02}), 0x0102);
  EXPECT_EQ(interleaved_length(Prefix{'$', 1, 0xff, 0xff}), 65535);
  EXPECT_EQ(interleaved_length(Prefix{'$', 255, 0, 0}), 0);
  EXPECT_EQ(interleaved_length(Prefix{'%', 0, 0, 1}), std::nullopt);
  EXPECT_EQ(interleaved_length(Prefix{'$', 0, 0}), std::nullopt);
  EXPECT_EQ(interleaved_length(Prefix{}), std::nullopt);
}

TEST(Interleaved, ReportsVersionAndSourcesFromTheFirstByte) {
  const struct {
    std::uint8_t first;
    int version;
    std::size_t csrc_bytes;
  } cases[] = {{0x80, 2, 0}, {0xb0, 2, 0}, {0x8f, 2, 60}, {0x81, 2, 4}, {0x00, 0, 0}, {0x40, 1, 0}, {0xff, 3, 60}};
  for (const auto& c : cases) {
    EXPECT_EQ(rtp_front(c.first).version, c.version) << int{c.first};
    EXPECT_EQ(rtp_front(c.first).csrc_bytes, c.csrc_bytes) << int{c.first};
  }
}

TEST(Interleaved, LeavesThePayloadAfterHeaderAndSources) {
  const struct {
    std::uint16_t length;
    std::size_t csrc_bytes;
    std::optional<std::size_t> payload;
  } cases[] = {{12, 0, 0},  {13, 0, 1}, {65535, 0, 65523},     {11, 0, std::nullopt}, {0, 0, std::nullopt},
               {72, 60, 0}, {16, 4, 0}, {15, 4, std::nullopt}, {71, 60, std::nullopt}};
  for (const auto& c : cases) EXPECT_EQ(interleaved_payload(c.length, {2, c.csrc_bytes}), c.payload) << c.length;
}

}  // namespace
}  // namespace vexa
