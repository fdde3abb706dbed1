// SPDX-License-Identifier: Apache-2.0
#include "models/reading.h"

#include <algorithm>

namespace vexa::models {
namespace {

constexpr char kJpeg[] = "JPEG";
constexpr const char* kCaptureSizes = "captureSizes";
constexpr const char* kMaxImageSizes = "maxImageSizes";

using Steps = std::vector<SLibDCommonParameterInt>;

struct StepTexts {
  const char* before;
  const char* after;
};

Steps labelled(const std::vector<std::int32_t>& numbers, const StepTexts& texts) {
  Steps steps;
  for (const std::int32_t number : numbers)
    steps.emplace_back(texts.before + std::to_string(number) + texts.after, number);
  return steps;
}

constexpr StepTexts kRate = {"", "fps"};
constexpr StepTexts kQuality = {"Level ", ""};
constexpr StepTexts kBitRate = {"", "kbit/s"};

// "Level 5" or "2000kbit/s": JPEG has the one, other codecs the other.
void demand_right_rate(const Part& part, bool jpeg, const char* quality, const char* bit_rate, Complaints& complaints) {
  const char* wanted = jpeg ? quality : bit_rate;
  const char* wrong = jpeg ? bit_rate : quality;
  if (!part[wanted]) complaints.add(part.complain_of(wanted, jpeg ? "is missing: JPEG needs it" : "is missing"));
  if (part[wrong]) complaints.add(part.complain_of(wrong, jpeg ? "is not for JPEG" : "is for JPEG only"));
}

SLibDVideoCodecInfo read_codec(const Part& part, Complaints& complaints) {
  SLibDVideoCodecInfo codec;
  codec.name = part["name"].text();
  demand_right_rate(part, codec.name == kJpeg, "qualities", "bitRates", complaints);
  for (const Part& size : part["sizes"].items()) codec.resolutions.push_back(read_size(size, complaints));
  codec.frameRates = labelled(read_ascending(part["frameRates"], complaints), kRate);
  codec.qualities = labelled(read_ascending(part["qualities"], complaints), kQuality);
  codec.bitRates = labelled(read_ascending(part["bitRates"], complaints), kBitRate);
  return codec;
}

const SLibDVideoCodecInfo* find_codec(const std::vector<SLibDVideoCodecInfo>& codecs, const std::string& name) {
  const auto found = std::find_if(codecs.begin(), codecs.end(),
                                  [&name](const SLibDVideoCodecInfo& codec) { return codec.name == name; });
  return found == codecs.end() ? nullptr : &*found;
}

std::int32_t codec_type(const std::string& name) {
  constexpr std::int32_t kMpeg4 = 1;
  constexpr std::int32_t kH264 = 2;
  if (name == "H.264") return kH264;
  return name == "MPEG4" ? kMpeg4 : 0;
}

// The label of a setting, which must be one of those that the codec offers.
std::string label_of(const Part& setting, const Steps& offered, Complaints& complaints) {
  const auto found = std::find_if(offered.begin(), offered.end(), [&setting](const SLibDCommonParameterInt& step) {
    return step.value == setting.number();
  });
  if (found != offered.end()) return found->label;
  complaints.add(setting.complain("is not one of those that the codec offers"));
  return {};
}

SLibDCameraInfo read_stream(const Part& part, const std::vector<SLibDVideoCodecInfo>& codecs, Complaints& complaints) {
  SLibDCameraInfo info;
  info.codecName = part["codec"].text();
  info.codecType = codec_type(info.codecName);
  const SLibDVideoCodecInfo* codec = find_codec(codecs, info.codecName);
  complaints.demand(codec != nullptr, part["codec"], "is not one of the camera's codecs");
  if (codec == nullptr) return info;
  const SLibDResolutionInfo size = read_size(part["size"], complaints);
  const bool offered = std::any_of(codec->resolutions.begin(), codec->resolutions.end(),
                                   [&size](const SLibDResolutionInfo& other) { return other.text == size.text; });
  complaints.demand(offered, part["size"], "is not one of those that the codec offers");
  info.imageSizeText = size.text;
  info.imageWidth = size.width;
  info.imageHeight = size.height;
  info.frameRate = part["frameRate"].number();
  info.frameRateText = label_of(part["frameRate"], codec->frameRates, complaints);
  const bool jpeg = info.codecName == kJpeg;
  demand_right_rate(part, jpeg, "quality", "bitRate", complaints);
  info.quality = part["quality"].number();
  info.bitRate = part["bitRate"].number();
  if (jpeg) info.qualityText = label_of(part["quality"], codec->qualities, complaints);
  if (!jpeg) info.bitRateText = label_of(part["bitRate"], codec->bitRates, complaints);
  return info;
}

void read_outputs(const Part& outputs, Profile& profile, Complaints& complaints) {
  for (const Part& output : outputs.items()) {
    if (output.text() == "ip") profile.videoOutModes.push_back(LIB_VIDEO_OUT_IP);
    if (output.text() == "pal") profile.videoOutModes.push_back(LIB_VIDEO_OUT_PAL);
    if (output.text() == "ntsc") profile.videoOutModes.push_back(LIB_VIDEO_OUT_NTSC);
  }
  const bool keeps_output = profile.driver == DriverClass::kSimpleHD || profile.driver == DriverClass::kSimplePTZ;
  complaints.demand(!outputs || keeps_output, outputs, "is for the drivers \"simple-hd\" and \"simple-ptz\" only");
}

bool is_wide(const SLibDResolutionInfo& size) { return size.width * 5 >= size.height * 8; }

// The camera takes no size that its capture cannot give or that is above its largest, so it leaves the factory with
// none. Wide pictures, from 8:5 on, are cut out of a wide capture only.
void demand_factory_sizes(const Part& video, Complaints& complaints) {
  for (const Part& part : video["streams"].items()) {
    const SLibDResolutionInfo size = read_size(part["size"], complaints);
    const auto fits_first_of = [&](const char* list) {
      const std::vector<Part> limits = video[list].items();
      if (limits.empty()) return true;
      const SLibDResolutionInfo limit = read_size(limits.front(), complaints);
      const bool shaped = list != kCaptureSizes || is_wide(size) == is_wide(limit);
      return shaped && size.width <= limit.width && size.height <= limit.height;
    };
    complaints.demand(fits_first_of(kCaptureSizes), part["size"], "cannot be cut out of the first of captureSizes");
    complaints.demand(fits_first_of(kMaxImageSizes), part["size"], "is above the first of maxImageSizes");
  }
}

}  // namespace

void read_video(const Part& video, Profile& profile, Complaints& complaints) {
  SLibDFixedCameraInfo& camera = profile.camera;
  for (const Part& part : video["codecs"].items()) {
    SLibDVideoCodecInfo codec = read_codec(part, complaints);
    complaints.demand(find_codec(camera.codecs, codec.name) == nullptr, part["name"], "occurs twice among the codecs");
    camera.codecs.push_back(std::move(codec));
  }
  for (const Part& part : video["streams"].items()) {
    profile.streams.push_back(read_stream(part, camera.codecs, complaints));
    profile.streams.back().streamNumber = static_cast<std::int32_t>(profile.streams.size());
  }
  for (const char* list : {kCaptureSizes, kMaxImageSizes}) {
    for (const Part& size : video[list].items()) (void)read_size(size, complaints);
  }
  demand_factory_sizes(video, complaints);
  if (video["solidPtz"]) (void)read_size(video["solidPtz"], complaints);
  camera.streamCount1 = static_cast<std::int32_t>(profile.streams.size());
  camera.streamCount2 = camera.streamCount1;
  camera.electronicFlip = video["electronicFlip"].flag() ? 1 : 0;
  read_outputs(video["outputs"], profile, complaints);
}

}  // namespace vexa::models
