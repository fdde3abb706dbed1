#include "transport/wire/sender_clock.h"

#include <algorithm>
#include <cstdlib>

namespace vexa {
namespace {

constexpr std::int64_t kMillisecond = 1'000'000;
constexpr std::int64_t kSecond = 1'000'000'000;
constexpr std::int64_t kBillion = 1'000'000'000;

/// NTP and RTP time of two reports differ by more: the clock was set. A tenth of a second, and what a bad crystal does.
constexpr std::int64_t kLeastStep = 100 * kMillisecond;
constexpr std::int64_t kWorstDrift = 1000;  // parts of a million
/// Both went elsewhere together: no report is late by so much.
constexpr std::int64_t kLeastStepByArrival = 2 * kSecond;

constexpr std::size_t kFirstSamples = 4;
constexpr std::int64_t kLeastSpanOfARate = 10 * kSecond;
/// The RTP clock may run by so much otherwise than the sender's.
constexpr std::uint64_t kRtpDrift = 500;  // parts of a million

std::int64_t nanoseconds_of_ticks(std::int64_t ticks, int clock_rate) {
  // Whole seconds first: ticks may be 2^31.
  return ticks / clock_rate * kSecond + ticks % clock_rate * kSecond / clock_rate;
}

}  // namespace

void SenderClock::forget() {
  if (state_ != State::kUnknown) ++epoch_;
  state_ = State::kUnknown;
  count_ = 0;
  anchor_.reset();
  rate_.reset();
}

// The same time although the RTP clock went on.
bool SenderClock::stands(const SenderReport& report) const {
  return state_ != State::kUnknown && report.ntp == latest_.ntp && report.rtp_time != latest_.rtp_time;
}

bool SenderClock::has_stepped(std::int64_t time, const SenderReport& report, Arrival arrival, int clock_rate) const {
  const std::int64_t passed = time - latest_time_;
  const std::int64_t host_passed = arrival.monotonic - latest_arrival_;
  const std::int64_t allowed = kLeastStep + std::abs(host_passed) / 1'000'000 * kWorstDrift;
  if (clock_rate > 0 && host_passed < kSecond * 3600) {
    const auto ticks = static_cast<std::int32_t>(report.rtp_time - latest_.rtp_time);
    if (std::abs(passed - nanoseconds_of_ticks(ticks, clock_rate)) > allowed) return true;
  }
  return std::abs(passed - host_passed) > kLeastStepByArrival + allowed;
}

void SenderClock::report(const SenderReport& report, Arrival arrival, int clock_rate) {
  if (report.ntp == 0) return;  // the sender has no clock
  if (state_ != State::kUnknown && report.ntp == latest_.ntp && report.rtp_time == latest_.rtp_time) return;
  if (stands(report)) {
    state_ = State::kFrozen;
    latest_.rtp_time = report.rtp_time;
    latest_arrival_ = arrival.monotonic;
    return;
  }
  const std::int64_t time = unix_nanoseconds(report.ntp);
  if (state_ != State::kUnknown && has_stepped(time, report, arrival, clock_rate)) {
    ++steps_;
    ++epoch_;
    count_ = 0;
    anchor_.reset();
    rate_.reset();
  }
  state_ = State::kRunning;
  latest_ = report;
  latest_time_ = time;
  latest_arrival_ = arrival.monotonic;
  add({arrival.monotonic, time - arrival.monotonic});
}

void SenderClock::add(Sample sample) {
  samples_[count_++ % kWindow] = sample;
  if (count_ == kFirstSamples) anchor_ = best_of(0, kFirstSamples);
  measure_rate();
}

std::int64_t SenderClock::drift_until(std::int64_t later, std::int64_t earlier) const {
  return (later - earlier) / kMillisecond * rate_.value_or(0) / (kBillion / kMillisecond);
}

// A report that was delayed makes the clock look slow: the sample that makes it look fastest was delayed least.
SenderClock::Sample SenderClock::best_of(std::size_t first, std::size_t count) const {
  const std::int64_t now = samples_[(count_ - 1) % kWindow].monotonic;
  Sample best = samples_[first % kWindow];
  for (std::size_t i = first; i < first + count; ++i) {
    const Sample& sample = samples_[i % kWindow];
    if (sample.offset + drift_until(now, sample.monotonic) > best.offset + drift_until(now, best.monotonic)) {
      best = sample;
    }
  }
  return best;
}

void SenderClock::measure_rate() {
  if (!anchor_ || count_ < 2 * kFirstSamples) return;
  const Sample best = best_of(count_ - kFirstSamples, kFirstSamples);
  const std::int64_t span = best.monotonic - anchor_->monotonic;
  if (span < kLeastSpanOfARate) return;
  const std::int64_t parts = (best.offset - anchor_->offset) / (span / kSecond);
  rate_ = static_cast<std::int32_t>(std::clamp<std::int64_t>(parts, -kBillion, kBillion));
}

std::optional<SenderClock::Moment> SenderClock::time_of(std::uint32_t rtp_time, int clock_rate) const {
  if (state_ != State::kRunning || clock_rate <= 0) return std::nullopt;
  const auto ticks = static_cast<std::int32_t>(rtp_time - latest_.rtp_time);
  const std::int64_t distance = nanoseconds_of_ticks(ticks, clock_rate);
  const auto tick = static_cast<std::uint64_t>(kSecond / clock_rate + 1);
  return Moment{latest_time_ + distance, tick + static_cast<std::uint64_t>(std::abs(distance)) / 1'000'000 * kRtpDrift};
}

std::optional<std::int64_t> SenderClock::offset(Arrival now) const {
  if (state_ != State::kRunning) return std::nullopt;
  const std::size_t kept = std::min(count_, kWindow);
  const Sample best = best_of(count_ - kept, kept);
  return best.offset + drift_until(now.monotonic, best.monotonic) + now.monotonic - now.real;
}

int local_time_minutes(std::int64_t offset) {
  constexpr std::int64_t kQuarter = 15 * 60 * kSecond;
  constexpr std::int64_t kMostQuarters = 14 * 4;
  constexpr std::int64_t kTolerance = 5 * kSecond;
  const std::int64_t quarters = (offset + (offset < 0 ? -kQuarter / 2 : kQuarter / 2)) / kQuarter;
  if (std::abs(quarters) > kMostQuarters || std::abs(offset - quarters * kQuarter) > kTolerance) return 0;
  return static_cast<int>(quarters) * 15;
}

}  // namespace vexa
