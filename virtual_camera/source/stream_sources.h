// SPDX-License-Identifier: Apache-2.0
// Where the pictures of each video stream come from under the camera's present settings.
#ifndef VIRTUAL_CAMERA_SOURCE_STREAM_SOURCES_H_
#define VIRTUAL_CAMERA_SOURCE_STREAM_SOURCES_H_

#include <map>
#include <memory>
#include <optional>
#include <string>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/scene/live_scene.h"
#include "virtual_camera/source/picture_source.h"
#include "virtual_camera/values/options.h"

namespace vexa::camera {

class LiveVideo;

struct StreamPlan {
  std::unique_ptr<PictureSource> source;  // null: the session opens but carries no picture
};

// One for each camera; it outlives the sources that it opens. On the loop's thread, but for present_user_data().
class StreamSources {
 public:
  // All that it is given outlives it. The options' clips may be loaded until the first stream is opened.
  StreamSources(const CameraOptions& options, const SettingsStore& settings, const LiveScene& scene);
  StreamSources(const StreamSources&) = delete;
  StreamSources& operator=(const StreamSources&) = delete;

  // What an RTSP session on stream `number` sends: the clip that the options name, or, of a camera with a profile and
  // no clip, pictures made as the stream is set, drawn or of the scene. nullopt for a stream that such a camera lacks,
  // has switched off, or has set to what RTP cannot carry.
  [[nodiscard]] std::optional<StreamPlan> plan(int number);
  // What "/imageN" sends: the images that the options name, or, of a camera with a profile and no images, pictures made
  // as stream `number` is set. Null where there is no such stream.
  [[nodiscard]] std::unique_ptr<PictureSource> open_images(int number);
  // The user data of a picture that leaves at this moment; empty: none. Any thread.
  [[nodiscard]] std::string present_user_data() const;

 private:
  [[nodiscard]] std::unique_ptr<PictureSource> open_made(int number, const StreamSettings& stream);
  [[nodiscard]] std::unique_ptr<PictureSource> watch_scene(int number, Codec codec, const StreamSettings& stream);

  const CameraOptions& options_;
  const SettingsStore& settings_;
  const LiveScene& scene_;
  std::map<int, std::weak_ptr<LiveVideo>> live_;  // by stream, while somebody watches it
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_STREAM_SOURCES_H_
