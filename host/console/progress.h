// SPDX-License-Identifier: Apache-2.0
// The progress line of work that reports each of its steps.
#ifndef HOST_CONSOLE_PROGRESS_H_
#define HOST_CONSOLE_PROGRESS_H_

#include <chrono>

#include "host/console/terminal.h"

namespace vexa::host {

// Redraws the line four times a second at most, however often it is asked to. Used by the thread that does the work.
class Progress {
 public:
  // The terminal outlives this.
  explicit Progress(Terminal& terminal) : terminal_(&terminal) {}

  // `make_line` returns the text. It is called only when a new line is due and somebody can see it.
  template <typename MakeLine>
  void show(const MakeLine& make_line) {
    if (!terminal_->shows_progress()) return;
    const auto now = std::chrono::steady_clock::now();
    if (now < next_) return;
    next_ = now + kInterval;
    terminal_->progress(make_line());
  }

 private:
  static constexpr std::chrono::milliseconds kInterval{250};

  Terminal* terminal_;
  std::chrono::steady_clock::time_point next_{};
};

}  // namespace vexa::host

#endif  // HOST_CONSOLE_PROGRESS_H_
