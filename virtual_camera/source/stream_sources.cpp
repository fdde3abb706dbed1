// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/stream_sources.h"

#include <chrono>
#include <utility>
#include <variant>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/scene/scene.h"
#include "virtual_camera/source/clip_source.h"
#include "virtual_camera/source/drawn_source.h"
#include "virtual_camera/source/live_video.h"

namespace vexa::camera {
namespace {

ClipSource::AtEnd at_end_of(const CameraOptions& options) {
  return options.loop ? ClipSource::AtEnd::kStartOver : ClipSource::AtEnd::kStop;
}

// RTP gives the sides of a JPEG picture in units of 8, in one byte (RFC 2435, 3.1).
bool rtp_carries(const StreamSettings& stream) {
  const auto fits = [](int side) { return side % 8 == 0 && side <= 8 * 255; };
  return stream.codec != Codec::kJpeg || (fits(stream.width) && fits(stream.height));
}

}  // namespace

StreamSources::StreamSources(const CameraOptions& options, const SettingsStore& settings, const LiveScene& scene)
    : options_(options), settings_(settings), scene_(scene) {}

// All who watch a stream share one encoder; those who began before the stream was set otherwise keep theirs. Null where
// this build has no encoder for it.
std::unique_ptr<PictureSource> StreamSources::watch_scene(int number, Codec codec, const StreamSettings& stream) {
  LiveEncoding encoding;
  encoding.codec = codec;
  encoding.width = stream.width;
  encoding.height = stream.height;
  encoding.frame_rate = stream.frame_rate;
  encoding.bit_rate = stream.bit_rate;
  encoding.quality = stream.quality;
  std::shared_ptr<LiveVideo> video = live_[number].lock();
  if (!video || video->encoding() != encoding) {
    const auto paint = [&scene = scene_](std::chrono::steady_clock::time_point now, I420Picture& picture) {
      render(scene.view({picture.width(), picture.height()}, now), scene.moment(now), picture);
    };
    auto opened = LiveVideo::open(encoding, options_.speed, paint);
    if (std::holds_alternative<std::string>(opened)) return nullptr;
    video = std::get<std::shared_ptr<LiveVideo>>(std::move(opened));
    live_[number] = video;
  }
  return video->watch();
}

// Null for a stream that is switched off.
std::unique_ptr<PictureSource> StreamSources::open_made(int number, const StreamSettings& stream) {
  if (!stream.codec) return nullptr;
  if (options_.pictures_made == PicturesMade::kOfTheScene) {
    if (std::unique_ptr<PictureSource> seen = watch_scene(number, *stream.codec, stream)) return seen;
  }
  return std::make_unique<DrawnSource>(*stream.codec, DrawnVideo{stream.width, stream.height, stream.frame_rate});
}

std::optional<StreamPlan> StreamSources::plan(int number) {
  if (options_.clip) {
    auto clip = std::make_unique<ClipSource>(options_.clip, options_.frames_per_second, at_end_of(options_));
    if (!options_.user_data.empty()) clip->keep_as_they_are();  // it has them from its loading
    return StreamPlan{std::move(clip)};
  }
  if (!options_.profile) return StreamPlan{};
  const auto stream = stream_settings(settings_, number);
  if (!stream || !rtp_carries(*stream)) return std::nullopt;
  StreamPlan plan{open_made(number, *stream)};
  if (!plan.source) return std::nullopt;
  return plan;
}

std::unique_ptr<PictureSource> StreamSources::open_images(int number) {
  if (options_.images) {
    return std::make_unique<ClipSource>(options_.images, options_.frames_per_second, at_end_of(options_));
  }
  const auto stream = options_.profile ? stream_settings(settings_, number) : std::nullopt;
  return stream ? open_made(number, *stream) : nullptr;
}

std::string StreamSources::present_user_data() const {
  if (!options_.user_data.empty()) return options_.user_data;
  const std::optional<CameraPose> pose = scene_.pose(std::chrono::steady_clock::now());
  return pose ? pose->user_data : "";
}

}  // namespace vexa::camera
