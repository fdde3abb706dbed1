// SPDX-License-Identifier: Apache-2.0
// Frames and sound from the HTTP streams of a virtual camera.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <ctime>
#include <fstream>
#include <iterator>
#include <map>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/media_driver.h"
#include "tests/media/video_transports.h"
#include "tests/support/own_address.h"
#include "tests/support/process_state.h"
#include "tests/support/temporary_folder.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;
using vexa::camera::HttpStreamFault;
using Action = HttpStreamFault::Action;

struct HttpWay {
  const char* codec;
  const char* clip;
  std::int32_t key;
  std::int32_t delta;
};

constexpr HttpWay kJpegWay = {"JPEG", VEXA_CLIPS "/small.mjpeg", VIDEO_FRAME_JPEG, VIDEO_FRAME_JPEG};
constexpr HttpWay kH264Way = {"H.264", VEXA_CLIPS "/small.h264", VIDEO_FRAME_H264_KEY, VIDEO_FRAME_H264_DELTA};
constexpr HttpWay kMpeg4Way = {"MPEG4", VEXA_CLIPS "/small.m4v", VIDEO_FRAME_MPEG4_KEY, VIDEO_FRAME_MPEG4_DELTA};
constexpr HttpWay kHttpWays[] = {kJpegWay, kH264Way, kMpeg4Way};

class HttpLive : public testing::Test {
 protected:
  HttpLive() {
    options_.address = own_loopback(0);
    options_.rtsp_port = 0;
    options_.password = "secret";
  }

  void run(const HttpWay& way, int timeout = 5000) {
    if (options_.image_path.empty()) options_.image_path = way.clip;
    options_.speed = std::string(way.codec) == "JPEG" ? kJpegPace : kPace;
    camera_ = std::make_unique<vexa::camera::VirtualCamera>(held_by(pace_, options_));
    driver_.keep_pace(pace_);
    ASSERT_TRUE(camera_->start()) << camera_->error();
    driver_.use(camera_->address(), camera_->http_port(), timeout);
    const vexa::Guard guard(driver_.m_ConnectionLock);
    driver_.m_ConnectionInfo.streamTransport = 0;
    driver_.m_CameraInfo.codecName = way.codec;
  }

  void play(const HttpWay& way, int timeout = 5000) {
    run(way, timeout);
    ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
  }

  /// Picture `index` of the stream, as it must arrive.
  static std::string picture(const HttpWay& way, std::size_t index, const std::string& user_data = "") {
    static std::map<std::string, std::shared_ptr<const vexa::camera::ImageClip>> clips;
    auto& clip = clips[way.clip];
    if (!clip) clip = vexa::camera::ImageClip::load(way.clip);
    const auto& pictures = clip->pictures();
    const std::string sent = with_user_data(clip->kind(), pictures[index % pictures.size()], user_data);
    return without_user_data(clip->kind(), sent);
  }

  void expect_frames(const HttpWay& way, std::size_t count, const std::string& user_data = "") {
    const std::vector<TakenFrame> frames = taker_.take_all(driver_, count);
    ASSERT_EQ(frames.size(), count) << way.codec;
    for (std::size_t i = 0; i < count; ++i) {
      ASSERT_EQ(frames[i].bytes, picture(way, i, user_data)) << way.codec << " " << i;
      const bool key = i % 25 == 0;
      EXPECT_EQ(frames[i].info.frameType, key ? way.key : way.delta) << way.codec << " " << i;
    }
  }

  /// Polls until the stream reports that it has been silent too long; frames may come before.
  bool times_out() {
    const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(20);
    while (std::chrono::steady_clock::now() < end) {
      TakenFrame frame;
      const ELibDReturnCode code = taker_.take(driver_, frame);
      if (code == LIBD_TIMEOUT) return true;
      if (code == LIBD_NO_FRAME) std::this_thread::sleep_for(std::chrono::milliseconds(1));
    }
    return false;
  }

  void strike(Action action, std::uint64_t index, const std::string& text, std::size_t bytes = 0) {
    HttpStreamFault fault;
    fault.index = index;
    fault.action = action;
    fault.text = text;
    fault.bytes = bytes;
    options_.stream_faults.push_back(fault);
  }

  CameraOptions options_;
  const std::shared_ptr<KeptPace> pace_ = std::make_shared<KeptPace>();
  MediaDriver driver_;
  std::unique_ptr<vexa::camera::VirtualCamera> camera_;
  FrameTaker taker_;
};

TEST_F(HttpLive, EveryFrameIsTheEncoders) {
  for (const HttpWay& way : kHttpWays) {
    options_.image_path = way.clip;
    play(way);
    expect_frames(way, 120);
    EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
  }
}

TEST_F(HttpLive, PicturesMayComeInPiecesOfAnyLength) {
  for (const HttpWay& way : kHttpWays) {
    for (const std::size_t piece : {1U, 7U, 1021U}) {
      options_.image_path = way.clip;
      options_.stream_piece = piece;
      play(way, 600000);  // a try for each byte of a picture, which is what a busy machine may need
      expect_frames(way, piece == 1 ? 1 : 4);
      EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
    }
  }
}

TEST_F(HttpLive, TheCamerasPositionIsTakenFromEveryCodec) {
  for (const HttpWay& way : kHttpWays) {
    options_.image_path = way.clip;
    options_.user_data = std::string("CamPos: ") + way.codec + " 0123456789abcdef";
    play(way);
    expect_frames(way, 10, options_.user_data);
    EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
    EXPECT_EQ(driver_.position_text(), options_.user_data.substr(0, 24));
  }
}

TEST_F(HttpLive, TextBetweenThePartsIsPassedOver) {
  strike(Action::kBefore, 2, "garbage of a camera\r\nDataLen\r\n");
  play(kJpegWay);
  expect_frames(kJpegWay, 10);
}

TEST_F(HttpLive, PicturesOfAMegabyteKeepUp) {
  const TemporaryFolder folder;
  const std::string path = folder / "megabyte.mjpeg";
  std::string large = picture(kJpegWay, 0);
  for (int i = 0; i < 15; ++i) large.insert(2, "\xff\xfe\xff\xff" + std::string(65533, 'x'));
  std::ofstream(path, std::ios::binary) << large;
  options_.image_path = path;
  play(kJpegWay);
  const auto frames = taker_.take_all(driver_, 50);
  EXPECT_EQ(frames.size(), 50U);
  for (const TakenFrame& frame : frames) EXPECT_TRUE(frame.bytes == large);
  driver_.StopVideoStreaming();
}

TEST_F(HttpLive, ALargePartIsDroppedAndTakenAfterARestart) {
  const TemporaryFolder folder;
  const std::string path = folder / "large.mjpeg";
  std::string large = picture(kJpegWay, 0);
  for (int i = 0; i < 25; ++i) large.insert(2, "\xff\xfe\xff\xff" + std::string(65533, 'x'));
  std::ofstream(path, std::ios::binary) << picture(kJpegWay, 1) << large;
  options_.image_path = path;
  play(kJpegWay, 1000);
  EXPECT_EQ(taker_.take_all(driver_, 1).size(), 1U);
  EXPECT_TRUE(times_out());
  ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
  const auto frames = taker_.take_all(driver_, 4);
  ASSERT_EQ(frames.size(), 4U);
  EXPECT_EQ(frames[1].bytes, large);
  EXPECT_EQ(frames[2].bytes, picture(kJpegWay, 1));
  driver_.StopVideoStreaming();
}

struct BrokenStream {
  const char* name;
  HttpWay way;
  Action action;
  const char* text;
  std::size_t bytes;
};

std::string name_of_broken_stream(const testing::TestParamInfo<BrokenStream>& stream) { return stream.param.name; }

class BrokenHttpLive : public HttpLive, public testing::WithParamInterface<BrokenStream> {};

TEST_P(BrokenHttpLive, IsSilentTimesOutAndComesBackWithARestart) {
  const BrokenStream& broken = GetParam();
  strike(broken.action, 3, broken.text, broken.bytes);
  // A length that the stream comes to fill is over before a slow host asks.
  strike(Action::kSilence, 20, "");
  run(broken.way, 1000);
  for (int round = 0; round < 2; ++round) {
    ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
    expect_frames(broken.way, 2);
    EXPECT_TRUE(times_out());
  }
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

const BrokenStream kBrokenStreams[] = {
    {"AHugeLength", kJpegWay, Action::kDataLength, "99999999999", 0},
    {"ALengthJustAboveTheBuffer", kJpegWay, Action::kDataLength, "1200001", 0},
    {"SilenceWithinAPart", kJpegWay, Action::kSilence, "", 500},
    {"SilenceBetweenParts", kJpegWay, Action::kSilence, "", 0},
    {"ACloseWithinAPart", kJpegWay, Action::kClose, "", 500},
    {"SilenceWithinAUnitOfH264", kH264Way, Action::kSilence, "", 500},
    {"ACloseWithinAUnitOfMpeg4", kMpeg4Way, Action::kClose, "", 500},
    {"AnotherCodecThanJpeg", kJpegWay, Action::kOtherClip, VEXA_CLIPS "/small.h264", 0},
};

INSTANTIATE_TEST_SUITE_P(Of, BrokenHttpLive, testing::ValuesIn(kBrokenStreams), name_of_broken_stream);

std::atomic<std::time_t> disturbed_now{0};

class DisturbedHttpLive : public HttpLive, public testing::WithParamInterface<BrokenStream> {
 protected:
  DisturbedHttpLive() {
    disturbed_now = 1000;
    driver_.state().now = [] { return disturbed_now.load(); };
  }

  /// Polls, while the driver's clock runs, until the stream gives a frame or reports that it has been silent too long.
  ELibDReturnCode next_outcome(TakenFrame& frame) {
    ELibDReturnCode code = LIBD_NO_FRAME;
    eventually([&] {
      code = taker_.take(driver_, frame);
      if (code == LIBD_NO_FRAME) ++disturbed_now;
      return code != LIBD_NO_FRAME;
    });
    return code;
  }
};

TEST_P(DisturbedHttpLive, IsReadUpToTheFaultAgainAfterARestart) {
  const BrokenStream& disturbed = GetParam();
  strike(disturbed.action, 3, disturbed.text, disturbed.bytes);
  run(disturbed.way, 10000);  // a camera that reads another clip answers late
  for (int round = 0; round < 2; ++round) {
    ASSERT_EQ(driver_.StartVideoStreaming(), LIBD_OK);
    expect_frames(disturbed.way, 2);
    for (int outcome = 0; outcome < 2; ++outcome) {
      TakenFrame frame;
      const ELibDReturnCode code = next_outcome(frame);
      EXPECT_TRUE(code == LIBD_OK || code == LIBD_TIMEOUT) << code;
      EXPECT_LE(frame.bytes.size(), 1200000U);
    }
  }
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

const BrokenStream kDisturbedStreams[] = {
    {"NoLength", kJpegWay, Action::kNoDataLength, "", 0},
    {"ANegativeLength", kJpegWay, Action::kDataLength, "-5", 0},
    {"ALengthOfZero", kJpegWay, Action::kDataLength, "0", 0},
    {"ALengthTooShort", kJpegWay, Action::kDataLength, "100", 0},
    {"ALengthTooLong", kJpegWay, Action::kDataLength, "30000", 0},
    {"AWordForALength", kJpegWay, Action::kDataLength, "long", 0},
    {"ACutPart", kJpegWay, Action::kCut, "", 700},
    {"ACutUnitOfH264", kH264Way, Action::kCut, "", 7},
    {"ACutUnitOfMpeg4", kMpeg4Way, Action::kCut, "", 3},
    {"GarbageInH264", kH264Way, Action::kBefore, "garbage\xff\xfe", 0},
    {"AnotherCodecThanH264", kH264Way, Action::kOtherClip, VEXA_CLIPS "/small.m4v", 0},
    {"AnotherCodecThanMpeg4", kMpeg4Way, Action::kOtherClip, VEXA_CLIPS "/small.mjpeg", 0},
};

INSTANTIATE_TEST_SUITE_P(Of, DisturbedHttpLive, testing::ValuesIn(kDisturbedStreams), name_of_broken_stream);

TEST_F(HttpLive, ACodecThatIsChangedComesWithTheNextStart) {
  play(kJpegWay);
  expect_frames(kJpegWay, 3);
  driver_.StopVideoStreaming();
  camera_->stop();
  options_.image_path = kMpeg4Way.clip;
  play(kMpeg4Way);
  expect_frames(kMpeg4Way, 30);
  driver_.StopVideoStreaming();
}

TEST_F(HttpLive, ARefusedStreamIsNotStarted) {
  options_.user = "another";
  run(kJpegWay);
  EXPECT_EQ(driver_.StartVideoStreaming(), LIBD_UNAUTHORIZED);
  EXPECT_EQ(driver_.m_StreamSocket, -1);
  EXPECT_EQ(driver_.StopVideoStreaming(), LIBD_OK);
}

TEST_F(HttpLive, SoundOfEveryCodecArrivesAsTheCameraSendsIt) {
  options_.sound_path = VEXA_CLIPS "/tone";
  options_.loop = false;
  run(kJpegWay);
  for (const char* word : {"g711_64", "g726_40", "g726_32", "g726_24", "g726_16"}) {
    SLibDAudioInfo info;
    info.codec = word[1] == '7' && word[2] == '1' ? "G711" : "G726";
    info.bitRate = 1000 * std::stoi(std::string(word).substr(5));
    ASSERT_EQ(driver_.SetAudioInfo(info), LIBD_OK);
    SLibDAudioInfo told;
    ASSERT_EQ(driver_.GetAudioInfo(told), LIBD_OK);
    EXPECT_EQ(told.codec, info.codec);
    EXPECT_EQ(told.bitRate, info.bitRate);
    std::ifstream file(std::string(VEXA_CLIPS "/tone.") + word, std::ios::binary);
    const std::string sound((std::istreambuf_iterator<char>(file)), std::istreambuf_iterator<char>());
    ASSERT_EQ(driver_.StartAudioStreaming(), LIBD_OK);
    std::string heard;
    unsigned char buffer[1000];
    SLibDAudioFrameInfo frame;
    frame.data = buffer;
    frame.capacity = sizeof buffer;
    while (heard.size() < sound.size() && driver_.GetCurrentAudioFrame(frame) == LIBD_OK) {
      heard.append(reinterpret_cast<char*>(buffer), static_cast<std::size_t>(frame.length));
      EXPECT_EQ(frame.codecType, word[2] == '1' ? 10 : 20);
    }
    EXPECT_EQ(heard, sound) << word;
    driver_.StopAudioStreaming();
  }
}

}  // namespace
}  // namespace vexa_test
