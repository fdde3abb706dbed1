// SPDX-License-Identifier: Apache-2.0
// vexa-node: the recorder daemon.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <csignal>
#include <cstdio>
#include <exception>

#include "command_line/description.h"
#include "host/console/interrupt.h"
#include "host/recording/media_container.h"
#include "node/program/segment_store.h"
#include "node/program/standalone.h"

namespace {

using vexa::host::ExitCode;
using vexa::host::Problem;

constexpr char kDescription[] = "Records cameras in segments of fragmented MP4, for as long as it runs.";
constexpr char kFooter[] = R"(Examples:
  vexa-node --standalone --cameras-file cameras.json --folder /var/lib/vexa --create --keep-hours 72 --keep-bytes 500000000000
  vexa-node check /var/lib/vexa

Environment:
  VEXACTL_USER, VEXACTL_PASSWORD    used for cameras whose file names no credentials

Exit codes:
    0  stopped by SIGTERM, SIGHUP or Ctrl-C, with every segment finished; check: all segments are whole
    1  the command line, or a file or folder that it names, cannot be used
    5  a disk refuses what cannot be done without
    6  check: a segment is not whole)";

struct Options {
  vexa::node::StandaloneOptions standalone;
  bool is_standalone = false;
  double segment = 60;
  double flush = 2;
  double keep_hours = 0;
  std::uint64_t keep_bytes = 0;
  std::string checked;
};

CLI::App* declare(CLI::App& program, Options& options) {
  program.footer(kFooter);
  program.set_version_flag("--version", "vexa-node " VEXA_VERSION);
  vexa::command_line::add_help_json(program);
  program.add_flag("--standalone", options.is_standalone, "record all cameras of a file, with no other node");
  program.add_option("--cameras-file", options.standalone.cameras_file, "file of cameras, as of vexactl");
  program.add_option("--folder", options.standalone.folder, "folder of the segments");
  program.add_flag("--create", options.standalone.create, "take a folder that holds no segments yet");
  program.add_option("--segment", options.segment, "length of a segment in seconds")
      ->check(CLI::Range(1.0, 86400.0))
      ->capture_default_str();
  program.add_option("--flush", options.flush, "seconds of video that a power cut may cost")
      ->check(CLI::Range(0.1, 3600.0))
      ->capture_default_str();
  program.add_option("--keep-hours", options.keep_hours, "remove segments that are older")
      ->check(CLI::Range(0.001, 1e6));
  program.add_option("--keep-bytes", options.keep_bytes, "remove the oldest segments when there are more bytes")
      ->check(CLI::Range(std::uint64_t{1}, std::uint64_t{1} << 60));
  CLI::App* check = program.add_subcommand("check", "Read a folder of segments and list what is not whole");
  check->add_option("folder", options.checked, "folder of the segments")->required();
  return check;
}

int report(const Problem& problem) {
  std::fputs(fmt::format("vexa-node: {}\n  {}\n", problem.text, problem.advice).c_str(), stderr);
  return static_cast<int>(problem.code);
}

int check_folder(const std::string& path) {
  vexa::node::DiskCalls calls;
  const auto store = vexa::node::SegmentStore::open(path, false, calls);
  if (!store) return report(store.error());
  std::size_t damaged = 0;
  const auto text = audit(*store, damaged);
  if (!text) return report(text.error());
  if (std::fputs(text->c_str(), stdout) < 0 || std::fflush(stdout) != 0)
    return static_cast<int>(ExitCode::kCannotWrite);
  return static_cast<int>(damaged == 0 ? ExitCode::kOk : ExitCode::kIncomplete);
}

int record(Options& options, const char* const* environment) {
  vexa::node::StandaloneOptions& standalone = options.standalone;
  if (!options.is_standalone || standalone.cameras_file.empty() || standalone.folder.empty()) {
    return report(vexa::host::usage("--standalone, --cameras-file and --folder are needed", "See vexa-node --help."));
  }
  const vexa::host::MediaContainer probe(standalone.folder, vexa::host::ContainerFormat::kMp4, 0);
  if (auto without_video = probe.check()) return report(*without_video);
  const auto microseconds = [](double seconds) {
    return std::chrono::microseconds(static_cast<std::int64_t>(seconds * 1e6));
  };
  standalone.times = {microseconds(options.segment), microseconds(options.flush)};
  if (options.keep_hours > 0) {
    standalone.retention.age = std::chrono::seconds(static_cast<std::int64_t>(options.keep_hours * 3600));
  }
  if (options.keep_bytes > 0) {
    standalone.retention.high_bytes = options.keep_bytes;
    standalone.retention.low_bytes = options.keep_bytes - options.keep_bytes / 20;
  }
  if (!vexa::host::Interrupt::install() || std::signal(SIGPIPE, SIG_IGN) == SIG_ERR) {
    return report(vexa::host::usage("signals cannot be taken", "See the limits of the system."));
  }
  if (auto failed = run_standalone(standalone, environment)) return report(*failed);
  return 0;
}

int run(int argc, char** argv, const char* const* environment) {
  CLI::App program{kDescription, "vexa-node"};
  Options options;
  CLI::App* check = declare(program, options);
  try {
    program.parse(argc, argv);
  } catch (const CLI::ParseError& error) {
    if (error.get_exit_code() == 0) return program.exit(error);
    return report(vexa::host::usage(error.what(), "See vexa-node --help."));
  }
  return check->parsed() ? check_folder(options.checked) : record(options, environment);
}

}  // namespace

int main(int argc, char** argv, char** environment) {
  try {
    return run(argc, argv, environment);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "vexa-node: %s\n", error.what());
    return static_cast<int>(ExitCode::kUsage);
  }
}
