// SPDX-License-Identifier: Apache-2.0
// The command line of vexa-camera.
#ifndef VIRTUAL_CAMERA_PROGRAM_COMMAND_LINE_H_
#define VIRTUAL_CAMERA_PROGRAM_COMMAND_LINE_H_

#include <cstddef>
#include <optional>
#include <string>

#include "virtual_camera/values/options.h"

namespace vexa::camera {

// What the program does; main() owns it.
struct ProgramOptions {
  CameraOptions camera;
  std::size_t count = 1;
  std::size_t threads = 1;
  std::string fleet;         // a file or a number of cameras; empty: `count` cameras without names
  std::string cameras_file;  // written for vexactl
  std::string journal_path;
  double duration = 0;  // seconds; 0: until a signal
};

struct CommandLine {
  ProgramOptions options;
  std::optional<int> exit_code;  // the program ends at once with it: after --help, or a mistake, both already printed
};

[[nodiscard]] CommandLine parse_command_line(int argc, const char* const* argv);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PROGRAM_COMMAND_LINE_H_
