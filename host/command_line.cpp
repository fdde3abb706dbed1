// SPDX-License-Identifier: Apache-2.0
#include "host/command_line.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <optional>
#include <string>
#include <vector>

#include "command_line/description.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"

namespace vexa::host {
namespace {

constexpr char kDescription[] = "vexactl: drives a network camera from the command line.";

constexpr char kFooter[] = R"(
Start here:
  vexactl info 192.168.0.100 --credentials camera.cred
  vexactl doctor 192.168.0.100 --credentials camera.cred
  vexactl record 192.168.0.100 --credentials camera.cred --seconds 10 --out live.mkv
  vexactl record --cameras cameras.json --forever --segment 600 --out {camera}.mp4
  vexactl stats --cameras cameras.json --watch
  vexactl snapshot 192.168.0.100 --credentials camera.cred --out live.jpg
  vexactl settings 192.168.0.100 --credentials camera.cred
  vexactl set 192.168.0.100 codec=H.264 size=1280x720 --credentials camera.cred
  vexactl info 192.168.0.100 --credentials camera.cred --cgi-log cgi.log
  vexactl log cgi.log
  vexactl ptz 192.168.0.100 goto -45 10 --zoom 4 --credentials camera.cred
  where the first line of camera.cred is USER:PASSWORD.
  vexactl COMMAND --help lists the options of a command.

Environment:
  VEXACTL_USER, VEXACTL_PASSWORD    used where no option gives user name or password

Exit codes:
    0  done
    1  the command line, or a file that it names, cannot be used
    2  the camera cannot be reached, does not answer, or refuses the request
    3  the camera refuses user name and password
    4  the camera sends no picture, or has stopped sending
    5  a result cannot be written
    6  with --strict: pictures of a recording were lost
  130  interrupted by Ctrl-C or a signal; what was recorded until then is kept)";

struct KnownCommand {
  std::unique_ptr<Command> command;
  CLI::App* options;
};

std::vector<std::unique_ptr<Command>> all_commands() {
  std::vector<std::unique_ptr<Command>> commands;
  commands.push_back(make_info_command());
  commands.push_back(make_record_command());
  commands.push_back(make_stats_command());
  commands.push_back(make_snapshot_command());
  commands.push_back(make_listen_command());
  commands.push_back(make_settings_command());
  commands.push_back(make_set_command());
  commands.push_back(make_codecs_command());
  commands.push_back(make_exposure_command());
  commands.push_back(make_daynight_command());
  commands.push_back(make_profile_command());
  commands.push_back(make_doctor_command());
  commands.push_back(make_serve_command());
  commands.push_back(make_ptz_command());
  commands.push_back(make_preset_command());
  commands.push_back(make_tour_command());
  commands.push_back(make_shadow_command());
  commands.push_back(make_io_command());
  commands.push_back(make_output_command());
  commands.push_back(make_watch_command());
  commands.push_back(make_detection_command());
  commands.push_back(make_tampering_command());
  commands.push_back(make_audio_detection_command());
  commands.push_back(make_edge_command());
  commands.push_back(make_log_command());
  return commands;
}

// What may be shown of an argument that is not understood: an option's name. Anything else may be a password.
std::string showable(const std::string& argument) {
  if (argument.starts_with("--")) return argument.substr(0, argument.find('='));
  return argument.starts_with('-') ? argument.substr(0, 2) : "";
}

// A word that stands where a command or an action is expected. What holds more than small letters and hyphens may be
// part of a password, and stays unsaid.
std::optional<std::string> plain_word(const std::vector<std::string>& extras) {
  constexpr std::size_t kLongest = 24;
  if (extras.empty() || extras.front().size() > kLongest) return std::nullopt;
  const std::string& word = extras.front();
  const bool plain = word.find_first_not_of("abcdefghijklmnopqrstuvwxyz-") == std::string::npos && word.front() != '-';
  return plain ? std::optional(word) : std::nullopt;
}

Problem not_understood(const std::vector<std::string>& extras, const std::string& help) {
  for (const std::string& extra : extras) {
    if (!showable(extra).empty()) return usage(fmt::format("unknown option {}", showable(extra)), help);
  }
  const auto word = plain_word(extras);
  return usage(
      word ? fmt::format("there are too many arguments, from \"{}\" on", *word) : "there are too many arguments", help);
}

Problem no_command(const std::vector<std::string>& extras) {
  constexpr char kHelp[] = "See vexactl --help for the commands.";
  const auto word = plain_word(extras);
  return usage(word ? fmt::format("there is no command \"{}\"", *word) : "the command is missing or unknown", kHelp);
}

Problem no_action(const CLI::App& command, const std::string& help) {
  const auto word = plain_word(command.remaining());
  return usage(word ? fmt::format("{} has no action \"{}\"", command.get_name(), *word)
                    : "the action is missing, or not one of the command's",
               help);
}

bool is(const CLI::ParseError& error, CLI::ExitCodes kind) { return error.get_exit_code() == static_cast<int>(kind); }

// The parser's own text, where it holds no value that was given.
std::string text_of(const CLI::ParseError& error) {
  std::string text = error.what();
  const bool names_options_only = is(error, CLI::ExitCodes::RequiredError) ||
                                  is(error, CLI::ExitCodes::ArgumentMismatch) ||
                                  is(error, CLI::ExitCodes::ExcludesError);
  if (names_options_only) return text;
  const std::string_view kConversion = "Could not convert: ";
  const std::string name = text.starts_with(kConversion)
                               ? text.substr(kConversion.size(), text.find(" = ") - kConversion.size())
                               : text.substr(0, std::min(text.find(':'), text.size()));
  const bool named = !name.empty() && name.find_first_of(" =") == std::string::npos;
  return named ? fmt::format("the value of {} cannot be used", name) : "an option's value cannot be used";
}

// "ptz CAMERA pan": the command, with its action where one was given.
std::string words_of(const CLI::App* command) {
  const auto actions = command->get_subcommands();
  if (actions.empty()) return command->get_name();
  const bool of_camera = command->get_option_no_throw("--camera") != nullptr;
  return fmt::format("{}{} {}", command->get_name(), of_camera ? " CAMERA" : "", actions.front()->get_name());
}

ExitCode on_parse_error(const CLI::ParseError& error, const CLI::App& program, Terminal& terminal) {
  if (is(error, CLI::ExitCodes::Success)) {
    const bool version = error.get_name() == "CallForVersion";
    return write_result(terminal, version ? fmt::format("{}\n", error.what()) : program.help());
  }
  const auto chosen = program.get_subcommands();
  if (chosen.empty()) {
    return terminal.report(no_command(program.remaining()));
  }
  const std::string help = fmt::format("See vexactl {} --help.", words_of(chosen.front()));
  if (std::string_view(error.what()) == "A subcommand is required") {
    return terminal.report(no_action(*chosen.front(), help));
  }
  if (is(error, CLI::ExitCodes::ExtrasError)) return terminal.report(not_understood(program.remaining(true), help));
  return terminal.report({ExitCode::kUsage, text_of(error), help});
}

}  // namespace

ExitCode run_command_line(const Invocation& invocation, Terminal& terminal) {
  CLI::App program{kDescription, "vexactl"};
  program.footer(kFooter);
  program.set_version_flag("--version", "vexactl " VEXA_VERSION);
  command_line::add_help_json(program);
  program.require_subcommand(1);
  std::vector<KnownCommand> commands;
  for (auto& command : all_commands()) {
    CLI::App* options = command->declare(program, invocation.environment);
    commands.push_back({std::move(command), options});
  }
  try {
    program.parse(invocation.argc, invocation.argv);
  } catch (const CLI::ParseError& error) {
    return on_parse_error(error, program, terminal);
  }
  for (const KnownCommand& known : commands) {
    if (known.options->parsed()) return known.command->run(terminal);
  }
  return ExitCode::kUsage;
}

}  // namespace vexa::host
