// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/audio_text.h"

#include "runtime/base/text.h"

namespace vexa {
namespace {

constexpr std::size_t kWordRoom = 512;
constexpr int kBitsPerKilobit = 1000;

constexpr struct {
  std::string_view value;
  const char* codec;
  const char* bit_rate_label;
  std::int32_t bit_rate;
  const char* frame_size_label;
  std::int32_t frame_size;  // 160 ms of sound
} kAudioCodecs[] = {{"g711_64", "G711", "64 Kbps", 64000, "1280 bytes", 1280},
                    {"g726_40", "G726", "40 Kbps", 40000, "800 bytes", 800},
                    {"g726_32", "G726", "32 Kbps", 32000, "640 bytes", 640},
                    {"g726_24", "G726", "24 Kbps", 24000, "480 bytes", 480},
                    {"g726_16", "G726", "16 Kbps", 16000, "320 bytes", 320}};

}  // namespace

void take_audio_codec(std::string_view value, SLibDAudioInfo& info) {
  for (const auto& row : kAudioCodecs) {
    if (row.value != value) continue;
    info.codec = row.codec;
    info.bitRateLabel = row.bit_rate_label;
    info.bitRate = row.bit_rate;
    info.frameSizeLabel = row.frame_size_label;
    info.frameSize = row.frame_size;
  }
}

std::string audio_codec_word(const SLibDAudioInfo& info) {
  const bool g726 = info.codec == "G726";
  // Kept: any other codec asks for G.711, whatever its bit rate; cameras take none but these.
  return format_within(kWordRoom, "%s_%d", g726 ? "g726" : "g711", g726 ? info.bitRate / kBitsPerKilobit : 64).text;
}

std::int32_t audio_codec_type(std::string_view codec) {
  constexpr std::int32_t kG711 = 10;
  constexpr std::int32_t kG726 = 20;
  if (codec == "G711") return kG711;
  return codec == "G726" ? kG726 : -1;
}

}  // namespace vexa
