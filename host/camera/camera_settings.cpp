// SPDX-License-Identifier: Apache-2.0
#include "host/camera/camera_settings.h"

#include <fmt/format.h>

#include <algorithm>
#include <nlohmann/json.hpp>

#include "host/base/printable.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

Json size_or_null(int width, int height) {
  return width > 0 && height > 0 ? Json(fmt::format("{}x{}", width, height)) : Json(nullptr);
}

Json number_or_null(int number) { return number > 0 ? Json(number) : Json(nullptr); }

// Asks getters and keeps the first failure that is more than a setting which the camera does not report. A failure ends
// the command, so that an earlier failure's reason is not shown.
class SettingReader {
 public:
  explicit SettingReader(CLibraryDevice& device) : device_(device) {}

  // The word for a getter's value; null when the camera does not report it.
  template <typename Value, typename Words>
  Json word(ELibDReturnCode (CLibraryDevice::*get)(Value&), const Words& words) {
    Value value{};
    if (!was_reported((device_.*get)(value))) return nullptr;
    const auto word = word_for(words, value);
    return word ? Json(*word) : Json(nullptr);
  }

  void add_infrared(Json& settings) {
    ELibIRIlluminatorMode mode = LIB_IR_OFF;
    int strength = 0;
    const bool read = was_reported(device_.GetIRIlluminator(mode, strength));
    const auto word = word_for(kInfraredWords, mode);
    settings["infrared"] = read && word ? Json(*word) : Json(nullptr);
    settings["infrared-strength"] = read ? Json(strength) : Json(nullptr);
  }

  // LIBD_OK when there was none.
  [[nodiscard]] ELibDReturnCode failure() const { return failure_; }

 private:
  bool was_reported(ELibDReturnCode result) {
    const bool unreported = result == LIBD_NOT_SUPPORTED || (result == LIBD_FAILED && !left_a_reason(device_));
    if (result != LIBD_OK && !unreported && failure_ == LIBD_OK) failure_ = result;
    return result == LIBD_OK;
  }

  CLibraryDevice& device_;
  ELibDReturnCode failure_ = LIBD_OK;
};

void add_image(SettingReader& reader, Json& settings) {
  settings["day-night"] = reader.word(&CLibraryDevice::GetDayNightMode, kDayNightWords);
  settings["noise-reduction"] = reader.word(&CLibraryDevice::GetXdnrMode, kNoiseWords);
  settings["wide-dynamic-range"] = reader.word(&CLibraryDevice::GetViewDR, kRangeWords);
  settings["visibility-enhancer"] = reader.word(&CLibraryDevice::GetVisibilityEnhancerMode, kVisibilityWords);
  reader.add_infrared(settings);
}

const SLibDVideoCodecInfo* find_offer(const SLibDFixedCameraInfo& offer, const std::string& codec) {
  const auto found = std::find_if(offer.codecs.begin(), offer.codecs.end(),
                                  [&codec](const SLibDVideoCodecInfo& info) { return info.name == codec; });
  return found == offer.codecs.end() ? nullptr : &*found;
}

// Refused here, as a camera would refuse it without a word of why.
std::optional<Problem> check_offer(const ModelCamera& camera, const SLibDCameraInfo& video) {
  const std::string advice = fmt::format("vexactl codecs {} lists what it offers.", to_string(camera.address()));
  SLibDFixedCameraInfo offer;
  if (camera.device().GetFixedCameraInfo(offer) != LIBD_OK || offer.codecs.empty()) return std::nullopt;
  const SLibDVideoCodecInfo* codec = find_offer(offer, video.codecName);
  if (codec == nullptr) {
    return Problem{ExitCode::kUsage, fmt::format("the camera does not offer {}", printable(video.codecName)), advice};
  }
  const bool offered =
      std::any_of(codec->resolutions.begin(), codec->resolutions.end(), [&video](const SLibDResolutionInfo& size) {
        return size.width == video.imageWidth && size.height == video.imageHeight;
      });
  if (offered) return std::nullopt;
  return Problem{ExitCode::kUsage,
                 fmt::format("the camera does not offer {}x{} in {} as it is set", video.imageWidth, video.imageHeight,
                             video.codecName),
                 advice};
}

// The camera reports one of the two alone, so that the other codecs' is only known when it is given.
std::optional<Problem> check_rate(const SLibDCameraInfo& video) {
  const bool jpeg = codec_named(video.codecName) == Codec::kJpeg;
  if ((jpeg ? video.quality : video.bitRate) > 0) return std::nullopt;
  return Problem{ExitCode::kUsage,
                 fmt::format("{} needs {}", printable(video.codecName), jpeg ? "quality" : "bit-rate"),
                 "The camera reports the rate of its present codec only."};
}

std::optional<Problem> change_stream(const ModelCamera& camera, const SettingChanges& changes) {
  Result<SLibDCameraInfo> video = camera.video();
  if (!video) return video.error();
  if (changes.codec) video->codecName = name_of(*changes.codec);
  if (changes.size) {
    video->imageWidth = changes.size->width;
    video->imageHeight = changes.size->height;
    video->imageSizeText = changes.size->text;
  }
  video->frameRate = changes.frame_rate.value_or(video->frameRate);
  video->bitRate = changes.bit_rate.value_or(video->bitRate);
  video->quality = changes.quality.value_or(video->quality);
  video->rotation = changes.rotation.value_or(video->rotation);
  if (auto problem = check_rate(*video)) return problem;
  if (auto problem = check_offer(camera, *video)) return problem;
  const ELibDReturnCode result = camera.device().SetCameraInfo(*video);
  if (result == LIBD_OK) return std::nullopt;
  return camera.explain_change(fmt::format("video stream {}", video->streamNumber), result);
}

ELibDReturnCode change_infrared(CLibraryDevice& device, const SettingChanges& changes) {
  ELibIRIlluminatorMode mode = LIB_IR_OFF;
  int strength = 0;
  const ELibDReturnCode read = device.GetIRIlluminator(mode, strength);
  if (read == LIBD_FAILED && !left_a_reason(device)) return LIBD_NOT_SUPPORTED;
  if (read != LIBD_OK) return read;
  return device.SetIRIlluminator(changes.infrared.value_or(mode), changes.infrared_strength.value_or(strength));
}

}  // namespace

Result<Json> read_settings(const ModelCamera& camera) {
  const Result<SLibDCameraInfo> video = camera.video();
  if (!video) return fail(video.error());
  Json settings = {{"stream", video->streamNumber},
                   {"codec", printable(video->codecName)},
                   {"size", size_or_null(video->imageWidth, video->imageHeight)},
                   {"frame-rate", number_or_null(video->frameRate)},
                   {"bit-rate", number_or_null(video->bitRate)},
                   {"quality", number_or_null(video->quality)},
                   {"video-standard", video->videoStandard == LIBD_VIDEO_NTSC ? "ntsc" : "pal"},
                   {"capture-size", size_or_null(video->captureWidth, video->captureHeight)},
                   {"max-image-size", size_or_null(video->maxImageWidth, video->maxImageHeight)},
                   {"solid-ptz", switch_word(video->solidPtz)},
                   {"unicast-port", number_or_null(video->unicastVideoPort)},
                   {"unicast-port-1", number_or_null(video->unicastVideoPort1)},
                   {"unicast-port-2", number_or_null(video->unicastVideoPort2)},
                   {"rtsp-port", number_or_null(video->rtspPort)}};
  SettingReader reader(camera.device());
  add_image(reader, settings);
  settings["video-output"] = reader.word(&CLibraryDevice::GetVideoOutMode, kOutputWords);
  if (reader.failure() != LIBD_OK) return fail(camera.explain(reader.failure()));
  return settings;
}

std::string settings_table(const Json& settings) {
  std::string table;
  for (const auto& [key, value] : settings.items()) {
    const std::string text = value.is_null() ? "-" : value.is_string() ? value.get<std::string>() : value.dump();
    table += fmt::format("{:<21}{}\n", key, text);
  }
  return table;
}

std::optional<Problem> change_settings(const ModelCamera& camera, const SettingChanges& changes) {
  if (changes.of_stream()) {
    if (auto problem = change_stream(camera, changes)) return problem;
  }
  CLibraryDevice& device = camera.device();
  std::optional<Problem> problem;
  const auto change = [&](const char* what, bool wanted, const auto& set) {
    if (!wanted || problem) return;
    const ELibDReturnCode result = set();
    if (result != LIBD_OK) problem = camera.explain_change(what, result);
  };
  change("day-night", changes.day_night.has_value(), [&] { return device.SetDayNightMode(*changes.day_night); });
  change("noise-reduction", changes.noise_reduction.has_value(),
         [&] { return device.SetXdnrMode(*changes.noise_reduction); });
  change("wide-dynamic-range", changes.dynamic_range.has_value(),
         [&] { return device.SetViewDR(*changes.dynamic_range); });
  change("visibility-enhancer", changes.visibility.has_value(),
         [&] { return device.SetVisibilityEnhancerMode(*changes.visibility); });
  change("infrared", changes.infrared || changes.infrared_strength, [&] { return change_infrared(device, changes); });
  change("back-light", changes.back_light.has_value(),
         [&] { return device.SetBackLightCompMode(*changes.back_light); });
  change("exposure", changes.exposure.has_value(), [&] {
    std::string mode = *changes.exposure;
    return device.SetBrightMode(mode);
  });
  return problem;
}

}  // namespace vexa::host
