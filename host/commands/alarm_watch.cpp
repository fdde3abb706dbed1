// SPDX-License-Identifier: Apache-2.0
#include "host/commands/alarm_watch.h"

#include <chrono>
#include <thread>
#include <vector>

#include "host/camera/one_session.h"
#include "host/console/interrupt.h"
#include "host/console/terminal.h"
#include "host/words/utc_time.h"

namespace vexa::host {

void follow_detection(const ModelCamera& camera) {
  camera.device().SetVMDtype(camera.profile().lodDetection ? LIBD_VMD_VMF : LIBD_VMD_WINDOW);
}

ExitCode AlarmWatch::run() {
  follow_detection(camera_);
  const ELibDReturnCode started = camera_.device().StartIoStreaming();
  if (started != LIBD_OK) return terminal_.report(camera_.explain(started));
  if (options_.metadata) {
    follow_both();
  } else {
    end(follow_alarms());
  }
  camera_.stop_alarms();
  if (failure_) return terminal_.report(*failure_);
  return Interrupt::requested() ? ExitCode::kInterrupted : ExitCode::kOk;
}

void AlarmWatch::follow_both() {
  const ELibDReturnCode started = camera_.device().StartModRawData();
  if (started != LIBD_OK) {
    end(camera_.explain(started));
    return;
  }
  std::thread metadata([this] { end(follow_metadata()); });
  end(follow_alarms());
  metadata.join();
  camera_.device().StopModRawData();
}

bool AlarmWatch::goes_on() const { return !over_ && !Interrupt::requested(); }

void AlarmWatch::end(const std::optional<Problem>& problem) {
  const std::lock_guard<std::mutex> lock(mutex_);
  over_ = true;
  if (problem && !failure_) failure_ = problem;
}

std::optional<Problem> AlarmWatch::show(const std::string& line) {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (over_) return std::nullopt;
  if (terminal_.write_result(line) != 0) {
    return Problem{ExitCode::kCannotWrite, "an alarm cannot be written", "Is standard output still open?"};
  }
  if (++shown_ == options_.lines) over_ = true;
  return std::nullopt;
}

std::optional<Problem> AlarmWatch::follow_alarms() {
  PinStates states;
  while (goes_on()) {
    if (auto problem = check_reader(terminal_)) return problem;
    std::vector<SLibDPinInfo> pins;
    const ELibDReturnCode result = camera_.device().GetCurrentIoStatus(pins);
    if (result == LIBD_NO_FRAME) continue;
    if (result != LIBD_OK) return camera_.explain(result);
    const std::string moment = utc_text(std::chrono::system_clock::now());
    for (const SLibDPinInfo& pin : states.changed(pins)) {
      if (auto problem = show(alarm_line(pin, moment, options_.format))) return problem;
      if (auto problem = take_snapshot(pin, moment)) return problem;
    }
  }
  return std::nullopt;
}

std::optional<Problem> AlarmWatch::follow_metadata() {
  SLibDRawMDFrameInfo frame;
  while (goes_on()) {
    const ELibDReturnCode result = camera_.device().GetCurrentPosition(frame);
    if (result == LIBD_NO_FRAME) continue;
    if (result != LIBD_OK) return camera_.explain(result);
    const std::string moment = utc_text(std::chrono::system_clock::now());
    if (auto problem = show(metadata_line(frame, moment, options_.format))) return problem;
  }
  return std::nullopt;
}

// An alarm without a picture is better than none: only a folder that takes no file ends the watch.
std::optional<Problem> AlarmWatch::take_snapshot(const SLibDPinInfo& pin, const std::string& moment) {
  if (snapshots_ == nullptr || pin.state == 0) return std::nullopt;
  auto problem = snapshots_->take(pin, moment);
  if (!problem || problem->code == ExitCode::kCannotWrite) return problem;
  terminal_.say("vexactl: no picture of this alarm: " + problem->text);
  return std::nullopt;
}

ExitCode watch_by_session(const SessionOptions& session, Terminal& terminal, const AlarmWatchOptions& options) {
  PinStates states;
  std::uint64_t shown = 0;
  std::optional<Problem> problem;
  const auto is_done = [&] { return problem || (options.lines != 0 && shown >= options.lines); };
  const auto show = [&](const std::string& line) {
    if (is_done()) return;
    ++shown;
    if (terminal.write_result(line) != 0) {
      problem = Problem{ExitCode::kCannotWrite, "an alarm cannot be written", "Is standard output still open?"};
    }
  };
  SessionWork work;
  work.callbacks.alarms = [&](Session&, const std::vector<SLibDPinInfo>& pins) {
    const std::string moment = utc_text(std::chrono::system_clock::now());
    for (const SLibDPinInfo& pin : states.changed(pins)) show(alarm_line(pin, moment, options.format));
  };
  work.callbacks.metadata = [&](Session&, const SLibDRawMDFrameInfo& frame) {
    show(metadata_line(frame, utc_text(std::chrono::system_clock::now()), options.format));
  };
  work.is_done = [&] {
    if (!problem) problem = check_reader(terminal);
    return is_done();
  };
  const std::optional<Problem> ended = work_by_session(session, work, terminal);
  if (ended && ended->code == ExitCode::kInterrupted) return ended->code;
  if (ended) return terminal.report(*ended);
  return problem ? terminal.report(*problem) : ExitCode::kOk;
}

}  // namespace vexa::host
