// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/journal.h"

#include <algorithm>
#include <utility>

namespace vexa::camera {
namespace {

std::size_t count_in(const std::deque<Request>& requests, std::string_view part) {
  const auto matches = [part](const Request& request) { return request.bytes.find(part) != std::string::npos; };
  return static_cast<std::size_t>(std::count_if(requests.begin(), requests.end(), matches));
}

}  // namespace

void Journal::add(Request request) {
  if (observer_) observer_(request);
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    requests_.push_back(std::move(request));
    if (requests_.size() > limit_) requests_.pop_front();
  }
  changed_.notify_all();
}

std::vector<Request> Journal::snapshot() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return {requests_.begin(), requests_.end()};
}

std::size_t Journal::count(std::string_view part) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return count_in(requests_, part);
}

void Journal::clear() {
  const std::lock_guard<std::mutex> lock(mutex_);
  requests_.clear();
}

bool Journal::wait_for(const Predicate& predicate, std::chrono::milliseconds time) const {
  std::unique_lock<std::mutex> lock(mutex_);
  return changed_.wait_for(lock, time, [&] { return predicate(requests_); });
}

bool Journal::wait_for_count(std::string_view part, std::size_t count, std::chrono::milliseconds time) const {
  return wait_for([&](const std::deque<Request>& requests) { return count_in(requests, part) >= count; }, time);
}

}  // namespace vexa::camera
