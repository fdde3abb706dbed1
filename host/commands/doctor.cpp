// SPDX-License-Identifier: Apache-2.0
// vexactl doctor: what works between this machine and a camera, and a report of it.
#include <fcntl.h>
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <cerrno>
#include <iterator>
#include <nlohmann/json.hpp>
#include <system_error>

#include "host/access/redactor.h"
#include "host/base/printable.h"
#include "host/base/unique_fd.h"
#include "host/camera/camera_checks.h"
#include "host/camera/camera_options.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"
#include "host/doctor/network_checks.h"

namespace vexa::host {
namespace {

using std::chrono::milliseconds;

constexpr int kRtspPort = 554;
constexpr double kLongestReception = 3600;

void append(std::vector<Check>& checks, std::vector<Check> more) {
  std::move(more.begin(), more.end(), std::back_inserter(checks));
}

std::vector<Check> network_checks(const CameraAddress& address, milliseconds limit) {
  const CameraAddress rtsp{address.host, kRtspPort};
  return {check_camera_name(address, limit),    check_route(address, limit), check_port("http port", address, limit),
          check_port("rtsp port", rtsp, limit), check_http(address, limit),  check_keep_alive(rtsp, limit)};
}

// Replaces no file.
std::optional<Problem> write_new_file(const std::string& path, const std::string& text) {
  UniqueFd file(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0644));
  int error = file.valid() ? write_all(file.get(), text.data(), text.size()) : errno;
  if (error == 0 && !file.reset()) error = errno;
  if (error == 0) return std::nullopt;
  return Problem{ExitCode::kCannotWrite,
                 fmt::format("cannot write {}: {}", path, std::generic_category().message(error)),
                 "Name a file that is not there yet, in a folder that can be written."};
}

class DoctorCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command =
        program.add_subcommand("doctor", "Check the way to a camera and the camera itself, and report what works");
    add_camera_options(*command, options_, environment);
    command->add_option("--seconds", seconds_, "length of the check of losses and jitter")
        ->type_name("N")
        ->capture_default_str();
    command
        ->add_option("--write-profile", profile_,
                     "write a profile proposed from the camera's answers; no file is replaced")
        ->type_name("FILE");
    command->footer(
        "Changes no setting but the session time-out, which every start of video sets. The report holds neither "
        "addresses, names, serial numbers nor "
        "passwords,\n"
        "and can be attached to a description of a fault. Each wait for the camera is at most --timeout.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (!(seconds_ > 0 && seconds_ <= kLongestReception)) {
      return terminal.report(
          usage(fmt::format("--seconds is not a number above 0, up to {}", kLongestReception), "10 when not given."));
    }
    const Result<ChosenCamera> chosen = choose_camera(options_);
    if (!chosen) return terminal.report(chosen.error());
    const Result<CameraConnection> connection = connection_to(*chosen, options_, terminal);
    if (!connection) return terminal.report(connection.error());
    std::vector<Check> checks = network_checks(connection->address, milliseconds(connection->timeout_ms));
    CameraChecks camera(*connection);
    check_camera(camera, checks);
    SLibDFixedSystemInfo driver;
    LiveCamera(*connection).GetFixedSystemInfo(driver);
    const Redactor redactor(connection->credentials);
    const auto report = report_of(checks, driver.version, redactor);
    const ExitCode written = write_result(terminal, options_.json ? to_text(report) : text_of_report(report));
    if (written != ExitCode::kOk) return written;
    if (const auto problem = propose_profile(camera, redactor)) return terminal.report(*problem);
    return outcome_of(checks);
  }

 private:
  // What the camera itself is asked, once user name and password are known to be right.
  void check_camera(CameraChecks& camera, std::vector<Check>& checks) const {
    checks.push_back(answers(checks) ? camera.credentials() : untried("credentials"));
    const bool refused = checks.back().verdict == Verdict::kFails;
    checks.push_back(refused || !answers(checks) ? untried("system") : camera.system());
    if (!camera.usable()) {
      for (const char* name : {"profile", "inquiries", "streams", "reception", "clock", "card"}) {
        checks.push_back(untried(name));
      }
      return;
    }
    checks.push_back(camera.profile());
    append(checks, camera.inquiries());
    append(checks, camera.streams());
    append(checks, camera.reception(seconds_));
    checks.push_back(camera.card());
  }

  // Whether anything listens where the camera is to be: without it each question costs its time-out.
  static bool answers(const std::vector<Check>& checks) {
    return std::any_of(checks.begin(), checks.end(), [](const Check& check) {
      return check.name == "http port" && check.verdict == Verdict::kWorks;
    });
  }

  static Check untried(const char* name) {
    Check check;
    check.name = name;
    return check;
  }

  std::optional<Problem> propose_profile(CameraChecks& camera, const Redactor& redactor) const {
    if (!profile_) return std::nullopt;
    const Result<std::string> proposed = camera.proposed_profile();
    if (!proposed) return proposed.error();
    if (redactor(*proposed) != *proposed) {
      return Problem{ExitCode::kUnreachable, "the camera repeats the password in its answers",
                     "No profile was written, since it would hold the password."};
    }
    return write_new_file(*profile_, *proposed);
  }

  CameraOptions options_;
  double seconds_ = 10;
  std::optional<std::string> profile_;
};

}  // namespace

std::unique_ptr<Command> make_doctor_command() { return std::make_unique<DoctorCommand>(); }

}  // namespace vexa::host
