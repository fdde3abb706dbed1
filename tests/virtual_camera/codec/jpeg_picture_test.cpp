// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/jpeg_picture.h"

#include <gtest/gtest.h>

#include <string>

#include "virtual_camera/codec/image_clip.h"
#include "virtual_camera/codec/rtp_packetiser.h"

namespace vexa::camera {
namespace {

using JpegFile = std::vector<std::uint8_t>;

JpegFile first_picture(const std::string& clip) {
  const auto images = ImageClip::load(std::string(VEXA_CLIPS) + "/" + clip + ".mjpeg");
  if (!images) return {};
  return {images->pictures().front().begin(), images->pictures().front().end()};
}

TEST(ReadJpeg, TakesAPictureApart) {
  const struct {
    const char* clip;
    unsigned restart_interval;
  } cases[] = {{"plain", 0}, {"restart", 3}, {"sliced", 20}};
  for (const auto& c : cases) {
    const auto jpeg = read_jpeg(first_picture(c.clip));
    ASSERT_TRUE(jpeg) << c.clip;
    EXPECT_EQ(jpeg->width, 320U);
    EXPECT_EQ(jpeg->height, 240U);
    EXPECT_EQ(jpeg->restart_interval, c.restart_interval) << c.clip;
    EXPECT_EQ(jpeg->huffman.size(), 4U);
    ASSERT_GT(jpeg->scan.size(), 1000U);
    EXPECT_EQ(jpeg->scan.back(), 0xD9);
  }
}

TEST(ReadJpeg, RefusesAPictureCutInFrontOfItsScan) {
  const JpegFile whole = first_picture("plain");
  const std::size_t scan = whole.size() - read_jpeg(whole)->scan.size();
  for (std::size_t length = 0; length < scan; ++length) {
    EXPECT_FALSE(read_jpeg(std::span(whole).first(length))) << length;
  }
  EXPECT_TRUE(read_jpeg(std::span(whole).first(scan)));
}

TEST(ReadJpeg, RefusesHuffmanTablesOfThePicturesOwn) { EXPECT_FALSE(read_jpeg(first_picture("small"))); }

JpegPicture drawn(std::uint16_t restart_interval, std::size_t scan) {
  JpegPicture picture;
  picture.width = 640;
  picture.height = 480;
  picture.restart_interval = restart_interval;
  picture.tables.fill(9);
  picture.scan.assign(scan, 7);
  return picture;
}

JpegFile jpeg_payload(const PacketisedPicture& packets, std::size_t packet) {
  const auto bytes = packets.payload(packet);
  return {bytes.begin(), bytes.end()};
}

TEST(PacketiseJpeg, PutsTheTablesIntoTheFirstPacketAlone) {
  const PacketisedPicture packets = packetise_jpeg(drawn(0, 400), {}, 200);
  ASSERT_EQ(packets.packets(), 3U);
  JpegFile first = {0, 0, 0, 0, 1, 255, 80, 60, 0, 0, 0, 128};
  first.insert(first.end(), 128, 9);
  first.insert(first.end(), 60, 7);
  EXPECT_EQ(jpeg_payload(packets, 0), first);
  JpegFile second = {0, 0, 0, 60, 1, 255, 80, 60};
  second.insert(second.end(), 192, 7);
  EXPECT_EQ(jpeg_payload(packets, 1), second);
  EXPECT_EQ(jpeg_payload(packets, 2).size(), 8U + 148U);
}

TEST(PacketiseJpeg, ReportsTheRestartIntervalInEveryPacket) {
  const PacketisedPicture packets = packetise_jpeg(drawn(0x0102, 300), {}, 250);
  ASSERT_EQ(packets.packets(), 2U);
  for (std::size_t i = 0; i < 2; ++i) {
    const JpegFile payload = jpeg_payload(packets, i);
    EXPECT_EQ(payload[4], 65);
    EXPECT_EQ(JpegFile(payload.begin() + 8, payload.begin() + 12), (JpegFile{1, 2, 0xFF, 0xFF}));
  }
}

TEST(PacketiseJpeg, PutsUserDataBeforeTheFirstHeader) {
  const JpegFile user_data(168, 5);
  const PacketisedPicture packets = packetise_jpeg(drawn(0, 100), user_data, 200);
  const JpegFile first = jpeg_payload(packets, 0);
  EXPECT_EQ(JpegFile(first.begin(), first.begin() + 168), user_data);
  EXPECT_EQ(first.size(), 168U + 8 + 4 + 128 + 1) << "one byte of scan data at least";
}

TEST(PacketiseMpeg4, CutsThePictureIntoPieces) {
  const JpegFile picture = {0, 0, 1, 0xB6, 1, 2, 3};
  const PacketisedPicture packets = packetise_mpeg4(picture, 3);
  ASSERT_EQ(packets.packets(), 3U);
  EXPECT_EQ(jpeg_payload(packets, 0), (JpegFile{0, 0, 1}));
  EXPECT_EQ(jpeg_payload(packets, 2), (JpegFile{3}));
}

TEST(PacketisedClip, KnowsTheCodecAndTheKeyPicturesOfItsFile) {
  const auto mpeg4 = PacketisedClip::load(VEXA_CLIPS "/small.m4v", 1400);
  ASSERT_TRUE(mpeg4);
  EXPECT_EQ(mpeg4->codec(), Codec::kMpeg4);
  EXPECT_TRUE(mpeg4->is_key(0));
  EXPECT_FALSE(mpeg4->is_key(1));
  EXPECT_TRUE(mpeg4->is_key(25));
  const auto jpeg = PacketisedClip::load(VEXA_CLIPS "/plain.mjpeg", 1400);
  ASSERT_TRUE(jpeg);
  EXPECT_EQ(jpeg->codec(), Codec::kJpeg);
  EXPECT_TRUE(jpeg->is_key(1));
  EXPECT_FALSE(PacketisedClip::load(VEXA_CLIPS "/small.mjpeg", 1400)) << "RTP cannot carry its Huffman tables";
}

}  // namespace
}  // namespace vexa::camera
