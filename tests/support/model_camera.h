// SPDX-License-Identifier: Apache-2.0
// A camera of a model and the driver made for it, used through the host's interface alone.
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <utility>

#include "tests/support/own_address.h"
#include "tests/support/temporary_folder.h"
#include "vexa/models.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {

/// For fixtures to derive from. Empty until start_model(); the driver ends before its camera.
class ModelCamera {
 protected:
  /// Starts a camera of the model's profile, with the rest of `options`, and connects a driver to it.
  void start_model(const std::string& model, vexa::camera::CameraOptions options, int stream_transport = 1) {
    options.address = own_loopback(9);
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
    vexa::ProfileError error;
    ASSERT_TRUE(vexa::LoadProfile(options.profile_path, profile_, error)) << error.Message();
    camera_ = std::make_unique<vexa::camera::VirtualCamera>(options);
    ASSERT_TRUE(camera_->start()) << camera_->error();
    device_ = vexa::MakeDevice(profile_);
    device_->SetCGILogPath((folder_ / "cgi.log").c_str());
    SLibDConnectionInfo connection;
    connection.streamTransport = stream_transport;
    connection.host = options.address;
    connection.port = camera_->http_port();
    connection.timeout = 20000;
    connection.userName = options.user;
    connection.password = options.password;
    device_->SetCurrentConnectionInfo(connection);
  }

  TemporaryFolder folder_;
  vexa::Profile profile_;
  std::unique_ptr<vexa::camera::VirtualCamera> camera_;
  std::unique_ptr<CLibraryDevice> device_;
};

}  // namespace vexa_test
