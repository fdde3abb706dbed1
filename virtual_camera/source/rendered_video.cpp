#include "virtual_camera/source/rendered_video.h"

#include <string>
#include <utility>
#include <variant>

#include "virtual_camera/scene/live_scene.h"
#include "virtual_camera/scene/scene.h"
#include "virtual_camera/source/live_video.h"

namespace vexa::camera {
namespace {

LiveCodec live_codec_of(ImageKind kind) {
  switch (kind) {
    case ImageKind::kJpeg:
      return LiveCodec::kJpeg;
    case ImageKind::kMpeg4:
      return LiveCodec::kMpeg4;
    case ImageKind::kH264:
      break;
  }
  return LiveCodec::kH264;
}

}  // namespace

std::unique_ptr<PictureSource> watch_scene(CameraState& state, int number, const StreamSettings& stream) {
  const auto kind = codec_kind(stream.codec);
  if (!kind) return nullptr;
  LiveEncoding encoding;
  encoding.codec = live_codec_of(*kind);
  encoding.width = stream.width;
  encoding.height = stream.height;
  encoding.frame_rate = stream.frame_rate;
  encoding.bit_rate = stream.bit_rate;
  encoding.quality = stream.quality;
  std::shared_ptr<LiveVideo> video = state.live[number].lock();
  if (!video || video->encoding() != encoding) {
    const auto paint = [&state](std::chrono::steady_clock::time_point now, I420Picture& picture) {
      render(view_of(state, {picture.width(), picture.height()}, now), moment_of(state, now), picture);
    };
    auto opened = LiveVideo::open(encoding, state.options.speed, paint);
    if (std::holds_alternative<std::string>(opened)) return nullptr;
    video = std::get<std::shared_ptr<LiveVideo>>(std::move(opened));
    state.live[number] = video;
  }
  return video->watch();
}

}  // namespace vexa::camera
