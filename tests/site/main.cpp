// SPDX-License-Identifier: Apache-2.0
// Sites of many nodes with faults, one run a seed, in simulated time. The same arguments give the same runs.
//   site-simulation [--nodes N] [--cameras N] [--seconds N] [--seed N] [--seeds N]
#include <algorithm>
#include <cstdio>

#include "tests/site/random_faults.h"
#include "tests/support/number_options.h"

namespace {

struct Arguments {
  long nodes = 20;
  long cameras = 100;
  long seconds = 600;
  long seed = 1;
  long seeds = 50;
};

constexpr std::int64_t kQuiet = 100000;  // after the last fault, and before the end

bool is_good(const vexa_test::SiteReport& report) {
  return report.double_tokens == 0 && report.longest_gap <= 30000 && report.unrecorded == 0 && report.misplaced == 0;
}

int run(const Arguments& arguments) {
  std::uint64_t moves = 0, least = 0, gaps = 0, requests = 0;
  std::int64_t longest = 0;
  for (long seed = arguments.seed; seed < arguments.seed + arguments.seeds; ++seed) {
    vexa_test::SiteSetup setup;
    setup.nodes = static_cast<std::size_t>(arguments.nodes);
    setup.cameras = static_cast<std::size_t>(arguments.cameras);
    setup.capacity = static_cast<std::uint32_t>(arguments.cameras);
    setup.seed = static_cast<std::uint64_t>(seed);
    vexa_test::SimulatedSite site(setup);
    plan_faults(site, setup, 30000, arguments.seconds * 1000 - kQuiet);
    site.run(arguments.seconds * 1000);
    const vexa_test::SiteReport report = site.report();
    if (!is_good(report)) {
      std::fprintf(stderr,
                   "seed %ld: %llu times two valid tokens, longest gap %lld ms, %llu cameras unrecorded and %llu "
                   "misplaced at the end\n",
                   seed, static_cast<unsigned long long>(report.double_tokens),
                   static_cast<long long>(report.longest_gap), static_cast<unsigned long long>(report.unrecorded),
                   static_cast<unsigned long long>(report.misplaced));
      return 1;
    }
    moves += report.moves;
    least += report.least;
    gaps += report.gaps;
    requests += report.requests;
    longest = std::max(longest, report.longest_gap);
  }
  std::printf(
      "%ld runs of %ld nodes, %ld cameras, %ld s: no two valid tokens, %llu gaps, the longest %.1f s, "
      "%llu cameras moved, at least %llu had to, %.2f requests a second and node\n",
      arguments.seeds, arguments.nodes, arguments.cameras, arguments.seconds, static_cast<unsigned long long>(gaps),
      static_cast<double>(longest) / 1000, static_cast<unsigned long long>(moves),
      static_cast<unsigned long long>(least),
      static_cast<double>(requests) / static_cast<double>(arguments.seeds * arguments.nodes * arguments.seconds));
  if (moves * 10 > least * 12) {
    std::fprintf(stderr, "more than 1.2 of the least moved\n");
    return 1;
  }
  return 0;
}

}  // namespace

int main(int count, char** texts) {
  Arguments arguments;
  if (!vexa_test::read_numbers(count, texts,
                               {{"--nodes", &arguments.nodes},
                                {"--cameras", &arguments.cameras},
                                {"--seconds", &arguments.seconds},
                                {"--seed", &arguments.seed},
                                {"--seeds", &arguments.seeds}})) {
    std::fprintf(stderr, "usage: %s [--nodes N] [--cameras N] [--seconds N] [--seed N] [--seeds N]\n", texts[0]);
    return 2;
  }
  return run(arguments);
}
