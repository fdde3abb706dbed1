#include "virtual_camera/camera_profile.h"

#include <fmt/format.h>

#include <algorithm>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <utility>

#include "virtual_camera/profile_place.h"

namespace vexa::camera {
namespace {

// The camera's word of what a profile names.
std::string codec_word(const ProfilePlace& place) {
  const std::string name = place.one_of({"JPEG", "MPEG4", "H.264"});
  if (name == "H.264") return "h264";
  return name == "MPEG4" ? "mpeg4" : "jpeg";
}

std::string exposure_word(const ProfilePlace& place) {
  const std::string name = place.one_of({"Full auto", "Shutter Priority", "Iris Priority"});
  if (name == "Full auto") return "full";
  return name == "Iris Priority" ? "iris" : "shutter";
}

std::vector<int> ascending(const ProfilePlace& list, int most) {
  std::vector<int> numbers;
  for (const ProfilePlace& item : list.items()) {
    const int number = item.number(1, most);
    if (!numbers.empty() && number <= numbers.back()) item.refuse("must be above the one before it");
    numbers.push_back(number);
  }
  return numbers;
}

std::vector<PictureSize> sizes_of(const ProfilePlace& list) {
  std::vector<PictureSize> sizes;
  for (const ProfilePlace& item : list.items()) {
    const PictureSize size = item.size();
    if (std::find(sizes.begin(), sizes.end(), size) != sizes.end()) item.refuse("occurs twice");
    sizes.push_back(size);
  }
  return sizes;
}

std::vector<std::string> words_of(const ProfilePlace& list, std::initializer_list<std::string_view> words) {
  std::vector<std::string> found;
  for (const ProfilePlace& item : list.items()) {
    std::string word = item.one_of(words);
    if (std::find(found.begin(), found.end(), word) != found.end()) item.refuse("occurs twice");
    found.push_back(std::move(word));
  }
  return found;
}

OfferedCodec codec_of(const ProfilePlace& place) {
  place.with_only({"name", "sizes", "frameRates", "qualities", "bitRates"});
  OfferedCodec codec;
  codec.word = codec_word(place.required("name"));
  codec.sizes = sizes_of(place.required("sizes"));
  codec.frame_rates = ascending(place.required("frameRates"), 60);
  const bool jpeg = codec.word == "jpeg";
  if (place.optional(jpeg ? "bitRates" : "qualities")) place.refuse("has the other codecs' rate");
  if (jpeg) codec.qualities = ascending(place.required("qualities"), 100);
  if (!jpeg) codec.bit_rates = ascending(place.required("bitRates"), 100000);
  return codec;
}

template <typename Value>
void demand_offered(const ProfilePlace& place, const std::vector<Value>& offered, const Value& value) {
  if (std::find(offered.begin(), offered.end(), value) == offered.end()) place.refuse("is not offered by the codec");
}

StreamDefaults stream_of(const ProfilePlace& place, const CameraProfile& profile) {
  place.with_only({"codec", "size", "frameRate", "quality", "bitRate"});
  StreamDefaults stream;
  stream.codec = codec_word(place.required("codec"));
  const OfferedCodec* codec = profile.codec(stream.codec);
  if (codec == nullptr) place.optional("codec").refuse("is not one of the camera's codecs");
  stream.size = place.required("size").size();
  stream.frame_rate = place.required("frameRate").number(1, 60);
  demand_offered(place.optional("size"), codec->sizes, stream.size);
  demand_offered(place.optional("frameRate"), codec->frame_rates, stream.frame_rate);
  const bool jpeg = stream.codec == "jpeg";
  if (place.optional(jpeg ? "bitRate" : "quality")) place.refuse("has the other codecs' rate");
  int& rate = jpeg ? stream.quality : stream.bit_rate;
  rate = place.required(jpeg ? "quality" : "bitRate").number(1, 100000);
  demand_offered(place.optional(jpeg ? "quality" : "bitRate"), jpeg ? codec->qualities : codec->bit_rates, rate);
  return stream;
}

void read_video(const ProfilePlace& video, CameraProfile& profile) {
  video.with_only(
      {"streams", "codecs", "standards", "captureSizes", "maxImageSizes", "solidPtz", "electronicFlip", "outputs"});
  for (const ProfilePlace& place : video.required("codecs").items()) {
    OfferedCodec codec = codec_of(place);
    if (profile.codec(codec.word) != nullptr) place.refuse("is a codec that occurs twice");
    profile.codecs.push_back(std::move(codec));
  }
  for (const ProfilePlace& place : video.required("streams").items()) {
    profile.streams.push_back(stream_of(place, profile));
  }
  profile.standards = words_of(video.optional("standards"), {"pal", "ntsc"});
  profile.capture_sizes = sizes_of(video.optional("captureSizes"));
  profile.max_sizes = sizes_of(video.optional("maxImageSizes"));
  if (const ProfilePlace solid = video.optional("solidPtz")) profile.solid_ptz = solid.size();
  profile.electronic_flip = video.optional("electronicFlip").flag();
  profile.outputs = words_of(video.optional("outputs"), {"ip", "pal", "ntsc"});
}

std::vector<int> steps_of(const ProfilePlace& list) {
  std::vector<int> values;
  for (const ProfilePlace& item : list.items()) {
    item.with_only({"label", "value"});
    (void)item.required("label").text();
    values.push_back(item.required("value").number(0, 10000));
  }
  return values;
}

void read_image(const ProfilePlace& image, CameraProfile& profile) {
  image.with_only({"dayNight", "backLight", "noiseReduction", "wideDynamicRange", "visibilityEnhancer",
                   "infraredStrength", "exposure"});
  profile.day_night = words_of(image.optional("dayNight"), {"auto", "day", "night"});
  profile.back_light = image.optional("backLight").flag();
  profile.noise_reduction = image.optional("noiseReduction").flag();
  profile.wide_dynamic_range = image.optional("wideDynamicRange").flag();
  profile.visibility_enhancer = image.optional("visibilityEnhancer").flag();
  profile.infrared_strength = image.optional("infraredStrength").number(1, 100);
  for (const ProfilePlace& place : image.optional("exposure").items()) {
    place.with_only({"mode", "shutter", "iris"});
    profile.exposure.push_back(exposure_word(place.required("mode")));
    if (place.optional("shutter")) profile.shutter_steps = steps_of(place.optional("shutter"));
    if (place.optional("iris")) profile.iris_steps = steps_of(place.optional("iris"));
  }
}

void read_ptz(const ProfilePlace& ptz, CameraProfile& profile) {
  if (!ptz) return;
  ptz.with_only({"dialect", "noMoveSpeed", "pan", "tilt", "zoom", "focus", "presets", "tours", "shadowTours"});
  profile.ptz = true;
  profile.continuous_ptz = ptz.required("dialect").one_of({"continuous", "move"}) == "continuous";
  profile.focus = static_cast<bool>(ptz.optional("focus"));
  profile.presets = ptz.optional("presets").number(0, 256);
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

CameraProfile read_camera(const ProfilePlace& root) {
  root.with_only({"$schema", "description", "driver", "model", "cameraTypes", "video", "image", "ptz", "audio", "io",
                  "edgeStorage"});
  CameraProfile profile;
  profile.model = root.required("model").text();
  profile.manual_iris_lens =
      root.required("driver").one_of({"common", "heron", "marlin", "simple-hd", "simple-ptz"}) == "marlin";
  read_video(root.required("video"), profile);
  read_image(root.optional("image"), profile);
  read_ptz(root.optional("ptz"), profile);
  const ProfilePlace audio = root.optional("audio").with_only({"inputs", "outputs"});
  profile.audio_inputs = words_of(audio.optional("inputs"), {"g711_64", "g726_40", "g726_32", "g726_24", "g726_16"});
  read_io(root.optional("io"), profile);
  profile.edge_storage = root.optional("edgeStorage").flag();
  return profile;
}

}  // namespace

std::string size_text(PictureSize size) { return fmt::format("{},{}", size.width, size.height); }

const OfferedCodec* CameraProfile::codec(std::string_view word) const {
  const auto found =
      std::find_if(codecs.begin(), codecs.end(), [word](const OfferedCodec& codec) { return codec.word == word; });
  return found == codecs.end() ? nullptr : &*found;
}

std::variant<CameraProfile, std::string> parse_camera_profile(std::string_view text, const std::string& file) {
  try {
    const auto json = nlohmann::ordered_json::parse(text);
    return read_camera(ProfilePlace(&json, ""));
  } catch (const ProfileMistake& mistake) {
    const std::string_view separator = mistake.key.empty() ? "" : ": ";
    return fmt::format("{}: {}{}{}", file, mistake.key, separator, mistake.text);
  } catch (const nlohmann::json::parse_error& error) {
    const auto end = text.begin() + static_cast<std::ptrdiff_t>(std::min(error.byte, text.size()));
    return fmt::format("{}:{}: not JSON", file, 1 + std::count(text.begin(), end, '\n'));
  }
}

std::variant<CameraProfile, std::string> load_camera_profile(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  if (!file.is_open() || file.bad() || text.empty()) return fmt::format("{}: cannot be read, or is empty", path);
  return parse_camera_profile(text, path);
}

}  // namespace vexa::camera
