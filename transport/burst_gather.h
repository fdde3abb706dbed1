// Whether, and how long, a reader lets datagrams gather before it drains them.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>

namespace vexa {

/// A thread that wakes for every datagram pays for the wake-up, not for the work. On a stream that trickles, a nap of
/// up to 2 ms after the first datagram makes one wake-up of many; on a stream that comes in bursts, the burst is there
/// when the thread wakes, and the nap is a wake-up too many. This one measures both: datagrams taken for each wake-up
/// at once and after a nap. The better way is taken, the other tried now and then.
class BurstGather {
 public:
  static constexpr std::chrono::microseconds kLongest{2000};
  static constexpr std::chrono::microseconds kShortest{125};
  static constexpr std::chrono::microseconds kFirst{500};
  static constexpr std::chrono::microseconds kPrompt{250};

  /// The longest nap from here on: kLongest, or kPrompt where a picture's last datagram must not wait.
  void limit(std::chrono::microseconds longest) {
    longest_ = longest;
    nap_ = std::min(nap_, longest);
  }

  /// The thread was woken by a datagram: how long to nap before reading; 0 for not at all.
  std::chrono::microseconds woken() {
    finish_burst();
    const bool nap_is_better = taken_after_nap_ > kWakeupsOfANap * taken_at_once_;
    napped_ = nap_is_better != (++bursts_ % kTrialInterval == 0);
    return napped_ ? nap_ : std::chrono::microseconds{0};
  }

  /// The socket is empty in the middle of a picture: how long to nap again rather than wait for the rest; 0 for
  /// waiting. Saves the wake-up by which a wait would only lead to the next nap.
  std::chrono::microseconds goes_on() {
    if (!napped_ || datagrams_ == 0) return std::chrono::microseconds{0};
    finish_burst();
    return nap_;
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
    if (napped_) fit_nap();
    datagrams_ = 0;
    bytes_ = 0;
  }

  // The faster the stream, the shorter the nap: a socket's buffer must not fill meanwhile. So it shrinks at once, and
  // grows slowly: the end of a picture is a small burst on the fastest stream.
  void fit_nap() {
    if (bytes_ > kLargeBurst) {
      const auto fitting = static_cast<std::uint64_t>(nap_.count()) * kLargeBurst / bytes_;
      nap_ = std::max(std::chrono::microseconds(static_cast<std::chrono::microseconds::rep>(fitting)), kShortest);
    } else if (bytes_ < kSmallBurst) {
      nap_ = std::min(nap_ + nap_ / 8, longest_);
    }
  }

  std::chrono::microseconds longest_ = kLongest;
  std::chrono::microseconds nap_ = kFirst;
  double taken_at_once_ = 1;
  double taken_after_nap_ = 4;
  unsigned bursts_ = 0;
  bool napped_ = false;
  std::size_t datagrams_ = 0;
  std::size_t bytes_ = 0;
};

}  // namespace vexa
