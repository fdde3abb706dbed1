// SPDX-License-Identifier: Apache-2.0
#include <algorithm>
#include <cstdint>
#include <limits>
#include <string_view>

#include "models/reading.h"

namespace vexa::models {
namespace {

template <typename Value>
struct Word {
  std::string_view word;
  Value value;
};

constexpr Word<DriverClass> kDrivers[] = {{"common", DriverClass::kCommon},
                                          {"heron", DriverClass::kHeron},
                                          {"marlin", DriverClass::kMarlin},
                                          {"simple-hd", DriverClass::kSimpleHD},
                                          {"simple-ptz", DriverClass::kSimplePTZ}};

constexpr Word<CameraTypeBits> kCameraTypes[] = {{"fixed", kFixedCamera},
                                                 {"ptz", kPtzCamera},
                                                 {"sd", kSdCamera},
                                                 {"hd", kHdCamera},
                                                 {"audio", kAudioCamera},
                                                 {"edge-storage", kEdgeStorageCamera},
                                                 {"analog-output", kAnalogOutputCamera},
                                                 {"lod-detection", kLodDetectionCamera}};

constexpr Word<ELibDDayNightType> kDayNight[] = {
    {"auto", LIBD_DAYNIGHT_AUTO}, {"day", LIBD_DAYNIGHT_DAY}, {"night", LIBD_DAYNIGHT_NIGHT}};

struct AudioWord {
  std::string_view word;
  const char* codec;
  const char* bit_rate_label;
  std::int32_t bit_rate;
  const char* frame_size_label;
  std::int32_t frame_size;
};

constexpr AudioWord kAudioWords[] = {{"g711_64", "G711", "64 Kbps", 64000, "1280 bytes", 1280},
                                     {"g726_40", "G726", "40 Kbps", 40000, "800 bytes", 800},
                                     {"g726_32", "G726", "32 Kbps", 32000, "640 bytes", 640},
                                     {"g726_24", "G726", "24 Kbps", 24000, "480 bytes", 480},
                                     {"g726_16", "G726", "16 Kbps", 16000, "320 bytes", 320}};

// The schema lets no other word through.
template <typename Value, std::size_t kWords>
Value value_of(const Word<Value> (&words)[kWords], const Part& part) {
  const auto found = std::find_if(std::begin(words), std::end(words),
                                  [word = part.text()](const Word<Value>& entry) { return entry.word == word; });
  return found == std::end(words) ? words[0].value : found->value;
}

std::vector<SLibDCommonParameterInt> read_steps(const Part& list, Complaints& complaints) {
  std::vector<SLibDCommonParameterInt> steps;
  for (const Part& part : list.items()) {
    const std::int32_t value = part["value"].number();
    complaints.demand(steps.empty() || steps.back().value < value, part["value"], "must be above the one before it");
    steps.emplace_back(part["label"].text(), value);
  }
  return steps;
}

// A mode has the steps of its own kind and no others.
void demand_steps(const Part& mode, const char* key, bool wanted, Complaints& complaints) {
  if (wanted && !mode[key]) complaints.add(mode.complain_of(key, "is missing: the mode steps through it"));
  if (!wanted && mode[key]) complaints.add(mode.complain_of(key, "is not for this mode"));
}

SLibDBrightModeInfo read_bright_mode(const Part& part, Complaints& complaints) {
  SLibDBrightModeInfo mode;
  mode.name = part["mode"].text();
  demand_steps(part, "shutter", mode.name == "Shutter Priority", complaints);
  demand_steps(part, "iris", mode.name == "Iris Priority", complaints);
  mode.shutterSpeeds = read_steps(part["shutter"], complaints);
  mode.irisPositions = read_steps(part["iris"], complaints);
  return mode;
}

// A profile promises no mode that its driver never sets.
void demand_driver_sets(const Part& exposure, DriverClass driver, Complaints& complaints) {
  const bool sets_none = driver == DriverClass::kHeron || driver == DriverClass::kSimpleHD;
  complaints.demand(!exposure || !sets_none, exposure, "is not for the drivers \"heron\" and \"simple-hd\"");
  for (const Part& part : exposure.items()) {
    const bool sets = driver != DriverClass::kMarlin || part["mode"].text() != "Iris Priority";
    complaints.demand(sets, part["mode"], "is not for the driver \"marlin\"");
  }
}

void read_image(const Part& image, Profile& profile, Complaints& complaints) {
  auto& modes = profile.control.brightModes;
  demand_driver_sets(image["exposure"], profile.driver, complaints);
  for (const Part& part : image["exposure"].items()) {
    SLibDBrightModeInfo mode = read_bright_mode(part, complaints);
    const bool first = std::none_of(modes.begin(), modes.end(),
                                    [&mode](const SLibDBrightModeInfo& other) { return other.name == mode.name; });
    complaints.demand(first, part["mode"], "occurs twice among the exposure modes");
    modes.push_back(std::move(mode));
  }
  for (const Part& part : image["dayNight"].items()) {
    SLibDDayNightModeInfo mode;
    mode.mode = value_of(kDayNight, part);
    profile.control.dayNightModes.push_back(mode);
  }
}

// Positions are angles by the span, and travel in 16 bits with a sign; the origin is the one end, half a span from the
// other.
void demand_range(const Part& axis, Complaints& complaints) {
  constexpr std::int32_t kLeast = std::numeric_limits<std::int16_t>::min();
  constexpr std::int32_t kMost = std::numeric_limits<std::int16_t>::max();
  const std::int32_t origin = axis["origin"].number();
  const std::int32_t end = origin + axis["span"].number() / 2;
  complaints.demand(!axis || axis["span"].number() != 0, axis["span"], "must not be 0: angles are computed with it");
  complaints.demand(std::min(origin, end) >= kLeast && std::max(origin, end) <= kMost, axis["origin"],
                    "must keep both ends within -32768 to 32767");
}

void read_pan_tilt(const Part& ptz, SLibDFixedPanTiltInfo& info, Complaints& complaints) {
  const Part pan = ptz["pan"];
  const Part tilt = ptz["tilt"];
  demand_range(pan, complaints);
  demand_range(tilt, complaints);
  info.panMaxSpeed = pan["maxSpeed"].number();
  info.panSpan = pan["span"].number();
  info.panAngleRange = pan["angleRange"].number();
  info.panOrigin = pan["origin"].number();
  info.horizontalWideAngle = pan["wideAngle"].number();
  info.tiltMaxSpeed = tilt["maxSpeed"].number();
  info.tiltSpan = tilt["span"].number();
  info.tiltAngleRange = tilt["angleRange"].number();
  info.tiltOrigin = tilt["origin"].number();
  info.verticalWideAngle = tilt["wideAngle"].number();
  info.tiltOffset = tilt["offset"].number();
}

// Speeds and positions of a lens: of both the greatest must not be below the least.
template <typename Lens>
void read_lens(const Part& part, Lens& lens, Complaints& complaints) {
  lens.minSpeed = part["minSpeed"].number();
  lens.maxSpeed = part["maxSpeed"].number();
  lens.minPosition = part["minPosition"].number();
  lens.maxPosition = part["maxPosition"].number();
  complaints.demand(lens.minSpeed <= lens.maxSpeed, part["maxSpeed"], "must not be below minSpeed");
  complaints.demand(lens.minPosition <= lens.maxPosition, part["maxPosition"], "must not be below minPosition");
}

void read_zoom_ratios(const Part& list, std::vector<SLibDZoomRatioInt>& ratios, Complaints& complaints) {
  for (const Part& part : list.items()) {
    SLibDZoomRatioInt step;
    step.ratio = part["ratio"].number();
    step.position = part["position"].number();
    const bool first = ratios.empty();
    complaints.demand(first || ratios.back().position < step.position, part["position"],
                      "must be above the one before it");
    complaints.demand(first || ratios.back().ratio <= step.ratio, part["ratio"], "must not be below the one before it");
    ratios.push_back(step);
  }
}

void read_ptz(const Part& ptz, Profile& profile, Complaints& complaints) {
  SLibDFixedPTZControlInfo& control = profile.control;
  profile.continuousPtz = ptz["dialect"].text() == "continuous";
  control.noMoveSpeed = ptz["noMoveSpeed"].flag();
  read_pan_tilt(ptz, control.panTilt, complaints);
  read_lens(ptz["zoom"], control.zoom, complaints);
  read_lens(ptz["focus"], control.focus, complaints);
  read_zoom_ratios(ptz["zoom"]["ratios"], profile.zoomRatios, complaints);
  control.zoomSteps = profile.zoomRatios;
  control.presetCount = ptz["presets"].number();
  control.tourCount = ptz["tours"].number();
  control.shadowTourCount = ptz["shadowTours"].number();
}

void add_audio(std::vector<SLibDAudioCodecInfo>& codecs, const AudioWord& word) {
  auto codec = std::find_if(codecs.begin(), codecs.end(),
                            [&word](const SLibDAudioCodecInfo& known) { return known.name == word.codec; });
  if (codec == codecs.end()) {
    codec = codecs.insert(codecs.end(), SLibDAudioCodecInfo());
    codec->name = word.codec;
    codec->samplingRates.emplace_back("8 kHz", 8000);
  }
  codec->bitRates.emplace_back(word.bit_rate_label, word.bit_rate);
  codec->frameSizes.emplace_back(word.frame_size_label, word.frame_size);
}

void read_audio(const Part& list, std::vector<SLibDAudioCodecInfo>& codecs) {
  for (const Part& part : list.items()) {
    for (const AudioWord& word : kAudioWords) {
      if (word.word == part.text()) add_audio(codecs, word);
    }
  }
}

void read_io(const Part& io, Profile& profile) {
  profile.hasIoBox = static_cast<bool>(io);
  SLibDFixedIoBoxInfo& box = profile.ioBox;
  box.inputCount = io["inputs"].number();
  box.outputCount = io["outputs"].number();
  box.videoDetection = static_cast<bool>(io["videoDetection"]);
  box.tamperingDetection = io["tamperingDetection"].flag();
  box.audioDetection = io["audioDetection"].flag();
  profile.motionDetection = io["videoDetection"].text() == "motion";
  profile.lodDetection = io["videoDetection"].text() == "lod";
}

// A bit of the camera's type, and the part of the profile that must bear it out.
struct Evidence {
  CameraTypeBits bit;
  bool holds;
  const char* text;
};

void demand_types_fit(const Part& types, const Profile& profile, bool has_ptz, Complaints& complaints) {
  const Evidence all[] = {
      {kPtzCamera, has_ptz, "must name \"ptz\" exactly when the profile has a part \"ptz\""},
      {kAudioCamera, profile.audio.available != 0, "must name \"audio\" exactly when the profile has a part \"audio\""},
      {kEdgeStorageCamera, profile.edgeStorage, "must name \"edge-storage\" exactly when \"edgeStorage\" is true"},
      {kAnalogOutputCamera, !profile.videoOutModes.empty(),
       "must name \"analog-output\" exactly when \"video\" has \"outputs\""},
      {kLodDetectionCamera, profile.lodDetection,
       "must name \"lod-detection\" exactly when \"io.videoDetection\" is \"lod\""},
  };
  for (const Evidence& evidence : all) {
    const bool named = (profile.cameraTypes & evidence.bit) != 0;
    complaints.demand(named == evidence.holds, types, evidence.text);
  }
}

}  // namespace

std::variant<Profile, Complaint> read_profile(const Node& root) {
  const Part part(&root, "");
  Profile profile;
  Complaints complaints;
  profile.description = part["description"].text();
  profile.model = part["model"].text();
  profile.driver = value_of(kDrivers, part["driver"]);
  for (const Part& type : part["cameraTypes"].items()) profile.cameraTypes |= value_of(kCameraTypes, type);
  read_video(part["video"], profile, complaints);
  read_image(part["image"], profile, complaints);
  read_ptz(part["ptz"], profile, complaints);
  profile.hasControl = part["ptz"] || part["image"]["exposure"] || part["image"]["dayNight"];
  read_audio(part["audio"]["inputs"], profile.audio.inputCodecs);
  read_audio(part["audio"]["outputs"], profile.audio.outputCodecs);
  profile.audio.available = part["audio"] ? 1 : 0;
  read_io(part["io"], profile);
  profile.edgeStorage = part["edgeStorage"].flag();
  demand_types_fit(part["cameraTypes"], profile, static_cast<bool>(part["ptz"]), complaints);
  if (complaints.first()) return *complaints.first();
  return profile;
}

}  // namespace vexa::models
