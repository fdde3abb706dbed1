// SPDX-License-Identifier: Apache-2.0
// A virtual camera at an address of its own, and vexactl to drive it.
#pragma once

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdint>
#include <filesystem>
#include <memory>
#include <string>
#include <system_error>
#include <utility>
#include <vector>

#include "tests/host/program_run.h"
#include "tests/support/own_address.h"
#include "virtual_camera/codec/clip.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa_test {

inline constexpr char kUser[] = "operator";
inline constexpr char kPassword[] = "tr0ub4dor";
inline constexpr char kBasicToken[] = "b3BlcmF0b3I6dHIwdWI0ZG9y";  // of both

inline const std::vector<std::string> kCredentials = {"VEXACTL_USER=operator", "VEXACTL_PASSWORD=tr0ub4dor"};

class WithCamera : public testing::Test {
 protected:
  void start_camera(vexa::camera::CameraOptions options = {}) {
    if (options.clip_path.empty()) options.clip_path = VEXA_CLIPS "/small.h264";
    start_as_set(std::move(options));
  }

  // A camera that streams what its settings state, where it has a profile and no clip.
  void start_as_set(vexa::camera::CameraOptions options) {
    options.address = own_loopback(1);
    options.user = kUser;
    options.password = kPassword;
    camera_ = std::make_unique<vexa::camera::VirtualCamera>(options);
    ASSERT_TRUE(camera_->start()) << camera_->error();
    place_ = options.address + ":" + std::to_string(camera_->http_port());
  }

  static vexa::camera::CameraOptions four_times_faster() {
    vexa::camera::CameraOptions options;
    options.speed = 4;
    return options;
  }

  [[nodiscard]] vexa::camera::VirtualCamera& camera() { return *camera_; }
  [[nodiscard]] const std::string& place() const { return place_; }
  [[nodiscard]] const TemporaryFolder& folder() const { return folder_; }

  static std::vector<std::string> vexactl(std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), VEXA_BINARY_DIR "/bin/vexactl");
    return arguments;
  }

  ProgramResult run(std::vector<std::string> arguments, std::vector<std::string> environment = kCredentials) {
    return ProgramRun(folder_, vexactl(std::move(arguments)), std::move(environment)).wait();
  }

  // Whether a program has written something to this file: what it opens, it may have yet to fill.
  [[nodiscard]] bool has_bytes(const std::string& name) const {
    std::error_code error;
    const std::uintmax_t size = std::filesystem::file_size(folder_ / name, error);
    return !error && size > 0;
  }

  // The first `count` pictures of a stream, as the driver delivers them.
  static std::string pictures(std::size_t count, const std::string& clip_path = VEXA_CLIPS "/small.h264") {
    const auto clip = vexa::camera::Clip::load(clip_path);
    std::string bytes;
    for (std::size_t i = 0; clip && i < count; ++i) {
      const auto picture = clip->access_units()[i % clip->access_units().size()].as_delivered();
      bytes.append(picture.begin(), picture.end());
    }
    return bytes;
  }

 private:
  std::unique_ptr<vexa::camera::VirtualCamera> camera_;
  std::string place_;
  TemporaryFolder folder_;
};

// Neither text may hold the password, plain or as it travels.
inline void expect_no_password(const ProgramResult& result) {
  for (const std::string& text : {result.out, result.err}) {
    EXPECT_EQ(text.find(kPassword), std::string::npos) << text;
    EXPECT_EQ(text.find(kBasicToken), std::string::npos) << text;
  }
}

}  // namespace vexa_test
