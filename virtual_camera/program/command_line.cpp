// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/program/command_line.h"

#include <CLI/CLI.hpp>
#include <chrono>
#include <cstdint>
#include <fstream>
#include <iostream>

#include "command_line/description.h"
#include "virtual_camera/program/fault_arguments.h"

namespace vexa::camera {
namespace {

constexpr int kUsageError = 2;

constexpr const char* kAbout =
    "A network camera in software: HTTP commands, RTSP, and video over RTP/UDP from a clip.\n"
    "Prints one line for each camera once all are ready, and runs until a signal or --duration.\n"
    "Example: vexa-camera --clip build/clips/hd.h264 --count 2 --loss 0.01";

void add_place(CLI::App& app, ProgramOptions& options) {
  CameraOptions& camera = options.camera;
  camera.http_port = 80;
  app.add_option("--address", camera.address, "address of the first camera")->capture_default_str();
  app.add_option("--count", options.count, "cameras, at consecutive addresses")
      ->check(CLI::Range(1, 1000))
      ->capture_default_str();
  CLI::Option* fleet =
      app.add_option(
             "--fleet", options.fleet,
             "cameras with names of their own: as this file states, or so many of the installed profiles in turn")
          ->type_name("FILE|N")
          ->excludes("--count");
  app.add_option("--cameras-file", options.cameras_file,
                 "write the file of cameras that vexactl takes, and files of credentials beside it")
      ->type_name("FILE")
      ->needs(fleet);
  app.add_option("--max-viewers", camera.max_viewers,
                 "RTSP sessions and picture streams over HTTP that a camera serves at once; more are refused")
      ->check(CLI::Range(1, 256))
      ->capture_default_str();
  app.add_option("--threads", options.threads, "threads that serve them")
      ->check(CLI::Range(1, 64))
      ->capture_default_str();
  app.add_option("--http-port", camera.http_port, "0 takes any free port")->capture_default_str();
  app.add_option("--rtsp-port", camera.rtsp_port, "0 takes any free port")->capture_default_str();
  app.add_option_function<std::uint16_t>(
         "--control-port",
         [&camera](std::uint16_t port) {
           camera.control = true;
           camera.control_port = port;
         },
         "port on 127.0.0.1 that makes things happen around the camera, or in the whole fleet; / lists what: /walk, "
         "/lens/cover, /reboot, /network/unplug, /faults/packets?loss=0.01 ...; with --fleet after /camera/NAME, and a "
         "page for browsers")
      ->option_text("PORT");
  app.add_option_function<std::uint64_t>(
         "--card", [&camera](std::uint64_t megabytes) { camera.card_bytes = megabytes << 20U; },
         "put a card of this size into the slot: the camera records on it while it is set to and its network is away "
         "(control port: /network/unplug, /network/plug)")
      ->check(CLI::Range(1, 1 << 20))
      ->option_text("MEGABYTES");
  app.add_option("--journal", options.journal_path, "write every request to this file, one JSON object a line");
  app.add_option("--duration", options.duration, "end after this many seconds")->check(CLI::NonNegativeNumber);
}

void add_credentials(CLI::App& app, CameraOptions& camera) {
  app.add_option("--user", camera.user, "user name the camera expects")->capture_default_str();
  CLI::Option* password = app.add_option("--password", camera.password, "password the camera expects [admin]");
  const auto read_file = [&camera](const std::string& path) {
    std::ifstream file(path);
    std::getline(file, camera.password);
  };
  app.add_option_function<std::string>("--password-file", read_file, "read it from this file's first line")
      ->check(CLI::ExistingFile)
      ->excludes(password);
}

void add_stream(CLI::App& app, CameraOptions& camera) {
  app.add_option("--profile", camera.profile_path,
                 "profile of the camera model, a file or an installed one's name; without --clip it streams as its "
                 "settings define");
  camera.pictures_made = PicturesMade::kOfTheScene;
  app.add_flag_callback(
      "--drawn", [&camera] { camera.pictures_made = PicturesMade::kDrawn; },
      "with --profile: draw simple pictures instead of the scene, which takes an encoder for each stream watched");
  app.add_option("--clip", camera.clip_path,
                 "file to stream over RTP: H.264 (.h264, Annex B), MPEG-4 (.m4v) or JPEG (.mjpeg)")
      ->check(CLI::ExistingFile);
  app.add_option("--images", camera.image_path, "file to stream over HTTP: JPEG (.mjpeg), .h264 or MPEG-4 (.m4v)")
      ->check(CLI::ExistingFile);
  app.add_option("--stream-piece", camera.stream_piece, "bytes of an HTTP stream that leave at a time; 0: a picture")
      ->type_name("BYTES");
  app.add_option("--sound", camera.sound_path, "sound to stream over HTTP: this name and the codec, \"NAME.g711_64\"");
  app.add_option("--user-data", camera.user_data,
                 "text in every picture over HTTP, and in key pictures over RTP, such as \"CamPos: 1/2/3\"");
  app.add_flag("--once{false}", camera.loop, "end the stream with the clip instead of starting it over");
  app.add_option("--pictures", camera.pictures, "end the stream after this many pictures");
  app.add_option("--fps", camera.frames_per_second, "pictures a second")
      ->check(CLI::PositiveNumber)
      ->capture_default_str();
  app.add_option("--speed", camera.speed, "pace: 4 sends four times faster")
      ->check(CLI::PositiveNumber)
      ->capture_default_str();
  app.add_option("--ptz-speed", camera.ptz_speed, "pace of pan, tilt, zoom and tours, on top of --speed")
      ->check(CLI::PositiveNumber)
      ->capture_default_str();
  app.add_option("--max-payload", camera.max_payload, "RTP payload bytes of a packet")
      ->check(CLI::Range(3, 65000))
      ->capture_default_str();
  app.add_option("--start-sequence", camera.start_sequence, "first sequence number")->capture_default_str();
  app.add_option("--start-timestamp", camera.start_timestamp, "first timestamp")->capture_default_str();
  app.add_option("--range-clock", camera.range_clock, "announce this clock, such as 20240131T235959.250Z");
  app.add_option_function<std::uint32_t>(
         "--session-timeout",
         [&camera](std::uint32_t seconds) {
           camera.session_timeout = std::chrono::seconds(seconds);
           camera.session_expiry = SessionExpiry::kWhenSilent;
         },
         "announce this time-out, and end sessions that stay silent longer [60, never ended]")
      ->type_name("SECONDS");
  app.add_option("--lock-after", camera.lock_after,
                 "lock the camera for 30 minutes after so many requests with wrong credentials in a row");
  app.add_option("--seed", camera.seed, "of every random fault")->capture_default_str();
}

}  // namespace

CommandLine parse_command_line(int argc, const char* const* argv) {
  CommandLine line;
  CameraOptions& camera = line.options.camera;
  camera.sent_log_limit = 0;
  camera.hash_packets = false;
  camera.journal_limit = 0;
  CLI::App app(kAbout, "vexa-camera");
  app.set_version_flag("--version", "vexa-camera " VEXA_VERSION);
  command_line::add_help_json(app);
  FaultArguments faults;
  add_place(app, line.options);
  add_credentials(app, camera);
  add_stream(app, camera);
  faults.add_to(app, camera.packet_faults);
  try {
    app.parse(argc, argv);
    faults.apply(camera);
  } catch (const CLI::ParseError& error) {
    line.exit_code = app.exit(error, std::cout, std::cerr) == 0 ? 0 : kUsageError;
  }
  return line;
}

}  // namespace vexa::camera
