#include "virtual_camera/source/stream_plan.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <chrono>
#include <cstdint>
#include <string_view>
#include <utility>
#include <vector>

#include "virtual_camera/codec/drawn_video.h"
#include "virtual_camera/source/clip_source.h"
#include "virtual_camera/source/rendered_video.h"

namespace vexa::camera {
namespace {

int leading_int(std::string_view text) {
  int value = 0;
  std::from_chars(text.data(), text.data() + text.size(), value);
  return value;
}

ClipSource::AtEnd at_end_of(const CameraOptions& options) {
  return options.loop ? ClipSource::AtEnd::kStartOver : ClipSource::AtEnd::kStop;
}

// RTP tells the sides of a JPEG picture in units of 8, in one byte (RFC 2435, 3.1).
bool rtp_carries(const StreamSettings& stream) {
  const auto fits = [](int side) { return side % 8 == 0 && side <= 8 * 255; };
  return codec_kind(stream.codec) != ImageKind::kJpeg || (fits(stream.width) && fits(stream.height));
}

// Null for a stream that is switched off.
std::unique_ptr<PictureSource> open_made(CameraState& state, int number, const StreamSettings& stream) {
  const auto codec = codec_kind(stream.codec);
  if (!codec) return nullptr;
  if (state.options.pictures_made == PicturesMade::kOfTheScene) {
    if (std::unique_ptr<PictureSource> seen = watch_scene(state, number, stream)) return seen;
  }
  return std::make_unique<DrawnSource>(*codec, DrawnVideo{stream.width, stream.height, stream.frame_rate});
}

}  // namespace

std::optional<ImageKind> codec_kind(std::string_view word) {
  if (word == "jpeg") return ImageKind::kJpeg;
  if (word == "mpeg4") return ImageKind::kMpeg4;
  if (word == "h264") return ImageKind::kH264;
  return std::nullopt;
}

std::optional<StreamSettings> stream_settings(const SettingsStore& settings, int number) {
  const auto value = [&](const char* name) { return settings.get("camera", fmt::format("{}{}", name, number)); };
  const auto codec = value("ImageCodec");
  if (!codec) return std::nullopt;
  StreamSettings stream;
  stream.codec = *codec;
  const std::string size = value("ImageSize").value_or("");
  stream.width = leading_int(size);
  stream.height = leading_int(std::string_view(size).substr(std::min(size.find(',') + 1, size.size())));
  stream.frame_rate = leading_int(value("FrameRate").value_or(""));
  stream.bit_rate = leading_int(value("BitRate").value_or(""));
  stream.quality = leading_int(value("Quality").value_or(""));
  return stream;
}

std::optional<StreamPlan> plan_stream(CameraState& state, int number) {
  const CameraOptions& options = state.options;
  if (options.clip) {
    auto clip = std::make_unique<ClipSource>(options.clip, options.frames_per_second, at_end_of(options));
    if (!options.user_data.empty()) clip->keep_as_they_are();  // it has them from its loading
    return StreamPlan{std::move(clip)};
  }
  if (!options.profile) return StreamPlan{};
  const auto stream = stream_settings(state.settings, number);
  if (!stream || !rtp_carries(*stream)) return std::nullopt;
  StreamPlan plan{open_made(state, number, *stream)};
  if (!plan.source) return std::nullopt;
  return plan;
}

std::unique_ptr<PictureSource> plan_images(CameraState& state, int number) {
  const CameraOptions& options = state.options;
  if (options.images) {
    return std::make_unique<ClipSource>(options.images, options.frames_per_second, at_end_of(options));
  }
  const auto stream = options.profile ? stream_settings(state.settings, number) : std::nullopt;
  return stream ? open_made(state, number, *stream) : nullptr;
}

std::string present_user_data(const CameraState& state) {
  if (!state.options.user_data.empty()) return state.options.user_data;
  return state.pose ? state.pose(std::chrono::steady_clock::now()).user_data : "";
}

}  // namespace vexa::camera
