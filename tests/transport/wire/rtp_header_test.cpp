#include "transport/wire/rtp_header.h"

#include <gtest/gtest.h>

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

}  // namespace
}  // namespace vexa::test
