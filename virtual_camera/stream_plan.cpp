#include "virtual_camera/stream_plan.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <string_view>
#include <vector>

#include "virtual_camera/drawn_h264.h"
#include "virtual_camera/rtp_packetiser.h"

namespace vexa::camera {
namespace {

int leading_int(std::string_view text) {
  int value = 0;
  std::from_chars(text.data(), text.data() + text.size(), value);
  return value;
}

}  // namespace

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

std::optional<StreamPlan> plan_stream(const CameraOptions& options, const SettingsStore& settings, int number) {
  if (options.clip || !options.profile) return StreamPlan{options.clip, options.frames_per_second};
  const auto stream = stream_settings(settings, number);
  if (!stream || stream->codec != "h264") return std::nullopt;
  const std::vector<std::uint8_t> drawn = draw_h264({stream->width, stream->height, stream->frame_rate});
  return StreamPlan{std::make_shared<const PacketisedClip>(Clip::from_annex_b(drawn), options.max_payload),
                    static_cast<double>(stream->frame_rate)};
}

}  // namespace vexa::camera
