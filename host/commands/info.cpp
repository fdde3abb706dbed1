// SPDX-License-Identifier: Apache-2.0
// vexactl info: a camera's identity and video settings.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include "host/base/codec.h"
#include "host/base/printable.h"
#include "host/camera/camera_options.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

struct CameraFacts {
  CameraAddress address;
  LiveCamera::Identity camera;
  SLibDFixedSystemInfo driver;
};

constexpr int kStream = 1;

std::string video_text(const SLibDCameraInfo& video) {
  std::string text =
      fmt::format("{} {}x{}, {} fps", video.codecName, video.imageWidth, video.imageHeight, video.frameRate);
  if (codec_named(video.codecName) == Codec::kJpeg) return text + fmt::format(", quality {}", video.quality);
  return text + fmt::format(", {} kbit/s", video.bitRate);
}

std::string to_table(const CameraFacts& facts) {
  const auto row = [](std::string_view name, std::string_view value) {
    return fmt::format("{:<18}{}\n", name, printable(value));
  };
  const SLibDSystemInfo& system = facts.camera.system;
  return row("Camera", to_string(facts.address)) + row("Maker", system.maker) + row("Model", system.modelName) +
         row("Software version", system.softwareVersion) + row("Serial number", system.serialNumber) +
         row("MAC address", system.macAddress) + row("Video stream 1", video_text(facts.camera.video)) +
         row("Driver version", facts.driver.version);
}

Json to_json(const CameraFacts& facts) {
  const SLibDSystemInfo& system = facts.camera.system;
  const SLibDCameraInfo& video = facts.camera.video;
  return {{"camera", to_string(facts.address)},
          {"maker", system.maker},
          {"modelName", system.modelName},
          {"softwareVersion", system.softwareVersion},
          {"serialNumber", system.serialNumber},
          {"macAddress", system.macAddress},
          {"video",
           {{"stream", kStream},
            {"codec", video.codecName},
            {"width", video.imageWidth},
            {"height", video.imageHeight},
            {"framesPerSecond", video.frameRate},
            {"kilobitsPerSecond", video.bitRate},
            {"quality", video.quality}}},
          {"driverVersion", facts.driver.version}};
}

class InfoCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("info", "Show a camera's identity and video settings");
    add_camera_options(*command, options_, environment);
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    Result<OpenCamera> camera = open_camera(options_, terminal);
    if (!camera) return terminal.report(camera.error());
    const Result<LiveCamera::Identity> identity = camera->driver->identify(kStream);
    if (!identity) return terminal.report(identity.error());
    CameraFacts facts{camera->address, *identity, {}};
    camera->driver->GetFixedSystemInfo(facts.driver);
    return write_result(terminal, options_.json ? to_text(to_json(facts)) : to_table(facts));
  }

 private:
  CameraOptions options_;
};

}  // namespace

std::unique_ptr<Command> make_info_command() { return std::make_unique<InfoCommand>(); }

}  // namespace vexa::host
