// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <limits.h>
#include <pthread.h>
#include <sys/resource.h>

#include <atomic>
#include <cstddef>
#include <fstream>

#include "tests/runtime/thread_routines.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

unsigned int count_run(void* argument) {
  ++*static_cast<std::atomic<int>*>(argument);
  return 0;
}

TEST(BeginThread, RefusesSecurityAttributes) {
  std::atomic<int> runs{0};
  int attributes = 0;
  unsigned int id = 77;
  EXPECT_EQ(_beginthreadex(&attributes, 0, count_run, &runs, 0, &id), nullptr);
  EXPECT_EQ(id, 77U);
  EXPECT_EQ(runs, 0);
}

TEST(BeginThread, RefusesAMissingRoutine) {
  EXPECT_EQ(_beginthreadex(nullptr, 0, nullptr, nullptr, 0, nullptr), nullptr);
}

TEST(BeginThread, RoutinesResultBecomesTheExitCode) {
  for (unsigned int result : {0U, 1U, 258U, 260U, 0x80000000U, 0xFFFFFFFFU}) {
    typedHandle* thread = start(return_argument, &result);
    ASSERT_NE(thread, nullptr);
    EXPECT_EQ(thread->kind, HANDLE_TYPE_THREAD);
    EXPECT_TRUE(finishes(thread));
    EXPECT_EQ(exit_code(thread), result);
    EXPECT_EQ(CloseThreadHandle(thread), 1);
  }
}

TEST(BeginThread, ExitCodeIs259WhileTheRoutineRuns) {
  Gate gate;
  typedHandle* thread = start(wait_at_gate, &gate);
  ASSERT_NE(thread, nullptr);
  EXPECT_EQ(exit_code(thread), 259U);
  EXPECT_TRUE(eventually([&] { return gate.entered != 0; }));
  EXPECT_EQ(exit_code(thread), 259U);
  gate.release = true;
  EXPECT_TRUE(finishes(thread));
  EXPECT_EQ(exit_code(thread), 42U);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
}

TEST(BeginThread, IgnoresTheInitialFlag) {
  constexpr unsigned int kCreateSuspended = 4;
  unsigned int result = 5;
  typedHandle* thread = _beginthreadex(nullptr, 0, return_argument, &result, kCreateSuspended, nullptr);
  ASSERT_NE(thread, nullptr);
  EXPECT_TRUE(finishes(thread));
  EXPECT_EQ(exit_code(thread), 5U);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
}

unsigned int store_own_identifier(void* argument) {
  *static_cast<std::atomic<pthread_t>*>(argument) = pthread_self();
  return 0;
}

TEST(BeginThread, ReportsTheThreadsIdentifier) {
  std::atomic<pthread_t> own{0};
  unsigned int out = 0;
  typedHandle* thread = _beginthreadex(nullptr, 0, store_own_identifier, &own, 0, &out);
  ASSERT_NE(thread, nullptr);
  unsigned long id = 0;
  EXPECT_TRUE(threadId(thread, id));
  EXPECT_TRUE(finishes(thread));
  EXPECT_EQ(id, own);
  EXPECT_EQ(out, static_cast<unsigned int>(own));
  EXPECT_EQ(CloseThreadHandle(thread), 1);
}

TEST(BeginThread, AThreadThatEndsAtOnceKeepsItsExitCode) {
  unsigned int result = 7;
  for (int i = 0; i < 300; ++i) {
    typedHandle* thread = start(return_argument, &result);
    ASSERT_NE(thread, nullptr);
    ASSERT_TRUE(finishes(thread));
    ASSERT_EQ(exit_code(thread), 7U);
    ASSERT_EQ(CloseThreadHandle(thread), 1);
  }
}

unsigned int store_stack_size(void* argument) {
  pthread_attr_t attributes;
  if (pthread_getattr_np(pthread_self(), &attributes) != 0) return 1;
  std::size_t size = 0;
  pthread_attr_getstacksize(&attributes, &size);
  pthread_attr_destroy(&attributes);
  *static_cast<std::atomic<std::size_t>*>(argument) = size;
  return 0;
}

TEST(BeginThread, StackIs512KiBUnlessALargerThanTheLeastIsAskedFor) {
#if defined(__SANITIZE_THREAD__)
  GTEST_SKIP() << "the thread sanitizer makes every stack larger";
#endif
  const auto least = static_cast<unsigned int>(PTHREAD_STACK_MIN);
  const struct {
    unsigned int asked;
    std::size_t got;
  } cases[] = {{0, 524288}, {1, 524288}, {least - 1, 524288}, {16777216, 16777216}};
  for (const auto& c : cases) {
    std::atomic<std::size_t> size{0};
    typedHandle* thread = _beginthreadex(nullptr, c.asked, store_stack_size, &size, 0, nullptr);
    ASSERT_NE(thread, nullptr) << c.asked;
    EXPECT_TRUE(finishes(thread));
    EXPECT_EQ(size, c.got) << c.asked;
    EXPECT_EQ(CloseThreadHandle(thread), 1);
  }
}

TEST(BeginThread, TakesTheLeastStackAndOddSizes) {
  const auto least = static_cast<unsigned int>(PTHREAD_STACK_MIN);
  for (const unsigned int size : {least, least + 1, 524287U}) {
    unsigned int result = 9;
    typedHandle* thread = _beginthreadex(nullptr, size, return_argument, &result, 0, nullptr);
    ASSERT_NE(thread, nullptr) << size;
    EXPECT_TRUE(finishes(thread));
    EXPECT_EQ(CloseThreadHandle(thread), 1);
  }
}

rlim_t address_space_in_use() {
  std::ifstream statm("/proc/self/statm");
  rlim_t pages = 0;
  statm >> pages;
  return pages * 4096;
}

TEST(BeginThread, GivesNullWhenTheThreadCannotBeMade) {
  rlimit limit = {};
  ASSERT_EQ(getrlimit(RLIMIT_AS, &limit), 0);
  rlimit small = limit;
  small.rlim_cur = address_space_in_use() + (rlim_t{256} << 20);
  ASSERT_EQ(setrlimit(RLIMIT_AS, &small), 0);
  unsigned int id = 77;
  typedHandle* thread = _beginthreadex(nullptr, 0xFFFF0000U, return_nothing, nullptr, 0, &id);
  ASSERT_EQ(setrlimit(RLIMIT_AS, &limit), 0);
  EXPECT_EQ(thread, nullptr);
  EXPECT_EQ(id, 77U);
}

TEST(BeginThread, GivesNullAtEachAllocationThatFails) {
  std::atomic<int> runs{0};
  typedHandle* thread = nullptr;
  int failures = 0;
  for (bool failed = true; failed; failures += failed ? 1 : 0) {
    EXPECT_EQ(thread, nullptr) << failures;
    const AllocationFailure failure(failures);
    thread = start(count_run, &runs);
    failed = failure.happened();
  }
  EXPECT_EQ(failures, 3) << "the handle, the start block, the map entry";
  ASSERT_NE(thread, nullptr);
  EXPECT_TRUE(finishes(thread));
  EXPECT_EQ(runs, 1);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
}

struct Unwound {
  std::atomic<bool>* flag;
  ~Unwound() { *flag = true; }
};

[[gnu::noinline]] void end_with_31() { _endthreadex(31); }

unsigned int end_from_within(void* argument) {
  const Unwound unwound{static_cast<std::atomic<bool>*>(argument)};
  end_with_31();
  return 1;
}

TEST(EndThread, RecordsItsCodeAndUnwindsTheRoutine) {
  std::atomic<bool> unwound{false};
  typedHandle* thread = start(end_from_within, &unwound);
  ASSERT_NE(thread, nullptr);
  EXPECT_TRUE(finishes(thread));
  EXPECT_EQ(exit_code(thread), 31U);
  EXPECT_EQ(CloseThreadHandle(thread), 1);
  EXPECT_TRUE(unwound);
}

TEST(EndThread, EndsAForeignThread) {
  pthread_t thread = {};
  const auto routine = [](void*) -> void* {
    _endthreadex(3);
    return nullptr;
  };
  ASSERT_EQ(pthread_create(&thread, nullptr, routine, nullptr), 0);
  EXPECT_EQ(pthread_join(thread, nullptr), 0);
}

TEST(ThreadFunction, ReturnsNullForANullStartBlock) { EXPECT_EQ(thread_func_internal(nullptr), nullptr); }

TEST(ThreadHandle, OperationsRefuseNullAndOtherKinds) {
  typedHandle* event = CreateEvent(nullptr, 1, 0, nullptr);
  for (typedHandle* handle : {static_cast<typedHandle*>(nullptr), event}) {
    unsigned long number = 77;
    EXPECT_FALSE(threadId(handle, number));
    EXPECT_EQ(GetExitCodeThread(handle, &number), 0);
    EXPECT_EQ(number, 77U);
    EXPECT_EQ(CloseThreadHandle(handle), 0);
  }
  EXPECT_EQ(CloseEventHandle(event), 1);
}

}  // namespace
}  // namespace vexa_test
