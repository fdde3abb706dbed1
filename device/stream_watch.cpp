// SPDX-License-Identifier: Apache-2.0
#include "device/stream_watch.h"

#include <cstdint>
#include <string>

#include "device/driver_state.h"
#include "runtime/base/result.h"
#include "vexa/failure.h"

namespace vexa {
namespace {

struct Row {
  const char* name;
  std::uint64_t StreamStatistics::*count;
};

constexpr Row kRows[] = {{"sources", &StreamStatistics::epoch},
                         {"key frames", &StreamStatistics::keyFrames},
                         {"packets missing", &StreamStatistics::packetsMissing},
                         {"packets missing in the camera", &StreamStatistics::packetsMissingInCamera},
                         {"packets discarded", &StreamStatistics::packetsDiscarded},
                         {"packets dropped by the kernel", &StreamStatistics::packetsDroppedByKernel},
                         {"frames dropped", &StreamStatistics::framesDropped}};

/// "frames dropped +1 = 4, …" of the counts that rose; of key frames the first alone, as they come all the time.
std::string rises(const StreamStatistics& before, const StreamStatistics& now) {
  std::string text;
  for (const Row& row : kRows) {
    const std::uint64_t was = before.*row.count;
    const std::uint64_t is = now.*row.count;
    if (is <= was || (row.count == &StreamStatistics::keyFrames && was != 0)) continue;
    if (!text.empty()) text += ", ";
    text.append(row.name).append(" +").append(std::to_string(is - was)).append(" = ").append(std::to_string(is));
  }
  return text;
}

}  // namespace

void StreamWatch::look(ELibDReturnCode result) {
  if (!state_.recorder.is_on()) {
    before_.reset();
    return;
  }
  (void)within_memory([&] {
    StreamStatistics now;
    GetStreamStatistics(state_.driver, now);
    const std::string rise = before_ ? rises(*before_, now) : "";
    before_ = now;
    if (!rise.empty()) state_.recorder.note("video", rise);
    const ELibDReturnCode condition = result == LIBD_NO_FRAME ? LIBD_OK : result;
    if (condition == condition_) return;
    condition_ = condition;
    state_.recorder.note("video", condition == LIBD_OK ? "goes on" : CodeName(condition));
  });
}

}  // namespace vexa
