// SPDX-License-Identifier: Apache-2.0
// Threads for what blocks: connecting and closing.
#pragma once

#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <thread>
#include <vector>

namespace vexa {

/// Runs jobs in the order they come, on at most as many threads as given; a thread is made when a job finds none idle.
/// A job must not throw. Destroying it waits for the jobs that are there.
class JobPool {
 public:
  explicit JobPool(std::size_t most_threads) : most_(most_threads) {}
  ~JobPool();
  JobPool(const JobPool&) = delete;
  JobPool& operator=(const JobPool&) = delete;

  /// Any thread. False when the job could not be taken: no thread runs, and none can be made.
  [[nodiscard]] bool post(std::function<void()> job);
  [[nodiscard]] std::size_t threads() const;
  /// Jobs that were queued at the same time, the most in its life.
  [[nodiscard]] std::size_t most_queued() const;

 private:
  void work();

  const std::size_t most_;
  mutable std::mutex mutex_;  ///< of what follows
  std::condition_variable news_;
  std::deque<std::function<void()>> jobs_;
  std::vector<std::thread> threads_;
  std::size_t idle_ = 0;
  std::size_t most_queued_ = 0;
  bool over_ = false;
};

}  // namespace vexa
