// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/rtp_stream.h"

#include <gtest/gtest.h>

#include <vector>

namespace vexa::camera {
namespace {

// Pictures of one, two and three packets, over and over.
std::shared_ptr<const PacketisedClip> three_pictures() {
  const std::vector<std::uint8_t> bytes{0, 0, 1, 0x65, 0x88,           //
                                        0, 0, 1, 0x41, 0x9A, 3, 4, 5,  //
                                        0, 0, 1, 0x41, 0x9A, 3, 4, 5, 6, 7};
  return std::make_shared<const PacketisedClip>(Clip::from_annex_b(bytes), 4);
}

CameraOptions stream_options() {
  CameraOptions options;
  options.clip = three_pictures();
  return options;
}

std::vector<Outgoing> take(RtpStream& stream, int pictures) {
  std::vector<Outgoing> packets;
  for (int i = 0; i < pictures; ++i) stream.take_picture(packets);
  return packets;
}

TEST(RtpStream, HeadersHoldVersionTypeSequenceTimestampAndSource) {
  CameraOptions options = stream_options();
  options.start_sequence = 0x1234;
  options.start_timestamp = 0x56789ABC;
  options.payload_type = 97;
  RtpStream stream(options, {}, 7, 1);
  const std::vector<Outgoing> packets = take(stream, 2);
  ASSERT_EQ(packets.size(), 3U);
  const auto& first = packets[0].header;
  EXPECT_EQ(std::vector<int>(first.begin(), first.begin() + 8),
            (std::vector<int>{0x80, 0xE1, 0x12, 0x34, 0x56, 0x78, 0x9A, 0xBC}));
  const auto& second = packets[1].header;
  EXPECT_EQ(std::vector<int>(second.begin(), second.begin() + 8),
            (std::vector<int>{0x80, 0x61, 0x12, 0x35, 0x56, 0x78, 0xA8, 0xCC}));
  for (std::size_t i = 8; i < 12; ++i) EXPECT_EQ(first[i], second[i]);
}

TEST(RtpStream, MarkerIsOnTheLastPacketOfEachPicture) {
  CameraOptions options = stream_options();
  RtpStream stream(options, {}, 7, 1);
  std::vector<bool> markers;
  for (const Outgoing& packet : take(stream, 3)) markers.push_back(packet.record.marker);
  EXPECT_EQ(markers, (std::vector<bool>{true, false, true, false, false, true}));
}

TEST(RtpStream, SequenceAndTimestampWrapAndRunOnWhenTheClipStartsOver) {
  CameraOptions options = stream_options();
  options.start_sequence = 65533;
  options.start_timestamp = 4294967295U - 3600;
  RtpStream stream(options, {}, 7, 1);
  const std::vector<Outgoing> packets = take(stream, 4);
  std::vector<int> sequences;
  for (const Outgoing& packet : packets) sequences.push_back(packet.record.sequence);
  EXPECT_EQ(sequences, (std::vector<int>{65533, 65534, 65535, 0, 1, 2, 3}));
  EXPECT_EQ(packets[0].record.timestamp, 4294963695U);
  EXPECT_EQ(packets[1].record.timestamp, 4294967295U);
  EXPECT_EQ(packets[3].record.timestamp, 3599U);
  EXPECT_EQ(packets[6].record.timestamp, 7199U);
  EXPECT_EQ(packets[6].record.picture, 3U);
  EXPECT_EQ(packets[6].record.clip_picture, 0U);
}

TEST(RtpStream, TimestampsFollowTheRateWithoutDrift) {
  CameraOptions options = stream_options();
  options.frames_per_second = 30000.0 / 1001;
  options.start_timestamp = 0;
  options.speed = 4;
  RtpStream stream(options, {}, 7, 1);
  const std::vector<Outgoing> packets = take(stream, 30001);
  EXPECT_EQ(packets.back().record.timestamp, 30000U * 3003);
  options.frames_per_second = 7;
  RtpStream odd(options, {}, 7, 1);
  std::vector<std::uint32_t> timestamps;
  for (const Outgoing& packet : take(odd, 8)) {
    if (packet.record.packet == 0) timestamps.push_back(packet.record.timestamp);
  }
  EXPECT_EQ(timestamps, (std::vector<std::uint32_t>{0, 12857, 25714, 38571, 51429, 64286, 77143, 90000}));
}

TEST(RtpStream, EndsAfterItsPicturesOrWithTheClip) {
  const struct {
    std::uint64_t pictures;
    bool loop;
    std::uint64_t sent;
  } cases[] = {{5, true, 5}, {2, false, 2}, {5, false, 3}, {0, false, 3}};
  for (const auto& c : cases) {
    CameraOptions options = stream_options();
    options.pictures = c.pictures;
    options.loop = c.loop;
    RtpStream stream(options, {}, 7, 1);
    std::vector<Outgoing> packets;
    while (!stream.ended()) stream.take_picture(packets);
    EXPECT_EQ(stream.next_picture(), c.sent);
  }
}

TEST(RtpStream, RestartsTakeTheirValueBeforeTheNamedPicture) {
  PacketFaults faults;
  faults.sequence_restarts = {{1, 500}};
  faults.timestamp_restarts = {{2, 1000}};
  CameraOptions options = stream_options();
  options.start_timestamp = 0;
  RtpStream stream(options, faults, 7, 1);
  const std::vector<Outgoing> packets = take(stream, 4);
  EXPECT_EQ(packets[0].record.sequence, 1);
  EXPECT_EQ(packets[1].record.sequence, 500);
  EXPECT_EQ(packets[2].record.sequence, 501);
  EXPECT_EQ(packets[1].record.timestamp, 3600U);
  EXPECT_EQ(packets[3].record.timestamp, 1000U);
  EXPECT_EQ(packets[6].record.timestamp, 4600U);
}

TEST(RtpStream, APictureTakesATextAndOneWithoutIsTheClipsOwn) {
  const CameraOptions options = stream_options();
  RtpStream stream(options, {}, 7, 1);
  std::vector<Outgoing> packets;
  ASSERT_TRUE(stream.load());
  EXPECT_EQ(stream.loaded().due.count(), 0);
  stream.take_picture(packets, "CamPos: 1");
  const std::size_t told = packets.size();
  EXPECT_GT(told, 1U) << "a unit of its own";
  EXPECT_EQ(packets[told - 1].record.picture_packets, told);
  EXPECT_TRUE(packets[told - 1].record.marker);
  stream.take_picture(packets);
  ASSERT_EQ(packets.size(), told + 2);
  EXPECT_EQ(packets[told].payload.data(), options.clip->pictures()[1].payload(0).data());
  EXPECT_EQ(packets[told].record.sequence, 1 + told);
}

TEST(RtpStream, TimestampsFollowTheStampsOfASourceThatRunsBackwards) {
  /// Three pictures, one each 40 ms, from the last to the first.
  class Backwards : public PictureSource {
   public:
    [[nodiscard]] const SourceFormat& format() const override { return format_; }
    [[nodiscard]] bool ended() const override { return sent_ == 3; }
    [[nodiscard]] std::optional<SourcePicture> next() override {
      if (ended()) return std::nullopt;
      SourcePicture picture;
      picture.bytes = std::make_shared<const std::string>("\0\0\0\1\x65\x88", 6);
      picture.due = std::chrono::milliseconds(40 * sent_);
      picture.stamp = std::chrono::milliseconds(80 - 40 * sent_++);
      return picture;
    }

   private:
    SourceFormat format_;
    int sent_ = 0;
  };
  CameraOptions options;
  options.start_timestamp = 3600;
  RtpStream stream(std::make_unique<Backwards>(), options, {}, {7, 1});
  std::vector<std::uint32_t> timestamps;
  for (const Outgoing& packet : take(stream, 4)) timestamps.push_back(packet.record.timestamp);
  EXPECT_EQ(timestamps, (std::vector<std::uint32_t>{3600, 0, 4294963696U}));
  EXPECT_TRUE(stream.ended());
}

TEST(RtpStream, RestartsWithoutAValueAreDrawnFromTheSeed) {
  PacketFaults faults;
  faults.sequence_restarts = {{1, {}}};
  faults.timestamp_restarts = {{1, {}}};
  const CameraOptions options = stream_options();
  const auto second_picture = [&](std::uint64_t seed) {
    RtpStream stream(options, faults, 7, seed);
    const SentPacket record = take(stream, 2)[1].record;
    return std::pair(record.sequence, record.timestamp);
  };
  EXPECT_EQ(second_picture(1), second_picture(1));
  EXPECT_NE(second_picture(1), second_picture(2));
}

}  // namespace
}  // namespace vexa::camera
