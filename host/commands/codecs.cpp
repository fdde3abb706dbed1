// SPDX-License-Identifier: Apache-2.0
// vexactl codecs and exposure: what a camera offers, and steps along its exposure.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>
#include <utility>

#include "host/base/printable.h"
#include "host/camera/model_camera.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"
#include "host/words/setting_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;
using Steps = std::vector<SLibDCommonParameterInt>;

Json values_of(const Steps& steps) {
  Json values = Json::array();
  for (const SLibDCommonParameterInt& step : steps) values.push_back(step.value);
  return values;
}

Json sizes_of(const std::vector<SLibDResolutionInfo>& sizes) {
  Json texts = Json::array();
  for (const SLibDResolutionInfo& size : sizes) texts.push_back(size.text);
  return texts;
}

Json to_json(const SLibDFixedCameraInfo& offer) {
  Json json = Json::array();
  for (const SLibDVideoCodecInfo& codec : offer.codecs) {
    Json entry = {
        {"codec", codec.name}, {"sizes", sizes_of(codec.resolutions)}, {"frame-rates", values_of(codec.frameRates)}};
    if (!codec.qualities.empty()) entry["qualities"] = values_of(codec.qualities);
    if (!codec.bitRates.empty()) entry["bit-rates"] = values_of(codec.bitRates);
    json.push_back(std::move(entry));
  }
  return json;
}

// "  sizes        1920x1080 1280x720"
std::string offer_table(const Json& offer) {
  std::string table;
  for (const Json& codec : offer) {
    table += codec["codec"].get<std::string>() + "\n";
    for (const auto& [key, values] : codec.items()) {
      if (key == "codec") continue;
      table += fmt::format("  {:<12}", key);
      for (const Json& value : values) table += " " + (value.is_string() ? value.get<std::string>() : value.dump());
      table += "\n";
    }
  }
  return table;
}

class CodecsCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("codecs", "List the codecs and sizes that a camera offers as it is set");
    add_model_options(*command, options_, environment);
    command->footer("Capture size, largest size and solid PTZ of the camera narrow what it offers.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    // Asking for the settings is what narrows the offer.
    const Result<SLibDCameraInfo> video = camera->video();
    if (!video) return terminal.report(video.error());
    SLibDFixedCameraInfo offer;
    const ELibDReturnCode result = camera->device().GetFixedCameraInfo(offer);
    if (result != LIBD_OK) return terminal.report(camera->explain(result));
    const Json json = to_json(offer);
    return write_result(terminal, options_.camera.json ? to_text(with_json_names(json)) : offer_table(json));
  }

 private:
  ModelOptions options_;
};

struct ExposureOptions {
  ModelOptions model;
  std::optional<std::string> mode;
  std::optional<int> level;
  std::optional<int> step;
};

std::optional<Problem> check(const ExposureOptions& options) {
  constexpr int kScale = 10000;
  if (options.level && options.step) {
    return Problem{ExitCode::kUsage, "--level and --step exclude each other", "Give one of them."};
  }
  if ((options.level || options.step) && !options.mode) {
    return Problem{ExitCode::kUsage, "--level and --step need --mode",
                   "Name the mode whose steps they go along: --mode \"Shutter Priority\" or \"Iris Priority\"."};
  }
  if (options.level && (*options.level < 0 || *options.level > kScale)) {
    return Problem{ExitCode::kUsage, fmt::format("--level is not a number from 0 to {}", kScale),
                   "0 is the list's first step, 10000 its last."};
  }
  if (options.step && (*options.step == 0 || *options.step < -kScale || *options.step > kScale)) {
    return Problem{ExitCode::kUsage, "--step is not a number below or above 0",
                   "Above 0 it is the next step of the list, below 0 the one before."};
  }
  return std::nullopt;
}

Json exposure_json(const Profile& profile) {
  Json json = Json::array();
  for (const SLibDBrightModeInfo& mode : profile.control.brightModes) {
    Json labels = Json::array();
    for (const Steps* steps : {&mode.shutterSpeeds, &mode.irisPositions}) {
      for (const SLibDCommonParameterInt& step : *steps) labels.push_back(step.label);
    }
    json.push_back({{"mode", mode.name}, {"steps", std::move(labels)}});
  }
  return json;
}

std::string exposure_table(const Json& modes) {
  std::string table;
  for (const Json& mode : modes) {
    table += mode["mode"].get<std::string>() + "\n";
    std::string steps;
    for (const Json& label : mode["steps"]) steps += (steps.empty() ? "  " : ", ") + label.get<std::string>();
    if (!steps.empty()) table += steps + "\n";
  }
  return table;
}

class ExposureCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("exposure", "Show what a camera offers for exposure, or set it");
    add_model_options(*command, options_.model, environment);
    command->add_option("--mode", options_.mode, "\"Full auto\", \"Shutter Priority\" or \"Iris Priority\"")
        ->type_name("MODE");
    command->add_option("--level", options_.level, "brightness along the mode's steps, 0 to 10000")->type_name("N");
    command->add_option("--step", options_.step, "above 0: one step brighter along the list; below 0: one step back")
        ->type_name("N");
    command->footer("It shows the modes and steps of the camera's model, none when its profile is not installed.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (const auto problem = check(options_)) return terminal.report(*problem);
    const Result<ModelCamera> camera = ModelCamera::open(options_.model, terminal);
    if (!camera) return terminal.report(camera.error());
    if (options_.mode) {
      if (const auto problem = change(*camera)) return terminal.report(*problem);
    }
    // Without a profile the driver still changes the mode; only the list is not known.
    if (!options_.mode && camera->profile().control.brightModes.empty()) {
      return terminal.report({ExitCode::kUsage, "the camera's model offers no exposure modes",
                              "Its profile decides; --profile names another."});
    }
    const Json json = exposure_json(camera->profile());
    return write_result(terminal, options_.model.camera.json ? to_text(json) : exposure_table(json));
  }

 private:
  [[nodiscard]] std::optional<Problem> change(const ModelCamera& camera) const {
    CLibraryDevice& device = camera.device();
    std::string mode = *options_.mode;
    ELibDReturnCode result = device.SetBrightMode(mode);
    if (result != LIBD_OK) return camera.explain_change("exposure", result);
    // The driver goes by the mode that the host has stored.
    SLibDPTZControlInfo control;
    device.GetPTZControlInfo(control);
    control.brightMode = mode;
    device.SetPTZControlInfo(control);
    if (options_.level) result = device.BrightAbsolute(*options_.level);
    if (options_.step) result = device.Bright(*options_.step);
    if (result == LIBD_INVALID_MODE) {
      return Problem{ExitCode::kUsage, "this exposure mode has no steps",
                     "--level and --step go with \"Shutter Priority\" and \"Iris Priority\"."};
    }
    if (result != LIBD_OK) return camera.explain_change("exposure", result);
    return std::nullopt;
  }

  ExposureOptions options_;
};

}  // namespace

std::unique_ptr<Command> make_codecs_command() { return std::make_unique<CodecsCommand>(); }
std::unique_ptr<Command> make_exposure_command() { return std::make_unique<ExposureCommand>(); }

}  // namespace vexa::host
