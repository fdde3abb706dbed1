// SPDX-License-Identifier: Apache-2.0
// vexactl ptz watch: a camera's position, taken from its pictures.
#include "host/commands/ptz_watch.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <chrono>
#include <nlohmann/json.hpp>

#include "host/camera/live_pictures.h"
#include "host/console/interrupt.h"
#include "host/console/terminal.h"
#include "host/words/alarm_words.h"
#include "host/words/ptz_scale.h"
#include "host/words/utc_time.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;
using Clock = std::chrono::steady_clock;

// A position comes with a key picture at the latest.
constexpr std::chrono::seconds kLongestWaitForPosition{10};

std::string view_line(const PtzView& view, const std::string& moment, WatchFormat format) {
  if (format == WatchFormat::kText) {
    return fmt::format("{}  pan {:8.3f}  tilt {:7.3f}  view {:.3f} x {:.3f}  zoom {:.2f}{}\n", moment, view.pan,
                       view.tilt, view.horizontal_angle, view.vertical_angle, view.magnification,
                       view.moving ? "  moving" : "");
  }
  return Json{{"time", moment},
              {"pan", view.pan},
              {"tilt", view.tilt},
              {"horizontalAngle", view.horizontal_angle},
              {"verticalAngle", view.vertical_angle},
              {"zoom", view.magnification},
              {"moving", view.moving}}
             .dump() +
         "\n";
}

class WatchAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("watch", "Show the camera's position, a line for each change");
    action->add_option("--count", count_, "end after this many lines")->check(CLI::PositiveNumber);
    action->footer(
        "Angles are degrees: pan to the right, tilt up, and what the picture spans across and down. The first line is "
        "the present position; with --json each line is a JSON object. Ends with Ctrl-C.");
    return action;
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    // The stream that a driver plays when none has been chosen; the position is the same in all.
    SLibDCameraInfo video;
    const ELibDReturnCode asked = camera.device().GetCameraInfo(video);
    if (asked != LIBD_OK) return terminal.report(camera.explain(asked));
    Interrupt::finish_orderly();
    LivePictures pictures(camera.device());
    const ELibDReturnCode started = pictures.start();
    if (started != LIBD_OK) return terminal.report(camera.explain(started));
    return follow(camera, pictures, terminal);
  }

 private:
  [[nodiscard]] WatchFormat format() const { return json() ? WatchFormat::kJson : WatchFormat::kText; }

  ExitCode follow(const ModelCamera& camera, LivePictures& pictures, Terminal& terminal) const {
    std::optional<PtzView> shown;
    const auto give_up = Clock::now() + kLongestWaitForPosition;
    for (std::uint64_t lines = 0; count_ == 0 || lines < count_;) {
      if (Interrupt::requested()) return ExitCode::kInterrupted;
      if (const auto problem = check_reader(terminal)) return terminal.report(*problem);
      if (pictures.poll() == LivePictures::Polled::kSilent) return terminal.report(silent_camera());
      SLibDPTZStatus status;
      const bool told = camera.device().GetCurrentPosition(status) == LIBD_OK;
      if (!told && !shown && Clock::now() > give_up) return terminal.report(no_position());
      if (!told) continue;
      const PtzView view = view_of(status, camera.profile());
      if (shown == view) continue;
      shown = view;
      ++lines;
      const auto line = view_line(view, utc_text(std::chrono::system_clock::now()), format());
      if (const ExitCode code = write_result(terminal, line); code != ExitCode::kOk) return code;
    }
    return ExitCode::kOk;
  }

  static Problem no_position() {
    return {ExitCode::kNoVideo, "the camera's pictures carry no position",
            "Configure the camera to put its position into the user data of its pictures."};
  }

  std::uint64_t count_ = 0;  // 0: no such end
};

}  // namespace

std::unique_ptr<CameraAction> make_ptz_watch_action() { return std::make_unique<WatchAction>(); }

}  // namespace vexa::host
