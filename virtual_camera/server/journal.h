// SPDX-License-Identifier: Apache-2.0
// What a virtual camera was asked: every request, byte for byte, in the order of arrival.
#ifndef VIRTUAL_CAMERA_SERVER_JOURNAL_H_
#define VIRTUAL_CAMERA_SERVER_JOURNAL_H_

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace vexa::camera {

enum class RequestKind { kHttp, kRtsp };

struct Request {
  RequestKind kind = RequestKind::kHttp;
  std::string bytes;  // as received, header end included; what had come when the peer broke off in the middle
  std::string peer;   // "127.0.0.1:40000"
  std::chrono::system_clock::time_point time;
  int status = 0;      // of the answer decided on; 0 when none was
  std::string answer;  // the bytes the camera set out to send; a fault may have cut them
};

// Owned by the camera; thread-safe. A request is in the journal before the first byte of its answer leaves.
class Journal {
 public:
  using Predicate = std::function<bool(const std::deque<Request>&)>;
  using Observer = std::function<void(const Request&)>;

  // Keeps the newest `limit` requests.
  explicit Journal(std::size_t limit) : limit_(limit) {}

  // Called for each request on the camera's own thread. Set it before the camera starts.
  void observe(Observer observer) { observer_ = std::move(observer); }

  void add(Request request);
  [[nodiscard]] std::vector<Request> snapshot() const;
  [[nodiscard]] std::size_t count(std::string_view part) const;  // requests that contain `part`
  void clear();

  // Waits until the predicate holds for the requests so far; false when it never did within the time.
  [[nodiscard]] bool wait_for(const Predicate& predicate, std::chrono::milliseconds time) const;
  [[nodiscard]] bool wait_for_count(std::string_view part, std::size_t count, std::chrono::milliseconds time) const;

 private:
  const std::size_t limit_;
  Observer observer_;
  mutable std::mutex mutex_;
  mutable std::condition_variable changed_;
  std::deque<Request> requests_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_JOURNAL_H_
