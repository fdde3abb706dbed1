#include "virtual_camera/model/stream_settings.h"

#include <fmt/format.h>

#include <algorithm>
#include <string>
#include <string_view>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

int number_in(std::string_view text) { return leading_number(text).value_or(0); }

}  // namespace

std::optional<StreamSettings> stream_settings(const SettingsStore& settings, int number) {
  const auto value = [&](const char* name) { return settings.get("camera", fmt::format("{}{}", name, number)); };
  const auto codec = value("ImageCodec");
  if (!codec) return std::nullopt;
  StreamSettings stream;
  stream.codec = codec_of(*codec);
  const std::string size = value("ImageSize").value_or("");
  stream.width = number_in(size);
  stream.height = number_in(std::string_view(size).substr(std::min(size.find(',') + 1, size.size())));
  stream.frame_rate = number_in(value("FrameRate").value_or(""));
  stream.bit_rate = number_in(value("BitRate").value_or(""));
  stream.quality = number_in(value("Quality").value_or(""));
  return stream;
}

}  // namespace vexa::camera
