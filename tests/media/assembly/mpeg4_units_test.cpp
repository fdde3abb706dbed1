// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/rtp_pictures.h"

#include <gtest/gtest.h>

#include "tests/media/assembly/packet_bytes.h"

namespace vexa::test {
namespace {

AssembledPicture assembled_mpeg4(const std::vector<Payload>& payloads, Payload& frame) {
  const Packets packets(payloads);
  const AssembledPicture picture = assemble_mpeg4(packets, frame);
  frame.resize(picture.length);
  return picture;
}

TEST(Mpeg4Units, PayloadsAreJoinedAsTheyAre) {
  Payload frame(64);
  const AssembledPicture picture = assembled_mpeg4({{0, 0, 1, 0xb6, 7}, {}, {8}, {0, 0, 1}}, frame);
  EXPECT_EQ(picture.outcome, Assembly::kWhole);
  EXPECT_EQ(frame, (Payload{0, 0, 1, 0xb6, 7, 8, 0, 0, 1}));
}

TEST(Mpeg4Units, TheFourthByteGivesTheType) {
  for (int code = 0; code < 256; ++code) {
    std::int32_t type = -1;
    if (code == 0x01 || code == 0xb6) type = 11;
    if (code == 0xb0 || code == 0xb3) type = 10;
    Payload frame(64);
    EXPECT_EQ(assembled_mpeg4({{0, 0, 1, static_cast<unsigned char>(code), 9}}, frame).frame_type, type) << code;
    frame.resize(64);
    EXPECT_EQ(assembled_mpeg4({{7, 7, 7, static_cast<unsigned char>(code)}}, frame).frame_type, type) << code;
  }
}

TEST(Mpeg4Units, TheFourthByteMayComeInAnyPacket) {
  const std::vector<Payload> cases[] = {
      {{0, 0, 1, 0xb0}}, {{0, 0, 1}, {0xb0}}, {{0}, {0, 1, 0xb0}}, {{}, {0, 0}, {}, {1}, {0xb0, 0xb6}}};
  for (const std::vector<Payload>& payloads : cases) {
    Payload frame(64);
    EXPECT_EQ(assembled_mpeg4(payloads, frame).frame_type, 10);
    EXPECT_TRUE(kMpeg4Rules.is_key(Packets(payloads)));
  }
}

TEST(Mpeg4Units, APictureBelowFourBytesHasNoType) {
  const std::vector<Payload> cases[] = {{{}}, {{0}}, {{0, 0, 1}}, {{0, 0}, {1}}};
  for (const std::vector<Payload>& payloads : cases) {
    Payload frame(64);
    EXPECT_EQ(assembled_mpeg4(payloads, frame).frame_type, -1);
  }
}

TEST(Mpeg4Units, APictureMayFillItsFrameAndNotMore) {
  for (const auto& [capacity, outcome] : {std::pair{6u, Assembly::kTooLarge}, {7u, Assembly::kWhole}}) {
    Payload frame(capacity);
    EXPECT_EQ(assembled_mpeg4({{0, 0, 1, 0xb6}, {1, 2, 3}}, frame).outcome, outcome) << capacity;
  }
}

TEST(Mpeg4Units, EveryPictureCutAtEachLengthIsJoined) {
  const Payload whole = {0, 0, 1, 0xb0, 1, 0, 0, 1, 0xb5, 9};
  for (std::size_t first = 0; first <= whole.size(); ++first) {
    for (std::size_t end = first; end <= whole.size(); ++end) {
      const auto at = [&whole](std::size_t place) { return whole.begin() + static_cast<std::ptrdiff_t>(place); };
      Payload frame(64);
      const AssembledPicture picture = assembled_mpeg4({{at(0), at(first)}, {at(first), at(end)}}, frame);
      EXPECT_EQ(frame, Payload(at(0), at(end)));
      EXPECT_EQ(picture.frame_type, end > 3 ? 10 : -1);
    }
  }
}

TEST(Mpeg4Rules, OnlyAPictureLedByASequenceOrAGroupIsAKeyPicture) {
  for (const auto& [code, key] : {std::pair{0xb0, true}, {0xb3, true}, {0xb6, false}, {0x01, false}, {0xb2, false}}) {
    EXPECT_EQ(kMpeg4Rules.is_key(Packets({{0, 0, 1, static_cast<unsigned char>(code)}})), key) << code;
  }
}

TEST(Mpeg4Rules, APictureOpensWithTheStartCodeThatItBeginsWith) {
  EXPECT_EQ(kMpeg4Rules.opening(Packets({{0, 0, 1, 0xb3}}).front()), 0xb3);
  EXPECT_EQ(kMpeg4Rules.opening(Packets({{0, 0, 2, 0xb3}}).front()), 0);
  EXPECT_EQ(kMpeg4Rules.opening(Packets({{0, 0, 1}}).front()), 0);
  EXPECT_EQ(kMpeg4Rules.opening(Packets({Payload{}}).front()), 0);
}

TEST(Mpeg4Rules, AGroupIsWholeAtItsFrontUnlessTheCameraSendsSequenceHeaders) {
  const Packets sequence({{0, 0, 1, 0xb0, 1}});
  const Packets group({{0, 0, 1, 0xb3, 1}});
  const Packets picture({{0, 0, 1, 0xb6, 1}});
  EXPECT_TRUE(kMpeg4Rules.is_preamble(sequence.front()));
  EXPECT_FALSE(kMpeg4Rules.is_preamble(group.front()));
  EXPECT_TRUE(kMpeg4Rules.opens_whole(sequence, true));
  EXPECT_TRUE(kMpeg4Rules.opens_whole(sequence, false));
  EXPECT_FALSE(kMpeg4Rules.opens_whole(group, true));
  EXPECT_TRUE(kMpeg4Rules.opens_whole(group, false));
  EXPECT_FALSE(kMpeg4Rules.opens_whole(picture, false));
}

}  // namespace
}  // namespace vexa::test
