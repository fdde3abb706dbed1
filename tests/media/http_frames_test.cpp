// SPDX-License-Identifier: Apache-2.0
// Frames from HTTP image streams, on connections of the test's own.
#include <gtest/gtest.h>
#include <sys/time.h>

#include <ctime>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/media_driver.h"
#include "tests/support/stream_pair.h"

namespace vexa_test {
namespace {

std::time_t http_frames_now = 0;

class HttpDriver : public MediaDriver {
 public:
  HttpDriver() {
    http_frames_now = 1000;
    state().now = [] { return http_frames_now; };
    soil_latest_error();
    EXPECT_TRUE(state().reset_stream_buffer());
  }
  ~HttpDriver() override { m_StreamSocket = -1; }

  void use_codec(const std::string& codec) {
    const vexa::Guard guard(m_ConnectionLock);
    m_CameraInfo.codecName = codec;
  }
  void use_timeout(int timeout) {
    const vexa::Guard guard(m_ConnectionLock);
    m_ConnectionInfo.timeout = timeout;
  }
};

class HttpFrames : public testing::Test {
 protected:
  HttpFrames() {
    driver_.m_StreamSocket = pair_.driver_end();
    driver_.m_LastFrameTime = 1000;
    driver_.use_timeout(200);
    frame_.data = room_.data();
    frame_.capacity = 1000;
  }

  ELibDReturnCode read(const std::string& codec) {
    driver_.use_codec(codec);
    return driver_.GetCurrentFrameData(frame_);
  }
  std::string bytes() const { return {reinterpret_cast<const char*>(frame_.data), frame_.length}; }

  HttpDriver driver_;
  StreamPair pair_;
  std::vector<unsigned char> room_ = std::vector<unsigned char>(1000, '#');
  CVexaCommon::VideoFrameInfo frame_;
};

TEST_F(HttpFrames, OfAnUnknownCodecOrAClosedStreamDoNotExist) {
  pair_.say("DataLen: 3\r\n\r\nabc");
  for (const char* codec : {"", "jpeg", "H264", "MPEG-4"}) EXPECT_EQ(read(codec), LIBD_FAILED) << codec;
  driver_.m_StreamSocket = -1;
  EXPECT_EQ(read("JPEG"), LIBD_FAILED);
  EXPECT_EQ(driver_.latest_error(), "-102 from before");
}

TEST_F(HttpFrames, OfJpegAreThePartsOfTheStream) {
  pair_.say("DataLen: 3\r\n\r\nabcDataLen: 4\r\n\r\nefghDataLen: 1\r\n\r\ni");
  http_frames_now = 1234;
  EXPECT_EQ(read("JPEG"), LIBD_OK);
  EXPECT_EQ(bytes(), "abc");
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_JPEG);
  EXPECT_EQ(frame_.seconds, 0);
  EXPECT_EQ(frame_.microseconds, 0);
  EXPECT_EQ(driver_.m_LastFrameTime, 1234);
  int received = 0;
  EXPECT_EQ(driver_.GetCurrentJPEGFrameData(frame_, received), LIBD_OK);
  EXPECT_EQ(received, 4);
  EXPECT_EQ(driver_.GetCurrentJPEGFrameData(frame_, received), LIBD_OK);
  EXPECT_EQ(bytes(), "i");
}

TEST_F(HttpFrames, OfJpegThatDoNotFitSaySo) {
  pair_.say("DataLen: 1001\r\n\r\n");
  http_frames_now = 1234;
  EXPECT_EQ(read("JPEG"), LIBD_BUFFER_TOO_SMALL);
  EXPECT_EQ(driver_.latest_error(), "-303 Buffer too small");
  EXPECT_EQ(driver_.m_LastFrameTime, 1234);
}

TEST_F(HttpFrames, OfJpegThatFailHaveTheCodeOfTheFailure) {
  pair_.say("DataLen: x\r\n\r\n");
  EXPECT_EQ(read("JPEG"), LIBD_FAILED);
  EXPECT_EQ(driver_.latest_error(), "0 DataLen not found");
  pair_.say("DataLen: 10\r\n\r\nabc");
  EXPECT_EQ(read("JPEG"), LIBD_TIMEOUT);
  EXPECT_EQ(driver_.latest_error(), "-200 Receive timed out");
}

TEST_F(HttpFrames, OfJpegOfLength0AreNoFrameYet) {
  driver_.use_timeout(10000);
  const struct {
    std::time_t now;
    ELibDReturnCode result;
  } cases[] = {{1000, LIBD_NO_FRAME}, {1010, LIBD_NO_FRAME}, {1011, LIBD_TIMEOUT}};
  for (const auto& c : cases) {
    http_frames_now = c.now;
    pair_.say("DataLen: 0\r\n\r\n");
    EXPECT_EQ(read("JPEG"), c.result) << c.now;
    EXPECT_EQ(driver_.m_LastFrameTime, 1000);
  }
}

/// An H.264 unit of the type, and an MPEG-4 unit of the code.
std::string nal(int header, const std::string& rest) {
  return std::string("\0\0\0\1", 4) + static_cast<char>(header) + rest;
}
std::string vop(int code, const std::string& rest) { return std::string("\0\0\1", 3) + static_cast<char>(code) + rest; }

struct ElementaryCase {
  const char* codec;
  std::string stream;  ///< ends in a unit that ends the picture; another follows
  std::string frame;
  std::int32_t type;
};

const std::string kSps = nal(0x67, "sps");
const std::string kPps = nal(0x68, "pps");
const std::string kIdr = nal(0x65, "idr slice");
const std::string kSlice = nal(0x41, "slice");
const std::string kSei = nal(6, "12345678CamPos: 0123456789abcdef");
const std::string kSequence = vop(0xb0, "sequence");
const std::string kPicture = vop(0xb6, "picture");
const std::string kUserData = vop(0xb2, "CamPos: 0123456789abcdef");

/// By the clock that stamps frames: std::time() reads another one, which is up to a tick behind it.
std::time_t seconds_of_day_clock() {
  timeval now{};
  gettimeofday(&now, nullptr);
  return now.tv_sec;
}

TEST_F(HttpFrames, OfElementaryStreamsEndWithThePicture) {
  const ElementaryCase cases[] = {
      {"H.264", kSps + kPps + kIdr, kSps + kPps + kIdr, VIDEO_FRAME_H264_KEY},
      {"H.264", kIdr, kIdr, VIDEO_FRAME_H264_DELTA},
      {"H.264", kSlice, kSlice, VIDEO_FRAME_H264_DELTA},
      {"H.264", kPps + nal(9, "delimiter") + kSlice, kPps + nal(9, "delimiter") + kSlice, VIDEO_FRAME_H264_DELTA},
      {"H.264", kSei + kSps + kSei + kSlice, kSps + kSlice, VIDEO_FRAME_H264_KEY},
      {"H.264", nal(0x27, "sps") + nal(0x01, "slice"), nal(0x27, "sps") + nal(0x01, "slice"), VIDEO_FRAME_H264_KEY},
      {"MPEG4", kSequence + vop(0x20, "layer") + kPicture, kSequence + vop(0x20, "layer") + kPicture,
       VIDEO_FRAME_MPEG4_KEY},
      {"MPEG4", kPicture, kPicture, VIDEO_FRAME_MPEG4_DELTA},
      {"MPEG4", vop(0xb3, "group") + kPicture, vop(0xb3, "group") + kPicture, VIDEO_FRAME_MPEG4_DELTA},
      {"MPEG4", kSequence + kUserData + vop(0xb3, "group") + kPicture, kSequence + vop(0xb3, "group") + kPicture,
       VIDEO_FRAME_MPEG4_KEY},
  };
  for (const ElementaryCase& c : cases) {
    ASSERT_TRUE(driver_.state().reset_stream_buffer());
    pair_.left();
    pair_.say(c.stream + c.stream.substr(0, 5) + "beginning of the next");
    driver_.m_LastFrameTime = 0;
    EXPECT_EQ(read(c.codec), LIBD_TIMEOUT);  // in front of the first start code stands nothing
    driver_.m_LastFrameTime = 1000;
    http_frames_now = 1000;
    const std::time_t before = seconds_of_day_clock();
    EXPECT_EQ(read(c.codec), LIBD_OK) << c.stream;
    EXPECT_EQ(bytes(), c.frame);
    EXPECT_EQ(frame_.frameType, c.type) << c.stream;
    EXPECT_GE(frame_.seconds, before);
    EXPECT_LE(frame_.seconds, seconds_of_day_clock());
    EXPECT_LT(frame_.microseconds, 1000000);
  }
}

TEST_F(HttpFrames, MarkTheTimeOfTheLastFrame) {
  driver_.use_timeout(300000);
  pair_.say(kSlice + kSlice);
  read("H.264");
  EXPECT_EQ(driver_.m_LastFrameTime, 1000);
  http_frames_now = 1234;
  EXPECT_EQ(read("H.264"), LIBD_OK);
  EXPECT_EQ(driver_.m_LastFrameTime, 1234);
}

TEST_F(HttpFrames, TakeTheCamerasPositionFromUserData) {
  const struct {
    const char* codec;
    std::string unit;
    std::string position;
  } cases[] = {{"H.264", nal(6, "123456CamPos: right behind the head"), "CamPos: right behind the"},
               {"H.264", nal(6, "12345CamPos: a byte too early"), "before"},
               {"H.264", nal(6, std::string("\0\0\3\0\0\3", 6) + "CamPos: 1"), "CamPos: 1"},
               {"H.264", nal(1, "123456CamPos: in a picture"), "before"},
               {"MPEG4", vop(0xb2, "CamPos: right behind the code"), "CamPos: right behind the"},
               {"MPEG4", vop(0xb2, "amPos: 1"), "before"},
               {"MPEG4", vop(0xb2, std::string(248, 'x') + "CamPos: 1"), "CamPos: "},
               {"MPEG4", vop(0xb2, std::string(249, 'x') + "CamPos: 1"), "before"},
               {"MPEG4", vop(0xb6, "CamPos: in a picture"), "before"}};
  for (const auto& c : cases) {
    ASSERT_TRUE(driver_.state().reset_stream_buffer());
    pair_.left();
    {
      const vexa::Guard guard(driver_.m_CamPosLock);
      driver_.m_CamPosText = "before";
    }
    pair_.say(c.unit + (c.codec[0] == 'H' ? kSlice + kSlice : kPicture + kPicture));
    read(c.codec);
    EXPECT_EQ(read(c.codec), LIBD_OK);
    EXPECT_EQ(driver_.position_text(), c.position) << c.unit;
  }
}

TEST_F(HttpFrames, LosesTheUnitsInFrontOfAPictureWhenTheStreamFallsSilent) {
  driver_.use_timeout(30);
  pair_.say(kSps + kPps + kIdr.substr(0, 5));
  EXPECT_EQ(read("H.264"), LIBD_NO_FRAME);
  EXPECT_EQ(read("H.264"), LIBD_NO_FRAME);
  EXPECT_EQ(bytes(), kSps + kPps);
  pair_.say(kIdr.substr(5) + kSlice);
  EXPECT_EQ(read("H.264"), LIBD_OK);
  EXPECT_EQ(bytes(), kIdr);
  EXPECT_EQ(frame_.frameType, VIDEO_FRAME_H264_DELTA);
}

TEST_F(HttpFrames, ThatNeverEndTimeOut) {
  driver_.use_timeout(1000);
  http_frames_now = 1002;
  pair_.say(kSps + kPps + kSei + kSlice);
  EXPECT_EQ(read("H.264"), LIBD_TIMEOUT);
  EXPECT_EQ(read("H.264"), LIBD_TIMEOUT);
  EXPECT_EQ(bytes(), kSps);
  EXPECT_EQ(read("H.264"), LIBD_TIMEOUT);
  EXPECT_EQ(bytes(), kPps);
  EXPECT_EQ(read("H.264"), LIBD_TIMEOUT);
  EXPECT_EQ(bytes(), "");
}

TEST_F(HttpFrames, ThatFillTheirBufferWithoutAPictureFail) {
  pair_.say(kSps + kPps + kSlice + kSlice);
  read("H.264");
  frame_.capacity = static_cast<unsigned int>(kSps.size() + kPps.size());
  EXPECT_EQ(read("H.264"), LIBD_FAILED);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(HttpFrames, WithAUnitLargerThanTheRoomFailForEver) {
  pair_.say(kSps + kPps + kSlice + kSlice);
  read("H.264");
  frame_.capacity = static_cast<unsigned int>(kSps.size() + kPps.size()) - 1;
  EXPECT_EQ(read("H.264"), LIBD_FAILED);
  frame_.capacity = 7;
  for (int i = 0; i < 3; ++i) EXPECT_EQ(read("H.264"), LIBD_FAILED);
}

TEST_F(HttpFrames, WithoutRoomFailAtOnce) {
  frame_.capacity = 0;
  for (const char* codec : {"H.264", "MPEG4"}) EXPECT_EQ(read(codec), LIBD_FAILED);
  EXPECT_EQ(driver_.latest_error(), "-102 from before");
}

TEST_F(HttpFrames, AreTheSameHoweverTheBytesCome) {
  const std::string key = kSps + kPps + kIdr;
  std::thread camera([&] {
    for (const char byte : key + kSlice + kSlice) {
      pair_.say({&byte, 1});
      std::this_thread::yield();
    }
  });
  driver_.use_timeout(20000);
  EXPECT_EQ(read("H.264"), LIBD_NO_FRAME);
  EXPECT_EQ(read("H.264"), LIBD_OK);
  EXPECT_EQ(bytes(), key);
  EXPECT_EQ(read("H.264"), LIBD_OK);
  EXPECT_EQ(bytes(), kSlice);
  camera.join();
}

TEST_F(HttpFrames, BeginWithWhatComesBeforeTheFirstStartCode) {
  for (const std::string front : {"x", "xyz", "wxyz"}) {
    ASSERT_TRUE(driver_.state().reset_stream_buffer());
    pair_.left();
    pair_.say(front + kSlice + kSlice);
    EXPECT_EQ(read("H.264"), LIBD_OK);
    EXPECT_EQ(bytes(), front + kSlice);
  }
}

TEST_F(HttpFrames, OfAFailingSocketHaveTheSystemsText) {
  driver_.m_StreamSocket = 12345;
  for (const char* codec : {"JPEG", "H.264", "MPEG4"}) {
    driver_.soil_latest_error();
    EXPECT_EQ(read(codec), LIBD_FAILED);
    EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
  }
}

TEST(StreamBuffer, HoldsTheLargestFrameAndMore) {
  HttpDriver driver;
  EXPECT_GE(driver.m_StreamBufferSize, 2000000U + 65536U);
  driver.state().release_stream_buffer();
  EXPECT_EQ(driver.m_StreamBuffer, nullptr);
  EXPECT_EQ(driver.m_StreamBufferSize, 0U);
}

}  // namespace
}  // namespace vexa_test
