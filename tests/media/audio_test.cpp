// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <ctime>
#include <thread>
#include <tuple>
#include <vector>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"
#include "tests/support/stream_pair.h"

namespace vexa_test {
namespace {

std::time_t audio_clock_now = 0;

class AudioDriver : public TestDriver {
 public:
  AudioDriver() {
    audio_clock_now = 1000;
    state().now = [] { return audio_clock_now; };
    soil_latest_error();
  }
};

/// Every field of the record.
auto fields_of(const SLibDAudioInfo& i) {
  return std::make_tuple(i.reserved1, i.codec, i.reserved3, i.bitRateLabel, i.bitRate, i.frameSizeLabel, i.frameSize,
                         i.samplingRateLabel, i.samplingRate, i.reserved10, i.label1, i.value1, i.label2, i.value2,
                         i.label3, i.value3, i.label4, i.value4, i.label5, i.value5, i.reserved21);
}

SLibDAudioInfo any_record() {
  return {1, "two", "three", "four", 5, "six", 7, "eight", 9, 10, "11", 12, "13", 14, "15", 16, "17", 18, "19", 20, 21};
}

TEST(GetFixedAudioInfo, IsNotSupportedByACameraWithoutAudio) {
  AudioDriver driver;
  SLibDFixedAudioInfo info;
  info.available = 7;
  EXPECT_EQ(driver.GetFixedAudioInfo(info), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(info.available, 7);
  EXPECT_EQ(driver.m_FixedAudioInfo.available, 0);
}

TEST(GetFixedAudioInfo, HandsOutTheListsOfACameraWithEitherKindOfAudio) {
  for (const bool first : {true, false}) {
    AudioDriver driver;
    (first ? driver.m_FixedSystemInfo.capability3 : driver.m_FixedSystemInfo.capability4) = -1;
    driver.m_FixedAudioInfo.inputCodecs.resize(1);
    driver.m_FixedAudioInfo.outputCodecs.resize(2);
    driver.m_FixedAudioInfo.reserved3.resize(3);
    driver.m_FixedAudioInfo.reserved4.resize(4);
    SLibDFixedAudioInfo info;
    EXPECT_EQ(driver.GetFixedAudioInfo(info), LIBD_OK);
    EXPECT_EQ(info.inputCodecs.size(), 1U);
    EXPECT_EQ(info.outputCodecs.size(), 2U);
    EXPECT_EQ(info.reserved3.size(), 3U);
    EXPECT_EQ(info.reserved4.size(), 4U);
    EXPECT_EQ(info.available, 1);
    EXPECT_EQ(driver.m_FixedAudioInfo.available, 1);
  }
}

class AudioSettings : public testing::Test {
 protected:
  /// A camera that answers the inquiry with `body`.
  ELibDReturnCode ask(const std::string& body, SLibDAudioInfo& info) {
    return with({inquiry("camera", body)}, [&] { return driver_.GetAudioInfo(info); });
  }
  template <typename Call>
  ELibDReturnCode with(Script script, Call call) {
    return with_script(driver_, std::move(script), call);
  }

  AudioDriver driver_;
};

TEST_F(AudioSettings, AreReadFromTheCamerasWord) {
  driver_.m_AudioInfo = any_record();
  for (const char* body : {"x=1&AudInCodec=g726_16&AudioIn=on", "AudInCodec=g726_16"}) {
    SLibDAudioInfo expected = any_record();
    expected.codec = "G726";
    expected.bitRateLabel = "16 Kbps";
    expected.bitRate = 16000;
    expected.frameSizeLabel = "320 bytes";
    expected.frameSize = 320;
    expected.samplingRateLabel = "8 kHz";
    expected.samplingRate = 8000;
    SLibDAudioInfo info;
    EXPECT_EQ(ask(body, info), LIBD_OK);
    EXPECT_EQ(fields_of(info), fields_of(expected)) << body;
    EXPECT_EQ(fields_of(driver_.m_AudioInfo), fields_of(any_record()));
  }
}

TEST_F(AudioSettings, AreTheStoredOnesAt8KilohertzWhenTheWordIsMissingOrUnknown) {
  driver_.m_AudioInfo = any_record();
  SLibDAudioInfo expected = any_record();
  expected.samplingRateLabel = "8 kHz";
  expected.samplingRate = 8000;
  for (const char* body : {"AudioIn=on", "AudInCodec=", "AudInCodec=opus&AudioIn=on", "AudInCodec=g726_16 "}) {
    SLibDAudioInfo info;
    EXPECT_EQ(ask(body, info), LIBD_OK);
    EXPECT_EQ(fields_of(info), fields_of(expected)) << body;
  }
}

TEST_F(AudioSettings, OfARefusingCameraLeaveTheRecord) {
  SLibDAudioInfo info = any_record();
  EXPECT_EQ(with({refusal("/command/inquiry.cgi?inq=camera")}, [&] { return driver_.GetAudioInfo(info); }),
            LIBD_UNAUTHORIZED);
  EXPECT_EQ(fields_of(info), fields_of(any_record()));
}

TEST_F(AudioSettings, AreSetWithOneRequestAndStored) {
  const struct {
    const char* codec;
    std::int32_t bit_rate;
    const char* word;
  } cases[] = {
      {"G726", 24000, "g726_24"}, {"G726", 40000, "g726_40"}, {"G711", 64000, "g711_64"}, {"g726", 24000, "g711_64"}};
  for (const auto& c : cases) {
    SLibDAudioInfo info = any_record();
    info.codec = c.codec;
    info.bitRate = c.bit_rate;
    const std::string path = std::string("/command/camera.cgi?AudInCodec=") + c.word + "&AudioIn=on";
    EXPECT_EQ(with({command(path)}, [&] { return driver_.SetAudioInfo(info); }), LIBD_OK);
    EXPECT_EQ(fields_of(driver_.m_AudioInfo), fields_of(info));
  }
}

TEST_F(AudioSettings, ThatTheCameraRefusesAreNotStored) {
  SLibDAudioInfo info = any_record();
  EXPECT_EQ(
      with({refusal("/command/camera.cgi?AudInCodec=g711_64&AudioIn=on")}, [&] { return driver_.SetAudioInfo(info); }),
      LIBD_UNAUTHORIZED);
  EXPECT_EQ(fields_of(driver_.m_AudioInfo), fields_of(SLibDAudioInfo()));
}

/// Lets each allocation of `call` fail in turn, against a camera that plays `script`; every failure is reported.
template <typename Call>
void expect_each_failure_told(const Script& script, int few, Call call) {
  fails_at_every_allocation(
      [&](Shortage& shortage) {
        AudioDriver driver;
        ScriptedCamera camera(script);
        driver.use(camera.host(), camera.port(), 5000);
        driver.m_AudioInfo = any_record();
        driver.m_AudioInfo.reserved3 = std::string(40, 'x');
        driver.m_FixedSystemInfo.capability3 = 1;
        driver.m_FixedAudioInfo.inputCodecs.resize(1);
        expect_failure_told(shortage, driver, [&] { return call(driver); });
      },
      few);
}

TEST_F(AudioSettings, FailWhenAnyOneAllocationDoes) {
  expect_each_failure_told({inquiry("camera", "AudInCodec=g711_64&" + std::string(40, 'x'))}, 3,
                           [](AudioDriver& driver) {
                             SLibDAudioInfo info;
                             return driver.GetAudioInfo(info);
                           });
  SLibDAudioInfo set = any_record();
  set.reserved3 = std::string(40, 'x');
  expect_each_failure_told({command("/command/camera.cgi?AudInCodec=g711_64&AudioIn=on")}, 3,
                           [&set](AudioDriver& driver) { return driver.SetAudioInfo(set); });
  expect_each_failure_told({}, 0, [](AudioDriver& driver) {
    SLibDFixedAudioInfo info;
    return driver.GetFixedAudioInfo(info);
  });
}

class AudioStream : public testing::Test {
 protected:
  AudioStream() {
    frame_.data = buffer_;
    frame_.capacity = 16;
    driver_.use("127.0.0.1", 1, 10000);
    driver_.m_AudioSocket = dup(pair_.driver_end());
    driver_.m_LastAudioTime = audio_clock_now;
  }

  AudioDriver driver_;
  StreamPair pair_;
  unsigned char buffer_[32] = {};
  SLibDAudioFrameInfo frame_;
};

TEST_F(AudioStream, GivesWhatOneReadGives) {
  pair_.say("0123456789abcdefghij");
  audio_clock_now = 1234;
  EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_OK);
  EXPECT_EQ(frame_.length, 16);
  EXPECT_STREQ(reinterpret_cast<char*>(buffer_), "0123456789abcdef");
  EXPECT_EQ(driver_.m_LastAudioTime, 1234);
  EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_OK);
  EXPECT_EQ(frame_.length, 4);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(AudioStream, ReportsTheCodecThatWasSet) {
  const struct {
    const char* codec;
    std::int32_t type;
  } cases[] = {{"G711", 10}, {"G726", 20}, {"none", -1}};
  for (const auto& c : cases) {
    driver_.m_AudioInfo.codec = c.codec;
    pair_.say("x");
    driver_.GetCurrentAudioFrame(frame_);
    EXPECT_EQ(frame_.codecType, c.type);
  }
}

TEST_F(AudioStream, SilentNoLongerThanTheTimeoutHasNoFrame) {
  pair_.hang_up();  // reads of nothing, without the wait
  frame_.length = 7;
  for (const std::time_t silent : {0, 10}) {
    audio_clock_now = 1000 + silent;
    EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_NO_FRAME);
  }
  EXPECT_EQ(frame_.length, 7);
  EXPECT_EQ(driver_.latest_error(), "0 from before");
}

TEST_F(AudioStream, SilentLongerThanTheTimeoutTimesOutAtEveryPoll) {
  pair_.hang_up();
  audio_clock_now = 1011;
  for (int i = 0; i < 3; ++i) EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_TIMEOUT);
}

TEST_F(AudioStream, WaitsASecondWhateverTheTimeout) {
  driver_.use("127.0.0.1", 1, 0);
  const long reader = kernel_thread_id();
  std::thread late([this, reader] {
    EXPECT_TRUE(eventually([reader] { return is_sleeping(reader); }));
    pair_.say("late");
  });
  EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_OK);
  late.join();
  EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_NO_FRAME);
}

TEST_F(AudioStream, WithoutRoomTakesNothing) {
  pair_.say("sound");
  for (const std::int32_t capacity : {0, -1}) {
    frame_.capacity = capacity;
    EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_NO_FRAME);
  }
  EXPECT_EQ(pair_.left(), "sound");
}

TEST_F(AudioStream, ThatFailsStaysStored) {
  close(driver_.m_AudioSocket);
  driver_.m_AudioSocket = 12345;
  EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_FAILED);
  EXPECT_EQ(driver_.latest_error(), "0 Bad file descriptor");
  EXPECT_EQ(driver_.m_AudioSocket, 12345);
  driver_.m_AudioSocket = -1;
}

TEST_F(AudioStream, IsStoppedAlthoughOnePollFollowsTheOther) {
  std::atomic<long> poller_id{0};
  std::vector<ELibDReturnCode> polled;
  std::thread poller([&] {
    poller_id = kernel_thread_id();
    ELibDReturnCode code = LIBD_OK;
    while ((code = driver_.GetCurrentAudioFrame(frame_)) != LIBD_FAILED) polled.push_back(code);
  });
  ASSERT_TRUE(eventually([&] { return poller_id != 0 && is_sleeping(poller_id); }));
  std::atomic<long> stopper_id{0};
  std::thread stopper([&] {
    stopper_id = kernel_thread_id();
    driver_.StopAudioStreaming();
  });
  ASSERT_TRUE(eventually([&] { return stopper_id != 0 && is_sleeping(stopper_id); }));
  pair_.say("sound");
  poller.join();
  stopper.join();
  EXPECT_EQ(polled, std::vector<ELibDReturnCode>{LIBD_OK});
}

TEST_F(AudioStream, ThatIsNotOpenLeavesTheFrame) {
  driver_.StopAudioStreaming();
  frame_.codecType = 99;
  EXPECT_EQ(driver_.GetCurrentAudioFrame(frame_), LIBD_FAILED);
  EXPECT_EQ(frame_.codecType, 99);
}

ScriptStep audio_answer(const std::string& sound) { return answered("/audio", "HTTP/1.0 200 OK\r\n\r\n" + sound); }

TEST(StartAudioStreaming, OpensTheStreamAndMarksTheTime) {
  AudioDriver driver;
  ScriptedCamera camera({audio_answer("sound")});
  driver.use(camera.host(), camera.port(), 5000);
  audio_clock_now = 77;
  EXPECT_EQ(driver.StartAudioStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_LastAudioTime, 77);
  unsigned char buffer[100];
  SLibDAudioFrameInfo frame;
  frame.data = buffer;
  frame.capacity = sizeof buffer;
  EXPECT_EQ(driver.GetCurrentAudioFrame(frame), LIBD_OK);
  EXPECT_EQ(frame.length, 5);
  driver.StopAudioStreaming();
  EXPECT_EQ(camera.finish(), "");
}

TEST(StartAudioStreaming, ClosesARunningStreamFirst) {
  const std::size_t descriptors = open_descriptors();
  {
    AudioDriver driver;
    StreamPair running;
    driver.m_AudioSocket = dup(running.driver_end());
    ScriptedCamera camera({refusal("/audio")});
    driver.use(camera.host(), camera.port(), 5000);
    EXPECT_EQ(driver.StartAudioStreaming(), LIBD_UNAUTHORIZED);
    EXPECT_EQ(driver.m_AudioSocket, -1);
    EXPECT_EQ(camera.finish(), "");
  }
  EXPECT_EQ(open_descriptors(), descriptors);
}

/// A stream that another thread opens between the stop and the opening of a start.
class OvertakenStart : public AudioDriver {
 public:
  ELibDReturnCode StopAudioStreaming() override {
    AudioDriver::StopAudioStreaming();
    m_AudioSocket = dup(other.driver_end());
    return LIBD_OK;
  }

  StreamPair other;
};

TEST(StartAudioStreaming, LosesNoStreamThatAnotherThreadHasOpenedMeanwhile) {
  const std::size_t descriptors = open_descriptors();
  {
    OvertakenStart driver;
    ScriptedCamera camera({refusal("/audio")});
    driver.use(camera.host(), camera.port(), 5000);
    EXPECT_EQ(driver.StartAudioStreaming(), LIBD_UNAUTHORIZED);
    EXPECT_EQ(driver.m_AudioSocket, -1);
    EXPECT_EQ(camera.finish(), "");
  }
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST(StopAudioStreaming, WithoutAStreamIsDoneAtOnce) {
  TestDriver driver;
  EXPECT_EQ(driver.StopAudioStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_AudioSocket, -1);
}

TEST(StopAudioStreaming, ClosesTheStream) {
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
  TestDriver driver;
  driver.m_AudioSocket = ends[0];
  EXPECT_EQ(driver.StopAudioStreaming(), LIBD_OK);
  EXPECT_EQ(driver.m_AudioSocket, -1);
  char nothing = 0;
  EXPECT_EQ(recv(ends[1], &nothing, 1, MSG_DONTWAIT), 0);
  close(ends[1]);
}

TEST(AudioUpload, IsNotSupported) {
  TestDriver driver;
  SLibDAudioFrameInfo frame;
  EXPECT_EQ(driver.StartAudioUpLoad(), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.StopAudioUpload(), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.SetAudioUploadFrame(frame), LIBD_NOT_SUPPORTED);
}

}  // namespace
}  // namespace vexa_test
