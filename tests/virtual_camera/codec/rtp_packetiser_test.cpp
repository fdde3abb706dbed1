// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/rtp_packetiser.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/virtual_camera/depacketiser.h"

namespace vexa::camera {
namespace {

using Buffer = std::vector<std::uint8_t>;

// One IDR picture whose only NAL unit has this many bytes.
AccessUnit picture_of(std::size_t size) {
  Buffer bytes{0, 0, 0, 1, 0x65, 0x88};
  for (std::size_t i = 2; i < size; ++i) bytes.push_back(static_cast<std::uint8_t>(1 + i % 255));
  return Clip::from_annex_b(bytes).access_units().at(0);
}

Buffer payload(const PacketisedPicture& picture, std::size_t packet) {
  const auto bytes = picture.payload(packet);
  return {bytes.begin(), bytes.end()};
}

TEST(RtpPacketiser, AUnitThatFitsGoesAsItIs) {
  const PacketisedPicture picture(picture_of(10), 10);
  ASSERT_EQ(picture.packets(), 1U);
  EXPECT_EQ(payload(picture, 0), (Buffer{0x65, 0x88, 3, 4, 5, 6, 7, 8, 9, 10}));
}

TEST(RtpPacketiser, AUnitOneByteTooLongIsFragmented) {
  const PacketisedPicture picture(picture_of(11), 10);
  ASSERT_EQ(picture.packets(), 2U);
  // Indicator: the unit's reference bits and type 28. Headers: start, then end, with the unit's type 5.
  EXPECT_EQ(payload(picture, 0), (Buffer{0x7C, 0x85, 0x88, 3, 4, 5, 6, 7, 8, 9}));
  EXPECT_EQ(payload(picture, 1), (Buffer{0x7C, 0x45, 10, 11}));
}

TEST(RtpPacketiser, MiddleFragmentsCarryNeitherStartNorEnd) {
  const PacketisedPicture picture(picture_of(5), 3);
  ASSERT_EQ(picture.packets(), 4U);
  EXPECT_EQ(payload(picture, 0), (Buffer{0x7C, 0x85, 0x88}));
  EXPECT_EQ(payload(picture, 1), (Buffer{0x7C, 0x05, 3}));
  EXPECT_EQ(payload(picture, 2), (Buffer{0x7C, 0x05, 4}));
  EXPECT_EQ(payload(picture, 3), (Buffer{0x7C, 0x45, 5}));
}

TEST(RtpPacketiser, PayloadsRebuildThePicture) {
  for (std::size_t size = 2; size < 40; ++size) {
    for (std::size_t most = 3; most < 42; ++most) {
      const AccessUnit unit = picture_of(size);
      const PacketisedPicture picture(unit, most);
      Depacketiser receiver;
      for (std::size_t i = 0; i < picture.packets(); ++i) {
        ASSERT_LE(picture.payload(i).size(), most);
        receiver.add(picture.payload(i));
      }
      ASSERT_EQ(receiver.take(), unit.as_delivered()) << size << " in " << most;
    }
  }
}

TEST(RtpPacketiser, ClipsRebuildFromTheirPackets) {
  const struct {
    const char* name;
    std::size_t most;
  } cases[] = {{"small", 100},    {"small", 1400}, {"small", 60000}, {"slices", 100},
               {"slices", 60000}, {"low2m", 1400}, {"hd", 1400}};
  for (const auto& [name, most] : cases) {
    const auto clip = PacketisedClip::load(std::string(VEXA_CLIPS) + "/" + name + ".h264", most);
    ASSERT_TRUE(clip);
    ASSERT_EQ(clip->pictures().size(), clip->clip().access_units().size());
    for (std::size_t i = 0; i < clip->pictures().size(); ++i) {
      Depacketiser receiver;
      const PacketisedPicture& picture = clip->pictures()[i];
      for (std::size_t packet = 0; packet < picture.packets(); ++packet) receiver.add(picture.payload(packet));
      ASSERT_TRUE(receiver.take() == clip->clip().access_units()[i].as_delivered()) << name << " " << i;
    }
  }
}

std::string payload_text(const PacketisedPicture& picture, std::size_t packet) {
  const auto bytes = picture.payload(packet);
  return {bytes.begin(), bytes.end()};
}

std::string with_code(char code, const std::string& rest) { return std::string("\0\0\1", 3) + code + rest; }

TEST(RtpPacketiser, ATextOfH264GoesBeforeTheFirstSlice) {
  const std::string code("\0\0\0\1", 4);
  const auto key = packetise(Codec::kH264, code + "gsps" + code + "hpps" + code + "e\x88idr", "CamPos: 1", 1400);
  ASSERT_TRUE(key);
  ASSERT_EQ(key->packets(), 4U);
  EXPECT_EQ(payload_text(*key, 1), "hpps");
  EXPECT_EQ(payload_text(*key, 2), "\6\5\x19" + std::string(16, 'u') + "CamPos: 1\x80");
  EXPECT_EQ(payload_text(*key, 3), "e\x88idr");
  const auto delta = packetise(Codec::kH264, code + "A\x9apicture", "CamPos: 1", 1400);
  ASSERT_TRUE(delta);
  ASSERT_EQ(delta->packets(), 2U);
  EXPECT_EQ(payload_text(*delta, 1), "A\x9apicture");
}

TEST(RtpPacketiser, ATextOfMpeg4LeavesThePicturesKindAtItsFront) {
  const std::string key = with_code('\xb0', "sequence") + with_code('\xb6', "plane");
  const std::string told = with_code('\xb0', "sequence") + with_code('\xb2', "CamPos: 1") + with_code('\xb6', "plane");
  EXPECT_EQ(payload_text(*packetise(Codec::kMpeg4, key, "CamPos: 1", 1400), 0), told);
  const std::string delta = with_code('\xb6', "plane");
  EXPECT_EQ(payload_text(*packetise(Codec::kMpeg4, delta, "CamPos: 1", 1400), 0),
            with_code('\1', "") + with_code('\xb2', "CamPos: 1") + delta);
  EXPECT_EQ(payload_text(*packetise(Codec::kMpeg4, delta, "", 1400), 0), delta);
}

TEST(RtpPacketiser, WhatRtpCannotCarryIsRefused) {
  EXPECT_FALSE(packetise(Codec::kH264, "no unit", "", 1400));
  EXPECT_FALSE(packetise(Codec::kJpeg, "no picture", "", 1400));
}

TEST(RtpPacketiser, AMissingFileIsNoClip) { EXPECT_EQ(PacketisedClip::load("/nowhere/clip.h264", 1400), nullptr); }

}  // namespace
}  // namespace vexa::camera
