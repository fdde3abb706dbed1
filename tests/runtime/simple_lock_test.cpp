// SPDX-License-Identifier: Apache-2.0
#include "vexa/simple_lock.h"

#include <gtest/gtest.h>
#include <pthread.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <thread>
#include <type_traits>
#include <vector>

#include "runtime/base/sync.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

TEST(SimpleLock, IsOnePolymorphicMutex) {
  static_assert(std::has_virtual_destructor<CSimpleLock>::value, "deleted through a base");
  static_assert(!std::is_copy_constructible<CSimpleLock>::value, "a mutex is not copied");
  static_assert(!std::is_copy_assignable<CSimpleLock>::value, "a mutex is not copied");
  EXPECT_EQ(sizeof(CSimpleLock), sizeof(void*) + sizeof(pthread_mutex_t));
}

// A thread that wants the lock, and whether it has had it.
class Contender {
 public:
  explicit Contender(CSimpleLock& lock)
      : thread_([this, &lock] {
          id_ = kernel_thread_id();
          lock.Lock();
          passed_ = true;
          lock.Unlock();
        }) {}
  ~Contender() { thread_.join(); }

  bool is_kept_out() {
    return eventually([this] { return id_ != 0 && is_sleeping(id_); }) && !passed_;
  }
  bool passes() {
    return eventually([this] { return passed_.load(); });
  }

 private:
  std::atomic<long> id_{0};
  std::atomic<bool> passed_{false};
  std::thread thread_;
};

TEST(SimpleLock, TakenTwiceByItsThreadKeepsOthersOutUntilItIsGivenBackTwice) {
  CSimpleLock lock;
  lock.Lock();
  lock.Lock();
  Contender contender(lock);
  EXPECT_TRUE(contender.is_kept_out());
  lock.Unlock();
  EXPECT_TRUE(contender.is_kept_out());
  lock.Unlock();
  EXPECT_TRUE(contender.passes());
}

TEST(SimpleLock, LowerCaseNamesAreTheSameLock) {
  CSimpleLock lock;
  lock.lock();
  lock.Lock();
  Contender contender(lock);
  EXPECT_TRUE(contender.is_kept_out());
  lock.Unlock();
  lock.unlock();
  EXPECT_TRUE(contender.passes());
}

TEST(SimpleLock, StandardGuardsTakeIt) {
  CSimpleLock lock;
  {
    const std::lock_guard<CSimpleLock> guard(lock);
    const std::lock_guard<CSimpleLock> again(lock);
  }
  Contender contender(lock);
  EXPECT_TRUE(contender.passes());
}

TEST(SimpleLock, GuardHoldsItForItsLife) {
  CSimpleLock lock;
  auto guard = std::make_unique<vexa::Guard>(lock);
  Contender contender(lock);
  EXPECT_TRUE(contender.is_kept_out());
  guard.reset();
  EXPECT_TRUE(contender.passes());
}

TEST(SimpleLock, OneThreadAtATimeIsInside) {
  CSimpleLock lock;
  int count = 0;
  std::vector<std::thread> threads;
  threads.reserve(4);
  for (int t = 0; t < 4; ++t) {
    threads.emplace_back([&] {
      for (int i = 0; i < 5000; ++i) {
        const vexa::Guard guard(lock);
        ++count;
      }
    });
  }
  for (std::thread& thread : threads) thread.join();
  EXPECT_EQ(count, 20000);
}

TEST(SimpleLock, IsDestroyedThroughItsBase) {
  struct Derived : CSimpleLock {
    explicit Derived(bool& flag) : destroyed(flag) {}
    ~Derived() override { destroyed = true; }
    bool& destroyed;
  };
  bool destroyed = false;
  std::unique_ptr<CSimpleLock> lock = std::make_unique<Derived>(destroyed);
  lock.reset();
  EXPECT_TRUE(destroyed);
}

}  // namespace
}  // namespace vexa_test
