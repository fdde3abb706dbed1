// A camera of a known model, with the driver class that its profile names.
#ifndef HOST_CAMERA_MODEL_CAMERA_H_
#define HOST_CAMERA_MODEL_CAMERA_H_

#include <memory>
#include <optional>
#include <string>

#include "host/camera/camera_options.h"
#include "vexa/models.h"

namespace vexa::host {

// Made once by each command and owned by it; used by the command's thread alone.
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

  // As vexa::host::allow_last_call.
  void allow_last_call() const { vexa::host::allow_last_call(*device_, connection_); }

  // Puts a failure to read from the camera into words.
  [[nodiscard]] Problem explain(ELibDReturnCode result) const;
  // Puts a failure to change `what` on a reachable camera into words.
  [[nodiscard]] Problem explain_change(const std::string& what, ELibDReturnCode result) const;

 private:
  ModelCamera(OpenCamera asked, int stream)
      : live_(std::move(asked.driver)), connection_(live_->connection()), stream_(stream) {}

  [[nodiscard]] std::optional<Problem> find_profile(const ModelOptions& options, const std::string& model);

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
