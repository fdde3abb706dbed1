// SPDX-License-Identifier: Apache-2.0
// A session in simulated time: the parts that decide what a session does, and a camera that fails in its own ways.
#pragma once

#include <cstdint>
#include <ctime>
#include <random>

#include "session/core/admission.h"
#include "session/core/credential_breaker.h"
#include "session/core/session_machine.h"
#include "tests/soak/simulated_stream.h"

namespace vexa_test {

/// What is wrong with a camera.
enum class Outage { kNone, kUnreachable, kSilent, kWrongPassword, kBusy };

/// Steps in seconds; each has a moment on the monotonic clock, which is never set, and one on the wall clock, which is.
class SimulatedSession {
 public:
  SimulatedSession(std::uint64_t number, std::uint32_t seed, vexa::Admission& turns);

  /// A second from `now` on. Why it is wrong; null when it is not.
  [[nodiscard]] const char* second(vexa::Moment now, std::time_t wall);
  /// Ends the session. The same.
  [[nodiscard]] const char* stop(vexa::Moment now);

  [[nodiscard]] const SimulatedStream& stream() const { return stream_; }
  [[nodiscard]] std::uint64_t outages() const { return outages_; }
  [[nodiscard]] std::uint64_t attempts() const { return attempts_; }
  [[nodiscard]] std::uint64_t keep_alives() const { return keep_alives_; }
  [[nodiscard]] vexa::Moment longest_return() const { return longest_return_; }
  /// Changes with all that has happened.
  [[nodiscard]] std::uint64_t trace() const { return trace_; }

 private:
  double chance() { return std::uniform_real_distribution<double>(0, 1)(random_); }
  void change_camera(vexa::Moment now);
  void begin_attempt(vexa::Moment now);
  void end_attempt(vexa::Moment now);
  void close(vexa::Moment now);
  [[nodiscard]] const char* run_stream(vexa::Moment now, std::time_t wall);
  [[nodiscard]] const char* keep_alive(vexa::Moment now, std::time_t wall);
  [[nodiscard]] const char* judge(vexa::Moment now);

  const std::uint64_t number_;
  std::mt19937 random_;
  vexa::Admission& turns_;
  vexa::SessionMachine machine_{true, {}};
  vexa::CredentialBreaker breaker_;
  SimulatedStream stream_;
  Outage outage_ = Outage::kNone;
  vexa::Moment outage_ends_{0};  ///< or the next one begins
  vexa::Moment well_since_{0};   ///< the camera has been
  bool attempting_ = false;
  vexa::Moment attempt_ends_{0};
  bool open_ = false;
  std::time_t last_keep_alive_ = 0;
  vexa::Moment kept_alive_{0};
  std::uint64_t latest_event_ = 0;
  std::uint64_t outages_ = 0;
  std::uint64_t attempts_ = 0;
  std::uint64_t refusals_ = 0;  ///< of the outage under way
  std::uint64_t keep_alives_ = 0;
  vexa::Moment longest_return_{0};
  bool has_returned_ = true;
  std::uint64_t trace_ = 1469598103934665603U;
};

}  // namespace vexa_test
