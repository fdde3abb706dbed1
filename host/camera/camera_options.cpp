// SPDX-License-Identifier: Apache-2.0
#include "host/camera/camera_options.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <memory>
#include <set>
#include <utility>

#include "host/access/camera_file.h"
#include "host/cgi_log/cgi_log.h"

namespace vexa::host {
namespace {

constexpr int kLongestTimeout = 600000;
constexpr int kMostStreams = 16;

constexpr char kCameraHelp[] = "the camera: HOST or HOST:PORT (HTTP port, else 80), or its name with --cameras";

Result<ChosenCamera> at_address(const std::string& text, const CameraOptions& options) {
  const Result<CameraAddress> address = parse_camera_address(text);
  if (!address) return fail(address.error());
  const Result<Credentials> credentials = load_credentials(options.credentials);
  if (!credentials) return fail(credentials.error());
  return ChosenCamera{to_string(*address), *address, *credentials};
}

Result<ChosenCamera> of_file(const CameraFile& file, const FileCamera& camera, const CameraOptions& options) {
  const Result<Credentials> credentials = file.credentials_of(camera, options.credentials, options.environment);
  if (!credentials) return fail(credentials.error());
  return ChosenCamera{camera.name, camera.address, *credentials, camera.profile, camera.tile_stream};
}

// All cameras of the file, or the one of that name.
Result<std::vector<FileCamera>> named_in(const CameraFile& file, const std::vector<std::string>& names) {
  if (names.empty()) return file.cameras();
  std::vector<FileCamera> named;
  for (const std::string& name : names) {
    Result<FileCamera> camera = file.find(name);
    if (!camera) return fail(camera.error());
    named.push_back(*std::move(camera));
  }
  return named;
}

std::optional<Problem> check_once_each(const std::vector<ChosenCamera>& cameras) {
  std::set<std::string> names;
  for (const ChosenCamera& camera : cameras) {
    if (!names.insert(camera.name).second) return usage("a camera is named twice", "Name each camera once.");
  }
  return std::nullopt;
}

void add_access_options(CLI::App& command, CameraOptions& options, const char* const* environment) {
  options.environment = environment;
  read_environment(options.credentials, environment);
  command
      .add_option("--cameras", options.cameras_file, "file of cameras, each with a name that stands for its address")
      ->type_name("FILE");
  auto* user = command.add_option("--user", options.credentials.user, "user name")->type_name("NAME");
  auto* password =
      command.add_option("--password-file", options.credentials.password_file, "file whose first line is the password")
          ->type_name("FILE");
  command.add_option("--credentials", options.credentials.credentials_file, "file whose first line is USER:PASSWORD")
      ->type_name("FILE")
      ->excludes(user)
      ->excludes(password);
  command.add_option("--timeout", options.timeout_ms, "longest wait for an answer, in milliseconds")
      ->type_name("MS")
      ->capture_default_str();
  command.add_flag("--json", options.json, "print the result as JSON");
  command.add_flag("--trace", options.trace, "show the driver's RTSP requests on standard error, without credentials");
  command
      .add_option("--cgi-log", options.cgi_log,
                  "append each request to the camera and its answer's status to this file")
      ->type_name("FILE");
}

}  // namespace

void add_camera_options(CLI::App& command, CameraOptions& options, const char* const* environment) {
  command.add_option("camera,--camera", options.address, kCameraHelp)->required()->type_name("");
  add_access_options(command, options, environment);
}

void add_options_of_cameras(CLI::App& command, CameraOptions& options, std::vector<std::string>& cameras,
                            const char* const* environment) {
  command.add_option("camera,--camera", cameras, std::string(kCameraHelp) + "; without one, all of its file")
      ->type_name("");
  add_access_options(command, options, environment);
}

void add_stream_option(CLI::App& command, int& stream) {
  command.add_option("--stream", stream, "which of the camera's video streams")->type_name("N")->capture_default_str();
}

void add_model_options(CLI::App& command, ModelOptions& options, const char* const* environment) {
  add_camera_options(command, options.camera, environment);
  command
      .add_option("--profile", options.profile,
                  "profile of the camera's model, a name or a file [the installed one of the model it reports]")
      ->type_name("PROFILE");
  add_stream_option(command, options.stream);
}

std::optional<Problem> check_stream(int stream) {
  if (stream >= 1 && stream <= kMostStreams) return std::nullopt;
  return usage(fmt::format("--stream is not a number from 1 to {}", kMostStreams), "1 is the camera's first stream.");
}

std::optional<Problem> check_camera_options(const CameraOptions& options) {
  if (options.timeout_ms < 1 || options.timeout_ms > kLongestTimeout) {
    return usage(fmt::format("--timeout is not a number from 1 to {}", kLongestTimeout),
                 "It is in milliseconds; 5000 when not given.");
  }
  return std::nullopt;
}

Result<std::vector<ChosenCamera>> choose_cameras(const CameraOptions& options, const std::vector<std::string>& names) {
  std::vector<ChosenCamera> chosen;
  const auto add = [&](Result<ChosenCamera> camera) -> std::optional<Problem> {
    if (!camera) return camera.error();
    chosen.push_back(*std::move(camera));
    return std::nullopt;
  };
  if (options.cameras_file) {
    const Result<CameraFile> file = CameraFile::read(*options.cameras_file);
    if (!file) return fail(file.error());
    const Result<std::vector<FileCamera>> named = named_in(*file, names);
    if (!named) return fail(named.error());
    for (const FileCamera& camera : *named) {
      if (auto problem = add(of_file(*file, camera, options))) return fail(*std::move(problem));
    }
  } else {
    if (names.empty()) return fail(usage("--camera is required", "Name one, or a file of them with --cameras."));
    for (const std::string& name : names) {
      if (auto problem = add(at_address(name, options))) return fail(*std::move(problem));
    }
  }
  if (auto problem = check_once_each(chosen)) return fail(*std::move(problem));
  return chosen;
}

Result<ChosenCamera> choose_camera(const CameraOptions& options) {
  if (auto problem = check_camera_options(options)) return fail(*std::move(problem));
  Result<std::vector<ChosenCamera>> chosen = choose_cameras(options, {options.address});
  if (!chosen) return fail(chosen.error());
  return std::move(chosen->front());
}

Result<CameraConnection> connection_to(const ChosenCamera& camera, const CameraOptions& options, Terminal& terminal) {
  CameraConnection connection{camera.address, camera.credentials, options.timeout_ms, options.transport,
                              options.cgi_log};
  if (connection.cgi_log) {
    if (const auto problem = check_cgi_log_target(*connection.cgi_log)) return fail(*problem);
  }
  if (options.trace) connection.trace = shown_trace(terminal, Redactor(connection.credentials));
  return connection;
}

Result<OpenCamera> open_camera(const CameraOptions& options, Terminal& terminal) {
  const Result<ChosenCamera> camera = choose_camera(options);
  if (!camera) return fail(camera.error());
  if (const auto problem = check_name(camera->address)) return fail(*problem);
  const Result<CameraConnection> connection = connection_to(*camera, options, terminal);
  if (!connection) return fail(connection.error());
  return OpenCamera{connection->address, camera->profile, std::make_unique<LiveCamera>(*connection)};
}

}  // namespace vexa::host
