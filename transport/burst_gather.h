// Whether, and how long, a reader lets datagrams gather before it drains them.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>

namespace vexa {

/// A thread that wakes for every datagram pays for the wake-up, not for the work. On a stream that trickles, a nap of
/// up to 2 ms after the first datagram makes one wake-up of many; on a stream that comes in bursts, the burst is there
/// when the thread wakes, and the nap is a wake-up too many. This one measures both: datagrams taken for each wake-up
/// at once and after a nap. The better way is taken, the other tried now and then.
class BurstGather {
 public:
  static constexpr std::chrono::microseconds kLongest{2000};
  static constexpr std::chrono::microseconds kShortest{125};

  /// The thread was woken by a datagram: how long to nap before reading; 0 for not at all.
  std::chrono::microseconds woken() {
    finish_burst();
    const bool nap_is_better = taken_after_nap_ > kWakeupsOfANap * taken_at_once_;
    napped_ = nap_is_better != (++bursts_ % kTrialInterval == 0);
    return napped_ ? nap_ : std::chrono::microseconds{0};
  }

  void received(std::size_t bytes) {
    ++datagrams_;
    bytes_ += bytes;
  }

 private:
  static constexpr double kWakeupsOfANap = 2;
  static constexpr unsigned kTrialInterval = 32;
  static constexpr double kNews = 1.0 / 8;
  static constexpr std::size_t kLargeBurst = 65536;  // a third of the smallest usual socket buffer
  static constexpr std::size_t kSmallBurst = 16384;

  void finish_burst() {
    double& taken = napped_ ? taken_after_nap_ : taken_at_once_;
    taken += (static_cast<double>(datagrams_) - taken) * kNews;
    // The faster the stream, the shorter the nap: a socket's buffer must not fill meanwhile.
    if (napped_ && bytes_ > kLargeBurst) nap_ = std::max(nap_ / 2, kShortest);
    if (napped_ && bytes_ < kSmallBurst) nap_ = std::min(nap_ * 2, kLongest);
    datagrams_ = 0;
    bytes_ = 0;
  }

  std::chrono::microseconds nap_ = kLongest;
  double taken_at_once_ = 1;
  double taken_after_nap_ = 4;
  unsigned bursts_ = 0;
  bool napped_ = false;
  std::size_t datagrams_ = 0;
  std::size_t bytes_ = 0;
};

}  // namespace vexa
