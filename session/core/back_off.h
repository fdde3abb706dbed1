// SPDX-License-Identifier: Apache-2.0
// How long a session waits before it tries its camera again.
#pragma once

#include "session/core/moment.h"

namespace vexa {

/// Exponential back-off with full jitter: each wait is drawn evenly from a tenth of a second up to a limit that begins
/// at 1 s and doubles with each failure up to 30 s, so that cameras which failed together do not come back together.
/// Only 10 s of whole pictures without a pause bring the limit back to 1 s: a connection alone proves nothing.
class BackOff {
 public:
  static constexpr Moment kLeast{100};
  static constexpr Moment kFirstLimit{1000};
  static constexpr Moment kLastLimit{30000};
  static constexpr Moment kProof{10000};

  /// The wait after one more failure. `chance` is drawn evenly from 0 up to 1, without 1; what lies outside counts as
  /// the nearer of both.
  Moment next(double chance);
  /// Whole pictures come without a pause since `since`. True when that is long enough.
  bool prove(Moment since, Moment now);
  /// From the beginning, as after a word of the host's.
  void reset() { limit_ = kFirstLimit; }
  [[nodiscard]] Moment limit() const { return limit_; }

 private:
  Moment limit_ = kFirstLimit;  ///< of the next wait
};

}  // namespace vexa
