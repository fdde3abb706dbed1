// SPDX-License-Identifier: Apache-2.0
// vexactl edge: recording on a camera's card, and the recordings there. Playing them has a file of its own.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <iostream>
#include <nlohmann/json.hpp>
#include <optional>

#include "host/base/printable.h"
#include "host/commands/edge_actions.h"
#include "host/console/terminal.h"
#include "host/words/setting_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

std::optional<Problem> check_card(const ModelCamera& camera) {
  return camera.profile().edgeStorage ? std::nullopt : std::optional(model_lacks(camera, "card to record on"));
}

std::string mode_table(const CardMode& mode) {
  const SLibDEdgeStorageMode& recording = mode.recording;
  return fmt::format(
      "recording        {}\n"
      "stream           {}\n"
      "watched address  {}\n"
      "seconds before   {}\n"
      "seconds after    {}\n"
      "free space       {} KB\n",
      switch_word(recording.enabled), recording.imageNumber,
      recording.watchAddress.empty() ? "-" : printable(recording.watchAddress), recording.alarmTime1,
      recording.alarmTime2, mode.free_kilobytes);
}

Json mode_object(const CardMode& mode) {
  const SLibDEdgeStorageMode& recording = mode.recording;
  return {{"enabled", recording.enabled},         {"stream", recording.imageNumber},
          {"watch", recording.watchAddress},      {"secondsBefore", recording.alarmTime1},
          {"secondsAfter", recording.alarmTime2}, {"freeKilobytes", mode.free_kilobytes}};
}

class CardModeAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("mode", "Show or switch recording on the card");
    action->add_option("switch", switch_, "on or off; shown without")->type_name("");
    action->add_option("--watch", watch_, "address that the camera watches: it records while it cannot reach it")
        ->type_name("ADDRESS");
    action->add_option("--before", before_, "seconds to record from before, of stream 1")
        ->check(CLI::NonNegativeNumber);
    action->add_option("--after", after_, "seconds to record on when the address is back")
        ->check(CLI::NonNegativeNumber);
    return action;
  }

  std::optional<Problem> check() override {
    const bool changes = watch_ || before_ || after_;
    if (!switch_.empty() && !switch_named(switch_)) {
      return usage(fmt::format("recording is switched on or off, not \"{}\"", printable(switch_)),
                   "For instance: vexactl edge CAMERA mode on --watch 192.168.0.2.");
    }
    if (switch_ != "on" && changes) {
      return usage("--watch, --before and --after belong to mode on",
                   "vexactl edge CAMERA mode shows the present mode.");
    }
    if (watch_ && watch_->empty()) return usage("--watch names no address", "For instance: --watch 192.168.0.2.");
    return std::nullopt;
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const Result<CardMode> mode = camera.card_mode();
    if (!mode) return terminal.report(mode.error());
    if (switch_.empty()) return write_result(terminal, json() ? to_text(mode_object(*mode)) : mode_table(*mode));
    return set(camera, mode->recording, terminal);
  }

 private:
  // What is not named stays as it is.
  ExitCode set(const ModelCamera& camera, SLibDEdgeStorageMode mode, Terminal& terminal) const {
    mode.enabled = switch_ == "on";
    if (mode.enabled) mode.imageNumber = camera.stream();
    mode.watchAddress = watch_.value_or(mode.watchAddress);
    mode.alarmTime1 = before_.value_or(mode.alarmTime1);
    mode.alarmTime2 = after_.value_or(mode.alarmTime2);
    if (mode.enabled && mode.watchAddress.empty()) {
      return terminal.report(usage("the camera watches no address yet", "Name one with --watch."));
    }
    const ELibDReturnCode result = camera.device().SetEdgeStorageMode(mode);
    if (result != LIBD_NO_FRAME) return report_change(camera, terminal, "recording on the card", result);
    return terminal.report({ExitCode::kUnreachable, "the card is full or missing; recording is on",
                            "vexactl edge CAMERA delete makes room."});
  }

  std::string switch_;
  std::optional<std::string> watch_;
  std::optional<int> before_;
  std::optional<int> after_;
};

class ListRecordingsAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override { return group.add_subcommand("list", "Show the recordings"); }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const Result<StoredRecordings> records = list_recordings(camera);
    if (!records) return terminal.report(records.error());
    return write_result(terminal, json() ? json_of(*records) : table_of(*records));
  }
};

class DeleteRecordingsAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("delete", "Delete a recording, or all");
    action->add_option("name", name_, "of the recording")->type_name("");
    action->add_flag("--all", all_, "every recording");
    action->add_flag("--yes", yes_, "do not ask first");
    return action;
  }

  std::optional<Problem> check() override {
    if (all_ != name_.empty()) {
      return usage("either one recording is deleted, or all", "Give its name, or --all.");
    }
    return std::nullopt;
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    if (const auto problem = find(camera)) return terminal.report(*problem);
    if (!yes_) {
      const std::optional<std::string> answer = ask(terminal);
      if (!answer) {
        return terminal.report(usage("nothing was deleted: no answer was given", "Answer y, or give --yes."));
      }
      if (*answer != "y" && *answer != "yes") {
        terminal.say("vexactl: nothing was deleted");
        return ExitCode::kOk;
      }
    }
    SLibDEdgeStorageStreamingInfo info;
    info.streamName = name_;
    CLibraryDevice& device = camera.device();
    const ELibDReturnCode result =
        all_ ? device.DeleteAllEdgeStorageRecord() : device.DeleteEdgeStorageRecordByName(info);
    return result == LIBD_OK ? ExitCode::kOk : terminal.report(camera.explain(result));
  }

 private:
  [[nodiscard]] std::optional<Problem> find(const ModelCamera& camera) const {
    if (all_) return std::nullopt;
    const Result<SLibDEdgeStorageRecord> found = find_recording(camera, name_);
    return found ? std::nullopt : std::optional(found.error());
  }

  // Nullopt when there is no one to answer.
  [[nodiscard]] std::optional<std::string> ask(Terminal& terminal) const {
    terminal.say(all_ ? "Delete all recordings? [y/N]"
                      : fmt::format("Delete the recording {}? [y/N]", printable(name_)));
    std::string answer;
    return std::getline(std::cin, answer) ? std::optional(answer) : std::nullopt;
  }

  std::string name_;
  bool all_ = false;
  bool yes_ = false;
};

}  // namespace

Result<StoredRecordings> list_recordings(const ModelCamera& camera) {
  SLibDEdgeStorageRecordList list;
  const ELibDReturnCode result = camera.device().GetEdgeStorageRecordList(list);
  if (result != LIBD_OK) return fail(camera.explain(result));
  return std::move(list.records);
}

Result<SLibDEdgeStorageRecord> find_recording(const ModelCamera& camera, const std::string& name) {
  const Result<StoredRecordings> listed = list_recordings(camera);
  if (!listed) return fail(listed.error());
  for (const SLibDEdgeStorageRecord& record : *listed) {
    if (record.streamName == name) return record;
  }
  return fail(usage("the card has no recording of that name", "vexactl edge CAMERA list shows what it has."));
}

std::unique_ptr<Command> make_edge_command() {
  std::vector<std::unique_ptr<CameraAction>> actions;
  actions.push_back(std::make_unique<CardModeAction>());
  actions.push_back(std::make_unique<ListRecordingsAction>());
  actions.push_back(make_play_recording_action());
  actions.push_back(make_get_recording_action());
  actions.push_back(std::make_unique<DeleteRecordingsAction>());
  actions.push_back(make_backfill_action());
  constexpr ActionGroupText kText{"edge", "Record on a camera's card; list, fetch and delete the recordings",
                                  "For instance:\n  vexactl edge 192.168.0.100 mode on --watch 192.168.0.2\n"
                                  "  vexactl edge 192.168.0.100 backfill --since 2024-01-31T23:59:59 --out gap"};
  return std::make_unique<ActionGroup>(kText, check_card, std::move(actions));
}

}  // namespace vexa::host
