// SPDX-License-Identifier: Apache-2.0
#include "host/camera/camera_options.h"

#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <memory>

#include "host/cgi_log/cgi_log.h"

namespace vexa::host {
namespace {

constexpr int kLongestTimeout = 600000;
constexpr int kMostStreams = 16;

}  // namespace

void add_camera_options(CLI::App& command, CameraOptions& options, const char* const* environment) {
  read_environment(options.credentials, environment);
  command.add_option("camera,--camera", options.address, "the camera: HOST or HOST:PORT (HTTP port, else 80)")
      ->required()
      ->type_name("");
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

Result<CameraConnection> connection_of(const CameraOptions& options, Terminal& terminal) {
  if (options.timeout_ms < 1 || options.timeout_ms > kLongestTimeout) {
    return fail(usage(fmt::format("--timeout is not a number from 1 to {}", kLongestTimeout),
                      "It is in milliseconds; 5000 when not given."));
  }
  const Result<CameraAddress> address = parse_camera_address(options.address);
  if (!address) return fail(address.error());
  const Result<Credentials> credentials = load_credentials(options.credentials);
  if (!credentials) return fail(credentials.error());
  CameraConnection connection{*address, *credentials, options.timeout_ms, options.transport, options.cgi_log};
  if (connection.cgi_log) {
    if (const auto problem = check_cgi_log_target(*connection.cgi_log)) return fail(*problem);
  }
  if (options.trace) connection.trace = shown_trace(terminal, Redactor(connection.credentials));
  return connection;
}

Result<OpenCamera> open_camera(const CameraOptions& options, Terminal& terminal) {
  const Result<CameraConnection> connection = connection_of(options, terminal);
  if (!connection) return fail(connection.error());
  if (const auto problem = check_name(connection->address)) return fail(*problem);
  return OpenCamera{connection->address, std::make_unique<LiveCamera>(*connection)};
}

}  // namespace vexa::host
