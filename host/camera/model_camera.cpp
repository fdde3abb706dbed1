// SPDX-License-Identifier: Apache-2.0
#include "host/camera/model_camera.h"

#include <fmt/format.h>

#include <algorithm>
#include <utility>

#include "host/access/redactor.h"
#include "host/base/printable.h"

namespace vexa::host {
namespace {

Profile without_profile(const std::string& model) {
  Profile profile;
  profile.model = model;
  CResolutionFilterFacade filter;
  filter.Initialize(model);
  filter.GetFilteredResolutionList(profile.camera.codecs);
  return profile;
}

}  // namespace

Problem wrong_profile(const ProfileError& error) {
  return {ExitCode::kUsage, error.Message(),
          "See docs/model_profiles.md for what a profile holds, or vexactl profile list for those installed."};
}

Result<ModelCamera> ModelCamera::open(const ModelOptions& options, Terminal& terminal) {
  if (auto problem = check_stream(options.stream)) return fail(*std::move(problem));
  Result<OpenCamera> asked = open_camera(options.camera, terminal);
  if (!asked) return fail(asked.error());
  SLibDSystemInfo system;
  const ELibDReturnCode result = asked->driver->GetCurrentSystemInfo(system);
  if (result != LIBD_OK) return fail(asked->driver->explain(result));
  const std::optional<std::string> profile = options.profile ? options.profile : asked->profile;
  ModelCamera camera(std::move(*asked), options.stream);
  if (auto problem = camera.find_profile(profile, system.modelName)) return fail(*std::move(problem));
  camera.device_ = MakeDevice(camera.profile_);
  if (!camera.device_) return fail(usage("there is not enough memory for a driver", "Free some."));
  introduce(*camera.device_, camera.connection_);
  return camera;
}

std::optional<Problem> ModelCamera::find_profile(const std::optional<std::string>& profile, const std::string& model) {
  const auto names = ProfileNames();
  const bool installed = std::find(names.begin(), names.end(), model) != names.end();
  if (!profile && !installed) {
    profile_ = without_profile(model);
    return std::nullopt;
  }
  ProfileError error;
  if (!LoadProfile(profile.value_or(model), profile_, error)) return wrong_profile(error);
  return std::nullopt;
}

Result<SLibDCameraInfo> ModelCamera::video() const {
  SLibDCameraInfo info;
  info.streamNumber = stream_;
  const ELibDReturnCode result = device_->GetCameraInfo(info);
  if (result != LIBD_OK) return fail(explain(result));
  // The driver leaves what the camera does not report as it was: in a new driver, empty.
  if (info.codecName.empty() && info.imageWidth == 0 && info.frameRate == 0) {
    return fail(usage(fmt::format("the camera reports no video stream {}", stream_),
                      "--stream counts from 1, the camera's first."));
  }
  info.streamNumber = stream_;  // the record comes back with the driver's own
  return info;
}

Result<LiveCamera*> ModelCamera::live() const {
  const Result<LiveCamera::Identity> identity = live_->identify(stream_);
  if (!identity) return fail(identity.error());
  return live_.get();
}

void ModelCamera::stop_alarms() const {
  bool closed = false;
  last_call([&](CLibraryDevice& device) {
    if (!std::exchange(closed, true)) return device.StopIoStreaming();
    // Interrupted, the stop has closed the stream all the same, and of a closed one it sends nothing.
    allow_last_call(*live_, connection_);
    return live_->end_alarm_data();
  });
}

Problem ModelCamera::explain(ELibDReturnCode result) const { return explain_failure(*device_, result, connection_); }

Problem ModelCamera::explain_change(const std::string& what, ELibDReturnCode result) const {
  if (was_interrupted(*device_)) return interrupted();
  const std::string camera = to_string(connection_.address);
  if (result == LIBD_NOT_SUPPORTED) {
    return {ExitCode::kUsage, fmt::format("cameras of model {} have no {}", printable(profile_.model), what),
            "vexactl settings shows what the camera has."};
  }
  if (result == LIBD_INVALID_ARGUMENT) {
    return {ExitCode::kUsage, fmt::format("the value of {} cannot be used", what), "It is out of its range."};
  }
  if (result != LIBD_FAILED) return explain(result);
  std::string text;
  device_->GetLatestErrorText(text);
  const std::string why = text.empty() ? "it takes no such value" : printable(Redactor(connection_.credentials)(text));
  return {ExitCode::kUnreachable, fmt::format("the camera {} refuses to change {}: {}", camera, what, why),
          "vexactl settings shows what the camera has, vexactl codecs what each codec offers."};
}

}  // namespace vexa::host
