// SPDX-License-Identifier: Apache-2.0
// Everything that may go wrong at a site, drawn from its seed.
#pragma once

#include "tests/site/simulated_site.h"

namespace vexa_test {

/// From `from` to `until`, every few seconds, of each kind of fault; the last ones last up to 40 s.
inline void plan_faults(SimulatedSite& site, const SiteSetup& setup, std::int64_t from, std::int64_t until) {
  std::mt19937_64 random(setup.seed * 7919 + 1);
  const auto draw = [&random](std::int64_t least, std::int64_t most) {
    return least + static_cast<std::int64_t>(random() % static_cast<std::uint64_t>(most - least + 1));
  };
  for (std::int64_t time = from; time < until; time += draw(2000, 15000)) {
    const auto node = static_cast<std::size_t>(random() % setup.nodes);
    const std::int64_t duration = draw(500, 40000);
    switch (random() % 12) {
      case 0:
        site.at(time, [&site, duration] { site.etcd_away(duration); });
        break;
      case 1:
        site.at(time, [&site] { site.revoke_all(); });
        break;
      case 2:
        site.at(time, [&site, duration] { site.slow_network(duration / 4); });
        break;
      case 3:
      case 4:
        site.at(time, [&site, node, duration] { site.stop(node, duration); });
        break;
      case 5:
      case 6:
        site.at(time, [&site, node, duration] { site.suspend(node, duration); });
        break;
      case 7:
      case 8:
        site.at(time, [&site, node, duration] { site.cut(node, duration); });
        break;
      default:
        site.at(time, [&site, node] { site.crash(node); });
        site.at(time + duration, [&site, node] { site.start(node); });
    }
  }
}

}  // namespace vexa_test
