// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/socket.h>

#include <atomic>
#include <thread>
#include <utility>

#include "tests/media/rtp_feed.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

class RtpFrames : public RtpFeed {
 protected:
  /// An IDR slice of `size` payload bytes in fragments of 60000.
  void send_large_picture(std::size_t size) {
    for (std::size_t sent = 0; sent < size; sent += 60000) {
      Payload fragment(std::min<std::size_t>(60000, size - sent) + 2, 7);
      fragment[0] = 0x7c;
      fragment[1] = sent == 0 ? 0x85 : 0x05;
      send_packet(fragment, sent + 60000 >= size ? Marker::kSet : Marker::kUnset);
    }
    timestamp_ += 3600;
  }
};

const std::vector<Payload> kKey = {{0x67, 1}, {0x68, 2}, {0x65, 0x88}};
const std::vector<Payload> kDelta = {{0x41, 0x9a}};

TEST_F(RtpFrames, APictureArrivesWithItsTypeAndMovesTheLastFrameTime) {
  clock_now = 1003;
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_KEY);
  EXPECT_EQ(frame_.length, 18u);
  EXPECT_EQ(frame_.seconds, 0);
  EXPECT_EQ(frame_.microseconds, 0);
  EXPECT_EQ(driver_.m_LastFrameTime, 1003);
}

TEST_F(RtpFrames, AnIdrSliceAloneIsAFirstPictureInOnePacketAndInMany) {
  const std::vector<Payload> pictures[] = {{{0x65, 0x88}}, {{0x7c, 0x85, 1}, {0x7c, 0x05, 2}, {0x7c, 0x45, 3}}};
  for (const std::vector<Payload>& picture : pictures) {
    ASSERT_TRUE(driver_.state().allocate_packets());
    send_picture(picture);
    EXPECT_EQ(read(), LIBD_OK);
    EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_KEY);
  }
}

TEST_F(RtpFrames, WithoutASocketOrForAnUnknownCodecNothingIsRead) {
  EXPECT_EQ(driver_.GetRtpCurrentVideoFrame("H.265", frame_), LIBD_FAILED);
  EXPECT_EQ(driver_.GetRtpCurrentVideoFrame("", frame_), LIBD_FAILED);
  const int socket = std::exchange(driver_.m_StreamSocket, -1);
  EXPECT_EQ(read(), LIBD_FAILED);
  driver_.m_StreamSocket = socket;
}

TEST_F(RtpFrames, WithoutAPacketBufferThereIsNoFrameAndWithACapacityBelow4Nothing) {
  frame_.capacity = 3;
  EXPECT_EQ(read(), LIBD_FAILED);
  frame_.capacity = 4;
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  driver_.ReleaseRtpPacketsPtr();
  EXPECT_EQ(read(), LIBD_NO_FRAME);
}

TEST_F(RtpFrames, NoDatagramInTimeIsNoFrameUntilTheTimeOutSinceTheLastFrame) {
  clock_now = 1003;
  driver_.m_ConnectionInfo.timeout = 20;  // whole seconds count: 0 of them
  driver_.m_LastFrameTime = 1003;
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  driver_.m_LastFrameTime = 1002;
  EXPECT_EQ(read(), LIBD_TIMEOUT);
}

struct SilenceCase {
  int timeout;  // milliseconds
  std::time_t silence;
  ELibDReturnCode code;
};

TEST_F(RtpFrames, WholeSecondsOfTheTimeOutDivideNoFrameFromATimeOut) {
  driver_.m_StopVideoRequested = true;  // the read does not wait
  for (const SilenceCase& c :
       {SilenceCase{5000, 5, LIBD_NO_FRAME}, SilenceCase{5000, 6, LIBD_TIMEOUT}, SilenceCase{4999, 4, LIBD_NO_FRAME},
        SilenceCase{4999, 5, LIBD_TIMEOUT}, SilenceCase{999, 0, LIBD_NO_FRAME}, SilenceCase{999, 1, LIBD_TIMEOUT},
        SilenceCase{0, 0, LIBD_NO_FRAME}, SilenceCase{5000, -1, LIBD_NO_FRAME}}) {
    driver_.m_ConnectionInfo.timeout = c.timeout;
    driver_.m_LastFrameTime = clock_now - c.silence;
    EXPECT_EQ(read(), c.code) << c.timeout << " ms, " << c.silence << " s";
  }
}

TEST_F(RtpFrames, AnotherReceiveFailureGivesItsCode) {
  const int socket = std::exchange(driver_.m_StreamSocket, camera_ + 1000);
  EXPECT_EQ(read(), LIBD_FAILED);
  EXPECT_EQ(driver_.LatestErrorText(), "Bad file descriptor");
  driver_.m_StreamSocket = socket;
}

TEST_F(RtpFrames, AnAggregationPacketAbandonsItsPictureAndAKeyPictureMustFollow) {
  send_picture(kKey);
  send_picture({{0x78, 0, 2, 0x41, 1}});
  send_picture(kDelta);
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(read(), LIBD_FAILED);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_KEY);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
}

TEST_F(RtpFrames, AReportOnTheMediaPortDoesNotEndTheStream) {
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  const Payload report = {0x80, 200, 0, 6, 0, 0, 0, 1, 0xe9, 0, 0, 1, 0, 0, 0, 0, 0, 1, 2, 3, 0, 0, 0, 9, 0, 0, 1, 0};
  EXPECT_EQ(send(camera_, report.data(), report.size(), 0), static_cast<ssize_t>(report.size()));
  ELibDReturnCode code = LIBD_FAILED;
  for (int picture = 0; picture < 5 && code != LIBD_OK; ++picture) {
    send_picture(kKey);
    code = read();
  }
  EXPECT_EQ(code, LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_KEY);
}

TEST_F(RtpFrames, ThePositionIsTakenFromEachSingleUnitOfType6) {
  Payload sei = {0x06, 5, 40};
  for (const char c : std::string("CamPos: 1/2/3")) sei.push_back(static_cast<unsigned char>(c));
  Payload slice = sei;
  slice[0] = 0x65;
  send_picture({{0x67, 1}, slice});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.position_text(), "");
  send_picture({sei, {0x41, 0x9a}});
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.position_text(), "CamPos: 1/2/3");
}

TEST_F(RtpFrames, AnotherCodecBeginsWithAnEmptyListAndWaitsForAKeyPicture) {
  send_picture(kKey);
  send_picture(kDelta);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.GetRtpCurrentVideoFrame("MPEG4", frame_), LIBD_NO_FRAME);
  EXPECT_TRUE(driver_.m_RtpPackets.empty());
  send_picture({{0, 0, 1, 0xb0, 1}});
  EXPECT_EQ(driver_.GetRtpCurrentVideoFrame("MPEG4", frame_), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_MPEG4_KEY);
}

TEST_F(RtpFrames, APictureLargerThanItsBufferIsDroppedAndALargerBufferTakesTheNext) {
  std::thread camera([this] {
    send_picture(kKey);
    send_large_picture(1300000);
    send_picture(kKey);
    send_large_picture(1300000);
  });
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(read(), LIBD_BUFFER_TOO_SMALL);
  EXPECT_EQ(frame_.length, 0u);
  EXPECT_EQ(read(), LIBD_OK);
  buffer_.resize(2000000);
  frame_.data = buffer_.data();
  frame_.capacity = 2000000;
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.length, 1300005u);
  camera.join();
}

TEST_F(RtpFrames, ThroughTheThreadAFrameThatDoesNotFitMakesTheNextBuffersLarge) {
  driver_.m_RtpLiveMode = true;
  driver_.use_live_h264();
  driver_.m_KeepAlivePeriod = 60;
  driver_.m_LastKeepAliveTime = clock_now;
  std::thread thread([this] { MediaDriver::StreamingThread(static_cast<CVexaCommon*>(&driver_)); });
  send_picture(kKey);
  send_large_picture(1300000);
  send_picture(kKey);
  send_large_picture(1300000);
  FrameTaker host;
  const auto frames = host.take_all(driver_, 3);
  ASSERT_EQ(frames.size(), 3u);
  EXPECT_EQ(frames[0].bytes.size(), 18u);
  EXPECT_EQ(frames[1].bytes.size(), 18u);
  EXPECT_EQ(frames[2].bytes.size(), 1300005u);
  {
    const vexa::Guard guard(driver_.m_VideoStateLock);
    driver_.m_StopVideoRequested = true;
  }
  SetEvent(driver_.m_StopVideoEvent);
  thread.join();
  EXPECT_TRUE(driver_.m_LargeFrameBuffers);
}

TEST_F(RtpFrames, APacketWhoseBytesAreOverwrittenIsGoneAndAKeyPictureMustFollow) {
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  const unsigned overwritten = timestamp_;
  send_packet({0x7c, 0x81, 1}, Marker::kUnset);  // its other packets never come
  ++sequence_;
  timestamp_ += 3600;
  constexpr unsigned kMany = 40;  // more than the buffer holds
  const unsigned last = sequence_ + kMany - 1;
  std::thread camera([this] {
    for (unsigned i = 0; i < kMany; ++i) send_packet(Payload(60000, 0x7c), Marker::kUnset);
  });
  while (driver_.m_RtpPackets.empty() || driver_.m_RtpPackets.back().sequence != last) {
    ASSERT_EQ(read(), LIBD_NO_FRAME);
  }
  camera.join();
  for (const SPacketInfo& packet : driver_.m_RtpPackets) {
    EXPECT_NE(packet.timestamp, overwritten);
    EXPECT_EQ(packet.data[12], 0x7c);
  }
  EXPECT_LE(driver_.m_RtpPackets.size(), 35u);
  timestamp_ += 3600;
  send_picture(kDelta);
  EXPECT_EQ(read(), LIBD_NO_FRAME) << "the sequence is forgotten";
  send_picture(kKey);
  ELibDReturnCode code = LIBD_NO_FRAME;
  for (int i = 0; i < 100 && code == LIBD_NO_FRAME; ++i) code = read();
  EXPECT_EQ(code, LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_KEY);
}

TEST_F(RtpFrames, ShortDatagramsAndEmptyPayloadsAreNoPictures) {
  for (std::size_t length = 0; length < 12; ++length) {
    const Payload datagram(length, 0xff);
    EXPECT_EQ(send(camera_, datagram.data(), datagram.size(), 0), static_cast<ssize_t>(length));
  }
  send_picture({{}});
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_KEY);
}

TEST_F(RtpFrames, AStreamThatNeverMakesAPictureLetsTheReaderGoAfterTheTimeOut) {
  std::atomic<bool> done{false};
  std::thread camera([&] {
    while (!done) send_packet({0x7c, 0x01, 1}, Marker::kUnset);
  });
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  done = true;
  Payload drained(65536);
  while (recv(driver_.m_StreamSocket, drained.data(), drained.size(), MSG_DONTWAIT) >= 0) {
  }
  camera.join();
}

TEST_F(RtpFrames, WithATimeOutOfZeroOrLessWhatHasArrivedIsRead) {
  for (const int timeout : {0, -1, -999}) {
    driver_.m_ConnectionInfo.timeout = timeout;
    EXPECT_EQ(read(), LIBD_NO_FRAME);
    send_picture(kKey);
    EXPECT_EQ(read(), LIBD_OK) << timeout;
  }
}

TEST_F(RtpFrames, TheCheckOfACompleteKeyPictureIsNoTimeOutOfTheRead) {
  driver_.m_ConnectionInfo.timeout = 600000;
  driver_.soil_latest_error();
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  ++sequence_;  // a picture is lost
  send_picture(kKey);
  EXPECT_EQ(read(), LIBD_OK);
  EXPECT_EQ(driver_.LatestErrorCode(), LIBD_FAILED);
  EXPECT_EQ(driver_.LatestErrorText(), "from before");
}

TEST_F(RtpFrames, AReadThatAStopEndsIsNoFrameAndNoTimeOut) {
  driver_.m_ConnectionInfo.timeout = 600000;
  driver_.soil_latest_error();
  driver_.m_StopVideoRequested = true;
  SetEvent(driver_.m_StopVideoEvent);
  EXPECT_EQ(read(), LIBD_NO_FRAME);
  EXPECT_EQ(driver_.LatestErrorText(), "from before");
}

struct StampCase {
  const char* what;
  std::uint32_t timestamp;
  std::int32_t seconds;
  std::int32_t microseconds;
  std::uint32_t base_after;
  std::int64_t clock_after;
};

TEST_F(RtpFrames, PlayedBackPicturesCarryTheRecordingsClock) {
  driver_.m_EdgeStoragePlayback = true;
  driver_.m_FirstPlaybackFrame = true;
  driver_.m_RangeClockSeconds = 1706745599;
  driver_.m_RangeClockMicros = 250000;
  const StampCase cases[] = {
      {"the first is the clock itself", 4294960000, 1706745599, 250000, 4294960000, 1706745599},
      {"one picture later", 4294963600, 1706745599, 290000, 4294960000, 1706745599},
      {"a second later, across the wrap, the base moves", 82704, 1706745600, 250000, 82704, 1706745600},
      {"then it counts from there", 86304, 1706745600, 290000, 82704, 1706745600},
  };
  for (const StampCase& c : cases) {
    driver_.state().stamp_picture(frame_, c.timestamp);
    EXPECT_EQ(frame_.seconds, c.seconds) << c.what;
    EXPECT_EQ(frame_.microseconds, c.microseconds) << c.what;
    EXPECT_EQ(driver_.m_PlaybackBaseTimestamp, c.base_after) << c.what;
    EXPECT_EQ(driver_.m_RangeClockSeconds, c.clock_after) << c.what;
  }
}

TEST_F(RtpFrames, APictureBeforeTheBaseMovesItAfterItsOwnStamp) {
  driver_.m_EdgeStoragePlayback = true;
  driver_.m_PlaybackBaseTimestamp = 90000;
  driver_.m_RangeClockSeconds = 1000;
  driver_.state().stamp_picture(frame_, 86400);
  // 86400 - 90000 is 4294963696 modulo 2^32: 47721 seconds and 73696 ticks.
  EXPECT_EQ(frame_.seconds, 48721);
  EXPECT_EQ(frame_.microseconds, 818844);
  EXPECT_EQ(driver_.m_PlaybackBaseTimestamp, 86400u);
  EXPECT_EQ(driver_.m_RangeClockSeconds, 48721);
  EXPECT_EQ(driver_.m_RangeClockMicros, 818844);
}

TEST_F(RtpFrames, LivePicturesAndClocksWithoutARateAreStampedZero) {
  driver_.m_RangeClockSeconds = 1000;
  driver_.m_PlaybackBaseTimestamp = 5;
  driver_.state().stamp_picture(frame_, 86400);
  EXPECT_EQ(frame_.seconds, 0);
  driver_.m_EdgeStoragePlayback = true;
  driver_.m_RtpClockRate = 0;
  driver_.state().stamp_picture(frame_, 86400);
  EXPECT_EQ(frame_.seconds, 0);
  EXPECT_EQ(frame_.microseconds, 0);
}

}  // namespace
}  // namespace vexa_test
