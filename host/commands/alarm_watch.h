// SPDX-License-Identifier: Apache-2.0
// Shows a camera's alarms as they come.
#ifndef HOST_COMMANDS_ALARM_WATCH_H_
#define HOST_COMMANDS_ALARM_WATCH_H_

#include <atomic>
#include <cstdint>
#include <mutex>
#include <optional>
#include <string>

#include "host/camera/model_camera.h"
#include "host/commands/alarm_snapshots.h"
#include "host/console/terminal.h"
#include "host/words/alarm_words.h"
#include "vexa/session.h"

namespace vexa::host {

struct AlarmWatchOptions {
  WatchFormat format = WatchFormat::kText;
  bool metadata = false;    // the frames of motion metadata too, polled on a thread of their own
  std::uint64_t lines = 0;  // ends after so many; 0: no such end
};

// One watch, run once by the command's thread. The camera, the terminal and the snapshots outlive it.
class AlarmWatch {
 public:
  // `snapshots` may be null; otherwise it has been started.
  AlarmWatch(const ModelCamera& camera, Terminal& terminal, AlarmWatchOptions options, AlarmSnapshots* snapshots)
      : camera_(camera), terminal_(terminal), options_(options), snapshots_(snapshots) {}

  // Opens the streams, shows what comes until the limit, Ctrl-C or a failure, and closes them.
  [[nodiscard]] ExitCode run();

 private:
  // Alarms on this thread, metadata on another.
  void follow_both();
  // Each polls until the watch ends; a failure of the driver is returned.
  [[nodiscard]] std::optional<Problem> follow_alarms();
  [[nodiscard]] std::optional<Problem> follow_metadata();

  [[nodiscard]] bool goes_on() const;
  // Ends the watch, for both threads; the first problem is the one reported.
  void end(const std::optional<Problem>& problem);
  [[nodiscard]] std::optional<Problem> show(const std::string& line);
  [[nodiscard]] std::optional<Problem> take_snapshot(const SLibDPinInfo& pin, const std::string& moment);

  const ModelCamera& camera_;
  Terminal& terminal_;
  const AlarmWatchOptions options_;
  AlarmSnapshots* const snapshots_;
  std::atomic<bool> over_{false};
  std::mutex mutex_;  // of what follows
  std::uint64_t shown_ = 0;
  std::optional<Problem> failure_;
};

// The same by a session, through outages and without pictures.
[[nodiscard]] ExitCode watch_by_session(const SessionOptions& session, Terminal& terminal,
                                        const AlarmWatchOptions& options);

// Detectors of simple cameras report as one item, all others window by window.
void follow_detection(const ModelCamera& camera);

}  // namespace vexa::host

#endif  // HOST_COMMANDS_ALARM_WATCH_H_
