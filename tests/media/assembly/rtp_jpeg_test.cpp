// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/rtp_pictures.h"

#include <gtest/gtest.h>

#include <string>

#include "tests/media/assembly/packet_bytes.h"
#include "tests/support/fenced_bytes.h"

namespace vexa::test {
namespace {

constexpr std::size_t kJfif = 605;
constexpr std::size_t kRestartSegment = 6;

struct FirstPacket {
  unsigned char type = 1;
  unsigned char q = 50;
  unsigned char width = 40;
  unsigned char height = 30;
  Payload rest = {};  ///< restart header, tables and scan data
};

Payload payload_of_first(const FirstPacket& first) {
  Payload payload = {0, 0, 0, 0, first.type, first.q, first.width, first.height};
  payload.insert(payload.end(), first.rest.begin(), first.rest.end());
  return payload;
}

/// What begin_jfif makes of the payload; nothing when it refuses.
std::optional<Payload> begun(const Payload& payload, std::size_t room = kJpegFirstPacketRoom) {
  const vexa_test::FencedBytes in(payload);
  const vexa_test::FencedBytes out(Payload(room, 0xee));
  const auto length = begin_jfif(out.bytes(), in.bytes());
  if (!length) return std::nullopt;
  return Payload(out.data(), out.data() + *length);
}

Payload scan_of(const Payload& jfif, std::size_t header) {
  return {jfif.begin() + static_cast<std::ptrdiff_t>(header), jfif.end()};
}

Payload joined(Payload a, const Payload& b) {
  a.insert(a.end(), b.begin(), b.end());
  return a;
}

TEST(RtpJpeg, TypesFrom64To127CarryARestartInterval) {
  for (int type = 0; type < 256; ++type) {
    const bool restart = type >= 64 && type <= 127;
    const auto jfif =
        begun(payload_of_first({.type = static_cast<unsigned char>(type), .rest = {0x12, 0x34, 9, 8, 7}}));
    ASSERT_TRUE(jfif) << type;
    EXPECT_EQ((*jfif)[141], restart ? 0xdd : 0xc0) << type;
    EXPECT_EQ(scan_of(*jfif, restart ? kJfif + kRestartSegment : kJfif),
              restart ? (Payload{7}) : (Payload{0x12, 0x34, 9, 8, 7}))
        << type;
    if (!restart) continue;
    EXPECT_EQ((*jfif)[144] << 8 | (*jfif)[145], 0x1234) << type;
  }
}

TEST(RtpJpeg, ARestartIntervalOfZeroIsLeftOut) {
  const auto jfif = begun(payload_of_first({.type = 64, .rest = {0, 0, 0xff, 0xff, 7}}));
  ASSERT_TRUE(jfif);
  EXPECT_EQ(scan_of(*jfif, kJfif), Payload{7});
}

TEST(RtpJpeg, QualityBelow128ScalesTheTables) {
  for (const auto& [q, third] : {std::pair{0, 255}, {1, 255}, {10, 50}, {50, 10}, {99, 1}, {100, 1}, {127, 1}}) {
    const auto jfif = begun(payload_of_first({.q = static_cast<unsigned char>(q), .rest = {7}}));
    ASSERT_TRUE(jfif) << q;
    EXPECT_EQ((*jfif)[9], third) << q;
    EXPECT_EQ(scan_of(*jfif, kJfif), Payload{7}) << q;
  }
}

Payload tables_of_length(unsigned length) {
  Payload tables = {0xaa, 0xbb, static_cast<unsigned char>(length >> 8), static_cast<unsigned char>(length)};
  for (int i = 0; i < 128; ++i) tables.push_back(static_cast<unsigned char>(100 + i));
  return tables;
}

TEST(RtpJpeg, QualityFrom128OnTakesTheTablesInBand) {
  for (const int q : {128, 129, 200, 254, 255}) {
    const auto jfif =
        begun(payload_of_first({.q = static_cast<unsigned char>(q), .rest = joined(tables_of_length(128), {7, 8})}));
    ASSERT_TRUE(jfif) << q;
    for (std::size_t i = 0; i < 64; ++i) {
      ASSERT_EQ((*jfif)[7 + i], 100 + i);
      ASSERT_EQ((*jfif)[76 + i], 164 + i);
    }
    EXPECT_EQ(scan_of(*jfif, kJfif), (Payload{7, 8})) << q;
  }
}

TEST(RtpJpeg, TablesInBandFollowTheRestartHeader) {
  const auto jfif = begun(
      payload_of_first({.type = 65, .q = 255, .rest = joined(joined({0, 9, 0xff, 0xff}, tables_of_length(128)), {7})}));
  ASSERT_TRUE(jfif);
  EXPECT_EQ((*jfif)[7], 100);
  EXPECT_EQ((*jfif)[145], 9);
  EXPECT_EQ(scan_of(*jfif, kJfif + kRestartSegment), Payload{7});
}

TEST(RtpJpeg, OfTheTablesLengthTheLowByteMustBe128) {
  for (const auto& [length, taken] : {std::pair{0u, false},
                                      {64u, false},
                                      {127u, false},
                                      {128u, true},
                                      {129u, false},
                                      {255u, false},
                                      {256u, false},
                                      {384u, true},
                                      {65408u, true},
                                      {65535u, false}}) {
    EXPECT_EQ(begun(payload_of_first({.q = 255, .rest = tables_of_length(length)})).has_value(), taken) << length;
  }
}

TEST(RtpJpeg, EveryTypeIsTakenForHalvedChrominanceBothWays) {
  for (const int type : {0, 1, 63, 128, 255}) {
    const auto jfif = begun(payload_of_first({.type = static_cast<unsigned char>(type), .rest = {7}}));
    ASSERT_TRUE(jfif) << type;
    EXPECT_EQ(Payload(jfif->begin() + 149, jfif->begin() + 159), (Payload{3, 0, 0x22, 0, 1, 0x11, 1, 2, 0x11, 1}))
        << type;
  }
}

TEST(RtpJpeg, SizesGoThroughAsTheyAre) {
  for (const int side : {0, 1, 255}) {
    const auto edge = static_cast<unsigned char>(side);
    const auto jfif = begun(payload_of_first({.width = edge, .height = edge, .rest = {7}}));
    ASSERT_TRUE(jfif) << side;
    EXPECT_EQ((*jfif)[145] << 8 | (*jfif)[146], side * 8);
    EXPECT_EQ((*jfif)[147] << 8 | (*jfif)[148], side * 8);
  }
}

TEST(RtpJpeg, AHeaderCutAnywhereIsRefused) {
  const struct {
    FirstPacket first;
    std::size_t header;
  } cases[] = {
      {{.rest = {7}}, 8},
      {{.type = 64, .rest = {0, 1, 0, 0, 7}}, 12},
      {{.q = 128, .rest = joined(tables_of_length(128), {7})}, 140},
      {{.type = 127, .q = 255, .rest = joined({0, 1, 0, 0}, joined(tables_of_length(128), {7}))}, 144},
  };
  for (const auto& c : cases) {
    const Payload whole = payload_of_first(c.first);
    for (std::size_t length = 0; length <= whole.size(); ++length) {
      const Payload cut(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length));
      EXPECT_EQ(begun(cut).has_value(), length >= c.header) << c.header << " cut to " << length;
    }
  }
}

TEST(RtpJpeg, UserDataOf168BytesComesBeforeTheHeader) {
  Payload block(168, 'x');
  block[0] = 0xff;
  block[1] = 0xd8;
  const Payload whole = joined(block, payload_of_first({.rest = {7, 8}}));
  EXPECT_TRUE(leads_with_user_data(whole));
  const auto jfif = begun(whole);
  ASSERT_TRUE(jfif);
  EXPECT_EQ(*jfif, *begun(payload_of_first({.rest = {7, 8}})));
  for (std::size_t length = 2; length < 176; ++length) {
    EXPECT_FALSE(begun(Payload(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length)))) << length;
  }
}

TEST(RtpJpeg, UserDataIsRecognisedByItsFirstTwoBytes) {
  EXPECT_FALSE(leads_with_user_data(Payload{}));
  EXPECT_FALSE(leads_with_user_data(Payload{0xff}));
  EXPECT_FALSE(leads_with_user_data(Payload{0xff, 0xd9}));
  EXPECT_FALSE(leads_with_user_data(Payload{0xd8, 0xff}));
  EXPECT_TRUE(leads_with_user_data(Payload{0xff, 0xd8}));
}

TEST(RtpJpeg, TheBeginningMayFillItsRoomAndNotMore) {
  const std::size_t most = kJpegFirstPacketRoom - kJfif;
  EXPECT_EQ(begun(payload_of_first({.rest = Payload(most, 7)}))->size(), kJpegFirstPacketRoom);
  EXPECT_FALSE(begun(payload_of_first({.rest = Payload(most + 1, 7)})));
  EXPECT_FALSE(begun(payload_of_first({.rest = {7}}), 100));
}

AssembledPicture assembled_jpeg(const std::vector<Payload>& others, Payload& frame) {
  const Payload beginning = {1, 2, 3};
  const AssembledPicture picture = assemble_jpeg(beginning, Packets(others), frame);
  frame.resize(picture.length);
  return picture;
}

TEST(RtpJpeg, FurtherPacketsAddWhatFollowsTheirHeader) {
  struct {
    const char* what;
    Payload payload;
    Payload added;
  } const cases[] = {
      {"type 1", {0, 0, 1, 0, 1, 50, 40, 30, 9, 8}, {9, 8}},
      {"type 63", {0, 0, 1, 0, 63, 50, 40, 30, 9, 8, 7, 6, 5}, {9, 8, 7, 6, 5}},
      {"type 64", {0, 0, 1, 0, 64, 50, 40, 30, 0, 1, 0, 0, 9}, {9}},
      {"type 127", {0, 0, 1, 0, 127, 50, 40, 30, 0, 1, 0, 0, 9}, {9}},
      {"type 128", {0, 0, 1, 0, 128, 50, 40, 30, 9, 8, 7, 6, 5}, {9, 8, 7, 6, 5}},
      {"type 64 in a packet of 23 bytes", {0, 0, 1, 0, 64, 50, 40, 30, 9, 8, 7}, {9, 8, 7}},
      {"type 64 in a packet of 24 bytes", {0, 0, 1, 0, 64, 50, 40, 30, 9, 8, 7, 6}, {}},
      {"Q of 255 has no tables here", {0, 0, 1, 0, 1, 255, 40, 30, 0, 0, 0, 128}, {0, 0, 0, 128}},
      {"a header alone", {0, 0, 1, 0, 1, 50, 40, 30}, {}},
      {"a part of a header", {0, 0, 1, 0, 64}, {}},
      {"nothing", {}, {}},
      {"what looks like user data", {0xff, 0xd8, 1, 0, 1, 50, 40, 30, 9}, {9}},
  };
  for (const auto& c : cases) {
    Payload frame(64);
    const AssembledPicture picture = assembled_jpeg({c.payload}, frame);
    EXPECT_EQ(picture.outcome, Assembly::kWhole) << c.what;
    EXPECT_EQ(picture.frame_type, VIDEO_FRAME_JPEG) << c.what;
    EXPECT_EQ(frame, joined({1, 2, 3}, c.added)) << c.what;
  }
}

TEST(RtpJpeg, AFurtherPacketTooShortForARestartHeaderIsReadWithTheShorterOne) {
  for (std::size_t scan = 1; scan < 8; ++scan) {
    Payload payload = {0, 0, 1, 0, 64, 50, 40, 30};
    for (std::size_t i = 0; i < scan; ++i) payload.push_back(static_cast<unsigned char>(9 + i));
    Payload frame(64);
    assembled_jpeg({payload}, frame);
    EXPECT_EQ(frame.size(), 3 + (scan < 4 ? scan : scan - 4)) << scan;
  }
}

TEST(RtpJpeg, APictureMayFillItsFrameAndNotMore) {
  const Payload further = {0, 0, 1, 0, 1, 50, 40, 30, 9, 8, 7};
  for (const auto& [capacity, outcome] : {std::pair{2u, Assembly::kTooLarge},
                                          {5u, Assembly::kTooLarge},
                                          {6u, Assembly::kWhole},
                                          {7u, Assembly::kWhole}}) {
    Payload frame(capacity);
    EXPECT_EQ(assembled_jpeg({further}, frame).outcome, outcome) << capacity;
  }
}

TEST(JpegRules, EveryPictureOfPayloadType26IsAKeyPicture) {
  EXPECT_EQ(kJpegRules.payload_type, 26);
  EXPECT_TRUE(kJpegRules.is_key(Packets({Payload{}})));
  EXPECT_FALSE(kJpegRules.is_preamble(Packets({payload_of_first({})}).front()));
}

TEST(JpegRules, APictureThatOpensAtOffsetZeroIsWholeAtItsFront) {
  Payload block(168, 'x');
  block[0] = 0xff;
  block[1] = 0xd8;
  const Payload begins = {1, 0, 0, 0, 1, 50, 40, 30};
  for (const Payload& first : {begins, joined(block, begins)}) {
    EXPECT_TRUE(kJpegRules.opens_whole(Packets({first}), false));
    EXPECT_EQ(kJpegRules.opening(Packets({first}).front()), 1);
  }
  for (const std::size_t place : {1u, 2u, 3u}) {
    Payload later = begins;
    later[place] = 1;
    EXPECT_FALSE(kJpegRules.opens_whole(Packets({later}), true)) << place;
    EXPECT_EQ(kJpegRules.opening(Packets({later}).front()), 2) << place;
  }
}

}  // namespace
}  // namespace vexa::test
