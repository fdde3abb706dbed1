// SPDX-License-Identifier: Apache-2.0
#include "transport/wire/rtp_header.h"

#include <gtest/gtest.h>

#include <vector>

namespace vexa::test {
namespace {

constexpr unsigned char kDatagram[] = {0x80, 0xe0, 0x12, 0x34, 0x89, 0xab, 0xcd, 0xef, 1, 2, 3, 4, 0x65};

TEST(RtpHeader, ReadsMarkerTypeSequenceAndTimestampInHostOrder) {
  const auto header = parse_rtp_header(kDatagram);
  ASSERT_TRUE(header.has_value());
  EXPECT_TRUE(header->marker);
  EXPECT_EQ(header->payload_type, 96);
  EXPECT_EQ(header->sequence, 0x1234);
  EXPECT_EQ(header->timestamp, 0x89abcdefu);
}

TEST(RtpHeader, IsReadFrom12BytesOnAndNotFromFewer) {
  for (std::size_t length = 0; length <= sizeof kDatagram; ++length) {
    EXPECT_EQ(parse_rtp_header(Bytes(kDatagram, length)).has_value(), length >= 12) << length;
  }
}

TEST(RtpHeader, TakesNoNoticeOfVersionPaddingExtensionAndSources) {
  for (const int first : {0x00, 0x40, 0x80, 0xbf, 0xff}) {
    unsigned char datagram[12] = {static_cast<unsigned char>(first), 0x60, 0, 7, 0, 0, 0, 9};
    const auto header = parse_rtp_header(datagram);
    ASSERT_TRUE(header.has_value());
    EXPECT_FALSE(header->marker);
    EXPECT_EQ(header->sequence, 7);
    EXPECT_EQ(header->timestamp, 9u);
  }
}

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
}  // namespace vexa::test
