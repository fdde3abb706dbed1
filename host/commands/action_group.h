// SPDX-License-Identifier: Apache-2.0
// A command with actions of its own: vexactl ptz CAMERA pan, vexactl preset CAMERA list.
#ifndef HOST_COMMANDS_ACTION_GROUP_H_
#define HOST_COMMANDS_ACTION_GROUP_H_

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/camera/model_camera.h"
#include "host/commands/command.h"

namespace vexa::host {

// One action of such a command. Owned by its group; runs once, on the main thread, after the camera has been
// identified.
class CameraAction {
 public:
  CameraAction() = default;
  CameraAction(const CameraAction&) = delete;
  CameraAction& operator=(const CameraAction&) = delete;
  virtual ~CameraAction() = default;

  // Adds the action with its options; returns what was added.
  virtual CLI::App* declare(CLI::App& group) = 0;
  // Finds mistakes before the camera is asked anything.
  [[nodiscard]] virtual std::optional<Problem> check() { return std::nullopt; }
  virtual ExitCode run(const ModelCamera& camera, Terminal& terminal) = 0;

  void set_json(bool json) { json_ = json; }

 protected:
  [[nodiscard]] bool json() const { return json_; }

 private:
  bool json_ = false;
};

struct ActionGroupText {
  const char* name;
  const char* description;
  const char* footer;
};

// Checks what all actions of a group need of a camera's model.
using ModelCheck = std::optional<Problem> (*)(const ModelCamera&);

// Declares the actions, opens the camera that they share, and runs the chosen one. Owned by the command line.
class ActionGroup final : public Command {
 public:
  ActionGroup(ActionGroupText text, ModelCheck check_model, std::vector<std::unique_ptr<CameraAction>> actions)
      : text_(text), check_model_(check_model), actions_(std::move(actions)) {}

  CLI::App* declare(CLI::App& program, const char* const* environment) override;
  ExitCode run(Terminal& terminal) override;

 private:
  [[nodiscard]] CameraAction& chosen() const;

  ActionGroupText text_;
  ModelCheck check_model_;
  std::vector<std::unique_ptr<CameraAction>> actions_;
  std::vector<CLI::App*> declared_;
  ModelOptions options_;
};

// The problem of a model without `part`, or of one that no profile describes.
[[nodiscard]] Problem model_lacks(const ModelCamera& camera, const std::string& part);

// Reports that `what` could not be changed, unless `result` is LIBD_OK; returns the exit code.
ExitCode report_change(const ModelCamera& camera, Terminal& terminal, const std::string& what, ELibDReturnCode result);

}  // namespace vexa::host

#endif  // HOST_COMMANDS_ACTION_GROUP_H_
