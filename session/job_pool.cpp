// SPDX-License-Identifier: Apache-2.0
#include "session/job_pool.h"

#include <algorithm>
#include <exception>
#include <utility>

#include "session/blocked_signals.h"

namespace vexa {

JobPool::~JobPool() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    over_ = true;
  }
  news_.notify_all();
  for (std::thread& thread : threads_) thread.join();
}

bool JobPool::post(std::function<void()> job) {
  const std::lock_guard<std::mutex> lock(mutex_);
  try {
    jobs_.push_back(std::move(job));
  } catch (const std::exception&) {
    return false;
  }
  most_queued_ = std::max(most_queued_, jobs_.size());
  if (idle_ < jobs_.size() && threads_.size() < most_) {
    const BlockedSignals none;
    try {
      threads_.reserve(threads_.size() + 1);  // a thread that is made has its place
      threads_.emplace_back([this] { work(); });
    } catch (const std::exception&) {
      if (threads_.empty()) {
        jobs_.pop_back();
        return false;
      }
    }
  }
  news_.notify_one();
  return true;
}

std::size_t JobPool::threads() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return threads_.size();
}

std::size_t JobPool::most_queued() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return most_queued_;
}

void JobPool::work() {
  std::unique_lock<std::mutex> lock(mutex_);
  for (;;) {
    ++idle_;
    news_.wait(lock, [this] { return over_ || !jobs_.empty(); });
    --idle_;
    if (jobs_.empty()) return;
    std::function<void()> job = std::move(jobs_.front());
    jobs_.pop_front();
    lock.unlock();
    job();
    job = nullptr;
    lock.lock();
  }
}

}  // namespace vexa
