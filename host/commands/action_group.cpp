// SPDX-License-Identifier: Apache-2.0
#include "host/commands/action_group.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>

#include "host/base/printable.h"

namespace vexa::host {

CLI::App* ActionGroup::declare(CLI::App& program, const char* const* environment) {
  CLI::App* command = program.add_subcommand(text_.name, text_.description);
  add_model_options(*command, options_, environment);
  command->require_subcommand(1);
  command->footer(text_.footer);
  // The camera's options may follow the action too.
  for (const auto& action : actions_) declared_.push_back(action->declare(*command)->fallthrough());
  return command;
}

ExitCode ActionGroup::run(Terminal& terminal) {
  CameraAction& action = chosen();
  action.set_json(options_.camera.json);
  if (const auto problem = action.check()) return terminal.report(*problem);
  const Result<ModelCamera> camera = ModelCamera::open(options_, terminal);
  if (!camera) return terminal.report(camera.error());
  if (const auto problem = check_model_(*camera)) return terminal.report(*problem);
  return action.run(*camera, terminal);
}

CameraAction& ActionGroup::chosen() const {
  std::size_t place = 0;
  while (place + 1 < declared_.size() && !declared_[place]->parsed()) ++place;
  return *actions_[place];
}

Problem model_lacks(const ModelCamera& camera, const std::string& part) {
  const Profile& profile = camera.profile();
  if (profile.name.empty()) {
    return usage(fmt::format("there is no profile for cameras of model {}", printable(profile.model)),
                 "Name one with --profile; vexactl profile list shows those installed.");
  }
  return usage(fmt::format("cameras of model {} have no {}", printable(profile.model), part),
               "vexactl profile show lists what a model has.");
}

ExitCode report_change(const ModelCamera& camera, Terminal& terminal, const std::string& what, ELibDReturnCode result) {
  return result == LIBD_OK ? ExitCode::kOk : terminal.report(camera.explain_change(what, result));
}

}  // namespace vexa::host
