// SPDX-License-Identifier: Apache-2.0
// What a host does with a driver while calls fail: the scenarios of tests/torture.
#ifndef TESTS_TORTURE_SCENARIOS_H_
#define TESTS_TORTURE_SCENARIOS_H_

#include <vector>

#include "vexa/library_device.h"

namespace vexa::torture {

constexpr const char* kCamera = "127.0.0.1";

// What one run of a scenario came to: the first code that is no success, or the first that no contract states.
struct Outcome {
  const char* step = nullptr;
  long code = LIBD_OK;
  bool unstated = false;
};

// Collects the codes of one run. Allocates nothing, as allocations may be failing.
class Run {
 public:
  void expect(const char* step, ELibDReturnCode code);
  void expect_true(const char* step, bool success) {
    if (!success) expect(step, LIBD_FAILED);
  }
  [[nodiscard]] const Outcome& outcome() const { return outcome_; }

 private:
  Outcome outcome_;
};

struct Scenario {
  const char* name;
  void (*body)(Run&, CLibraryDevice&);
};

const std::vector<Scenario>& usual_scenarios();

// With faults of their own, for the tests of the harness; they need no camera.
const std::vector<Scenario>& planted_scenarios();

}  // namespace vexa::torture

#endif  // TESTS_TORTURE_SCENARIOS_H_
