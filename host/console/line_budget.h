// SPDX-License-Identifier: Apache-2.0
// How many lines a second a command may say of its cameras.
#ifndef HOST_CONSOLE_LINE_BUDGET_H_
#define HOST_CONSOLE_LINE_BUDGET_H_

#include <chrono>

namespace vexa::host {

// One thread.
class LineBudget {
 public:
  static constexpr int kLines = 20;

  // Whether one more line may be said in this second.
  [[nodiscard]] bool take(std::chrono::steady_clock::time_point now) {
    if (now - begun_ >= std::chrono::seconds(1)) {
      begun_ = now;
      said_ = 0;
    }
    return ++said_ <= kLines;
  }

 private:
  std::chrono::steady_clock::time_point begun_{};
  int said_ = 0;
};

}  // namespace vexa::host

#endif  // HOST_CONSOLE_LINE_BUDGET_H_
