// Waiting for several streams and drivers: what is ready, and sets of drivers.
#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <memory>
#include <thread>
#include <vector>

#include "tests/support/descriptors.h"
#include "tests/support/process_state.h"
#include "tests/support/test_driver.h"
#include "vexa/waiting.h"

namespace vexa_test {
namespace {

using vexa::kAlarmStream;
using vexa::kAllStreams;
using vexa::kAudioStream;
using vexa::kMetadataStream;
using vexa::kVideoStream;
using vexa::ReadyDriver;

constexpr int kLong = 30000;              // milliseconds, never used up
constexpr std::int64_t kPatience = 5000;  // milliseconds

std::atomic<std::time_t> streams_now{100};

/// A driver whose streams are opened onto socket pairs; the test is the camera.
class StreamingDriver : public TestDriver {
 public:
  StreamingDriver() {
    streams_now = 100;
    state().now = [] { return streams_now.load(); };
  }
  ~StreamingDriver() override {
    for (const int end : camera_) close(end);
    for (const std::uint32_t bit : vexa::kPolledStreams) stream(bit).stop();
  }

  vexa::PolledStream& stream(std::uint32_t bit) {
    if (bit == kAlarmStream) return state().alarms;
    return bit == kMetadataStream ? state().metadata : state().audio;
  }

  /// The camera's end.
  int open(std::uint32_t bit) {
    int ends[2] = {-1, -1};
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    const auto opened = [&]() -> vexa::Result<vexa::Socket> { return vexa::Socket(ends[0]); };
    EXPECT_TRUE(stream(bit).start(opened, state().now, kPatience));
    camera_.push_back(ends[1]);
    return ends[1];
  }

  /// One poll that takes all bytes.
  ELibDReturnCode poll(std::uint32_t bit) {
    const auto read = [](int socket) -> vexa::Result<int> {
      char bytes[64];
      return static_cast<int>(std::max<ssize_t>(recv(socket, bytes, sizeof bytes, MSG_DONTWAIT), 0));
    };
    const auto polled = stream(bit).poll(read, state().now, kPatience);
    return polled ? *polled : polled.failure().code;
  }

  /// One that takes none, as of a part whose rest does not come, or fails.
  ELibDReturnCode poll_in_vain(std::uint32_t bit, const vexa::Result<int>& read) {
    const auto polled = stream(bit).poll([&](int) { return read; }, state().now, kPatience);
    return polled ? *polled : polled.failure().code;
  }

  void close_camera_end() {
    close(camera_.back());
    camera_.pop_back();
  }

 private:
  std::vector<int> camera_;
};

void send_byte(int camera) { ASSERT_EQ(send(camera, "x", 1, MSG_NOSIGNAL), 1); }

/// What both ways of asking say of one driver.
std::uint32_t ready_streams(StreamingDriver& driver, vexa::WaitSet& set) {
  std::vector<ReadyDriver> ready;
  const int count = set.Wait(ready, 0);
  EXPECT_EQ(static_cast<std::size_t>(count), ready.size());
  const std::uint32_t found = ready.empty() ? 0 : ready[0].streams;
  EXPECT_EQ(vexa::ReadyStreams(driver), found);
  // A timer that has fired is looked at by the wait; what is ready shows in the descriptor.
  if (found != 0) EXPECT_TRUE(is_readable(set.Descriptor()));
  return found;
}

class WaitingStreams : public testing::TestWithParam<vexa::StreamBits> {};

TEST_P(WaitingStreams, AreReadyWhileBytesOfTheCameraWait) {
  StreamingDriver driver;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAllStreams));
  EXPECT_EQ(ready_streams(driver, set), 0u);
  const int camera = driver.open(GetParam());
  EXPECT_EQ(ready_streams(driver, set), 0u);
  send_byte(camera);
  EXPECT_EQ(ready_streams(driver, set), GetParam());
  EXPECT_EQ(ready_streams(driver, set), GetParam());
  EXPECT_EQ(driver.poll(GetParam()), LIBD_OK);
  EXPECT_EQ(ready_streams(driver, set), 0u);
  send_byte(camera);
  EXPECT_TRUE(driver.stream(GetParam()).stop());
  EXPECT_EQ(ready_streams(driver, set), 0u);
}

TEST_P(WaitingStreams, AreReadyOnceWhenAReportOfSilenceFallsDue) {
  StreamingDriver driver;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAllStreams));
  const int camera = driver.open(GetParam());
  streams_now = 105;
  EXPECT_EQ(ready_streams(driver, set), 0u);
  streams_now = 106;
  EXPECT_EQ(ready_streams(driver, set), GetParam());
  EXPECT_EQ(driver.poll(GetParam()), LIBD_TIMEOUT);
  EXPECT_EQ(ready_streams(driver, set), 0u);
  streams_now = 111;
  EXPECT_EQ(ready_streams(driver, set), 0u);
  streams_now = 112;
  EXPECT_EQ(ready_streams(driver, set), GetParam());
  send_byte(camera);
  EXPECT_EQ(driver.poll(GetParam()), LIBD_OK);
  streams_now = 117;
  EXPECT_EQ(ready_streams(driver, set), 0u);
  streams_now = 118;
  EXPECT_EQ(ready_streams(driver, set), GetParam());
}

TEST_P(WaitingStreams, WakeTheHostOnceASecondWhenTheCameraHasClosed) {
  StreamingDriver driver;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAllStreams));
  driver.open(GetParam());
  driver.close_camera_end();
  for (std::time_t second = 100; second < 106; ++second) {
    streams_now = second;
    EXPECT_EQ(ready_streams(driver, set), GetParam()) << second;
    EXPECT_EQ(driver.poll(GetParam()), LIBD_NO_FRAME);
    EXPECT_EQ(ready_streams(driver, set), 0u) << second;
  }
  streams_now = 106;
  EXPECT_EQ(driver.poll(GetParam()), LIBD_TIMEOUT);
  EXPECT_EQ(ready_streams(driver, set), 0u);
}

TEST_P(WaitingStreams, RestForASecondAfterBytesThatGaveNoData) {
  for (const vexa::Result<int>& read : {vexa::Result<int>(0), vexa::Result<int>(vexa::kReceiveTimedOut)}) {
    StreamingDriver driver;
    vexa::WaitSet set;
    ASSERT_TRUE(set.Add(driver, kAllStreams));
    const int camera = driver.open(GetParam());
    send_byte(camera);
    EXPECT_NE(driver.poll_in_vain(GetParam(), read), LIBD_OK);
    EXPECT_EQ(ready_streams(driver, set), 0u);
    ++streams_now;
    EXPECT_EQ(ready_streams(driver, set), GetParam());
    EXPECT_EQ(driver.poll(GetParam()), LIBD_OK);
    send_byte(camera);
    EXPECT_EQ(ready_streams(driver, set), GetParam());
  }
}

TEST_P(WaitingStreams, AreNotReadyForAHostThatDoesNotWantThem) {
  StreamingDriver driver;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAllStreams & ~GetParam()));
  const int camera = driver.open(GetParam());
  send_byte(camera);
  streams_now = 200;
  driver.state().readiness.set_video(true);
  std::vector<ReadyDriver> ready;
  EXPECT_EQ(set.Wait(ready, 0), 1);
  EXPECT_EQ(ready[0].streams, kVideoStream);
  EXPECT_EQ(vexa::ReadyStreams(driver, GetParam()), GetParam());
  EXPECT_EQ(vexa::ReadyStreams(driver, kVideoStream), kVideoStream);
  ASSERT_TRUE(set.Add(driver, GetParam()));
  EXPECT_EQ(set.Wait(ready, 0), 1);
  EXPECT_EQ(ready[0].streams, GetParam());
}

TEST_P(WaitingStreams, AreKnownToASetThatTheDriverJoinsLater) {
  StreamingDriver driver;
  const int camera = driver.open(GetParam());
  send_byte(camera);
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAllStreams));
  EXPECT_EQ(ready_streams(driver, set), GetParam());
}

INSTANTIATE_TEST_SUITE_P(EachPolledStream, WaitingStreams,
                         testing::Values(kAlarmStream, kMetadataStream, kAudioStream));

TEST(WaitingAlarms, AreReadyWithTheFirstStatesAndNotOnceTheyAreTaken) {
  StreamingDriver driver;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAlarmStream));
  driver.open(kAlarmStream);
  driver.state().alarms.note_other_data(true, driver.state().now, kPatience);
  EXPECT_EQ(ready_streams(driver, set), kAlarmStream);
  driver.state().alarms.note_other_data(false, driver.state().now, kPatience);
  EXPECT_EQ(ready_streams(driver, set), 0u);
  streams_now = 106;
  EXPECT_EQ(ready_streams(driver, set), kAlarmStream);
}

TEST(WaitSet, ReturnsEachReadyDriverOnceWithAllItsStreamsUntilTheyAreTaken) {
  StreamingDriver first;
  StreamingDriver second;
  StreamingDriver idle;
  vexa::WaitSet set;
  for (StreamingDriver* driver : {&first, &second, &idle}) ASSERT_TRUE(set.Add(*driver, kAllStreams));
  first.state().readiness.set_video(true);
  send_byte(first.open(kAudioStream));
  second.state().readiness.set_video(true);
  for (int i = 0; i < 2; ++i) {
    std::vector<ReadyDriver> ready;
    ASSERT_EQ(set.Wait(ready, kLong), 2);
    const ReadyDriver& of_first = ready[0].driver == &first ? ready[0] : ready[1];
    EXPECT_EQ(of_first.driver, &first);
    EXPECT_EQ(of_first.streams, kVideoStream | kAudioStream);
  }
  first.state().readiness.set_video(false);
  second.state().readiness.set_video(false);
  EXPECT_EQ(first.poll(kAudioStream), LIBD_OK);
  std::vector<ReadyDriver> ready;
  EXPECT_EQ(set.Wait(ready, 0), 0);
  EXPECT_EQ(set.Wait(ready, 1), 0);
}

TEST(WaitSet, WaitsForVideoAloneUnlessMoreIsWanted) {
  StreamingDriver driver;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver));
  send_byte(driver.open(kAudioStream));
  streams_now = 200;
  std::vector<ReadyDriver> ready;
  EXPECT_EQ(set.Wait(ready, 0), 0);
  EXPECT_FALSE(is_readable(set.Descriptor()));
}

TEST(WaitSet, ForgetsADriverThatIsRemovedOrDestroyed) {
  StreamingDriver removed;
  StreamingDriver stranger;
  auto destroyed = std::make_unique<StreamingDriver>();
  vexa::WaitSet set;
  for (StreamingDriver* driver : {&removed, destroyed.get()}) {
    ASSERT_TRUE(set.Add(*driver, kAllStreams));
    driver->state().readiness.set_video(true);
    send_byte(driver->open(kAudioStream));
  }
  std::vector<ReadyDriver> ready;
  ASSERT_EQ(set.Wait(ready, 0), 2);
  set.Remove(removed);
  set.Remove(stranger);
  destroyed.reset();
  EXPECT_EQ(set.Wait(ready, 0), 0);
  EXPECT_FALSE(is_readable(set.Descriptor()));
  ASSERT_TRUE(set.Add(removed, kAudioStream));
  EXPECT_EQ(set.Wait(ready, 0), 1);
}

TEST(WaitSet, MayBeDestroyedBeforeItsDriversWhichJoinOthers) {
  StreamingDriver driver;
  const int camera = driver.open(kAudioStream);
  const std::size_t descriptors = open_descriptors();
  for (int i = 0; i < 3; ++i) {
    vexa::WaitSet set;
    ASSERT_TRUE(set.Add(driver, kAllStreams));
    driver.state().readiness.set_video(true);
  }
  EXPECT_EQ(open_descriptors(), descriptors);
  driver.state().readiness.set_video(false);
  send_byte(camera);
  EXPECT_EQ(driver.poll(kAudioStream), LIBD_OK);
  vexa::WaitSet one;
  vexa::WaitSet other;
  ASSERT_TRUE(one.Add(driver, kAudioStream));
  ASSERT_TRUE(other.Add(driver, kAllStreams));
  send_byte(camera);
  EXPECT_EQ(ready_streams(driver, one), kAudioStream);
  EXPECT_EQ(ready_streams(driver, other), kAudioStream);
}

TEST(WaitSet, WakesAThreadThatWaits) {
  for (const std::uint32_t bit : {kVideoStream, kAudioStream}) {
    for (const int milliseconds : {-1, kLong}) {
      StreamingDriver driver;
      vexa::WaitSet set;
      ASSERT_TRUE(set.Add(driver, kAllStreams));
      const int camera = driver.open(kAudioStream);
      std::atomic<long> waiter{0};
      std::vector<ReadyDriver> ready;
      std::thread host([&] {
        waiter = kernel_thread_id();
        set.Wait(ready, milliseconds);
      });
      EXPECT_TRUE(eventually([&] { return waiter != 0; }));
      if (bit == kVideoStream) {
        driver.state().readiness.set_video(true);
      } else {
        send_byte(camera);
      }
      host.join();
      ASSERT_EQ(ready.size(), 1u);
      EXPECT_EQ(ready[0].streams, bit);
    }
  }
}

// By the clock of the day: at most a second.
TEST(WaitSet, WakesAThreadWhenAReportOfSilenceFallsDue) {
  StreamingDriver driver;
  driver.state().now = vexa::system_seconds;
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver, kAudioStream));
  driver.open(kAudioStream);
  driver.state().readiness.opened(kAudioStream, driver.m_AudioSocket, vexa::system_seconds() + 1);
  std::vector<ReadyDriver> ready;
  ASSERT_EQ(set.Wait(ready, kLong), 1);
  EXPECT_EQ(ready[0].streams, kAudioStream);
}

TEST(WaitSet, TakesDriversInAndOutWhileAnotherThreadWaits) {
  vexa::WaitSet set;
  std::atomic<bool> over{false};
  std::thread host([&] {
    std::vector<ReadyDriver> ready;
    while (!over) set.Wait(ready, 1);
  });
  for (int i = 0; i < 200; ++i) {
    StreamingDriver driver;
    ASSERT_TRUE(set.Add(driver, kAllStreams));
    send_byte(driver.open(kAudioStream));
    driver.state().readiness.set_video(true);
    if (i % 2 == 0) set.Remove(driver);
  }
  over = true;
  host.join();
  std::vector<ReadyDriver> ready;
  EXPECT_EQ(set.Wait(ready, 0), 0);
}

}  // namespace
}  // namespace vexa_test
