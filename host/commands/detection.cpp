// SPDX-License-Identifier: Apache-2.0
// vexactl detection, tampering and audio-detection: the settings of a camera's detectors, and switching them.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <nlohmann/json.hpp>
#include <optional>
#include <vector>

#include "host/base/printable.h"
#include "host/camera/model_camera.h"
#include "host/commands/command.h"
#include "host/commands/detection_picture.h"
#include "host/console/terminal.h"
#include "host/words/setting_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr std::array<SettingWord<ELibDTamperLevel>, 3> kTamperLevels{
    {{"low", LIBD_TAMPER_LOW}, {"middle", LIBD_TAMPER_MIDDLE}, {"high", LIBD_TAMPER_HIGH}}};
constexpr std::array<SettingWord<int>, 3> kObjectSizes{{{"small", 0}, {"middle", 1}, {"large", 2}}};

Problem no_switch(const std::string& what, const std::string& word) {
  return usage(fmt::format("{} is switched on or off, not \"{}\"", what, printable(word)),
               fmt::format("See vexactl {} --help.", what));
}

template <typename Words>
auto value_named(const Words& words, std::string_view word) -> std::optional<decltype(words[0].value)> {
  for (const auto& entry : words) {
    if (entry.word == word) return entry.value;
  }
  return std::nullopt;
}

Json window_json(const SLibDDetectionWindow& window) {
  Json area = Json::array();
  for (const SLibDCommonPosition& point : window.area) area.push_back(Json::array({point.x, point.y}));
  return {{"enabled", window.enabled == 1}, {"mode", window.mode == 0 ? "detect" : "mask"}, {"area", area}};
}

std::string window_line(std::size_t number, const Json& window) {
  const Json& area = window["area"];
  std::string corners;
  for (const Json& point : area) corners += fmt::format(" {},{}", point[0].get<int>(), point[1].get<int>());
  return fmt::format("  window {}  {:<3}  {:<6} {}\n", number, switch_word(window["enabled"].get<bool>()),
                     window["mode"].get<std::string>(), corners.empty() ? " -" : corners);
}

// One setting of a camera without windows, null or a list of settings with them.
std::string detection_text(const Json& shown) {
  if (shown.empty()) return "the camera has no detection settings\n";
  if (shown.is_object()) {
    return fmt::format("size         {}\nsensitivity  {}\n", shown["size"].get<std::string>(),
                       shown["sensitivity"].get<int>());
  }
  std::string text;
  for (const Json& setting : shown) {
    text += fmt::format("setting {}: sensitivity {}, objects of {}x{} to {}x{}\n", setting["number"].get<int>(),
                        setting["sensitivity"].get<int>(), setting["smallest"][0].get<int>(),
                        setting["smallest"][1].get<int>(), setting["largest"][0].get<int>(),
                        setting["largest"][1].get<int>());
    std::size_t number = 0;
    for (const Json& window : setting["windows"]) text += window_line(++number, window);
  }
  return text;
}

// The detection settings of a camera, and changing those of the current view.
class DetectionCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("detection", "Show, set or draw a camera's video detection settings");
    add_model_options(*command, options_, environment);
    command->add_option("action", action_, "show, set, or draw: a picture with the windows on it")
        ->required()
        ->type_name("")
        ->check(CLI::IsMember({"show", "set", "draw"}));
    command->add_option("--out", out_, "draw: the picture's file, NAME.png or NAME.jpg")->type_name("FILE");
    command->add_option("--number", number_, "of the detection setting; 99: the current view")->capture_default_str();
    command->add_option("--sensitivity", sensitivity_, "1 to 100")->check(CLI::Range(1, 100));
    command->add_option("--size", size_, "of the smallest object, for cameras with a size class: small, middle, large");
    command->add_option("--window", window_, "1 to 4, which the options below change")->check(CLI::Range(1, 4));
    command
        ->add_option("--area", area_,
                     "X1 Y1 X2 Y2, two corners of the window; 10000 is the width or height of the picture")
        ->expected(4);
    command->add_option("--enabled", enabled_, "on or off")->check(CLI::IsMember({"on", "off"}));
    command->add_option("--mode", mode_, "detect or mask")->check(CLI::IsMember({"detect", "mask"}));
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (action_ == "draw") {
      if (const auto problem = check_picture_file(out_)) return terminal.report(*problem);
    }
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    std::vector<SLibDDetectionParam> settings;
    ELibDPositionMode position = LIBD_POSITION_PRESET;
    const ELibDReturnCode read = camera->device().GetObjectDetectionSetting(settings, position);
    if (read != LIBD_OK) return terminal.report(camera->explain(read));
    if (action_ == "show") return show(terminal, *camera, settings);
    if (action_ == "draw") return draw(terminal, *camera, settings);
    return set(terminal, *camera, settings);
  }

 private:
  ExitCode show(Terminal& terminal, const ModelCamera& camera, const std::vector<SLibDDetectionParam>& settings) const {
    Json list = Json::array();
    for (const SLibDDetectionParam& setting : settings) list.push_back(setting_json(camera, setting));
    if (camera.profile().lodDetection) list = list.empty() ? Json(nullptr) : list.front();
    return write_result(terminal, options_.camera.json ? to_text(list) : detection_text(list));
  }

  static Json setting_json(const ModelCamera& camera, const SLibDDetectionParam& setting) {
    const SLibDDetectionWindow& first = setting.windows[0];
    if (camera.profile().lodDetection) {
      return {{"size", word_for(kObjectSizes, static_cast<int>(first.minObjectWidth)).value_or("-")},
              {"sensitivity", first.sensitivity}};
    }
    Json windows = Json::array();
    for (const SLibDDetectionWindow& window : setting.windows) windows.push_back(window_json(window));
    return {{"number", setting.number},
            {"sensitivity", first.sensitivity},
            {"smallest", Json::array({first.minObjectWidth, first.minObjectHeight})},
            {"largest", Json::array({first.maxObjectWidth, first.maxObjectHeight})},
            {"windows", windows}};
  }

  ExitCode draw(Terminal& terminal, const ModelCamera& camera, const std::vector<SLibDDetectionParam>& settings) const {
    const auto setting = std::find_if(settings.begin(), settings.end(),
                                      [this](const SLibDDetectionParam& param) { return param.number == number_; });
    if (camera.profile().lodDetection || setting == settings.end()) {
      return terminal.report(usage(fmt::format("the camera has no detection windows of number {}", number_),
                                   "vexactl detection CAMERA show shows what it has."));
    }
    const auto problem = draw_detection(camera, *setting, out_);
    return problem ? terminal.report(*problem) : ExitCode::kOk;
  }

  ExitCode set(Terminal& terminal, const ModelCamera& camera, const std::vector<SLibDDetectionParam>& settings) const {
    SLibDDetectionParam param = chosen(camera, settings);
    if (size_ && !value_named(kObjectSizes, *size_)) {
      return terminal.report(
          usage(fmt::format("unknown size \"{}\"", printable(*size_)), "Choose small, middle or large."));
    }
    change(param);
    const ELibDReturnCode result = camera.device().SetDetectionParam(param);
    return result == LIBD_OK ? ExitCode::kOk : terminal.report(camera.explain_change("detection", result));
  }

  // The setting as the camera reports it; a new one, with its windows off, where it reports none of that number.
  SLibDDetectionParam chosen(const ModelCamera& camera, const std::vector<SLibDDetectionParam>& settings) const {
    if (camera.profile().lodDetection && !settings.empty()) return settings.front();
    for (const SLibDDetectionParam& setting : settings) {
      if (setting.number == number_) return setting;
    }
    SLibDDetectionParam fresh;
    fresh.number = number_;
    for (SLibDDetectionWindow& window : fresh.windows) {
      window.area = {{0, 0}, {0, 0}};
      window.enabled = window.mode = 0;
      window.sensitivity = 50;
    }
    return fresh;
  }

  void change(SLibDDetectionParam& param) const {
    SLibDDetectionWindow& first = param.windows[0];
    if (sensitivity_) first.sensitivity = *sensitivity_;
    if (size_) first.minObjectWidth = value_named(kObjectSizes, *size_).value_or(0);
    SLibDDetectionWindow& window = param.windows[window_ - 1];
    if (enabled_) window.enabled = *enabled_ == "on" ? 1 : 0;
    if (mode_) window.mode = *mode_ == "detect" ? 0 : 1;
    if (area_.size() == 4) window.area = {{area_[0], area_[1]}, {area_[2], area_[3]}};
  }

  ModelOptions options_;
  std::string action_;
  std::string out_;
  int number_ = 99;
  std::optional<int> sensitivity_;
  std::optional<std::string> size_;
  std::size_t window_ = 1;
  std::vector<int> area_;
  std::optional<std::string> enabled_;
  std::optional<std::string> mode_;
};

class TamperingCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("tampering", "Switch a camera's tampering detector");
    add_model_options(*command, options_, environment);
    command->add_option("switch", switch_, "on or off")->required()->type_name("");
    command->add_option("--level", level_, "low, middle or high")->capture_default_str();
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const std::optional<bool> on = switch_named(switch_);
    if (!on) return terminal.report(no_switch("tampering", switch_));
    const auto level = value_named(kTamperLevels, level_);
    if (!level)
      return terminal.report(
          usage(fmt::format("unknown level \"{}\"", printable(level_)), "Choose low, middle or high."));
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    const ELibDReturnCode result = camera->device().SetTamperingAlarm(*on, *level);
    return result == LIBD_OK ? ExitCode::kOk : terminal.report(camera->explain_change("tampering detection", result));
  }

 private:
  ModelOptions options_;
  std::string switch_;
  std::string level_ = "middle";
};

class AudioDetectionCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("audio-detection", "Switch a camera's audio detector");
    add_model_options(*command, options_, environment);
    command->add_option("switch", switch_, "on or off")->required()->type_name("");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const std::optional<bool> on = switch_named(switch_);
    if (!on) return terminal.report(no_switch("audio-detection", switch_));
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    const ELibDReturnCode result = camera->device().SetAudioDetection(*on);
    return result == LIBD_OK ? ExitCode::kOk : terminal.report(camera->explain_change("audio detection", result));
  }

 private:
  ModelOptions options_;
  std::string switch_;
};

}  // namespace

std::unique_ptr<Command> make_detection_command() { return std::make_unique<DetectionCommand>(); }
std::unique_ptr<Command> make_tampering_command() { return std::make_unique<TamperingCommand>(); }
std::unique_ptr<Command> make_audio_detection_command() { return std::make_unique<AudioDetectionCommand>(); }

}  // namespace vexa::host
