// SPDX-License-Identifier: Apache-2.0
// vexactl preset: a camera's stored positions. They are counted from 1, as on the camera and in its tours.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cerrno>
#include <iterator>
#include <nlohmann/json.hpp>
#include <system_error>

#include "host/base/printable.h"
#include "host/commands/action_group.h"
#include "host/console/terminal.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

std::optional<Problem> check_presets(const ModelCamera& camera) {
  if (camera.profile().control.presetCount > 0) return std::nullopt;
  return model_lacks(camera, "presets");
}

// An action on one preset.
class OnePresetAction : public CameraAction {
 public:
  std::optional<Problem> check() override {
    if (number_ >= 1) return std::nullopt;
    return usage("presets are counted from 1", "vexactl preset CAMERA list shows them.");
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) final {
    const int count = camera.profile().control.presetCount;
    if (number_ > count) {
      return terminal.report(
          usage(fmt::format("the camera has no preset {}", number_), fmt::format("It has presets 1 to {}.", count)));
    }
    const ELibDReturnCode result = act(camera.device(), number_ - 1);
    return result == LIBD_OK ? ExitCode::kOk : terminal.report(explain(camera, result));
  }

 protected:
  void declare_number(CLI::App& action) {
    action.add_option("number", number_, "of the preset, counted from 1")->required()->type_name("");
  }
  // `index` is the driver's, counted from 0.
  virtual ELibDReturnCode act(CLibraryDevice& device, int index) = 0;
  // Why the action failed.
  [[nodiscard]] virtual Problem explain(const ModelCamera& camera, ELibDReturnCode result) const {
    return camera.explain_change(preset(), result);
  }
  [[nodiscard]] std::string preset() const { return fmt::format("preset {}", number_); }

 private:
  int number_ = 0;
};

class SetPresetAction final : public OnePresetAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("set", "Store the present position");
    declare_number(*action);
    action->add_option("name", name_, "of the preset")->required()->type_name("");
    return action;
  }
  std::optional<Problem> check() override {
    if (name_.empty()) return usage("a preset needs a name", "For instance: vexactl preset CAMERA set 3 Gate.");
    return OnePresetAction::check();
  }

 private:
  ELibDReturnCode act(CLibraryDevice& device, int index) override {
    SLibDPresetInfo preset;
    preset.index = index;
    preset.name = name_;
    return device.SetPreset(preset);
  }

  std::string name_;
};

// Whether a failure is the camera's answer: neither an interrupt nor an error of the connection.
bool was_answered(CLibraryDevice& device) {
  if (was_interrupted(device)) return false;
  std::string text;
  device.GetLatestErrorText(text);
  constexpr int kErrors[] = {ECONNREFUSED, ECONNRESET, EPIPE, EHOSTUNREACH, ENETUNREACH, ETIMEDOUT};
  return std::none_of(std::begin(kErrors), std::end(kErrors), [&text](int error) {
    return text.find(std::generic_category().message(error)) != std::string::npos;
  });
}

class RecallPresetAction final : public OnePresetAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("recall", "Go to a stored position");
    declare_number(*action);
    return action;
  }

 private:
  ELibDReturnCode act(CLibraryDevice& device, int index) override { return device.RecallPreset(index); }
  [[nodiscard]] Problem explain(const ModelCamera& camera, ELibDReturnCode result) const override {
    if (result != LIBD_FAILED || !was_answered(camera.device())) return camera.explain_change(preset(), result);
    Problem problem = camera.explain_change(preset(), result);
    problem.text = fmt::format("the camera {} does not go to {}", to_string(camera.address()), preset());
    problem.advice =
        "A preset that was never stored cannot be recalled: vexactl preset CAMERA list shows those stored.";
    return problem;
  }
};

class ClearPresetAction final : public OnePresetAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("clear", "Clear a stored position");
    declare_number(*action);
    return action;
  }

 private:
  ELibDReturnCode act(CLibraryDevice& device, int index) override { return device.ClearPreset(index); }
};

class ListPresetsAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("list", "Show the stored positions");
    action->add_flag("--all", all_, "those without a name too");
    return action;
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    std::vector<SLibDPresetInfo> presets;
    const ELibDReturnCode result = camera.device().GetPresets(presets);
    // A camera without preset names is no failure; the driver leaves the list unnamed.
    if (result != LIBD_OK && !(result == LIBD_FAILED && !left_a_reason(camera.device()))) {
      return terminal.report(camera.explain(result));
    }
    Json list = Json::array();
    std::string table;
    for (const SLibDPresetInfo& preset : presets) {
      if (preset.name.empty() && !all_) continue;
      list.push_back({{"preset", preset.index + 1}, {"name", preset.name}});
      table += fmt::format("{:>3}  {}\n", preset.index + 1, preset.name.empty() ? "-" : printable(preset.name));
    }
    if (json()) return write_result(terminal, to_text(list));
    return write_table(terminal, "  #  name\n", table);
  }

 private:
  bool all_ = false;
};

}  // namespace

std::unique_ptr<Command> make_preset_command() {
  std::vector<std::unique_ptr<CameraAction>> actions;
  actions.push_back(std::make_unique<ListPresetsAction>());
  actions.push_back(std::make_unique<SetPresetAction>());
  actions.push_back(std::make_unique<RecallPresetAction>());
  actions.push_back(std::make_unique<ClearPresetAction>());
  constexpr ActionGroupText kText{"preset", "Show, store, recall and clear a camera's positions",
                                  "For instance:\n  vexactl preset 192.168.0.100 set 3 Gate\n"
                                  "  vexactl preset 192.168.0.100 recall 3"};
  return std::make_unique<ActionGroup>(kText, check_presets, std::move(actions));
}

}  // namespace vexa::host
