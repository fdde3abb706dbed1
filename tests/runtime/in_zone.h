// SPDX-License-Identifier: Apache-2.0
// The process's time zone, changed for the length of a test.
#pragma once

#include <cstdlib>
#include <ctime>
#include <optional>
#include <string>

namespace vexa::test {

/// For tests on one thread: the environment is not guarded.
// NOLINTBEGIN(concurrency-mt-unsafe)
class InZone {
 public:
  explicit InZone(const char* name) {
    if (const char* former = std::getenv("TZ")) former_ = former;
    setenv("TZ", name, 1);
    tzset();
  }
  ~InZone() {
    if (former_) {
      setenv("TZ", former_->c_str(), 1);
    } else {
      unsetenv("TZ");
    }
    tzset();
  }
  InZone(const InZone&) = delete;
  InZone& operator=(const InZone&) = delete;

 private:
  std::optional<std::string> former_;
};
// NOLINTEND(concurrency-mt-unsafe)

/// Whether the platform counts seconds beyond 2038.
constexpr bool kWideTime = sizeof(std::time_t) > 4;

}  // namespace vexa::test
