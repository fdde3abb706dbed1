#include "virtual_camera/rtp/sent_log.h"

namespace vexa::camera {

void SentLog::add(const std::vector<SentPacket>& packets) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    for (const SentPacket& packet : packets) {
      if (!packet.lost) ++sent_;
      if (limit_ == 0) continue;
      packets_.push_back(packet);
      if (packets_.size() > limit_) packets_.pop_front();
    }
  }
  changed_.notify_all();
}

void SentLog::add_finished_stream() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    ++finished_;
  }
  changed_.notify_all();
}

void SentLog::add_heard(std::uint64_t packets) {
  const std::lock_guard<std::mutex> lock(mutex_);
  heard_ += packets;
}

std::uint64_t SentLog::heard() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return heard_;
}

std::vector<SentPacket> SentLog::snapshot() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return {packets_.begin(), packets_.end()};
}

std::uint64_t SentLog::sent() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return sent_;
}

std::uint64_t SentLog::finished_streams() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return finished_;
}

void SentLog::clear() {
  const std::lock_guard<std::mutex> lock(mutex_);
  packets_.clear();
}

bool SentLog::wait_for(const Predicate& predicate, std::chrono::milliseconds time) const {
  std::unique_lock<std::mutex> lock(mutex_);
  return changed_.wait_for(lock, time, [&] { return predicate(packets_); });
}

bool SentLog::wait_for_finished(std::uint64_t streams, std::chrono::milliseconds time) const {
  std::unique_lock<std::mutex> lock(mutex_);
  return changed_.wait_for(lock, time, [&] { return finished_ >= streams; });
}

}  // namespace vexa::camera
