// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <pthread.h>
#include <unistd.h>

#include <atomic>
#include <cstddef>
#include <cstdlib>
#include <set>
#include <thread>
#include <vector>

#include "tests/runtime/thread_routines.h"
#include "tests/support/process_state.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

TEST(GetExitCodeThread, RefusesAMissingResult) {
  typedHandle* thread = start(return_nothing);
  ASSERT_NE(thread, nullptr);
  EXPECT_EQ(GetExitCodeThread(thread, nullptr), 0);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
}

TEST(CloseThreadHandle, OfARunningThreadReturnsAtOnceAndTheThreadGoesOn) {
  Gate gate;
  typedHandle* thread = start(wait_at_gate, &gate);
  ASSERT_NE(thread, nullptr);
  EXPECT_TRUE(eventually([&] { return gate.entered != 0; }));
  EXPECT_EQ(CloseThreadHandle(thread), 1);
  EXPECT_TRUE(is_running(gate.entered));
  EXPECT_TRUE(goes_through(gate));
}

TEST(CloseThreadHandle, MarksARunningThreadsHandleAsClosed) {
  Gate gate;
  typedHandle* thread = start(wait_at_gate, &gate);
  ASSERT_NE(thread, nullptr);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
  unsigned long number = 77;
  EXPECT_FALSE(threadId(thread, number));
  EXPECT_EQ(GetExitCodeThread(thread, &number), 0);
  EXPECT_EQ(number, 77U);
  EXPECT_EQ(CloseThreadHandle(thread), 0);
  EXPECT_TRUE(goes_through(gate));
}

// A host's thread-local object: it still has work to do when the thread's exit code is final.
struct LateWork {
  struct Task {
    long closer;
    typedHandle* other;
    std::atomic<bool> closing{false};
    std::atomic<bool> done{false};
  };
  Task* task = nullptr;

  ~LateWork() {
    if (task == nullptr) return;
    eventually([this] { return task->closing && is_sleeping(task->closer); });
    unsigned long code = 0;
    task->done = GetExitCodeThread(task->other, &code) == 1;
  }
};

thread_local LateWork late_work;

unsigned int leave_late_work(void* argument) {
  late_work.task = static_cast<LateWork::Task*>(argument);
  return 0;
}

TEST(CloseThreadHandle, OfAFinishedThreadJoinsItWithoutHoldingTheLock) {
  Gate gate;
  typedHandle* other = start(wait_at_gate, &gate);
  LateWork::Task task = {kernel_thread_id(), other};
  typedHandle* thread = start(leave_late_work, &task);
  ASSERT_NE(thread, nullptr);
  EXPECT_TRUE(finishes(thread));
  task.closing = true;
  EXPECT_EQ(CloseThreadHandle(thread), 1);
  EXPECT_TRUE(task.done);
  gate.release = true;
  EXPECT_TRUE(finishes(other));
  EXPECT_EQ(CloseThreadHandle(other), 1);
}

unsigned int return_259(void* argument) {
  *static_cast<std::atomic<long>*>(argument) = kernel_thread_id();
  return 259;
}

TEST(GetExitCodeThread, AResultOf259LooksLikeRunning) {
  std::atomic<long> id{0};
  typedHandle* thread = start(return_259, &id);
  ASSERT_NE(thread, nullptr);
  EXPECT_TRUE(eventually([&] { return id != 0 && !is_running(id); }));
  EXPECT_EQ(exit_code(thread), 259U);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
}

// Starts a thread, sees it end, closes it, and returns its identifier.
unsigned long end_with_259_and_close() {
  std::atomic<long> id{0};
  typedHandle* thread = start(return_259, &id);
  unsigned long identifier = 0;
  EXPECT_TRUE(threadId(thread, identifier));
  EXPECT_TRUE(eventually([&] { return id != 0 && !is_running(id); }));
  EXPECT_EQ(CloseThreadHandle(thread), 1);
  return identifier;
}

unsigned long close_while_running() {
  Gate gate;
  typedHandle* thread = start(wait_at_gate, &gate);
  unsigned long identifier = 0;
  EXPECT_TRUE(threadId(thread, identifier));
  EXPECT_EQ(CloseThreadHandle(thread), 1);
  EXPECT_TRUE(goes_through(gate));
  return identifier;
}

// The identifier of a thread that was joined or detached comes back; that of a lost one never does.
bool gives_threads_back(unsigned long (*start_and_close)()) {
  std::set<unsigned long> identifiers;
  constexpr std::size_t kThreads = 20;
  for (std::size_t i = 0; i < kThreads; ++i) identifiers.insert(start_and_close());
  return identifiers.size() < kThreads;
}

TEST(CloseThreadHandle, JoinsAThreadThatEndedWith259) { EXPECT_TRUE(gives_threads_back(end_with_259_and_close)); }

TEST(CloseThreadHandle, OfARunningThreadLeavesNothingBehindAtItsEnd) {
  EXPECT_TRUE(gives_threads_back(close_while_running));
}

struct OwnHandle {
  std::atomic<long> id{0};
  std::atomic<typedHandle*> handle{nullptr};
  std::atomic<int> closed{-1};
};

unsigned int close_own_handle_after_the_end(void* argument) {
  auto* own = static_cast<OwnHandle*>(argument);
  own->id = kernel_thread_id();
  eventually([own] { return own->handle != nullptr; });
  cleanup_thread_internal(5);
  own->closed = CloseThreadHandle(own->handle);
  return 6;
}

unsigned long close_by_the_thread_itself() {
  OwnHandle own;
  typedHandle* thread = start(close_own_handle_after_the_end, &own);
  unsigned long identifier = 0;
  EXPECT_TRUE(threadId(thread, identifier));
  own.handle = thread;
  EXPECT_TRUE(eventually([&] { return own.closed != -1 && !is_running(own.id); }));
  EXPECT_EQ(own.closed, 1);
  return identifier;
}

TEST(CloseThreadHandle, ByTheThreadItselfDoesNotWaitForItselfAndLeavesNothingBehind) {
  EXPECT_TRUE(gives_threads_back(close_by_the_thread_itself));
}

TEST(CleanupThread, AForeignThreadLeavesAnEntryThatTheNextOwnerReplaces) {
  pthread_attr_t attributes;
  pthread_attr_init(&attributes);
  pthread_attr_setstacksize(&attributes, 524288);
  pthread_t foreign = {};
  const auto routine = [](void*) -> void* {
    cleanup_thread_internal(5);
    cleanup_thread_internal(6);
    return nullptr;
  };
  ASSERT_EQ(pthread_create(&foreign, &attributes, routine, nullptr), 0);
  pthread_attr_destroy(&attributes);
  ASSERT_EQ(pthread_join(foreign, nullptr), 0);

  Gate gate;
  std::vector<typedHandle*> threads;
  bool reused = false;
  while (!reused && threads.size() < 64) {
    threads.push_back(start(wait_at_gate, &gate));
    ASSERT_NE(threads.back(), nullptr);
    unsigned long id = 0;
    EXPECT_TRUE(threadId(threads.back(), id));
    reused = id == foreign;
  }
  EXPECT_TRUE(reused);
  gate.release = true;
  for (typedHandle* thread : threads) {
    EXPECT_TRUE(finishes(thread));
    EXPECT_EQ(exit_code(thread), 42U);
    EXPECT_EQ(CloseThreadHandle(thread), 1);
  }
}

// Starts and closes threads in both ways; returns the number of things that went wrong.
int start_and_close_many(unsigned int seed) {
  int wrong = 0;
  for (unsigned int i = 0; i < 40; ++i) {
    unsigned int result = seed * 1000 + i;
    std::atomic<long> id{0};
    typedHandle* finished = start(return_argument, &result);
    typedHandle* running = start(store_identifier, &id);
    if (finished == nullptr || running == nullptr) return wrong + 1;
    wrong += CloseThreadHandle(running) == 1 ? 0 : 1;
    wrong += finishes(finished) && exit_code(finished) == result ? 0 : 1;
    wrong += CloseThreadHandle(finished) == 1 ? 0 : 1;
    wrong += eventually([&id] { return id != 0 && !is_running(id); }) ? 0 : 1;
  }
  return wrong;
}

TEST(ThreadHandle, ManyThreadsAreStartedAndClosedAtOnce) {
  std::atomic<int> wrong{0};
  std::vector<std::thread> owners;
  owners.reserve(8);
  for (unsigned int t = 1; t <= 8; ++t) owners.emplace_back([&wrong, t] { wrong += start_and_close_many(t); });
  for (std::thread& owner : owners) owner.join();
  EXPECT_EQ(wrong, 0);
}

struct StopPattern {
  typedHandle* stop_event = nullptr;
  std::atomic<bool> stop{false};
  std::atomic<int> rounds{0};
};

unsigned int work_until_stopped(void* argument) {
  auto* pattern = static_cast<StopPattern*>(argument);
  while (!pattern->stop) {
    ++pattern->rounds;
    WaitForSingleObject(pattern->stop_event, INFINITE);
  }
  return 0;
}

TEST(ThreadHandle, AWorkerSleepsOnItsStopEventAndIsPolledToItsEnd) {
  StopPattern pattern;
  pattern.stop_event = CreateEvent(nullptr, 1, 0, nullptr);
  typedHandle* worker = start(work_until_stopped, &pattern);
  ASSERT_NE(worker, nullptr);
  EXPECT_TRUE(eventually([&] { return pattern.rounds == 1; }));
  pattern.stop = true;
  EXPECT_EQ(SetEvent(pattern.stop_event), 1);
  EXPECT_TRUE(finishes(worker));
  EXPECT_EQ(ResetEvent(pattern.stop_event), 1);
  EXPECT_EQ(CloseHandle(worker), 1);
  EXPECT_EQ(CloseHandle(pattern.stop_event), 1);
  EXPECT_EQ(pattern.rounds, 1);
}

Gate exit_gate;
typedHandle* exit_thread = nullptr;

void poll_a_thread_while_the_process_exits() {
  exit_gate.release = true;
  unsigned long code = STILL_ACTIVE;
  const bool finished = eventually([&code] { return GetExitCodeThread(exit_thread, &code) == 1 && code == 42; });
  _exit(finished ? 17 : 1);
}

void exit_with_a_running_thread() {
  // Registered before the first thread, so that it runs after whatever the first thread has registered.
  std::atexit(poll_a_thread_while_the_process_exits);
  exit_thread = start(wait_at_gate, &exit_gate);
  std::exit(2);
}

TEST(ThreadHandleDeathTest, AThreadThatEndsWhileTheProcessExitsIsStillKnown) {
  GTEST_FLAG_SET(death_test_style, "threadsafe");
  EXPECT_EXIT(exit_with_a_running_thread(), testing::ExitedWithCode(17), "");
}

}  // namespace
}  // namespace vexa_test
