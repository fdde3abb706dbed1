// SPDX-License-Identifier: Apache-2.0
// vexactl ptz: turns, zooms and focuses a camera.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <cmath>
#include <functional>

#include "host/base/number_text.h"
#include "host/base/printable.h"
#include "host/commands/action_group.h"
#include "host/commands/ptz_watch.h"
#include "host/console/interrupt.h"
#include "host/words/ptz_scale.h"

namespace vexa::host {
namespace {

constexpr int kSpeedOfPercent = kLargestPosition / 100;
constexpr double kLongestMove = 3600;  // seconds

// A move that goes on until it is stopped.
struct MoveOptions {
  int speed = 50;
  std::optional<double> seconds = {};

  void declare(CLI::App& action) {
    action.add_option("--speed", speed, "percent of the camera's highest speed")
        ->type_name("N")
        ->check(CLI::Range(1, 100))
        ->capture_default_str();
    action.add_option("--for", seconds, "stop after this many seconds; left out: vexactl ptz CAMERA stop stops it")
        ->type_name("N");
  }
  [[nodiscard]] std::optional<Problem> check() const {
    if (!seconds || (*seconds > 0 && *seconds <= kLongestMove)) return std::nullopt;
    return usage("--for is not a number of seconds from 0 to 3600", "For instance: --for 1.5.");
  }
};

// Some cameras have so few speeds that the lowest percentages give speed 0.
std::optional<Problem> check_speed(const ModelCamera& camera, int percent, int highest) {
  if (camera.profile().continuousPtz || percent * highest >= 100) return std::nullopt;
  return usage(
      fmt::format("the camera does not move as slowly as {} percent", percent),
      fmt::format("It has {} speeds: --speed {} is the slowest.", highest, highest > 0 ? 99 / highest + 1 : 0));
}

using DriverCall = std::function<ELibDReturnCode(CLibraryDevice&)>;

struct Move {
  const char* what;
  DriverCall start;
  DriverCall stop;
};

ExitCode run_move(const ModelCamera& camera, Terminal& terminal, const Move& move, std::optional<double> seconds) {
  if (!seconds) return report_change(camera, terminal, move.what, move.start(camera.device()));
  Interrupt::finish_orderly();  // a started move is stopped also after Ctrl-C
  const ELibDReturnCode started = move.start(camera.device());
  // Interrupted in the middle, the camera may move all the same.
  if (started != LIBD_OK && !Interrupt::requested()) return report_change(camera, terminal, move.what, started);
  if (!Interrupt::requested()) Interrupt::wait(std::chrono::milliseconds(std::lround(*seconds * 1000)));
  const ELibDReturnCode stopped = camera.last_call(move.stop);
  if (stopped != LIBD_OK) return report_change(camera, terminal, move.what, stopped);
  return Interrupt::requested() ? ExitCode::kInterrupted : ExitCode::kOk;
}

bool has_focus(const ModelCamera& camera) { return camera.profile().control.focus.maxSpeed > 0; }
bool has_zoom(const ModelCamera& camera) { return camera.profile().control.zoom.maxSpeed > 0; }

// Pan or tilt, by their words.
class TurnAction final : public CameraAction {
 public:
  struct Words {
    const char* name;
    const char* description;
    const char* backward;
    const char* forward;
  };
  static constexpr Words kPan{"pan", "Turn to the left or right", "left", "right"};
  static constexpr Words kTilt{"tilt", "Turn up or down", "down", "up"};

  explicit TurnAction(const Words& words) : words_(words) {}

  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand(words_.name, words_.description);
    action->add_option("direction", direction_, fmt::format("{} or {}", words_.backward, words_.forward))
        ->required()
        ->type_name("");
    move_.declare(*action);
    return action;
  }

  std::optional<Problem> check() override {
    if (direction_ != words_.backward && direction_ != words_.forward) {
      return usage(fmt::format("unknown direction \"{}\"", printable(direction_)),
                   fmt::format("It is {} or {}.", words_.backward, words_.forward));
    }
    return move_.check();
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const bool pan = &words_ == &kPan;
    const SLibDFixedPanTiltInfo& limits = camera.profile().control.panTilt;
    const auto problem = check_speed(camera, move_.speed, pan ? limits.panMaxSpeed : limits.tiltMaxSpeed);
    if (problem) return terminal.report(*problem);
    const int speed = kSpeedOfPercent * (direction_ == words_.forward ? move_.speed : -move_.speed);
    const Move move{words_.name,
                    [=](CLibraryDevice& device) { return pan ? device.PanTilt(speed, 0) : device.PanTilt(0, speed); },
                    [](CLibraryDevice& device) { return device.PanTilt(0, 0); }};
    return run_move(camera, terminal, move, move_.seconds);
  }

 private:
  const Words& words_;
  std::string direction_;
  MoveOptions move_;
};

class ZoomAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("zoom", "Zoom, or go to a magnification");
    action->add_option("direction", word_, "wide, tele, or a magnification such as 4 or 2.5x")
        ->required()
        ->type_name("");
    move_.declare(*action);
    action->add_option("--step", step_, "wide and tele: go this far and stay, in percent of 4096 camera units")
        ->type_name("N")
        ->check(CLI::Range(1, 100));
    return action;
  }

  std::optional<Problem> check() override {
    if (word_ == "wide" || word_ == "tele") return move_.check();
    std::string_view number = word_;
    if (number.ends_with('x')) number.remove_suffix(1);
    magnification_ = number_text<double>(number);
    if (magnification_ && std::isfinite(*magnification_) && *magnification_ > 0) return std::nullopt;
    return usage("not a zoom direction or magnification", "It is wide, tele, or a magnification such as 4 or 2.5x.");
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    if (!has_zoom(camera)) return terminal.report(model_lacks(camera, "zoom"));
    if (magnification_) return go(camera, terminal);
    const int sign = word_ == "tele" ? 1 : -1;
    if (step_ > 0) return report_change(camera, terminal, "zoom", camera.device().ZoomRelative(sign * step_));
    const int speed = sign * kSpeedOfPercent * move_.speed;
    const Move move{"zoom", [speed](CLibraryDevice& device) { return device.Zoom(speed); },
                    [](CLibraryDevice& device) { return device.Zoom(0); }};
    return run_move(camera, terminal, move, move_.seconds);
  }

 private:
  ExitCode go(const ModelCamera& camera, Terminal& terminal) const {
    const auto position = zoom_position_at(*magnification_, camera.profile());
    if (!position) {
      return terminal.report(usage("the zoom is out of the lens's range",
                                   fmt::format("It magnifies {} times.", zoom_range_text(camera.profile()))));
    }
    return report_change(camera, terminal, "zoom", camera.device().ZoomAbsolute(*position));
  }

  std::string word_;
  std::optional<double> magnification_;
  int step_ = 0;
  MoveOptions move_;
};

class FocusAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("focus", "Focus by hand or automatically");
    action->add_option("way", word_, "near, far, auto, manual, or a position from 0 to 100 percent")
        ->required()
        ->type_name("");
    move_.declare(*action);
    return action;
  }

  std::optional<Problem> check() override {
    for (const char* word : {"near", "far", "auto", "manual"}) {
      if (word_ == word) return move_.check();
    }
    position_ = number_text<double>(word_);
    if (position_ && *position_ >= 0 && *position_ <= 100) return std::nullopt;
    return usage("not a focus mode or position", "It is near, far, auto, manual, or a position from 0 to 100 percent.");
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    if (!has_focus(camera)) return terminal.report(model_lacks(camera, "focus motor"));
    CLibraryDevice& device = camera.device();
    if (position_) {
      const auto place = static_cast<int>(std::lround(*position_ * kSpeedOfPercent));
      return report_change(camera, terminal, "focus", device.FocusAbsolute(place));
    }
    if (word_ == "auto" || word_ == "manual") {
      return report_change(camera, terminal, "focus", device.SetFocusMode(word_ == "auto"));
    }
    const int speed = kSpeedOfPercent * (word_ == "near" ? move_.speed : -move_.speed);
    const Move move{"focus", [speed](CLibraryDevice& driver) { return driver.Focus(speed); },
                    [](CLibraryDevice& driver) { return driver.Focus(0); }};
    return run_move(camera, terminal, move, move_.seconds);
  }

 private:
  std::string word_;
  std::optional<double> position_;
  MoveOptions move_;
};

class GotoAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("goto", "Turn to a position, given in degrees");
    action->add_option("pan", pan_, "degrees to the right")->required()->type_name("");
    action->add_option("tilt", tilt_, "degrees up")->required()->type_name("");
    action->add_option("--zoom", zoom_, "magnification to go to as well")->type_name("N");
    action->add_flag("--scale", on_scale_, "pan and tilt are whole numbers from 0 to 10000, the driver's scale");
    return action;
  }

  std::optional<Problem> check() override {
    if (!std::isfinite(pan_) || !std::isfinite(tilt_)) {
      return usage("a position is two numbers", "For instance: vexactl ptz CAMERA goto -45 10.");
    }
    if (zoom_ && !(std::isfinite(*zoom_) && *zoom_ > 0)) {
      return usage("--zoom is not a number above 0", "For instance: --zoom 4.");
    }
    const auto off_scale = [](double value) {
      return !(value >= 0 && value <= kLargestPosition && value == std::floor(value));
    };
    if (!on_scale_ || !(off_scale(pan_) || off_scale(tilt_))) return std::nullopt;
    return usage("a position on the scale is two whole numbers from 0 to 10000", "Leave --scale out to give degrees.");
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const auto pan = place_on(pan_axis(camera.profile()), pan_);
    const auto tilt = place_on(tilt_axis(camera.profile()), tilt_);
    if (!pan || !tilt) return terminal.report(too_far(camera.profile()));
    std::optional<int> zoom;
    if (zoom_) {
      zoom = zoom_position_at(*zoom_, camera.profile());
      if (!zoom) {
        return terminal.report(usage("the zoom is out of the lens's range",
                                     fmt::format("It magnifies {} times.", zoom_range_text(camera.profile()))));
      }
    }
    const ELibDReturnCode turned = camera.device().PanTiltAbsolute(*pan, *tilt);
    if (turned != LIBD_OK || !zoom) return report_change(camera, terminal, "pan and tilt", turned);
    return report_change(camera, terminal, "zoom", camera.device().ZoomAbsolute(*zoom));
  }

 private:
  [[nodiscard]] std::optional<int> place_on(const PtzAxis& axis, double value) const {
    return on_scale_ ? static_cast<int>(value) : axis.position_at(value);
  }
  static Problem too_far(const Profile& profile) {
    return usage("the position is out of the camera's range",
                 fmt::format("It pans from {} and tilts from {} degrees.", pan_axis(profile).range_text(),
                             tilt_axis(profile).range_text()));
  }

  double pan_ = 0;
  double tilt_ = 0;
  std::optional<double> zoom_;
  bool on_scale_ = false;
};

class AreaAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand(
        "area", "Turn to a point of the picture, or to an area of it and fill the picture with it");
    action
        ->add_option("place", place_,
                     "X Y of the point, or X Y WIDTH HEIGHT with X Y the area's centre; percent of the picture, "
                     "from its upper left corner")
        ->required()
        ->expected(2, 4)
        ->type_name("");
    return action;
  }

  std::optional<Problem> check() override {
    if (place_.size() == 3) return usage("an area has a width and a height", "For instance: area 50 50 20 20.");
    for (const double value : place_) {
      if (value >= 0 && value <= 100) continue;
      return usage("a place in the picture is not from 0 to 100 percent", "For instance: area 50 50 20 20.");
    }
    return std::nullopt;
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const Result<SLibDCameraInfo> video = camera.video();
    if (!video) return terminal.report(video.error());
    SLibDResolutionInfo size;
    size.width = video->imageWidth;
    size.height = video->imageHeight;
    CLibraryDevice& device = camera.device();
    const ELibDReturnCode result =
        place_.size() == 2 ? device.PanTiltDirect(on_picture(0), on_picture(1), size)
                           : device.ZoomArea(on_picture(0), on_picture(1), on_picture(2), on_picture(3), size);
    return report_change(camera, terminal, "pan and tilt", result);
  }

 private:
  [[nodiscard]] int on_picture(std::size_t which) const {
    return static_cast<int>(std::lround(place_[which] * kSpeedOfPercent));
  }

  std::vector<double> place_;
};

class StopAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    return group.add_subcommand("stop", "Stop every motion: pan, tilt, zoom and focus");
  }

  // Stops everything that can be stopped, also when one stop fails.
  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    CLibraryDevice& device = camera.device();
    ExitCode code = report_change(camera, terminal, "pan and tilt", device.PanTilt(0, 0));
    const auto stop = [&](const char* what, ELibDReturnCode result) {
      const ExitCode next = report_change(camera, terminal, what, result);
      if (code == ExitCode::kOk) code = next;
    };
    if (has_zoom(camera)) stop("zoom", device.Zoom(0));
    if (has_focus(camera)) stop("focus", device.Focus(0));
    return code;
  }
};

std::optional<Problem> check_moves(const ModelCamera& camera) {
  if ((camera.profile().cameraTypes & kPtzCamera) != 0) return std::nullopt;
  return model_lacks(camera, "pan, tilt and zoom");
}

}  // namespace

std::unique_ptr<Command> make_ptz_command() {
  std::vector<std::unique_ptr<CameraAction>> actions;
  actions.push_back(std::make_unique<TurnAction>(TurnAction::kPan));
  actions.push_back(std::make_unique<TurnAction>(TurnAction::kTilt));
  actions.push_back(std::make_unique<ZoomAction>());
  actions.push_back(std::make_unique<FocusAction>());
  actions.push_back(std::make_unique<GotoAction>());
  actions.push_back(std::make_unique<AreaAction>());
  actions.push_back(std::make_unique<StopAction>());
  actions.push_back(make_ptz_watch_action());
  constexpr ActionGroupText kText{
      "ptz", "Turn, zoom and focus a camera, and show its position",
      "For instance:\n  vexactl ptz 192.168.0.100 pan left --speed 30 --for 2\n"
      "  vexactl ptz 192.168.0.100 goto -45 10 --zoom 4\n  vexactl ptz 192.168.0.100 watch"};
  return std::make_unique<ActionGroup>(kText, check_moves, std::move(actions));
}

}  // namespace vexa::host
