// SPDX-License-Identifier: Apache-2.0
// The options that all commands with a camera share.
#ifndef HOST_CAMERA_CAMERA_OPTIONS_H_
#define HOST_CAMERA_CAMERA_OPTIONS_H_

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "host/access/credentials.h"
#include "host/access/driver_trace.h"
#include "host/camera/live_camera.h"
#include "host/console/terminal.h"

namespace CLI {
class App;
}

namespace vexa::host {

struct CameraOptions {
  std::string address;                           // or a name in the file of cameras
  std::optional<std::string> cameras_file = {};  // --cameras
  const char* const* environment = nullptr;      // as main() received it
  CredentialSources credentials;
  int timeout_ms = 5000;
  std::optional<std::string> cgi_log = {};
  VideoTransport transport = VideoTransport::kUdp;
  bool trace = false;
  bool json = false;
};

// Adds the options. User name and password of the process `environment` are taken where no option gives them.
void add_camera_options(CLI::App& command, CameraOptions& options, const char* const* environment);
// The same for any number of cameras; which, is for choose_cameras().
void add_options_of_cameras(CLI::App& command, CameraOptions& options, std::vector<std::string>& cameras,
                            const char* const* environment);

// --stream, and what it may be: cameras number their streams from 1, the driver knows 16.
void add_stream_option(CLI::App& command, int& stream);
[[nodiscard]] std::optional<Problem> check_stream(int stream);

struct ModelOptions {
  CameraOptions camera;
  std::optional<std::string> profile = {};  // --profile; else the installed one of the model that the camera names
  int stream = 1;
};

// The same, with those that name the camera's profile and video stream.
void add_model_options(CLI::App& command, ModelOptions& options, const char* const* environment);

// A camera that the command line names, by its address or by its name in the file of cameras.
struct ChosenCamera {
  std::string name;  // in the file, else the address
  CameraAddress address;
  Credentials credentials;
  std::optional<std::string> profile = {};  // of the file
  std::optional<int> tile_stream = {};      // of the file
};

// Those named, once each; all of the file where none is named.
[[nodiscard]] Result<std::vector<ChosenCamera>> choose_cameras(const CameraOptions& options,
                                                               const std::vector<std::string>& names);
// The one that the options name, their mistakes found. Asks no name server, and no camera.
[[nodiscard]] Result<ChosenCamera> choose_camera(const CameraOptions& options);

// A mistake in the options other than the camera's own.
[[nodiscard]] std::optional<Problem> check_camera_options(const CameraOptions& options);

[[nodiscard]] Result<CameraConnection> connection_to(const ChosenCamera& camera, const CameraOptions& options,
                                                     Terminal& terminal);

// A driver that knows its camera; no camera has been contacted yet.
struct OpenCamera {
  CameraAddress address;
  std::optional<std::string> profile;  // of the file of cameras
  std::unique_ptr<LiveCamera> driver;
};

[[nodiscard]] Result<OpenCamera> open_camera(const CameraOptions& options, Terminal& terminal);

}  // namespace vexa::host

#endif  // HOST_CAMERA_CAMERA_OPTIONS_H_
