// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <signal.h>
#include <sys/resource.h>
#include <unistd.h>

#include <atomic>
#include <chrono>
#include <memory>
#include <thread>
#include <vector>

#include "runtime/handle.h"
#include "tests/runtime/thread_routines.h"
#include "tests/support/failing_new.h"
#include "tests/support/interruptions.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

using Clock = std::chrono::steady_clock;

Event make_signalled_event() {
  Event event = make_event();
  EXPECT_EQ(SetEvent(event.get()), 1);
  return event;
}

unsigned long wait_for(const std::vector<typedHandle*>& handles, unsigned long timeout_ms = 0) {
  return WaitForMultipleObjects(handles.size(), handles.data(), 0, timeout_ms);
}

TEST(Wait, ResultsAre32BitValuesOfThisLayerNotOfWindows) {
  EXPECT_EQ(WAIT_FAILED, 0xFFFFFFFFUL);
  EXPECT_EQ(WAIT_TIMEOUT, 0xFFFFFFFEUL);
  const Event event = make_event();
  EXPECT_EQ(WaitForSingleObject(event.get(), 0), 0xFFFFFFFEUL);
  EXPECT_EQ(WaitForMultipleObjects(0, nullptr, 1, 0), 0xFFFFFFFFUL);
}

TEST(WaitForMultipleObjects, ReturnsTheLowestSignalledPositionCountingNulls) {
  const Event set = make_signalled_event();
  const Event also_set = make_signalled_event();
  const Event unset = make_event();
  const struct {
    std::vector<typedHandle*> handles;
    unsigned long result;
  } cases[] = {
      {{nullptr, unset.get(), set.get()}, 2},
      {{nullptr, set.get(), also_set.get()}, 1},
      {{set.get()}, 0},
      {{set.get(), set.get()}, 0},
      {{unset.get(), nullptr, nullptr, set.get(), also_set.get()}, 3},
      {{unset.get(), unset.get()}, WAIT_TIMEOUT},
      {{nullptr, nullptr}, WAIT_TIMEOUT},
  };
  for (const auto& c : cases) EXPECT_EQ(wait_for(c.handles), c.result);
}

TEST(WaitForMultipleObjects, FindsEachOfManyEvents) {
  std::vector<Event> events;
  std::vector<typedHandle*> handles;
  for (int i = 0; i < 100; ++i) {
    events.push_back(make_event());
    handles.push_back(events.back().get());
  }
  for (unsigned long i = 0; i < handles.size(); ++i) {
    EXPECT_EQ(SetEvent(handles[i]), 1);
    EXPECT_EQ(wait_for(handles), i);
    EXPECT_EQ(ResetEvent(handles[i]), 1);
  }
}

TEST(WaitForMultipleObjects, RefusesToWaitForAllWithoutWaiting) {
  const Event set = make_signalled_event();
  typedHandle* handle = set.get();
  for (const int wait_all : {1, 2, -1}) {
    EXPECT_EQ(WaitForMultipleObjects(1, &handle, wait_all, INFINITE), WAIT_FAILED);
    EXPECT_EQ(WaitForMultipleObjects(0, nullptr, wait_all, INFINITE), WAIT_FAILED);
  }
}

TEST(WaitForMultipleObjects, RefusesHandlesThatAreNotEventsWithoutWaiting) {
  const Event set = make_signalled_event();
  for (const std::int32_t kind : {HANDLE_TYPE_THREAD, HANDLE_TYPE_FILE, HANDLE_TYPE_FIND, 4, -1}) {
    typedHandle other = {kind};
    EXPECT_EQ(wait_for({set.get(), &other}, INFINITE), WAIT_FAILED) << kind;
    EXPECT_EQ(wait_for({&other, set.get()}, INFINITE), WAIT_FAILED) << kind;
    EXPECT_EQ(WaitForSingleObject(&other, INFINITE), WAIT_FAILED) << kind;
  }
}

TEST(WaitForMultipleObjects, RefusesAMissingList) {
  EXPECT_EQ(WaitForMultipleObjects(3, nullptr, 0, INFINITE), WAIT_FAILED);
}

TEST(WaitForMultipleObjects, FailsWithoutMemory) {
  const Event set = make_signalled_event();
  typedHandle* handle = set.get();
  const AllocationFailure failure(0);
  EXPECT_EQ(WaitForMultipleObjects(1, &handle, 0, INFINITE), WAIT_FAILED);
  EXPECT_TRUE(failure.happened());
}

TEST(WaitForMultipleObjects, WithoutHandlesIsASleep) {
  const auto begin = Clock::now();
  EXPECT_EQ(WaitForMultipleObjects(0, nullptr, 0, 200), WAIT_TIMEOUT);
  EXPECT_GE(Clock::now() - begin, std::chrono::milliseconds(200));
}

TEST(WaitForSingleObject, OfNullWaitsOutItsTime) {
  const auto begin = Clock::now();
  EXPECT_EQ(WaitForSingleObject(nullptr, 50), WAIT_TIMEOUT);
  EXPECT_GE(Clock::now() - begin, std::chrono::milliseconds(50));
}

TEST(WaitForSingleObject, TimesOutNoEarlierThanAsked) {
  const Event event = make_event();
  const auto begin = Clock::now();
  EXPECT_EQ(WaitForSingleObject(event.get(), 50), WAIT_TIMEOUT);
  EXPECT_GE(Clock::now() - begin, std::chrono::milliseconds(50));
}

// A thread that waits for `event`, and what came of it.
class Waiter {
 public:
  Waiter(typedHandle* event, unsigned long timeout_ms)
      : thread_([this, event, timeout_ms] {
          id_ = kernel_thread_id();
          result_ = WaitForSingleObject(event, timeout_ms);
          ended_ = true;
        }) {}
  ~Waiter() { join(); }

  bool is_waiting() {
    return eventually([this] { return id_ != 0 && is_sleeping(id_); });
  }
  bool ended() const { return ended_; }
  void interrupt() { pthread_kill(thread_.native_handle(), SIGUSR1); }
  unsigned long join() {
    if (thread_.joinable()) thread_.join();
    return result_;
  }

 private:
  std::atomic<long> id_{0};
  std::atomic<unsigned long> result_{12345};
  std::atomic<bool> ended_{false};
  std::thread thread_;
};

TEST(WaitForSingleObject, FromTheSignBitOnWaitsWithoutLimit) {
  for (const unsigned long timeout_ms : {INFINITE, 0x80000000UL}) {
    const Event event = make_event();
    Waiter waiter(event.get(), timeout_ms);
    EXPECT_TRUE(waiter.is_waiting());
    EXPECT_FALSE(waiter.ended());
    EXPECT_EQ(SetEvent(event.get()), 1);
    EXPECT_EQ(waiter.join(), 0U);
  }
}

TEST(WaitForSingleObject, EveryWaiterSeesOneSignal) {
  const Event event = make_event();
  std::vector<std::unique_ptr<Waiter>> waiters;
  waiters.reserve(8);
  for (int i = 0; i < 8; ++i) waiters.push_back(std::make_unique<Waiter>(event.get(), INFINITE));
  for (const auto& waiter : waiters) EXPECT_TRUE(waiter->is_waiting());
  EXPECT_EQ(SetEvent(event.get()), 1);
  for (const auto& waiter : waiters) EXPECT_EQ(waiter->join(), 0U);
}

std::atomic<int> signals_handled{0};

// SIGUSR1 is counted as long as it lives.
class CountedSignal {
 public:
  CountedSignal() {
    signals_handled = 0;
    struct sigaction action = {};
    action.sa_handler = [](int) { ++signals_handled; };
    sigaction(SIGUSR1, &action, &former_);
  }
  ~CountedSignal() { sigaction(SIGUSR1, &former_, nullptr); }

 private:
  struct sigaction former_ = {};
};

TEST(WaitForSingleObject, EndsAsATimeoutWhenASignalHandlerRuns) {
  const CountedSignal counted;
  for (const unsigned long timeout_ms : {INFINITE, 60000UL}) {
    const Event event = make_event();
    const auto begin = Clock::now();
    Waiter waiter(event.get(), timeout_ms);
    ASSERT_TRUE(waiter.is_waiting());
    // Again and again, as a handler that runs shortly before poll interrupts nothing.
    EXPECT_TRUE(eventually([&] {
      if (!waiter.ended()) waiter.interrupt();
      return waiter.ended();
    }));
    if (!waiter.ended()) SetEvent(event.get());
    EXPECT_EQ(waiter.join(), WAIT_TIMEOUT) << timeout_ms;
    EXPECT_LT(Clock::now() - begin, std::chrono::milliseconds(60000));
  }
  EXPECT_GT(signals_handled, 0);
}

TEST(WaitForMultipleObjects, WithoutAnEventEndsWhenASignalHandlerRuns) {
  const CountedSignal counted;
  std::atomic<bool> ended{false};
  std::thread waiter([&ended] {
    EXPECT_EQ(WaitForMultipleObjects(0, nullptr, 0, 60000), WAIT_TIMEOUT);
    ended = true;
  });
  EXPECT_TRUE(eventually([&] {
    if (!ended) pthread_kill(waiter.native_handle(), SIGUSR1);
    return ended.load();
  }));
  waiter.join();
}

TEST(WaitForSingleObject, FindsAnEventThatIsSignalledWhateverSignalsRun) {
  const Interruptions interruptions;
  const Event event = make_signalled_event();
  // One wait is over too soon for a signal to meet it.
  EXPECT_TRUE(interruptions.come_during([&] {
    for (int i = 0; i < 1000; ++i) EXPECT_EQ(WaitForSingleObject(event.get(), INFINITE), 0U);
  }));
}

// Sets the soft limit of descriptors as long as it lives.
class DescriptorLimit {
 public:
  explicit DescriptorLimit(rlim_t count) {
    getrlimit(RLIMIT_NOFILE, &former_);
    rlimit changed = former_;
    changed.rlim_cur = count;
    EXPECT_EQ(setrlimit(RLIMIT_NOFILE, &changed), 0);
  }
  ~DescriptorLimit() { setrlimit(RLIMIT_NOFILE, &former_); }

 private:
  rlimit former_ = {};
};

TEST(WaitForMultipleObjects, TakesAPollThatFailsForATimeout) {
  const Event set = make_signalled_event();
  const std::vector<typedHandle*> handles(200, set.get());
  EXPECT_EQ(wait_for(handles, INFINITE), 0U);
  const DescriptorLimit fewer_than_handles(100);
  EXPECT_EQ(wait_for(handles, INFINITE), WAIT_TIMEOUT);
}

TEST(WaitForMultipleObjects, TakesABrokenEventForOneThatIsNotSignalled) {
  Event event = make_event();
  close(vexa::record_of<vexa::EventHandle>(event.get())->read_fd);
  EXPECT_EQ(WaitForSingleObject(event.get(), INFINITE), WAIT_TIMEOUT);
  EXPECT_EQ(CloseEventHandle(event.release()), 0);
}

TEST(WaitForMultipleObjects, WaitsOnDescriptorsAbove1023) {
  const DescriptorLimit many(4096);
  std::vector<int> others;
  others.reserve(1100);
  for (int i = 0; i < 1100; ++i) others.push_back(open("/dev/null", O_RDONLY | O_CLOEXEC));
  const Event event = make_event();
  int fd = -1;
  EXPECT_TRUE(eventFd(event.get(), fd));
  EXPECT_GT(fd, 1023);
  EXPECT_EQ(WaitForSingleObject(event.get(), 0), WAIT_TIMEOUT);
  EXPECT_EQ(SetEvent(event.get()), 1);
  EXPECT_EQ(WaitForSingleObject(event.get(), INFINITE), 0U);
  for (const int other : others) close(other);
}

TEST(WaitForMultipleObjects, TouchesNoHandleAfterTheWait) {
#if defined(__SANITIZE_THREAD__)
  GTEST_SKIP() << "the thread sanitizer objects to the closing of a descriptor in use, which is the point here";
#endif
  Event closed = make_event();
  const Event set = make_event();
  // With a writer left, the closed pipe does not end the poll by hanging up.
  const int writer = fcntl(vexa::record_of<vexa::EventHandle>(closed.get())->write_fd, F_DUPFD_CLOEXEC, 0);
  typedHandle* handles[] = {closed.get(), set.get()};
  std::atomic<long> id{0};
  std::atomic<unsigned long> result{12345};
  std::thread waiter([&] {
    id = kernel_thread_id();
    result = WaitForMultipleObjects(2, handles, 0, INFINITE);
  });
  EXPECT_TRUE(eventually([&] { return id != 0 && is_sleeping(id); }));
  EXPECT_EQ(CloseEventHandle(closed.release()), 1);
  EXPECT_EQ(SetEvent(set.get()), 1);
  waiter.join();
  close(writer);
  EXPECT_EQ(result, 1U);
}

}  // namespace
}  // namespace vexa_test
