// SPDX-License-Identifier: Apache-2.0
// One command of vexactl. A family of commands has a file of its own here; command_line.cpp lists them.
#ifndef HOST_COMMANDS_COMMAND_H_
#define HOST_COMMANDS_COMMAND_H_

#include <memory>

#include "host/base/problem.h"
#include "host/console/terminal.h"

namespace CLI {
class App;
}

namespace vexa::host {

// Owned by the command line; declared once, run at most once, on the main thread. Never ends the process itself: the
// exit code is its result.
class Command {
 public:
  Command() = default;
  Command(const Command&) = delete;
  Command& operator=(const Command&) = delete;
  virtual ~Command() = default;

  // Adds the command with its options; returns what was added. `environment` as main() received it.
  virtual CLI::App* declare(CLI::App& program, const char* const* environment) = 0;
  // Runs it, after its options have been read.
  virtual ExitCode run(Terminal& terminal) = 0;
};

std::unique_ptr<Command> make_info_command();
std::unique_ptr<Command> make_record_command();
std::unique_ptr<Command> make_stats_command();
std::unique_ptr<Command> make_snapshot_command();
std::unique_ptr<Command> make_listen_command();
std::unique_ptr<Command> make_log_command();
std::unique_ptr<Command> make_settings_command();
std::unique_ptr<Command> make_set_command();
std::unique_ptr<Command> make_daynight_command();
std::unique_ptr<Command> make_codecs_command();
std::unique_ptr<Command> make_exposure_command();
std::unique_ptr<Command> make_profile_command();
std::unique_ptr<Command> make_doctor_command();
std::unique_ptr<Command> make_serve_command();
std::unique_ptr<Command> make_io_command();
std::unique_ptr<Command> make_output_command();
std::unique_ptr<Command> make_watch_command();
std::unique_ptr<Command> make_detection_command();
std::unique_ptr<Command> make_tampering_command();
std::unique_ptr<Command> make_audio_detection_command();
std::unique_ptr<Command> make_edge_command();
std::unique_ptr<Command> make_ptz_command();
std::unique_ptr<Command> make_preset_command();
std::unique_ptr<Command> make_tour_command();
std::unique_ptr<Command> make_shadow_command();

}  // namespace vexa::host

#endif  // HOST_COMMANDS_COMMAND_H_
