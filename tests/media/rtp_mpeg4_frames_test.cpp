// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include "tests/media/rtp_feed.h"

namespace vexa_test {
namespace {

class RtpMpeg4Frames : public RtpFeed {
 protected:
  RtpMpeg4Frames() : RtpFeed("MPEG4") {}
};

const std::vector<Payload> kMpeg4Key = {{0, 0, 1, 0xb0, 1, 0, 0, 1, 0xb5, 9}, {0, 0, 1, 0xb6, 7}};
const std::vector<Payload> kMpeg4Delta = {{0, 0, 1, 0xb6, 0x50}, {8}};

TEST_F(RtpMpeg4Frames, APictureIsItsPayloadsWithTheTypeOfItsFourthByte) {
  clock_now = 1003;
  send_picture(kMpeg4Key);
  send_picture(kMpeg4Delta);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_MPEG4_KEY);
  EXPECT_EQ(frame_bytes(), (Payload{0, 0, 1, 0xb0, 1, 0, 0, 1, 0xb5, 9, 0, 0, 1, 0xb6, 7}));
  EXPECT_EQ(frame_.seconds, 0);
  EXPECT_EQ(driver_.m_LastFrameTime, 1003);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_MPEG4_DELTA);
  EXPECT_EQ(frame_bytes(), (Payload{0, 0, 1, 0xb6, 0x50, 8}));
}

TEST_F(RtpMpeg4Frames, OnlyAKeyPictureBegins) {
  send_picture(kMpeg4Delta);
  send_picture(kMpeg4Key);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_MPEG4_KEY);
}

TEST_F(RtpMpeg4Frames, APictureOfNoKnownCodeIsHandedOutAsInvalid) {
  send_picture(kMpeg4Key);
  send_picture({{0, 0, 1, 0xb2, 7}});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_INVALID);
}

TEST_F(RtpMpeg4Frames, APictureAfterALossWaitsForTheNextKeyPicture) {
  send_picture(kMpeg4Key);
  EXPECT_EQ(read(), LIBD_OK);
  ++sequence_;
  send_picture(kMpeg4Delta);
  send_picture(kMpeg4Key);
  while (read() == LIBD_NO_FRAME) {
  }
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_MPEG4_KEY);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
}

TEST_F(RtpMpeg4Frames, APictureLargerThanItsBufferIsDropped) {
  frame_.capacity = 10;
  send_picture(kMpeg4Key);
  EXPECT_EQ(read(), LIBD_BUFFER_TOO_SMALL);
  EXPECT_EQ(frame_.length, 0u);
  send_picture({{0, 0, 1, 0xb0, 1}});
  EXPECT_EQ(read(), LIBD_OK);
}

TEST_F(RtpMpeg4Frames, ThePositionIsTakenFromTheFirst256BytesOfThePicture) {
  const std::string text = "CamPos: 9,8,7,6,5,4,3,2,1";
  Payload user_data = {0, 0, 1, 0xb2};
  user_data.insert(user_data.end(), text.begin(), text.end());
  send_picture({kMpeg4Key[0], user_data, kMpeg4Key[1]});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.position_text(), text.substr(0, 24));
  user_data[12] = '0';
  user_data.insert(user_data.begin() + 4, 256, 'x');
  send_picture({kMpeg4Key[0], user_data, kMpeg4Key[1]});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.position_text(), text.substr(0, 24)) << "the other one lies too far behind";
}

TEST_F(RtpMpeg4Frames, WithoutABufferOrRoomNothingIsRead) {
  frame_.capacity = 3;
  EXPECT_EQ(read(), LIBD_FAILED);
  driver_.ReleaseRtpPacketsPtr();
  EXPECT_EQ(read(), LIBD_NO_FRAME);
}

}  // namespace
}  // namespace vexa_test
