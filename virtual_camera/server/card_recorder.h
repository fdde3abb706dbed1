// SPDX-License-Identifier: Apache-2.0
// Records one of the camera's video streams on the card while the network is away.
#ifndef VIRTUAL_CAMERA_SERVER_CARD_RECORDER_H_
#define VIRTUAL_CAMERA_SERVER_CARD_RECORDER_H_

#include <asio/steady_timer.hpp>
#include <chrono>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/source/picture_source.h"

namespace vexa::camera {

struct CameraState;

// How hosts have set edge storage.
struct RecorderSettings {
  int image = 0;                  // the stream to record; 0: none
  std::chrono::seconds after{0};  // recorded on when the watched address is back
};

// The settings in the section "edgestorage"; no stream while it is off or watches no address.
[[nodiscard]] RecorderSettings recorder_settings(const SettingsStore& settings);

// Held by the camera's core and its timer; on the loop's thread. Writes pictures to the card, never reads any.
class CardRecorder : public std::enable_shared_from_this<CardRecorder> {
 public:
  explicit CardRecorder(std::shared_ptr<CameraState> state);

  // Whether the camera reaches the address that it watches.
  void set_reachable(bool reachable);
  // The settings may have changed.
  void update();
  // Ends the recording at once.
  void stop();

 private:
  void begin(int image);
  void take_next();
  void store(const SourcePicture& picture);

  std::shared_ptr<CameraState> state_;
  asio::steady_timer pace_;
  asio::steady_timer after_;
  bool reachable_ = true;
  std::unique_ptr<PictureSource> source_;  // null: nothing is recorded
  std::uint64_t made_ = 0;                 // recordings begun
  std::chrono::steady_clock::time_point began_;
  std::optional<std::chrono::nanoseconds> first_due_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_CARD_RECORDER_H_
