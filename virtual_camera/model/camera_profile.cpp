#include "virtual_camera/model/camera_profile.h"

#include <fmt/format.h>

#include <algorithm>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <utility>

#include "virtual_camera/model/lined_json.h"
#include "virtual_camera/model/profile_place.h"
#include "virtual_camera/model/profile_ptz.h"
#include "virtual_camera/model/profile_video.h"

namespace vexa::camera {
namespace {

constexpr std::size_t kLargestFile = 1 << 20;
constexpr std::size_t kMostSteps = 64;

std::string exposure_word(const ProfilePlace& place) {
  const std::string name = place.one_of({"Full auto", "Shutter Priority", "Iris Priority"});
  if (name == "Full auto") return "full";
  return name == "Iris Priority" ? "iris" : "shutter";
}

std::vector<int> steps_of(const ProfilePlace& list) {
  std::vector<int> values;
  for (const ProfilePlace& item : list.items(kMostSteps)) {
    item.with_only({"label", "value"});
    (void)item.required("label").text(32);
    const ProfilePlace place = item.required("value");
    const int value = place.number(0, 10000);
    if (!values.empty() && value <= values.back()) place.refuse("must be above the one before it");
    values.push_back(value);
  }
  return values;
}

// The steps that a mode goes through; other modes have none.
void read_exposure_steps(const ProfilePlace& place, const char* key, bool wanted, std::vector<int>& steps) {
  if (!wanted) return place.forbid(key, "is not for this mode");
  steps = steps_of(place.required(key));
}

void read_exposure(const ProfilePlace& list, std::string_view driver, CameraProfile& profile) {
  if (list && (driver == "heron" || driver == "simple-hd")) {
    list.refuse("is not for the drivers \"heron\" and \"simple-hd\"");
  }
  for (const ProfilePlace& place : list.items(3)) {
    place.with_only({"mode", "shutter", "iris"});
    const ProfilePlace mode = place.required("mode");
    const std::string word = exposure_word(mode);
    if (word == "iris" && driver == "marlin") mode.refuse("is not for the driver \"marlin\"");
    read_exposure_steps(place, "shutter", word == "shutter", profile.shutter_steps);
    read_exposure_steps(place, "iris", word == "iris", profile.iris_steps);
    const bool first = std::find(profile.exposure.begin(), profile.exposure.end(), word) == profile.exposure.end();
    if (!first) mode.refuse("occurs twice among the exposure modes");
    profile.exposure.push_back(word);
  }
}

void read_image(const ProfilePlace& image, std::string_view driver, CameraProfile& profile) {
  image.with_only({"dayNight", "backLight", "noiseReduction", "wideDynamicRange", "visibilityEnhancer",
                   "infraredStrength", "exposure"});
  profile.day_night = image.optional("dayNight").words({"auto", "day", "night"});
  profile.back_light = image.optional("backLight").flag();
  profile.noise_reduction = image.optional("noiseReduction").flag();
  profile.wide_dynamic_range = image.optional("wideDynamicRange").flag();
  profile.visibility_enhancer = image.optional("visibilityEnhancer").flag();
  profile.infrared_strength = image.optional("infraredStrength").number(1, 100);
  read_exposure(image.optional("exposure"), driver, profile);
}

void read_audio(const ProfilePlace& audio, CameraProfile& profile) {
  if (!audio) return;
  audio.with_only({"inputs", "outputs"});
  const auto codecs = {std::string_view("g711_64"), std::string_view("g726_40"), std::string_view("g726_32"),
                       std::string_view("g726_24"), std::string_view("g726_16")};
  profile.audio_inputs = audio.required("inputs").words(codecs);
  (void)audio.optional("outputs").words(codecs);
}

void read_io(const ProfilePlace& io, CameraProfile& profile) {
  if (!io) return;
  io.with_only({"inputs", "outputs", "videoDetection", "tamperingDetection", "audioDetection"});
  profile.io = true;
  profile.alarm_inputs = io.required("inputs").number(0, 16);
  profile.alarm_outputs = io.required("outputs").number(0, 16);
  profile.video_detection = io.optional("videoDetection").one_of({"motion", "object", "lod"});
  profile.tampering_detection = io.optional("tamperingDetection").flag();
  profile.audio_detection = io.optional("audioDetection").flag();
}

// What the types say of the camera, the other parts must bear out.
void check_types(const ProfilePlace& types, const CameraProfile& profile) {
  const auto named =
      types.words({"fixed", "ptz", "sd", "hd", "audio", "edge-storage", "analog-output", "lod-detection"});
  const struct {
    const char* word;
    bool holds;
    const char* where;
  } all[] = {{"ptz", profile.ptz.has_value(), "the profile has a part \"ptz\""},
             {"audio", !profile.audio_inputs.empty(), "the profile has a part \"audio\""},
             {"edge-storage", profile.edge_storage, "\"edgeStorage\" is true"},
             {"analog-output", !profile.outputs.empty(), "\"video\" has \"outputs\""},
             {"lod-detection", profile.video_detection == "lod", "\"io.videoDetection\" is \"lod\""}};
  for (const auto& type : all) {
    const bool is_named = std::find(named.begin(), named.end(), type.word) != named.end();
    if (is_named == type.holds) continue;
    types.refuse(fmt::format("must name \"{}\" exactly when {}", type.word, type.where));
  }
}

CameraProfile read_camera(const ProfilePlace& root) {
  root.with_only({"$schema", "description", "driver", "model", "cameraTypes", "video", "image", "ptz", "audio", "io",
                  "edgeStorage"});
  CameraProfile profile;
  (void)root.optional("$schema").text();
  (void)root.required("description").text(200);
  profile.model = root.required("model").text(64);
  const std::string driver = root.required("driver").one_of({"common", "heron", "marlin", "simple-hd", "simple-ptz"});
  profile.manual_iris_lens = driver == "marlin";
  read_video_part(root.required("video"), driver, profile);
  read_image(root.optional("image"), driver, profile);
  profile.ptz = ptz_part(root.optional("ptz"));
  read_audio(root.optional("audio"), profile);
  read_io(root.optional("io"), profile);
  profile.edge_storage = root.optional("edgeStorage").flag();
  check_types(root.required("cameraTypes"), profile);
  return profile;
}

std::string refusal(const std::string& file, const JsonMistake& mistake) {
  const std::string_view separator = mistake.key.empty() ? "" : ": ";
  return fmt::format("{}:{}{}{}: {}", file, mistake.line, separator, mistake.key, mistake.text);
}

bool is_wide(PictureSize size) { return size.width * 5 >= size.height * 8; }

}  // namespace

bool fits(PictureSize size, PictureSize limit) { return size.width <= limit.width && size.height <= limit.height; }

bool can_be_cut(PictureSize size, PictureSize capture) {
  return fits(size, capture) && is_wide(size) == is_wide(capture);
}

std::string size_text(PictureSize size) { return fmt::format("{},{}", size.width, size.height); }

const OfferedCodec* CameraProfile::codec(std::string_view word) const {
  const auto found =
      std::find_if(codecs.begin(), codecs.end(), [word](const OfferedCodec& codec) { return codec.word == word; });
  return found == codecs.end() ? nullptr : &*found;
}

std::variant<CameraProfile, std::string> parse_camera_profile(std::string_view text, const std::string& file) {
  const LinedJson json(text);
  if (json.mistake()) return refusal(file, *json.mistake());
  try {
    return read_camera(ProfilePlace(&json.root(), ""));
  } catch (const ProfileMistake& mistake) {
    return refusal(file, {json.line_of(*mistake.at), mistake.key, mistake.text});
  }
}

std::variant<CameraProfile, std::string> load_camera_profile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  std::string text(kLargestFile + 1, '\0');
  file.read(text.data(), static_cast<std::streamsize>(text.size()));
  if (!file.is_open() || file.bad() || file.gcount() == 0) return fmt::format("{}: cannot be read, or is empty", path);
  text.resize(static_cast<std::size_t>(file.gcount()));
  if (text.size() > kLargestFile) return fmt::format("{}: is larger than 1 MiB", path);
  return parse_camera_profile(text, path);
}

}  // namespace vexa::camera
