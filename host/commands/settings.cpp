// SPDX-License-Identifier: Apache-2.0
// vexactl settings, set and daynight: shows and changes a camera's settings.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>
#include <utility>

#include "host/base/printable.h"
#include "host/camera/camera_settings.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

class SettingsCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("settings", "Show a camera's settings");
    add_model_options(*command, options_, environment);
    command->footer("A setting that the camera does not report shows as \"-\", in JSON as null.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const Result<ModelCamera> opened = ModelCamera::open(options_, terminal);
    if (!opened) return terminal.report(opened.error());
    const Result<Json> json = read_settings(*opened);
    if (!json) return terminal.report(json.error());
    return write_result(terminal, options_.camera.json ? to_text(with_json_names(*json)) : settings_table(*json));
  }

 private:
  ModelOptions options_;
};

class SetCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("set", "Change a camera's settings");
    add_model_options(*command, options_, environment);
    command->add_option("settings", changes_, "what to change, each as KEY=VALUE")->required()->type_name("");
    command->footer("Settings:\n" + known_settings() +
                    "\nFor instance:\n  vexactl set 192.168.0.100 codec=H.264 size=1280x720 frame-rate=25 "
                    "bit-rate=4000\n\nA camera does not report its rotation: a change of the video "
                    "stream without rotation=180 resets it to 0.\n\nIt shows the resulting settings.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const Result<SettingChanges> changes = parse_changes(changes_);
    if (!changes) return terminal.report(changes.error());
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    if (const auto problem = change_settings(*camera, *changes)) {
      return terminal.report(*problem);
    }
    const Result<Json> json = read_settings(*camera);
    if (!json) return terminal.report(json.error());
    return write_result(terminal, options_.camera.json ? to_text(with_json_names(*json)) : settings_table(*json));
  }

 private:
  ModelOptions options_;
  std::vector<std::string> changes_;
};

class DayNightCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("daynight", "Show or set a camera's day/night mode");
    add_model_options(*command, options_, environment);
    command->add_option("mode", mode_, "auto, day or night; left out: show the present mode")->type_name("");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    SettingChanges changes;
    if (mode_) changes.day_night = parse_day_night(*mode_);
    if (mode_ && !changes.day_night) {
      return terminal.report(
          usage(fmt::format("unknown day/night mode \"{}\"", printable(*mode_)), "Choose auto, day or night."));
    }
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    if (const auto problem = change_settings(*camera, changes)) return terminal.report(*problem);
    return show(*camera, terminal);
  }

 private:
  ExitCode show(const ModelCamera& camera, Terminal& terminal) const {
    ELibDDayNightType mode = LIBD_DAYNIGHT_UNKNOWN;
    const ELibDReturnCode result = camera.device().GetDayNightMode(mode);
    const auto word = word_for(kDayNightWords, mode);
    if (result == LIBD_FAILED || !word) {
      return terminal.report({ExitCode::kUnreachable, "the camera reports no day/night mode",
                              "vexactl settings shows what the camera has."});
    }
    if (result != LIBD_OK) return terminal.report(camera.explain(result));
    return write_result(terminal, options_.camera.json ? to_text(Json{{"dayNight", *word}}) : *word + "\n");
  }

  ModelOptions options_;
  std::optional<std::string> mode_;
};

}  // namespace

std::unique_ptr<Command> make_settings_command() { return std::make_unique<SettingsCommand>(); }
std::unique_ptr<Command> make_set_command() { return std::make_unique<SetCommand>(); }
std::unique_ptr<Command> make_daynight_command() { return std::make_unique<DayNightCommand>(); }

}  // namespace vexa::host
