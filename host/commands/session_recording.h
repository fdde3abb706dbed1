// SPDX-License-Identifier: Apache-2.0
// vexactl record by sessions: any number of cameras, through outages.
#ifndef HOST_COMMANDS_SESSION_RECORDING_H_
#define HOST_COMMANDS_SESSION_RECORDING_H_

#include <optional>
#include <string>
#include <vector>

#include "host/camera/camera_options.h"
#include "host/console/terminal.h"
#include "host/recording/camera_recording.h"

namespace vexa::host {

struct SessionRecordingOptions {
  CameraOptions camera;  // what holds for all of them
  std::vector<ChosenCamera> cameras;
  int stream = 1;
  std::string out;  // with "{camera}" for the camera's name
  std::optional<std::string> format;
  std::optional<double> segment;  // seconds
  CameraRecording::Limits limits;
  bool strict = false;
  bool backfill = false;  // what the cameras' cards recorded during outages, too
};

// The text with the name, fit for a file's, in each place of "{camera}".
[[nodiscard]] std::string with_camera_name(std::string text, const std::string& camera);

// What cannot be recorded so, before a camera is asked.
[[nodiscard]] std::optional<Problem> check(const SessionRecordingOptions& options, const Terminal& terminal);

// Of options that have been checked. Until each camera's recording has ended, or Ctrl-C.
[[nodiscard]] ExitCode record_by_sessions(const SessionRecordingOptions& options, Terminal& terminal);

}  // namespace vexa::host

#endif  // HOST_COMMANDS_SESSION_RECORDING_H_
