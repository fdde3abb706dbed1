// SPDX-License-Identifier: Apache-2.0
// The readers of endless HTTP streams, on connections of the test's own.
#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <thread>
#include <vector>

#include "media/assembly/start_code.h"
#include "tests/support/process_state.h"
#include "tests/support/stream_pair.h"
#include "tests/support/test_driver.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

class HttpStream : public testing::Test {
 protected:
  HttpStream() {
    driver_.soil_latest_error();
    const vexa::Guard guard(driver_.m_ConnectionLock);
    driver_.m_ConnectionInfo.timeout = 100;
  }

  StreamDriver driver_;
  StreamPair pair_;
  std::vector<char> buffer_ = std::vector<char>(200000, '#');
};

class JpegPart : public HttpStream {
 protected:
  int receive(int capacity = 1000, int timeout = 100) {
    return driver_.http_multipart_jpeg_recv(pair_.driver_end(), buffer_.data(), capacity, timeout);
  }
  std::string received(std::size_t length) const { return {buffer_.data(), length}; }
};

std::string jpeg_part(const std::string& image, const std::string& length) {
  return "--part\r\nContent-Type: image/jpeg\r\nDataLen: " + length + "\r\n\r\n" + image + "\r\n";
}

std::string jpeg_part(const std::string& image) { return jpeg_part(image, std::to_string(image.size())); }

TEST_F(JpegPart, GivesOneImageACall) {
  pair_.say(jpeg_part("first image") + jpeg_part("second"));
  EXPECT_EQ(receive(), 11);
  EXPECT_EQ(received(12), "first image#");
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  EXPECT_EQ(receive(), 6);
  EXPECT_EQ(received(6), "second");
}

TEST_F(JpegPart, TakesAHeaderThatEndsInLineFeeds) {
  pair_.say("DataLen: 3\n\nabc");
  EXPECT_EQ(receive(), 3);
}

TEST_F(JpegPart, OfLength0IsAnImageOfLength0) {
  pair_.say(jpeg_part("") + jpeg_part("next"));
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(driver_.LatestErrorCode(), LIBD_FAILED);
  EXPECT_EQ(receive(), 4);
}

TEST_F(JpegPart, WithoutALengthIsRefused) {
  for (const char* length : {"", "x", "-1", "-99999999999"}) {
    driver_.soil_latest_error();
    pair_.say(jpeg_part("", length));
    EXPECT_EQ(receive(), -1) << length;
    EXPECT_EQ(driver_.latest_error(), "0 DataLen not found");
    pair_.left();
  }
  pair_.say("Content-Length: 3\r\n\r\nabc");
  EXPECT_EQ(receive(), -1);
  EXPECT_EQ(driver_.latest_error(), "0 DataLen not found");
}

TEST_F(JpegPart, LargerThanTheBufferStaysOnTheSocket) {
  pair_.say(jpeg_part("12345"));
  EXPECT_EQ(receive(4), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Buffer too small");
  EXPECT_EQ(received(1), "#");
  EXPECT_EQ(pair_.left(), "12345\r\n");
  pair_.say(jpeg_part("12345"));
  EXPECT_EQ(receive(5), 5);
}

TEST_F(JpegPart, OfAnAbsurdLengthIsRefused) {
  for (const char* length : {"2147483647", "2147483648", "4294967297", "99999999999999999999"}) {
    pair_.say(jpeg_part("", length));
    EXPECT_EQ(receive(200000), -1) << length;
    EXPECT_EQ(driver_.LatestErrorText(), "Buffer too small");
    pair_.left();
  }
}

TEST_F(JpegPart, CutByTheClosingCameraLeavesCodeAndText) {
  pair_.say(jpeg_part("1234", "100"));
  pair_.hang_up();
  EXPECT_EQ(receive(), -1);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(JpegPart, CutByASilentCameraTimesOut) {
  pair_.say(jpeg_part("1234", "100"));
  EXPECT_EQ(receive(1000, 30), -1);
  EXPECT_EQ(driver_.latest_error(), "-200 Receive timed out");
}

TEST_F(JpegPart, HeaderIsWaitedForASecondWhateverTheTimeout) {
  const long reader = kernel_thread_id();
  std::thread late([this, reader] {
    EXPECT_TRUE(eventually([reader] { return is_sleeping(reader); }));
    pair_.say(jpeg_part("late"));
  });
  EXPECT_EQ(receive(1000, 0), 4);
  late.join();
}

TEST_F(JpegPart, HeaderThatDoesNotComeIsNoFailure) {
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  pair_.say("DataLen: 3\r\n");
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  EXPECT_EQ(pair_.left(), "DataLen: 3\r\n");
}

TEST_F(JpegPart, OfAClosedSocketIsASystemFailure) {
  EXPECT_EQ(driver_.http_multipart_jpeg_recv(-1, buffer_.data(), 1000, 10), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
}

TEST_F(JpegPart, GivesTheCamerasPosition) {
  const struct {
    std::string image;
    std::string position;
  } cases[] = {{"\xff\xd8 CamPos: 0123456789abcdefghij", "CamPos: 0123456789abcdef"},
               {std::string("\0\0\0", 3) + "CamPos: 1", "CamPos: 1"},
               {std::string(150000, 'C') + "CamPos: far behind, and more", "CamPos: far behind, and "},
               {"CamPos: first 16 letters CamPos: second", "CamPos: first 16 letters"}};
  for (const auto& c : cases) {
    std::thread camera([&] { pair_.say(jpeg_part(c.image)); });
    EXPECT_EQ(receive(200000, 5000), static_cast<int>(c.image.size()));
    camera.join();
    EXPECT_EQ(driver_.position_text(), c.position);
    pair_.left();
  }
  pair_.say(jpeg_part("CamPos:without a blank"));
  receive();
  EXPECT_EQ(driver_.position_text(), "CamPos: first 16 letters");
}

TEST_F(JpegPart, ComesAByteAtATime) {
  std::thread camera([this] {
    for (const char byte : jpeg_part("slow image") + jpeg_part("another")) {
      pair_.say({&byte, 1});
      std::this_thread::yield();
    }
  });
  EXPECT_EQ(receive(1000, 5000), 10);
  EXPECT_EQ(receive(1000, 5000), 7);
  camera.join();
}

class AlarmPart : public HttpStream {
 protected:
  int receive() { return driver_.http_multipart_input_recv(pair_.driver_end(), mask_, state_); }

  unsigned int mask_ = 77;
  unsigned int state_ = 78;
};

TEST_F(AlarmPart, IsTurnedIntoBits) {
  pair_.say("--part\r\nSensor1=1&Sensor2=0&Tampering=1&Audio=0\r\n\r\nSensor1=0\n\n");
  EXPECT_EQ(receive(), 1);
  EXPECT_EQ(mask_, 0b11011U);
  EXPECT_EQ(state_, 0b01001U);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  EXPECT_EQ(receive(), 1);
  EXPECT_EQ(mask_, 1U);
  EXPECT_EQ(state_, 0U);
}

TEST_F(AlarmPart, IsReadAsTheCameraReportsMotion) {
  const struct {
    int vmd_type;
    bool motion_detection;
    unsigned int state;
  } cases[] = {{0, false, 0b0010}, {0, true, 0b0001}, {1, false, 0b1110}, {1, true, 0b0111}};
  for (const auto& c : cases) {
    driver_.m_IoBoxInfo.vmdType = c.vmd_type;
    driver_.m_UseMotionDetection = c.motion_detection;
    pair_.say("Sensor1=0&VMF=7&OdWin1=1&MdWin1=1\r\n\r\n");
    EXPECT_EQ(receive(), 1);
    EXPECT_EQ(state_, c.state) << c.vmd_type << c.motion_detection;
  }
}

TEST_F(AlarmPart, ThatDoesNotComeLeavesTheBits) {
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  pair_.say("Sensor1=1");
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(driver_.http_multipart_input_recv(-1, mask_, state_), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
  EXPECT_EQ(mask_, 77U);
  EXPECT_EQ(state_, 78U);
}

TEST_F(AlarmPart, WithoutItemsClearsTheBits) {
  pair_.say("--part\r\n\r\n");
  EXPECT_EQ(receive(), 1);
  EXPECT_EQ(mask_, 0U);
  EXPECT_EQ(state_, 0U);
}

class MetadataPart : public HttpStream {
 protected:
  int receive(int capacity = 65, int timeout = 100) {
    return driver_.http_multipart_mddata_recv(pair_.driver_end(), buffer_.data(), capacity, timeout);
  }
};

TEST_F(MetadataPart, Is64BytesAndATerminator) {
  const std::string first(64, 'a');
  const std::string second = std::string("\0b", 2) + std::string(62, 'c');
  pair_.say("--part\r\n\r\n" + first + "--part\r\n\r\n" + second);
  EXPECT_EQ(receive(), 64);
  EXPECT_EQ(std::string(buffer_.data(), 66), first + std::string("\0#", 2));
  EXPECT_EQ(receive(), 64);
  EXPECT_EQ(std::string(buffer_.data(), 64), second);
}

TEST_F(MetadataPart, NeedsRoomFor65Bytes) {
  pair_.say("--part\r\n\r\n" + std::string(64, 'a'));
  for (const int capacity : {64, 0, -1}) EXPECT_EQ(receive(capacity), -1);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  EXPECT_EQ(receive(65), 64);
}

TEST_F(MetadataPart, ShorterThan64BytesFails) {
  pair_.say("--part\r\n\r\n" + std::string(63, 'a'));
  EXPECT_EQ(receive(65, 30), -1);
  EXPECT_EQ(driver_.latest_error(), "-200 Receive timed out");
  driver_.soil_latest_error();
  pair_.say("--part\r\n\r\n" + std::string(63, 'a'));
  pair_.hang_up();
  EXPECT_EQ(receive(), -1);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(MetadataPart, HeaderIsWaitedForASecondWhateverTheTimeout) {
  std::thread late([this] {
    for (const char byte : std::string("--part, late\r\n\r")) {
      pair_.say({&byte, 1});
      std::this_thread::yield();
    }
    pair_.say("\n" + std::string(64, 'a'));
  });
  EXPECT_EQ(receive(65, 0), 64);
  late.join();
}

TEST_F(MetadataPart, HeaderThatDoesNotComeIsNoFailure) {
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
  EXPECT_EQ(driver_.http_multipart_mddata_recv(-1, buffer_.data(), 65, 10), -1);
}

std::string unit(const std::string& payload) { return std::string("\0\0\0\1", 4) + payload; }

class ElementaryStream : public HttpStream {
 protected:
  ElementaryStream() { driver_.hold_stream(1 << 20); }

  int receive(int capacity = 1000, int timeout = 200) {
    return driver_.http_stream_recv(pair_.driver_end(), buffer_.data(), capacity, TestDriver::find_start_code_h264, 4,
                                    timeout);
  }
  std::string frame(int capacity = 1000, int timeout = 200) {
    const int length = receive(capacity, timeout);
    return length < 0 ? "-1" : std::string(buffer_.data(), static_cast<std::size_t>(length));
  }
};

TEST_F(ElementaryStream, GivesAFrameACall) {
  pair_.say(unit("one") + unit("two") + unit("three"));
  EXPECT_EQ(receive(), 0);  // nothing stands in front of the first
  EXPECT_EQ(frame(), unit("one"));
  EXPECT_EQ(frame(), unit("two"));
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(ElementaryStream, TheLastFrameWaitsForTheNextStartCode) {
  pair_.say(unit("") + unit("one"));
  receive();
  EXPECT_EQ(frame(), unit(""));
  EXPECT_EQ(receive(1000, 30), 0);
  pair_.say(unit("x"));
  EXPECT_EQ(frame(), unit("one"));
}

TEST_F(ElementaryStream, ReadsNothingWithATimeoutBelow10) {
  pair_.say(unit("one") + unit("two") + unit("three"));
  for (const int timeout : {9, 1, 0, -1, INT_MIN}) EXPECT_EQ(receive(1000, timeout), 0);
  EXPECT_EQ(driver_.m_StreamWriteEnd, driver_.m_StreamBuffer);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(ElementaryStream, SearchesWhatCameWithTheLastTryOnlyInTheNextCall) {
  pair_.say("front" + unit("one") + unit("two"));
  EXPECT_EQ(receive(1000, 19), 0);  // one try
  EXPECT_EQ(driver_.m_StreamWriteEnd - driver_.m_StreamBuffer, 5 + 7 + 7);
  EXPECT_EQ(driver_.m_StreamSearchPos, driver_.m_StreamBuffer);
  EXPECT_EQ(frame(1000, 10), "front");
}

TEST_F(ElementaryStream, AFrameThatIsTooLongFailsOnEveryCall) {
  pair_.say(unit("12345") + unit("six") + unit("x"));
  receive();
  for (int i = 0; i < 3; ++i) {
    EXPECT_EQ(receive(8), -1);
    EXPECT_EQ(driver_.latest_error(), "0 from before");
  }
  EXPECT_EQ(frame(9), unit("12345"));
}

TEST_F(ElementaryStream, ASilentCameraIsNoFailure) {
  EXPECT_EQ(receive(1000, 20), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(ElementaryStream, AClosedCameraLetsTheTriesRunOut) {
  pair_.say(unit("one") + unit("two"));
  pair_.hang_up();
  EXPECT_EQ(receive(), 0);
  EXPECT_EQ(frame(), unit("one"));
  EXPECT_EQ(receive(1000, 50), 0);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(ElementaryStream, AClosedSocketIsASystemFailure) {
  EXPECT_EQ(driver_.http_stream_recv(-1, buffer_.data(), 1000, TestDriver::find_start_code_h264, 4, 100), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
}

TEST_F(ElementaryStream, AFullBufferWritesNothingAndLetsTheTriesRunOut) {
  driver_.hold_stream(50);
  pair_.say(std::string(80, 'x'));
  EXPECT_EQ(receive(1000, 30), 0);
  EXPECT_EQ(driver_.m_StreamWriteEnd - driver_.m_StreamBuffer, 50);
  EXPECT_EQ(receive(1000, 30), 0);
  EXPECT_EQ(pair_.left(), std::string(30, 'x'));
}

TEST_F(ElementaryStream, WithoutABufferTakesNothing) {
  driver_.hold_stream(0);
  pair_.say(unit("one"));
  EXPECT_EQ(receive(1000, 30), 0);
  EXPECT_EQ(pair_.left(), unit("one"));
}

TEST_F(ElementaryStream, AStopEndsTheWaitAtOnce) {
  SetEvent(driver_.m_StopVideoEvent);
  EXPECT_EQ(receive(1000, 600000), 0);
}

TEST_F(ElementaryStream, GivesTheSameFramesAByteAtATime) {
  std::thread camera([this] {
    for (const char byte : unit("one") + unit("two") + unit("x")) {
      pair_.say({&byte, 1});
      std::this_thread::yield();
    }
  });
  EXPECT_EQ(receive(1000, 5000), 0);
  EXPECT_EQ(frame(1000, 5000), unit("one"));
  EXPECT_EQ(frame(1000, 5000), unit("two"));
  camera.join();
}

TEST_F(ElementaryStream, GoesOnForEverThroughAFiniteBuffer) {
  driver_.hold_stream(65536 + 3000);
  constexpr int kUnits = 400;
  std::thread camera([this] {
    for (int i = 0; i <= kUnits; ++i) {
      pair_.say(unit(std::to_string(i) + std::string(1000, 'x')));
    }
  });
  EXPECT_EQ(receive(2000, 10000), 0);
  for (int i = 0; i < kUnits; ++i) {
    std::string got;
    while (got.empty()) got = frame(2000, 10000);
    ASSERT_EQ(got, unit(std::to_string(i) + std::string(1000, 'x')));
  }
  camera.join();
}

}  // namespace
}  // namespace vexa_test
