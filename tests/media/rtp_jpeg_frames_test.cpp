// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <thread>

#include "tests/media/rtp_feed.h"

namespace vexa_test {
namespace {

constexpr unsigned kJfifHeader = 605;

class RtpJpegFrames : public RtpFeed {
 protected:
  RtpJpegFrames() : RtpFeed("JPEG", 26) {}

  /// A packet of type 1 and quality 50, 320 x 240, at this fragment offset.
  static Payload jpeg_packet(unsigned offset, const Payload& scan) {
    Payload payload = {0,
                       static_cast<unsigned char>(offset >> 16),
                       static_cast<unsigned char>(offset >> 8),
                       static_cast<unsigned char>(offset),
                       1,
                       50,
                       40,
                       30};
    payload.insert(payload.end(), scan.begin(), scan.end());
    return payload;
  }
  static Payload with_bad_tables(const Payload& scan) {
    Payload payload = jpeg_packet(0, scan);
    payload[5] = 255;
    return payload;
  }

  std::vector<Payload> small_picture(unsigned char byte) const {
    return {jpeg_packet(0, {byte, 1}), jpeg_packet(2, {byte, 2, 3})};
  }

  void expect_small_picture(unsigned char byte) {
    EXPECT_EQ(read(), LIBD_OK);
    ASSERT_EQ(frame_.length, kJfifHeader + 5);
    const Payload bytes = frame_bytes();
    EXPECT_EQ(Payload(bytes.begin() + kJfifHeader, bytes.end()), (Payload{byte, 1, byte, 2, 3}));
  }
};

TEST_F(RtpJpegFrames, APictureIsAHeaderAndTheScanDataOfItsPackets) {
  clock_now = 1003;
  send_picture(small_picture(7));
  expect_small_picture(7);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_JPEG);
  EXPECT_EQ(frame_.seconds, 0);
  EXPECT_EQ(frame_.microseconds, 0);
  EXPECT_EQ(driver_.m_LastFrameTime, 1003);
  EXPECT_EQ(buffer_[0], 0xff);
  EXPECT_EQ(buffer_[1], 0xd8);
}

TEST_F(RtpJpegFrames, NoEndOfImageIsAppended) {
  send_picture({jpeg_packet(0, {9})});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.length, kJfifHeader + 1);
}

TEST_F(RtpJpegFrames, NothingYetLeavesAnEmptyFrameOfItsType) {
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_JPEG);
  EXPECT_EQ(frame_.length, 0u);
  clock_now = 1001;
  EXPECT_EQ(read(), LIBD_TIMEOUT);
}

TEST_F(RtpJpegFrames, ACapacityBelow4IsRefusedBeforeTheTypeIsSet) {
  frame_.capacity = 3;
  EXPECT_EQ(read(), LIBD_FAILED);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_INVALID);
}

TEST_F(RtpJpegFrames, OtherPayloadTypesAreNotCollected) {
  payload_type_ = 96;
  for (int i = 0; i < 20; ++i) send_picture(small_picture(1));
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
  payload_type_ = 26;
  send_picture(small_picture(7));
  expect_small_picture(7);
}

TEST_F(RtpJpegFrames, WhileOnlyOtherPayloadTypesArriveTheTimeOutHolds) {
  payload_type_ = 96;
  clock_now = 1001;
  send_picture(small_picture(1));
  EXPECT_EQ(read(), LIBD_TIMEOUT);
}

TEST_F(RtpJpegFrames, ADamagedPictureIsAnEmptyFrame) {
  send_picture({with_bad_tables({1, 2, 3, 4}), jpeg_packet(4, {5})});
  send_picture(small_picture(7));
  frame_.length = 99;
  EXPECT_EQ(read(), LIBD_FRAME_DAMAGED);
  EXPECT_EQ(frame_.length, 0u);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_JPEG);
  EXPECT_EQ(driver_.m_LastFrameTime, 1000);
  expect_small_picture(7);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
}

TEST_F(RtpJpegFrames, ADamagedPictureReachesTheHostEmpty) {
  send_picture({with_bad_tables({1, 2, 3, 4})});
  CVexaCommon::VideoFrameInfo frame;
  frame.capacity = 1200000;
  frame.data = new unsigned char[frame.capacity];
  bool wait_key = false;
  MediaDriver::ProcessCurrentFrameData(&driver_, frame, wait_key, driver_.GetRtpCurrentVideoFrame("JPEG", frame));
  TakenFrame taken;
  FrameTaker host;
  EXPECT_EQ(host.take(driver_, taken), LIBD_OK);
  EXPECT_EQ(taken.bytes, "");
  EXPECT_EQ(taken.info.frameType, VIDEO_FRAME_JPEG);
}

TEST_F(RtpJpegFrames, AFirstPacketOf4096BytesIsTakenWhenItFitsAfterTheHeader) {
  // The JFIF header and what stands after the RTP and JPEG headers make 4096 bytes at most.
  send_picture({jpeg_packet(0, Payload(4096 - kJfifHeader, 7))});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.length, 4096u);
  send_picture({jpeg_packet(0, Payload(4097 - kJfifHeader, 7))});
  EXPECT_EQ(read(), LIBD_FRAME_DAMAGED);
  send_picture({jpeg_packet(0, Payload(4096 - 20, 7))});
  EXPECT_EQ(read(), LIBD_FRAME_DAMAGED);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
}

TEST_F(RtpJpegFrames, AFirstPacketAbove4096BytesStaysListedForThatCall) {
  send_picture({jpeg_packet(0, Payload(4097 - 20, 7)), jpeg_packet(4077, {1})});
  EXPECT_EQ(read(), LIBD_FRAME_DAMAGED);
  EXPECT_EQ(frame_.length, 0u);
  EXPECT_EQ(driver_.m_RtpPackets.size(), 2u);
  send_picture(small_picture(7));
  expect_small_picture(7);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
}

TEST_F(RtpJpegFrames, AStreamOfTooLongFirstPacketsNeverSticks) {
  for (int i = 0; i < 5; ++i) {
    send_picture({jpeg_packet(0, Payload(4097 - 20, 7))});
    EXPECT_EQ(read(), LIBD_FRAME_DAMAGED) << i;
    EXPECT_LE(driver_.m_RtpPackets.size(), 1u);
  }
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
}

TEST_F(RtpJpegFrames, UserDataInFrontGivesTheCamerasPosition) {
  Payload first(168, 0);
  first[0] = 0xff;
  first[1] = 0xd8;
  const std::string text = "CamPos: 0001000200030004 and more";
  std::copy(text.begin(), text.end(), first.begin() + 20);
  const Payload header = jpeg_packet(0, {7, 1});
  first.insert(first.end(), header.begin(), header.end());
  send_picture({first, jpeg_packet(2, {7, 2, 3})});
  expect_small_picture(7);
  EXPECT_EQ(driver_.position_text(), "CamPos: 0001000200030004");
}

TEST_F(RtpJpegFrames, WithoutUserDataInFrontNoPositionIsSearchedFor) {
  Payload scan;
  for (const char c : std::string("CamPos: 5")) scan.push_back(static_cast<unsigned char>(c));
  send_picture({jpeg_packet(0, scan)});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.position_text(), "");
}

TEST_F(RtpJpegFrames, APictureAfterALossBeginsAfreshWithoutTheBrokenOne) {
  send_picture(small_picture(1));
  expect_small_picture(1);
  send_packet(jpeg_packet(0, {2}), Marker::kUnset);
  ++sequence_;  // the last packet is lost
  timestamp_ += 3600;
  send_picture(small_picture(3));
  send_picture(small_picture(4));
  while (read() == LIBD_NO_FRAME) {
  }
  EXPECT_EQ(buffer_[kJfifHeader], 3);
  expect_small_picture(4);
}

TEST_F(RtpJpegFrames, APictureThatLostItsFirstPacketsIsNotTakenForWhole) {
  ++sequence_;
  send_packet(jpeg_packet(2, {1, 2, 3}), Marker::kSet);
  timestamp_ += 3600;
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  send_picture(small_picture(4));
  while (read() == LIBD_NO_FRAME) {
  }
  EXPECT_EQ(buffer_[kJfifHeader], 4);
}

TEST_F(RtpJpegFrames, APictureLargerThanItsBufferIsDroppedAndALargerBufferTakesTheNext) {
  const auto send_large = [this] {
    send_packet(jpeg_packet(0, {1}), Marker::kUnset);
    for (int i = 0; i < 21; ++i) {
      send_packet(jpeg_packet(1, Payload(60000, 7)), i == 20 ? Marker::kSet : Marker::kUnset);
    }
    timestamp_ += 3600;
  };
  std::thread camera([&] {
    send_large();
    send_large();
  });
  EXPECT_EQ(read(), LIBD_BUFFER_TOO_SMALL);
  EXPECT_EQ(frame_.length, 0u);
  buffer_.resize(2000000);
  frame_.data = buffer_.data();
  frame_.capacity = 2000000;
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.length, kJfifHeader + 1 + 21 * 60000);
  camera.join();
}

TEST_F(RtpJpegFrames, TheFirstPlayedBackPictureCarriesTheRecordingsClock) {
  driver_.m_EdgeStoragePlayback = true;
  driver_.m_FirstPlaybackFrame = true;
  driver_.m_RangeClockSeconds = 1706745599;
  driver_.m_RangeClockMicros = 250000;
  send_picture(small_picture(1));
  send_picture(small_picture(2));
  expect_small_picture(1);
  EXPECT_EQ(frame_.seconds, 1706745599);
  EXPECT_EQ(frame_.microseconds, 250000);
  expect_small_picture(2);
  EXPECT_EQ(frame_.microseconds, 290000);
}

TEST_F(RtpJpegFrames, TheConversionFillsItsOutputOrRefuses) {
  unsigned char out[4096];
  unsigned int length = 0;
  Payload payload = jpeg_packet(0, {7, 8});
  EXPECT_TRUE(driver_.RTPJpegToJIF(out, &length, payload.data(), static_cast<unsigned int>(payload.size())));
  EXPECT_EQ(length, kJfifHeader + 2);
  EXPECT_EQ(out[length - 1], 8);
  payload = with_bad_tables({1, 2, 3, 4});
  EXPECT_FALSE(driver_.RTPJpegToJIF(out, &length, payload.data(), static_cast<unsigned int>(payload.size())));
}

}  // namespace
}  // namespace vexa_test
