// SPDX-License-Identifier: Apache-2.0
// vexactl io, output and watch: a camera's pins, its outputs, and its alarms as they come.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>
#include <optional>
#include <vector>

#include "host/base/printable.h"
#include "host/camera/model_camera.h"
#include "host/camera/one_session.h"
#include "host/commands/action_group.h"
#include "host/commands/alarm_snapshots.h"
#include "host/commands/alarm_watch.h"
#include "host/commands/command.h"
#include "host/console/interrupt.h"
#include "host/console/terminal.h"
#include "host/words/alarm_words.h"
#include "host/words/setting_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr char kRow[] = "{:>2}  {:<9}  {:<3}  {}\n";

class IoCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("io", "Show a camera's inputs, outputs and detectors");
    add_model_options(*command, options_, environment);
    command->footer("Cameras do not report the state of an output; in JSON it is null.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    SLibDIoBoxInfo info;
    const ELibDReturnCode result = camera->device().GetIoBoxInfo(info);
    if (result != LIBD_OK) return terminal.report(camera->explain(result));
    if (const auto problem = read_states(*camera, info.pins)) return terminal.report(*problem);
    if (options_.camera.json) return write_result(terminal, json_of(info.pins));
    return write_table(terminal, fmt::format(kRow, "#", "kind", "on", "state"), table_of(info.pins));
  }

 private:
  // The inputs' states come first, then a part with those of the detectors.
  static std::optional<Problem> read_states(const ModelCamera& camera, std::vector<SLibDPinInfo>& pins) {
    CLibraryDevice& device = camera.device();
    follow_detection(camera);
    const ELibDReturnCode started = device.StartIoStreaming();
    if (started != LIBD_OK) return camera.explain(started);
    for (int call = 0; call < 2; ++call) {
      std::vector<SLibDPinInfo> states;
      const ELibDReturnCode result = device.GetCurrentIoStatus(states);
      if (result != LIBD_OK && result != LIBD_NO_FRAME) return camera.explain(result);
      for (const SLibDPinInfo& state : states) take_state(state, pins);
    }
    device.StopIoStreaming();
    return std::nullopt;
  }

  // Detectors have other numbers in the list than in the stream; of each kind there is one.
  static void take_state(const SLibDPinInfo& state, std::vector<SLibDPinInfo>& pins) {
    for (SLibDPinInfo& pin : pins) {
      const bool numbered = state.type == PIN_TYPE_SENSOR_INPUT;
      if (pin.type == state.type && (!numbered || pin.number == state.number)) pin.state = state.state;
    }
  }

  static std::string state_of(const SLibDPinInfo& pin) {
    if (pin.type == PIN_TYPE_ALARM_OUTPUT) return "not reported";
    return pin.state != 0 ? "active" : "inactive";
  }

  static std::string table_of(const std::vector<SLibDPinInfo>& pins) {
    std::string text;
    for (const SLibDPinInfo& pin : pins) {
      text += fmt::format(kRow, pin.number, kind_of(pin), switch_word(pin.enabled), state_of(pin));
    }
    return text;
  }

  static std::string json_of(const std::vector<SLibDPinInfo>& pins) {
    Json list = Json::array();
    for (const SLibDPinInfo& pin : pins) {
      const Json state = pin.type == PIN_TYPE_ALARM_OUTPUT ? Json(nullptr) : Json(state_of(pin));
      list.push_back({{"pin", pin.number}, {"kind", kind_of(pin)}, {"enabled", pin.enabled}, {"state", state}});
    }
    return to_text(list);
  }

  ModelOptions options_;
};

class OutputCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("output", "Switch an alarm output of a camera");
    add_model_options(*command, options_, environment);
    command->add_option("number", number_, "of the output, counted from 1")->required()->type_name("");
    command->add_option("switch", switch_, "on or off")->required()->type_name("");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const std::optional<bool> on = switch_named(switch_);
    if (!on) {
      return terminal.report(usage(fmt::format("an output is switched on or off, not \"{}\"", printable(switch_)),
                                   "See vexactl output --help."));
    }
    if (number_ < 1) return terminal.report(usage("outputs are counted from 1", "vexactl io shows them."));
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    if (const auto problem = check_output(*camera)) return terminal.report(*problem);
    SLibDPinInfo pin;
    pin.number = number_;
    pin.type = PIN_TYPE_ALARM_OUTPUT;
    pin.state = *on ? 1 : 0;
    const ELibDReturnCode result = camera->device().SetOutput(pin);
    if (result != LIBD_OK) return terminal.report(camera->explain_change("output", result));
    terminal.say(
        fmt::format("vexactl: output {} of {} is switched {}", number_, to_string(camera->address()), switch_));
    return ExitCode::kOk;
  }

 private:
  // Cameras accept any number and do nothing with one they do not have. Of a model without a profile none is known.
  [[nodiscard]] std::optional<Problem> check_output(const ModelCamera& camera) const {
    const Profile& profile = camera.profile();
    const int count = profile.ioBox.outputCount;
    if (profile.name.empty() || number_ <= count) return std::nullopt;
    if (count == 0) return model_lacks(camera, "alarm outputs");
    return usage(fmt::format("cameras of model {} have no output {}", printable(profile.model), number_),
                 count == 1 ? "They have one, 1." : fmt::format("They have outputs 1 to {}.", count));
  }

  ModelOptions options_;
  int number_ = 0;
  std::string switch_;
};

class WatchCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("watch", "Show a camera's alarms as they occur, until Ctrl-C");
    add_model_options(*command, options_, environment);
    command->add_flag("--metadata", metadata_, "show the frames of motion metadata too");
    command->add_option("--count", count_, "end after this many lines")->check(CLI::PositiveNumber);
    command
        ->add_option("--snapshot-dir", snapshot_folder_, "write a picture of each alarm that begins into this folder")
        ->type_name("DIR");
    command->add_flag("--forever", forever_, "go on through outages, and wait for a camera that is not there");
    command->footer("Each line gives the time, the pin, its kind and its new state; with --json it is a JSON object.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (forever_) return run_forever(terminal);
    if (snapshot_folder_) {
      if (const auto problem = check_snapshot_folder(*snapshot_folder_)) return terminal.report(*problem);
    }
    const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    Interrupt::finish_orderly();
    std::optional<AlarmSnapshots> snapshots;
    if (snapshot_folder_) {
      snapshots.emplace(*snapshot_folder_);
      if (const auto problem = snapshots->start(*camera)) return terminal.report(*problem);
    }
    return AlarmWatch(*camera, terminal, watch_options(), snapshots ? &*snapshots : nullptr).run();
  }

 private:
  ExitCode run_forever(Terminal& terminal) {
    if (snapshot_folder_) {
      return terminal.report(usage("--forever takes no pictures of alarms", "Leave out --snapshot-dir."));
    }
    if (const auto problem = check_stream(options_.stream)) return terminal.report(*problem);
    const std::uint32_t streams = kAlarmStream | (metadata_ ? std::uint32_t{kMetadataStream} : 0);
    const Result<SessionOptions> session = session_of(options_.camera, options_.profile, options_.stream, streams);
    if (!session) return terminal.report(session.error());
    return watch_by_session(*session, terminal, watch_options());
  }

  [[nodiscard]] AlarmWatchOptions watch_options() const {
    return {options_.camera.json ? WatchFormat::kJson : WatchFormat::kText, metadata_, count_};
  }

  ModelOptions options_;
  bool metadata_ = false;
  bool forever_ = false;
  std::optional<std::string> snapshot_folder_;
  std::uint64_t count_ = 0;  // 0: no such end
};

}  // namespace

std::unique_ptr<Command> make_io_command() { return std::make_unique<IoCommand>(); }
std::unique_ptr<Command> make_output_command() { return std::make_unique<OutputCommand>(); }
std::unique_ptr<Command> make_watch_command() { return std::make_unique<WatchCommand>(); }

}  // namespace vexa::host
