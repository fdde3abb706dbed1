// SPDX-License-Identifier: Apache-2.0
// A camera's live video, picture by picture.
#ifndef HOST_CAMERA_LIVE_PICTURES_H_
#define HOST_CAMERA_LIVE_PICTURES_H_

#include <mutex>
#include <optional>
#include <string>
#include <vector>

#include "host/camera/live_camera.h"
#include "host/picture/picture_decoder.h"

namespace vexa::host {

// What it takes to decode a picture, see decode_picture().
struct PictureGroup {
  Codec codec = Codec::kJpeg;
  std::vector<FrameBytes> frames;  // from a key frame to the picture's own
};

// Keeps the pictures that are needed to decode the newest one. Owned by a command; one thread polls, any may ask for
// the newest.
class LivePictures final : private CDataSink {
 public:
  enum class Polled { kPicture, kNone, kSilent };

  // The camera's driver knows its settings already, and outlives this.
  explicit LivePictures(CLibraryDevice& camera) : camera_(camera) {}
  ~LivePictures() { camera_.StopVideoStreaming(); }
  LivePictures(const LivePictures&) = delete;
  LivePictures& operator=(const LivePictures&) = delete;

  [[nodiscard]] ELibDReturnCode start() { return camera_.StartVideoStreaming(); }
  // Takes the next picture. When none waits it first sleeps a little.
  [[nodiscard]] Polled poll();

  // Without frames until the first key frame has come.
  [[nodiscard]] PictureGroup newest() const;
  [[nodiscard]] bool has_picture() const;

 private:
  void Write(const unsigned char* data, unsigned int length) override { received_.assign(data, data + length); }
  void keep(std::int32_t frame_type);

  CLibraryDevice& camera_;
  FrameBytes received_;
  mutable std::mutex mutex_;  // of what follows
  PictureGroup group_;
  std::size_t group_bytes_ = 0;
};

// Starts the video and waits for the first key frame, half a minute at most.
[[nodiscard]] std::optional<Problem> await_key_frame(LiveCamera& camera, LivePictures& pictures);

// The problem of a camera that stopped sending pictures.
[[nodiscard]] Problem silent_camera();

}  // namespace vexa::host

#endif  // HOST_CAMERA_LIVE_PICTURES_H_
