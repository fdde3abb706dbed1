// Whether, and how long, a reader lets datagrams gather before it drains them.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <utility>

namespace vexa {

/// Decides whether, and how long, the reader of a stream naps before it reads. Owned by RtpReception, used by the
/// streaming thread; holds no socket and no clock.
///
/// A thread that wakes for each datagram pays for the wake-up more than for the work. On a stream that trickles, a nap
/// of up to 2 ms after the first datagram makes one wake-up of many; on a stream that comes in bursts, the burst is
/// there when the thread wakes, and the nap is a wake-up too many. This one measures both: datagrams taken for each
/// wake-up at once and after a nap. The better way is taken, the other tried now and then.
///
/// The naps of a picture end when pictures of this stream usually end: the time from the first datagram to the marker
/// is learnt from whether the marker had come by then. So the frame is ready soon after its last packet, and no wake-up
/// is spent in the middle of a picture but to keep the socket's buffer from filling.
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
    return napped_ ? next_nap() : std::chrono::microseconds{0};
  }

  /// The socket is empty in the middle of a picture: how long to nap again rather than wait for the rest; 0 for
  /// waiting. Saves the wake-up by which a wait would only lead to the next nap.
  std::chrono::microseconds goes_on() {
    if (!napped_ || datagrams_ == 0) return std::chrono::microseconds{0};
    finish_burst();
    return next_nap();
  }

  /// A picture's last packet was received.
  void picture_ended() {
    using std::chrono::microseconds;
    const microseconds slept = std::exchange(slept_, microseconds{0});
    if (slept.count() == 0) return;
    if (picture_.count() == 0) {
      picture_ = slept;
    } else if (slept > picture_) {
      picture_ += std::max(picture_ / kLater, kLeastStep);
    } else {
      picture_ -= std::max(picture_ / kSooner, kLeastStep);
    }
    picture_ = std::clamp(picture_, kShortest, kLongestPicture);
  }

  void received(std::size_t bytes) {
    ++datagrams_;
    bytes_ += bytes;
  }

 private:
  static constexpr double kWakeupsOfANap = 2;
  static constexpr unsigned kTrialInterval = 32;
  static constexpr double kSmoothing = 1.0 / 8;
  static constexpr std::size_t kLargeBurst = 65536;  // a third of the smallest usual socket buffer
  static constexpr std::size_t kSmallBurst = 16384;
  // Ten of eleven pictures are to be complete when they are expected to be: each that is not costs a wake-up.
  static constexpr int kLater = 16;
  static constexpr int kSooner = 160;
  static constexpr std::chrono::microseconds kLeastStep{2};
  static constexpr std::chrono::microseconds kLongestPicture{100000};

  void finish_burst() {
    double& taken = napped_ ? taken_after_nap_ : taken_at_once_;
    taken += (static_cast<double>(datagrams_) - taken) * kSmoothing;
    if (napped_) fit_nap();
    small_ = 2 * bytes_ <= kLargeBurst;
    datagrams_ = 0;
    bytes_ = 0;
  }

  // To the picture's expected end in equal parts; beyond it in parts that grow with the delay.
  std::chrono::microseconds next_nap() {
    const auto left = picture_ - slept_;
    if (picture_.count() == 0) {
      latest_nap_ = nap_;
    } else if (left.count() > 0) {
      // A picture's end is known: while little comes meanwhile, one nap does the work of two.
      const std::chrono::microseconds most = small_ && longest_ == kLongest ? 2 * nap_ : nap_;
      latest_nap_ = std::max(kShortest, left / ((left + most - std::chrono::microseconds{1}) / most));
    } else {
      latest_nap_ = std::min(nap_, std::max(kShortest, picture_ / 4 - left));
    }
    slept_ += latest_nap_;
    return latest_nap_;
  }

  // The faster the stream, the shorter the nap: a socket's buffer must not fill meanwhile. So it shrinks at once, and
  // grows slowly: the end of a picture is a small burst on the fastest stream.
  void fit_nap() {
    if (bytes_ > kLargeBurst) {
      const auto fitting = static_cast<std::uint64_t>(latest_nap_.count()) * kLargeBurst / bytes_;
      nap_ = std::max(std::chrono::microseconds(static_cast<std::chrono::microseconds::rep>(fitting)), kShortest);
    } else if (bytes_ < kSmallBurst) {
      nap_ = std::min(nap_ + nap_ / 8, longest_);
    }
  }

  std::chrono::microseconds longest_ = kLongest;
  std::chrono::microseconds nap_ = kFirst;  // at most
  std::chrono::microseconds latest_nap_ = kFirst;
  std::chrono::microseconds picture_{0};  // from a picture's first datagram to its last, in naps; 0: not known yet
  std::chrono::microseconds slept_{0};    // since the picture under way began
  double taken_at_once_ = 1;
  double taken_after_nap_ = 4;
  unsigned bursts_ = 0;
  bool napped_ = false;
  bool small_ = false;  // the latest burst was
  std::size_t datagrams_ = 0;
  std::size_t bytes_ = 0;
};

}  // namespace vexa
