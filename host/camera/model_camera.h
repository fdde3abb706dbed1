// SPDX-License-Identifier: Apache-2.0
// A camera of a known model, with the driver class that its profile names.
#ifndef HOST_CAMERA_MODEL_CAMERA_H_
#define HOST_CAMERA_MODEL_CAMERA_H_

#include <memory>
#include <optional>
#include <string>

#include "host/camera/camera_options.h"
#include "vexa/models.h"

namespace vexa::host {

// Owns the driver of one camera for the length of a command, and a second driver for video. One thread, that of the
// command; the drivers themselves may be used by any. Never shows the password: failures are worded by explain().
class ModelCamera {
 public:
  // Asks the camera for its model and makes that model's driver. A model without a profile gets the common driver.
  [[nodiscard]] static Result<ModelCamera> open(const ModelOptions& options, Terminal& terminal);

  [[nodiscard]] CLibraryDevice& device() const { return *device_; }
  [[nodiscard]] const Profile& profile() const { return profile_; }
  [[nodiscard]] const CameraAddress& address() const { return connection_.address; }
  [[nodiscard]] int timeout_ms() const { return connection_.timeout_ms; }
  [[nodiscard]] int stream() const { return stream_; }  // of the options, from 1
  // The settings of the stream that the options name, as the camera reports them.
  [[nodiscard]] Result<SLibDCameraInfo> video() const;

  // How the camera is set to record on its card.
  [[nodiscard]] Result<CardMode> card_mode() const { return live_->card_mode(); }

  // A driver that plays the stream of the options, which it has asked the camera about. This camera's own, as long as
  // it.
  [[nodiscard]] Result<LiveCamera*> live() const;

  // Makes a call that leaves the camera as it was found, `call(device)`: it reaches the camera also after an
  // interruption, and once more where one comes meanwhile.
  template <typename Call>
  ELibDReturnCode last_call(Call call) const {
    allow_last_call(*device_, connection_);
    const ELibDReturnCode result = call(*device_);
    if (result == LIBD_OK || !was_interrupted(*device_)) return result;
    allow_last_call(*device_, connection_);
    return call(*device_);
  }

  // Closes the alarm stream and ends the camera's alarm data, by a last call.
  void stop_alarms() const;

  // Puts a failure to read from the camera into words.
  [[nodiscard]] Problem explain(ELibDReturnCode result) const;
  // Puts a failure to change `what` on a reachable camera into words.
  [[nodiscard]] Problem explain_change(const std::string& what, ELibDReturnCode result) const;

 private:
  ModelCamera(OpenCamera asked, int stream)
      : live_(std::move(asked.driver)), connection_(live_->connection()), stream_(stream) {}

  [[nodiscard]] std::optional<Problem> find_profile(const std::optional<std::string>& profile,
                                                    const std::string& model);

  std::unique_ptr<LiveCamera> live_;
  CameraConnection connection_;
  int stream_;
  Profile profile_;
  std::unique_ptr<CLibraryDevice> device_;
};

// The problem of a profile that cannot be used.
[[nodiscard]] Problem wrong_profile(const ProfileError& error);

}  // namespace vexa::host

#endif  // HOST_CAMERA_MODEL_CAMERA_H_
