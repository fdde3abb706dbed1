// SPDX-License-Identifier: Apache-2.0
// Days of many sessions in minutes: cameras come and go, clocks are set, sequence numbers and timestamps wrap, years
// end and 2038 begins. The same arguments give the same run.
//   soak-simulation [--hours N] [--sessions N] [--seed N]      72 hours of 300 sessions by default
#include <cstdint>
#include <cstdio>
#include <deque>
#include <random>

#include "runtime/base/calendar.h"
#include "tests/soak/simulated_session.h"
#include "tests/support/number_options.h"

namespace {

using vexa_test::SimulatedSession;

struct Arguments {
  long hours = 72;
  long sessions = 300;
  long seed = 1;
};

/// The wall clock of a host: it is set now and then, in both directions. Where time_t has 32 bits it wraps in 2038.
class WallClock {
 public:
  explicit WallClock(std::int64_t start) : seconds_(start) {}

  void pass_a_second(std::mt19937& random) {
    ++seconds_;
    constexpr unsigned kOneIn = 3600;
    if (random() % kOneIn != 0) return;
    constexpr std::int64_t kSteps[] = {1, -1, 60, -60, 3600, -3600, 86400, -86400};
    seconds_ += kSteps[random() % std::size(kSteps)];
    ++sets_;
  }
  std::time_t now() const { return static_cast<std::time_t>(seconds_); }
  std::uint64_t sets() const { return sets_; }

  /// Whether the calendar of the library agrees with the system's about this moment.
  bool agrees() const {
    const std::time_t moment = now();
    std::tm broken{};
    return gmtime_r(&moment, &broken) != nullptr && vexa::utc_seconds(broken) == moment;
  }

 private:
  std::int64_t seconds_;
  std::uint64_t sets_ = 0;
};

// An hour before: the last second of 32 bits, the end of a year, the end of a February that has 29 days.
constexpr std::int64_t kStarts[] = {2147483647 - 3600, 1830297600 - 3600, 1835395200 - 3600};

struct Totals {
  std::uint64_t packets = 0, pictures = 0, wraps = 0, outages = 0, attempts = 0, keep_alives = 0, trace = 0;
  std::int64_t longest_return = 0;

  void add(const SimulatedSession& session) {
    packets += session.stream().packets();
    pictures += session.stream().pictures();
    wraps += session.stream().wraps();
    outages += session.outages();
    attempts += session.attempts();
    keep_alives += session.keep_alives();
    longest_return = std::max<std::int64_t>(longest_return, session.longest_return().count());
    trace = trace * 31 + session.trace();
  }
};

int fail(const char* wrong, std::size_t session, long second, long seed) {
  std::fprintf(stderr, "session %zu, second %ld: %s (--seed %ld)\n", session, second, wrong, seed);
  return 1;
}

int run(const Arguments& arguments) {
  constexpr std::size_t kAttemptsAtOnce = 8;
  std::mt19937 random(static_cast<std::uint32_t>(arguments.seed));
  vexa::Admission turns(kAttemptsAtOnce);
  WallClock clocks[] = {WallClock(kStarts[0]), WallClock(kStarts[1]), WallClock(kStarts[2])};
  std::deque<SimulatedSession> sessions;
  for (long i = 0; i < arguments.sessions; ++i) {
    sessions.emplace_back(static_cast<std::uint64_t>(i + 1), static_cast<std::uint32_t>(random()), turns);
  }
  const long seconds = arguments.hours * 3600;
  for (long second = 0; second < seconds; ++second) {
    for (WallClock& clock : clocks) {
      clock.pass_a_second(random);
      if (!clock.agrees()) return fail("the calendar is wrong", 0, second, arguments.seed);
    }
    const vexa::Moment now(std::int64_t{second} * 1000);
    for (std::size_t i = 0; i < sessions.size(); ++i) {
      const char* wrong = sessions[i].second(now, clocks[i % std::size(clocks)].now());
      if (wrong != nullptr) return fail(wrong, i, second, arguments.seed);
    }
    if (turns.inside() > kAttemptsAtOnce) return fail("too many attempts at once", 0, second, arguments.seed);
  }
  Totals totals;
  for (std::size_t i = 0; i < sessions.size(); ++i) {
    const char* wrong = sessions[i].stop(vexa::Moment(std::int64_t{seconds} * 1000));
    if (wrong != nullptr) return fail(wrong, i, seconds, arguments.seed);
    totals.add(sessions[i]);
  }
  if (turns.inside() != 0 || turns.waiting() != 0) return fail("turns are left", 0, seconds, arguments.seed);
  std::printf(
      "%ld hours of %ld sessions: %llu packets, %llu pictures, %llu wraps, %llu outages, %llu attempts, %llu "
      "keep-alives, "
      "%llu settings of clocks; the slowest return took %lld s; trace %016llx\n",
      arguments.hours, arguments.sessions, static_cast<unsigned long long>(totals.packets),
      static_cast<unsigned long long>(totals.pictures), static_cast<unsigned long long>(totals.wraps),
      static_cast<unsigned long long>(totals.outages), static_cast<unsigned long long>(totals.attempts),
      static_cast<unsigned long long>(totals.keep_alives),
      static_cast<unsigned long long>(clocks[0].sets() + clocks[1].sets() + clocks[2].sets()),
      static_cast<long long>(totals.longest_return / 1000), static_cast<unsigned long long>(totals.trace));
  return 0;
}

}  // namespace

int main(int count, char** texts) {
  Arguments arguments;
  if (!vexa_test::read_numbers(
          count, texts,
          {{"--hours", &arguments.hours}, {"--sessions", &arguments.sessions}, {"--seed", &arguments.seed}})) {
    std::fprintf(stderr, "usage: %s [--hours N] [--sessions N] [--seed N]\n", texts[0]);
    return 2;
  }
  return run(arguments);
}
