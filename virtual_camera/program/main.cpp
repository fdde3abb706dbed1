// SPDX-License-Identifier: Apache-2.0
// vexa-camera: virtual cameras as a program.
#include <fmt/format.h>

#include <asio.hpp>
#include <chrono>
#include <csignal>
#include <cstdio>
#include <exception>
#include <optional>

#include "virtual_camera/camera_host.h"
#include "virtual_camera/program/command_line.h"
#include "virtual_camera/program/journal_file.h"

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

int run(const ProgramOptions& options) {
  std::optional<JournalFile> journal;
  if (!options.journal_path.empty()) {
    journal.emplace(options.journal_path);
    if (!journal->good()) {
      fmt::print(stderr, "vexa-camera: cannot write {}\n", options.journal_path);
      return kFailed;
    }
  }
  Ending ending;
  CameraHost host(options.camera, options.count, options.threads);
  for (std::size_t i = 0; journal && i < host.size(); ++i) {
    VirtualCamera& camera = host.camera(i);
    camera.journal().observe([&](const Request& request) { journal->add(camera.address(), request); });
  }
  if (!host.start()) {
    fmt::print(stderr, "vexa-camera: {}\n", host.error());
    return kFailed;
  }
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
