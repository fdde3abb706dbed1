// SPDX-License-Identifier: Apache-2.0
// vexa-camera: virtual cameras as a program.
#include <fmt/format.h>

#include <asio.hpp>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <exception>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "virtual_camera/camera_host.h"
#include "virtual_camera/fleet/fleet.h"
#include "virtual_camera/program/command_line.h"
#include "virtual_camera/program/journal_file.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr int kFailed = 1;

// Blocks until SIGINT, SIGTERM or the end of the duration.
class Ending {
 public:
  Ending() : signals_(context_, SIGINT, SIGTERM), timer_(context_) {}

  void wait(double seconds) {
    signals_.async_wait([this](asio::error_code, int) { context_.stop(); });
    if (seconds > 0) {
      timer_.expires_after(
          std::chrono::duration_cast<std::chrono::milliseconds>(std::chrono::duration<double>(seconds)));
      timer_.async_wait([this](asio::error_code) { context_.stop(); });
    }
    context_.run();
  }

 private:
  asio::io_context context_;
  asio::signal_set signals_;
  asio::steady_timer timer_;
};

void print_ready(CameraHost& host) {
  for (std::size_t i = 0; i < host.size(); ++i) {
    const VirtualCamera& camera = host.camera(i);
    fmt::print("http://{0}:{1} rtsp://{0}:{2}/media/video1\n", camera.address(), camera.http_port(),
               camera.rtsp_port());
  }
  (void)std::fflush(stdout);
}

void print_fleet(Fleet& fleet) {
  for (std::size_t i = 0; i < fleet.size(); ++i) {
    const VirtualCamera& camera = fleet.camera(i);
    fmt::print("{0} http://{1}:{2} rtsp://{1}:{3}/media/video1\n", fleet.entry(i).name, camera.address(),
               camera.http_port(), camera.rtsp_port());
  }
  if (fleet.control_port() != 0) fmt::print("control http://127.0.0.1:{}/\n", fleet.control_port());
  (void)std::fflush(stdout);
}

FleetResult read_fleet(const ProgramOptions& options) {
  CameraOptions common = options.camera;
  common.control = false;  // the port is the whole fleet's
  const auto cameras = whole_number<std::size_t>(options.fleet);
  if (!cameras) return load_fleet(options.fleet, common);
  if (*cameras < 1 || *cameras > kMostCameras) return fmt::format("a fleet has 1 to {} cameras", kMostCameras);
  return make_fleet(*cameras, common);
}

int fail(std::string_view text) {
  fmt::print(stderr, "vexa-camera: {}\n", text);
  return kFailed;
}

// The journal of the cameras of a host or a fleet, where one is asked for.
template <typename Cameras>
void keep_journal(Cameras& cameras, JournalFile& journal) {
  for (std::size_t i = 0; i < cameras.size(); ++i) {
    VirtualCamera& camera = cameras.camera(i);
    camera.journal().observe([&](const Request& request) { journal.add(camera.address(), request); });
  }
}

int run_fleet(const ProgramOptions& options, std::optional<JournalFile>& journal) {
  FleetResult read = read_fleet(options);
  if (const auto* error = std::get_if<std::string>(&read)) return fail(*error);
  Ending ending;
  Fleet fleet(std::get<std::vector<FleetCamera>>(std::move(read)), options.threads);
  if (journal) keep_journal(fleet, *journal);
  const bool control = options.camera.control;
  if (!fleet.start(control ? std::optional(options.camera.control_port) : std::nullopt)) return fail(fleet.error());
  if (!options.cameras_file.empty()) {
    const std::string failure = fleet.write_cameras_file(options.cameras_file);
    if (!failure.empty()) return fail(failure);
  }
  print_fleet(fleet);
  ending.wait(options.duration);
  return 0;
}

int run(const ProgramOptions& options) {
  std::optional<JournalFile> journal;
  if (!options.journal_path.empty()) {
    journal.emplace(options.journal_path);
    if (!journal->good()) return fail(fmt::format("cannot write {}", options.journal_path));
  }
  if (!options.fleet.empty()) return run_fleet(options, journal);
  Ending ending;
  CameraHost host(options.camera, options.count, options.threads);
  if (journal) keep_journal(host, *journal);
  if (!host.start()) return fail(host.error());
  print_ready(host);
  ending.wait(options.duration);
  return 0;
}

}  // namespace
}  // namespace vexa::camera

int main(int argc, char** argv) {
  try {
    const vexa::camera::CommandLine line = vexa::camera::parse_command_line(argc, argv);
    return line.exit_code ? *line.exit_code : vexa::camera::run(line.options);
  } catch (const std::exception& error) {
    std::fprintf(stderr, "vexa-camera: %s\n", error.what());
    return vexa::camera::kFailed;
  }
}
