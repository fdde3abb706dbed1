// SPDX-License-Identifier: Apache-2.0
// What a flight recorder is given of a running stream.
#pragma once

#include <optional>

#include "vexa/return_codes.h"
#include "vexa/statistics.h"

namespace vexa {

struct DriverState;

/// Made and used by the streaming thread: notes what changed from one read to the next, a line for all of it. While the
/// recorder is off it tests its flag and does nothing else.
class StreamWatch {
 public:
  explicit StreamWatch(DriverState& state) : state_(state) {}

  /// After a read, with its result.
  void look(ELibDReturnCode result);

 private:
  DriverState& state_;
  std::optional<StreamStatistics> before_;  // none while the recorder is off
  ELibDReturnCode condition_ = LIBD_OK;     // of the latest read; no frame yet counts as none wrong
};

}  // namespace vexa
