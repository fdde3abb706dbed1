// What a virtual camera really put on the wire: every RTP datagram in order, and the ones it dropped on purpose.
#ifndef VIRTUAL_CAMERA_RTP_SENT_LOG_H_
#define VIRTUAL_CAMERA_RTP_SENT_LOG_H_

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <functional>
#include <mutex>
#include <vector>

namespace vexa::camera {

struct SentPacket {
  std::uint32_t session = 0;  // the RTSP session number
  // The header fields in the datagram, after all faults.
  std::uint16_t sequence = 0;
  std::uint32_t timestamp = 0;
  bool marker = false;
  std::uint64_t picture = 0;        // access unit counted from PLAY, running on when the clip starts over
  std::size_t clip_picture = 0;     // index of the access unit in the clip
  std::size_t packet = 0;           // place in its picture, from 0
  std::size_t picture_packets = 0;  // packets of that picture
  bool lost = false;                // never sent; listed where it would have gone
  bool duplicate = false;           // a second copy of a packet
  bool reordered = false;
  bool delayed = false;
  bool corrupted_header = false;
  bool corrupted_payload = false;
  bool marker_removed = false;
  std::size_t size = 0;    // bytes of the datagram
  std::uint64_t hash = 0;  // FNV-1a, 64 bits, over the datagram; 0 when hashing is off
  std::chrono::steady_clock::time_point time;
};

// Kept for tests, which compare it with what the host received. Thread-safe. Entries appear right after the datagrams
// have left.
class SentLog {
 public:
  using Predicate = std::function<bool(const std::deque<SentPacket>&)>;

  // Keeps the newest `limit` packets; 0 keeps none and only counts.
  explicit SentLog(std::size_t limit) : limit_(limit) {}

  [[nodiscard]] bool keeps() const { return limit_ != 0; }
  void add(const std::vector<SentPacket>& packets);
  void add_finished_stream();
  // RTCP packets that came from hosts.
  void add_heard(std::uint64_t packets);
  [[nodiscard]] std::uint64_t heard() const;
  [[nodiscard]] std::vector<SentPacket> snapshot() const;
  [[nodiscard]] std::uint64_t sent() const;              // datagrams that left, duplicates included
  [[nodiscard]] std::uint64_t finished_streams() const;  // streams that reached their last picture
  void clear();

  [[nodiscard]] bool wait_for(const Predicate& predicate, std::chrono::milliseconds time) const;
  [[nodiscard]] bool wait_for_finished(std::uint64_t streams, std::chrono::milliseconds time) const;

 private:
  const std::size_t limit_;
  mutable std::mutex mutex_;
  mutable std::condition_variable changed_;
  std::deque<SentPacket> packets_;
  std::uint64_t sent_ = 0;
  std::uint64_t finished_ = 0;
  std::uint64_t heard_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_SENT_LOG_H_
