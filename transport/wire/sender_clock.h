// The sender's clock, out of its RTCP reports.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>

#include "transport/wire/rtcp.h"

namespace vexa {

/// What is known of a sender's clock: times of RTP timestamps by it, and how it differs from the host's. Holds no clock
/// itself. All times are nanoseconds. It only ever describes: nothing waits for it.
class SenderClock {
 public:
  enum class State { kUnknown, kRunning, kFrozen };

  struct Arrival {
    std::int64_t real;  ///< since 1970
    std::int64_t monotonic;
  };

  struct Moment {
    std::int64_t time;          ///< since 1970, by the sender's clock
    std::uint64_t uncertainty;  ///< of the mapping, not of the clock
  };

  /// Another source: nothing is known. Epoch and steps go on.
  void forget();

  /// Takes a report that came at `arrival`; `clock_rate` is the RTP clock's.
  void report(const SenderReport& report, Arrival arrival, int clock_rate);

  /// None while no report has come, or the clock stands.
  std::optional<Moment> time_of(std::uint32_t rtp_time, int clock_rate) const;

  State state() const { return state_; }
  /// The sender's clock less the host's at `now`; none while it is not known.
  std::optional<std::int64_t> offset(Arrival now) const;
  /// How much faster it runs than the host's, in parts of 10^9; none before reports of 10 s.
  std::optional<std::int32_t> rate() const { return rate_; }
  std::uint32_t steps() const { return steps_; }
  /// Raised by every step and every forget() of a clock that was known.
  std::uint32_t epoch() const { return epoch_; }

 private:
  static constexpr std::size_t kWindow = 16;

  struct Sample {
    std::int64_t monotonic = 0;
    std::int64_t offset = 0;  ///< sender's time less the monotonic one
  };

  bool stands(const SenderReport& report) const;
  bool has_stepped(std::int64_t time, const SenderReport& report, Arrival arrival, int clock_rate) const;
  void add(Sample sample);
  std::int64_t drift_until(std::int64_t later, std::int64_t earlier) const;
  Sample best_of(std::size_t first, std::size_t count) const;
  void measure_rate();

  State state_ = State::kUnknown;
  SenderReport latest_;
  std::int64_t latest_time_ = 0;
  std::int64_t latest_arrival_ = 0;
  std::array<Sample, kWindow> samples_{};  // a ring
  std::size_t count_ = 0;                  // of samples since the last step
  std::optional<Sample> anchor_;           // the best of the first samples
  std::optional<std::int32_t> rate_;
  std::uint32_t steps_ = 0;
  std::uint32_t epoch_ = 0;
};

/// The whole quarters of an hour, in minutes, by which a clock that is `offset` nanoseconds ahead is local time sent as
/// UTC: up to 14 hours, and no more than 5 s off. 0 for any other clock.
int local_time_minutes(std::int64_t offset);

}  // namespace vexa
