// Waiting for video: the descriptor, the wait, and a set of drivers.
#include "vexa/waiting.h"

#include <gtest/gtest.h>
#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <sys/wait.h>

#include <atomic>
#include <map>
#include <memory>
#include <stdexcept>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/descriptors.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

constexpr int kLong = 30000;  // milliseconds, never used up

/// A driver whose frames come from the test in place of a camera.
class FedDriver : public MediaDriver {
 public:
  FedDriver() {
    state().now = [] { return std::time_t{1000}; };
    m_LastFrameTime = 1000;
    use("127.0.0.1", 1, 5000);
  }

  /// What the streaming thread does with a frame.
  void feed(ELibDReturnCode result = LIBD_OK, std::int32_t type = VIDEO_FRAME_JPEG) {
    VideoFrameInfo frame = made_frame(type);
    ProcessCurrentFrameData(this, frame, wait_key_, result);
  }

  static VideoFrameInfo made_frame(std::int32_t type) {
    VideoFrameInfo frame;
    frame.capacity = frame.length = 8;
    frame.data = new unsigned char[frame.capacity]();
    frame.frameType = type;
    return frame;
  }

  std::size_t waiting() {
    const vexa::Guard guard(m_FrameQueueLock);
    return m_FrameQueue.size();
  }

  ELibDReturnCode take() {
    SLibDVideoFrameInfo frame;
    return GetCurrentVideoFrame(frame);
  }

 private:
  bool wait_key_ = false;
};

TEST(VideoFrameDescriptor, IsReadableAsLongAsAFrameWaits) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  ASSERT_GE(descriptor, 0);
  EXPECT_FALSE(is_readable(descriptor));
  driver.feed();
  driver.feed();
  EXPECT_TRUE(is_readable(descriptor));
  EXPECT_EQ(driver.take(), LIBD_OK);
  EXPECT_TRUE(is_readable(descriptor));
  EXPECT_EQ(driver.take(), LIBD_OK);
  EXPECT_FALSE(is_readable(descriptor));
}

TEST(VideoFrameDescriptor, IsReadableWhenFramesWaitedBeforeItWasAskedFor) {
  FedDriver driver;
  driver.feed();
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  EXPECT_TRUE(is_readable(descriptor));
  EXPECT_EQ(driver.take(), LIBD_OK);
  EXPECT_FALSE(is_readable(descriptor));
}

TEST(VideoFrameDescriptor, IsOneNumberForTheLifeOfTheDriver) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  EXPECT_EQ(vexa::VideoFrameDescriptor(driver), descriptor);
  driver.feed();
  driver.state().clear_frame_queue();
  EXPECT_FALSE(is_readable(descriptor));
  EXPECT_EQ(vexa::VideoFrameDescriptor(driver), descriptor);
}

TEST(VideoFrameDescriptor, IsReadableExactlyWhenThePollHasMoreThanNoFrame) {
  for (const ELibDReturnCode result :
       {LIBD_OK, LIBD_FRAME_DAMAGED, LIBD_BUFFER_TOO_SMALL, LIBD_NO_FRAME, LIBD_FAILED, LIBD_TIMEOUT, LIBD_UNAUTHORIZED,
        LIBD_NOT_SUPPORTED, LIBD_INVALID_ARGUMENT, LIBD_INVALID_MODE, LIBD_STREAM_OPEN_FAILED}) {
    for (const bool silent_before : {false, true}) {
      for (const std::time_t last : {1000, 994}) {
        for (const std::int32_t type : {VIDEO_FRAME_JPEG, VIDEO_FRAME_INVALID}) {
          FedDriver driver;
          const int descriptor = vexa::VideoFrameDescriptor(driver);
          if (silent_before) driver.feed(LIBD_TIMEOUT);
          driver.m_LastFrameTime = last;
          driver.feed(result, type);
          const bool readable = is_readable(descriptor);
          EXPECT_EQ(vexa::ReadyStreams(driver), readable ? vexa::kVideoStream : 0u);
          EXPECT_EQ(readable, driver.take() != LIBD_NO_FRAME) << result << ' ' << silent_before << ' ' << last;
          EXPECT_FALSE(is_readable(descriptor)) << result;
        }
      }
    }
  }
}

TEST(VideoFrameDescriptor, IsReadableForFramesThatAModelClassQueues) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  bool wait_key = false;
  auto frame = FedDriver::made_frame(VIDEO_FRAME_JPEG);
  {
    const vexa::Guard guard(driver.m_FrameQueueLock);
    FedDriver::PropulateFrameInfoList(&driver, frame, wait_key);
  }
  EXPECT_TRUE(is_readable(descriptor));
}

TEST(VideoFrameDescriptor, IsUnreadableAgainWhenABacklogIsThrownAway) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  for (int i = 0; i < 31; ++i) driver.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA);
  EXPECT_TRUE(is_readable(descriptor));
  driver.feed(LIBD_OK, VIDEO_FRAME_H264_DELTA);
  EXPECT_FALSE(is_readable(descriptor));
}

TEST(VideoFrameDescriptor, TakesOneSystemCallForAllFramesUntilTheQueueIsEmpty) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  for (int i = 0; i < 5; ++i) driver.feed();
  eventfd_t writes = 0;  // a host must not do this
  ASSERT_EQ(eventfd_read(descriptor, &writes), 0);
  EXPECT_EQ(writes, 1u);
}

class ThrowingSink : public CDataSink {
 public:
  void Write(const unsigned char*, unsigned int) override { throw std::runtime_error("disk full"); }
};

TEST(VideoFrameDescriptor, StaysReadableForAFrameThatASinkHasRefused) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  driver.feed();
  ThrowingSink sink;
  SLibDVideoFrameInfo frame;
  frame.sink = &sink;
  EXPECT_THROW(driver.GetCurrentVideoFrame(frame), std::runtime_error);
  EXPECT_TRUE(is_readable(descriptor));
}

TEST(Waiting, TakesNoDescriptorFromAHostThatNeverAsks) {
  FedDriver driver;
  const std::size_t descriptors = open_descriptors();
  driver.feed();
  EXPECT_TRUE(vexa::WaitForVideoFrame(driver, 0));
  EXPECT_EQ(vexa::ReadyStreams(driver), vexa::kVideoStream);
  EXPECT_EQ(driver.take(), LIBD_OK);
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST(Waiting, HandsNoDescriptorToAProgramThatIsStarted) {
  FedDriver driver;
  const auto inherited = inherited_descriptors();
  vexa::WaitSet set;
  ASSERT_TRUE(set.Add(driver));
  ASSERT_GE(set.Descriptor(), 0);
  ASSERT_GE(vexa::VideoFrameDescriptor(driver), 0);
  EXPECT_EQ(inherited_descriptors(), inherited);
}

TEST(Waiting, ClosesItsDescriptorsWithDriverAndSet) {
  const std::size_t descriptors = open_descriptors();
  {
    FedDriver driver;
    vexa::WaitSet set;
    ASSERT_TRUE(set.Add(driver));
    ASSERT_GE(vexa::VideoFrameDescriptor(driver), 0);
  }
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST(Waiting, NamesTheLackOfDescriptorsAndTriesAgainLater) {
  FedDriver driver;
  driver.soil_latest_error();
  const std::string error = driver.latest_error();
  vexa::WaitSet set;
  std::vector<vexa::ReadyDriver> ready(1);
  {
    const NoDescriptorsLeft none;
    EXPECT_EQ(vexa::VideoFrameDescriptor(driver), vexa::kNoDescriptorLeft);
    EXPECT_EQ(set.Descriptor(), vexa::kNoDescriptorLeft);
    EXPECT_FALSE(set.Add(driver));
    EXPECT_EQ(set.Wait(ready, kLong), vexa::kNoDescriptorLeft);
    EXPECT_TRUE(ready.empty());
    EXPECT_FALSE(vexa::WaitForVideoFrame(driver, 0));
    driver.feed();
    EXPECT_TRUE(vexa::WaitForVideoFrame(driver, kLong));
  }
  EXPECT_EQ(driver.latest_error(), error);
  EXPECT_TRUE(is_readable(vexa::VideoFrameDescriptor(driver)));
  EXPECT_TRUE(set.Add(driver));
  EXPECT_EQ(set.Wait(ready, kLong), 1);
}

TEST(Waiting, IsUnharmedByAChildThatPollsAndEnds) {
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  driver.feed();
  const pid_t child = fork();
  if (child == 0) _exit(is_readable(descriptor) ? 0 : 1);
  int status = -1;
  ASSERT_EQ(waitpid(child, &status, 0), child);
  EXPECT_EQ(status, 0);
  EXPECT_TRUE(is_readable(descriptor));
  EXPECT_EQ(driver.take(), LIBD_OK);
  EXPECT_FALSE(is_readable(descriptor));
}

TEST(Waiting, LeavesAClosedDescriptorToWhoPollsForADestroyedDriver) {
  auto driver = std::make_unique<FedDriver>();
  const int descriptor = vexa::VideoFrameDescriptor(*driver);
  const int loop = epoll_create1(EPOLL_CLOEXEC);
  epoll_event entry = {};
  entry.events = EPOLLIN;
  ASSERT_EQ(epoll_ctl(loop, EPOLL_CTL_ADD, descriptor, &entry), 0);
  driver->feed();
  driver.reset();
  EXPECT_EQ(poll_events(descriptor), POLLNVAL);
  EXPECT_EQ(epoll_wait(loop, &entry, 1, 0), 0);
  close(loop);
}

TEST(WaitForVideoFrame, ReturnsAtOnceForAFrameAndFalseWithoutOne) {
  FedDriver driver;
  EXPECT_FALSE(vexa::WaitForVideoFrame(driver, 0));
  EXPECT_FALSE(vexa::WaitForVideoFrame(driver, 1));
  driver.feed();
  EXPECT_TRUE(vexa::WaitForVideoFrame(driver, 0));
  EXPECT_TRUE(vexa::WaitForVideoFrame(driver, -1));
  EXPECT_EQ(driver.take(), LIBD_OK);
  EXPECT_FALSE(vexa::WaitForVideoFrame(driver, 0));
}

TEST(WaitForVideoFrame, IsWokenByAFrameAndByAReportOfSilence) {
  for (const int milliseconds : {-1, kLong}) {
    for (const ELibDReturnCode result : {LIBD_OK, LIBD_TIMEOUT}) {
      FedDriver driver;
      std::atomic<long> waiter{0};
      bool woken = false;
      std::thread host([&] {
        waiter = kernel_thread_id();
        woken = vexa::WaitForVideoFrame(driver, milliseconds);
      });
      EXPECT_TRUE(eventually([&] { return waiter != 0 && is_sleeping(waiter); }));
      driver.feed(result);
      host.join();
      EXPECT_TRUE(woken);
      EXPECT_EQ(driver.take(), result);
    }
  }
}

TEST(Waiting, GivesEachFrameToOneOfTwoThreadsThatTake) {
  constexpr int kFrames = 2000;
  FedDriver driver;
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  std::atomic<int> taken{0};
  const auto take_all = [&] {
    while (driver.take() == LIBD_OK) ++taken;
  };
  std::thread one([&] {
    while (taken < kFrames) {
      pollfd entry = {descriptor, POLLIN, 0};
      poll(&entry, 1, 10);  // the other thread may have taken the last frame
      take_all();
    }
  });
  std::thread other([&] {
    while (taken < kFrames) {
      vexa::WaitForVideoFrame(driver, 10);
      take_all();
    }
  });
  for (int i = 0; i < kFrames; ++i) {
    while (driver.waiting() > 8) std::this_thread::yield();  // more than nine would push out the oldest
    driver.feed();
  }
  one.join();
  other.join();
  EXPECT_EQ(taken, kFrames);
  EXPECT_FALSE(is_readable(descriptor));
  EXPECT_FALSE(vexa::WaitForVideoFrame(driver, 0));
}

/// Feeds `frames` to each driver in turn; a queue keeps nine.
void feed_all(std::vector<std::unique_ptr<FedDriver>>& drivers, int frames) {
  for (int i = 0; i < frames; ++i) {
    for (auto& driver : drivers) driver->feed();
  }
}

std::vector<std::unique_ptr<FedDriver>> many_drivers(std::size_t count) {
  std::vector<std::unique_ptr<FedDriver>> drivers;
  while (drivers.size() < count) drivers.push_back(std::make_unique<FedDriver>());
  return drivers;
}

TEST(Waiting, OneThreadWithEpollServesThreeHundredDrivers) {
  constexpr int kFrames = 5;
  rlimit limit = {};
  getrlimit(RLIMIT_NOFILE, &limit);
  const rlimit raised = {std::min<rlim_t>(limit.rlim_max, 4096), limit.rlim_max};
  setrlimit(RLIMIT_NOFILE, &raised);
  {
    auto drivers = many_drivers(300);
    const int loop = epoll_create1(EPOLL_CLOEXEC);
    for (auto& driver : drivers) {
      epoll_event entry = {};
      entry.events = EPOLLIN;
      entry.data.ptr = driver.get();
      ASSERT_EQ(epoll_ctl(loop, EPOLL_CTL_ADD, vexa::VideoFrameDescriptor(*driver), &entry), 0);
    }
    std::thread cameras([&] { feed_all(drivers, kFrames); });
    std::map<FedDriver*, int> taken;
    for (int all = 0; all < 300 * kFrames;) {
      epoll_event events[64];
      const int count = epoll_wait(loop, events, 64, kLong);
      if (count <= 0) break;
      for (int i = 0; i < count; ++i) {
        auto* driver = static_cast<FedDriver*>(events[i].data.ptr);
        while (driver->take() == LIBD_OK) {
          ++taken[driver];
          ++all;
        }
      }
    }
    cameras.join();
    for (auto& driver : drivers) EXPECT_EQ(taken[driver.get()], kFrames);
    close(loop);
  }
  setrlimit(RLIMIT_NOFILE, &limit);
}

TEST(WaitSet, ServesThreeHundredDriversWithThreeDescriptors) {
  constexpr int kFrames = 5;
  auto drivers = many_drivers(300);
  const std::size_t descriptors = open_descriptors();
  vexa::WaitSet set;
  for (auto& driver : drivers) ASSERT_TRUE(set.Add(*driver));
  EXPECT_EQ(open_descriptors(), descriptors + 3);
  std::thread cameras([&] { feed_all(drivers, kFrames); });
  std::map<CVexaCommon*, int> taken;
  for (int all = 0; all < 300 * kFrames;) {
    std::vector<vexa::ReadyDriver> ready;
    if (set.Wait(ready, kLong) <= 0) break;
    for (const auto& found : ready) {
      EXPECT_EQ(found.streams, vexa::kVideoStream);
      while (static_cast<FedDriver*>(found.driver)->take() == LIBD_OK) {
        ++taken[found.driver];
        ++all;
      }
    }
  }
  cameras.join();
  for (auto& driver : drivers) EXPECT_EQ(taken[driver.get()], kFrames);
}

TEST(WaitingLive, TheDescriptorServesOneStreamAfterTheOther) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  const int descriptor = vexa::VideoFrameDescriptor(driver);
  FrameTaker host;
  for (int i = 0; i < 3; ++i) {
    ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
    for (std::uint64_t picture = 0; picture < 3;) {
      pollfd entry = {descriptor, POLLIN, 0};
      ASSERT_EQ(poll(&entry, 1, kLong), 1);
      TakenFrame frame;
      if (host.take(driver, frame) == LIBD_OK) EXPECT_TRUE(camera.sent(picture++, frame.bytes));
    }
    ASSERT_EQ(driver.StopVideoStreaming(), LIBD_OK);
    EXPECT_FALSE(is_readable(descriptor));
    EXPECT_EQ(vexa::VideoFrameDescriptor(driver), descriptor);
  }
}

TEST(WaitingLive, AHostThatOnlyWaitsLearnsOfACameraThatFallsSilent) {
  static std::atomic<std::time_t> now;
  now = 5000;
  auto options = camera_options();
  options.pictures = 3;
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  driver.state().now = [] { return now.load(); };
  driver.m_KeepAlivePeriod = 60;
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  FrameTaker host;
  TakenFrame frame;
  for (int frames = 0; frames < 3;) {
    ASSERT_TRUE(vexa::WaitForVideoFrame(driver, kLong));
    if (host.take(driver, frame) == LIBD_OK) ++frames;
  }
  {
    const vexa::Guard guard(driver.m_ConnectionLock);
    driver.m_ConnectionInfo.timeout = 50;
  }
  now += 1;  // more than the time-out's whole seconds
  ASSERT_TRUE(vexa::WaitForVideoFrame(driver, kLong));
  EXPECT_EQ(host.take(driver, frame), LIBD_TIMEOUT);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
}

TEST(WaitingLive, PromptFramesArriveWholeAndTheSettingHoldsForARunningStream) {
  auto options = camera_options();
  LiveCamera camera(options);
  MediaDriver driver;
  camera.introduce(driver);
  ASSERT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  FrameTaker host;
  for (std::uint64_t picture = 0; picture < 20;) {
    vexa::SetPromptFrames(driver, picture % 8 < 4);
    ASSERT_TRUE(vexa::WaitForVideoFrame(driver, kLong));
    TakenFrame frame;
    if (host.take(driver, frame) == LIBD_OK) EXPECT_TRUE(camera.sent(picture++, frame.bytes));
  }
}

}  // namespace
}  // namespace vexa_test
