// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/model/camera_profile.h"

#include <fmt/format.h>

#include <algorithm>
#include <cstddef>
#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>
#include <utility>

#include "vexa/models.h"
#include "virtual_camera/values/codec.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

using nlohmann::json;

// All below reads a profile that the library's reader has taken: every value has its type and is within its limits.

// A member that may be left out; null then, which has no members and no items of its own.
const json& part_of(const json& object, const char* key) {
  static const json kLeftOut;
  const auto found = object.is_object() ? object.find(key) : object.end();
  return object.is_object() && found != object.end() ? *found : kLeftOut;
}

template <typename Value>
Value value_of(const json& object, const char* key, Value left_out = {}) {
  const json& part = part_of(object, key);
  return part.is_null() ? left_out : part.get<Value>();
}

template <typename Value>
std::vector<Value> list_of(const json& object, const char* key) {
  return value_of<std::vector<Value>>(object, key);
}

// "1920x1080".
PictureSize size_of(const std::string& text) {
  const std::size_t by = text.find('x');
  return {leading_number(text).value_or(0), leading_number(std::string_view(text).substr(by + 1)).value_or(0)};
}

std::vector<PictureSize> sizes_of(const json& object, const char* key) {
  std::vector<PictureSize> sizes;
  for (const std::string& text : list_of<std::string>(object, key)) sizes.push_back(size_of(text));
  return sizes;
}

// The camera's word of a codec that profiles name as people do.
std::string codec_setting(const std::string& name) {
  const Codec codec = name == "H.264" ? Codec::kH264 : name == "MPEG4" ? Codec::kMpeg4 : Codec::kJpeg;
  return std::string(codec_word(codec));
}

// Likewise of an exposure mode.
std::string exposure_setting(const std::string& mode) {
  if (mode == "Full auto") return "full";
  return mode == "Iris Priority" ? "iris" : "shutter";
}

void take_video(const json& video, CameraProfile& profile) {
  for (const json& codec : video.at("codecs")) {
    profile.codecs.push_back({codec_setting(codec.at("name")), sizes_of(codec, "sizes"),
                              list_of<int>(codec, "frameRates"), list_of<int>(codec, "qualities"),
                              list_of<int>(codec, "bitRates")});
  }
  for (const json& stream : video.at("streams")) {
    profile.streams.push_back({codec_setting(stream.at("codec")), size_of(stream.at("size")),
                               value_of<int>(stream, "frameRate"), value_of<int>(stream, "quality"),
                               value_of<int>(stream, "bitRate")});
  }
  profile.standards = list_of<std::string>(video, "standards");
  profile.capture_sizes = sizes_of(video, "captureSizes");
  profile.max_sizes = sizes_of(video, "maxImageSizes");
  const auto solid = value_of<std::string>(video, "solidPtz");
  if (!solid.empty()) profile.solid_ptz = size_of(solid);
  profile.electronic_flip = value_of<bool>(video, "electronicFlip");
  profile.outputs = list_of<std::string>(video, "outputs");
}

void add_steps(const json& mode, const char* key, std::vector<int>& steps) {
  for (const json& step : part_of(mode, key)) steps.push_back(step.at("value").get<int>());
}

void take_image(const json& image, CameraProfile& profile) {
  profile.day_night = list_of<std::string>(image, "dayNight");
  profile.back_light = value_of<bool>(image, "backLight");
  profile.noise_reduction = value_of<bool>(image, "noiseReduction");
  profile.wide_dynamic_range = value_of<bool>(image, "wideDynamicRange");
  profile.visibility_enhancer = value_of<bool>(image, "visibilityEnhancer");
  profile.infrared_strength = value_of<int>(image, "infraredStrength");
  for (const json& mode : part_of(image, "exposure")) {
    profile.exposure.push_back(exposure_setting(mode.at("mode")));
    add_steps(mode, "shutter", profile.shutter_steps);
    add_steps(mode, "iris", profile.iris_steps);
  }
}

AxisTimes times_of(const json& axis, AxisTimes left_out) {
  return {value_of(axis, "travelTime", left_out.travel), value_of(axis, "rampTime", left_out.ramp)};
}

TurnProfile turn_of(const json& axis, AxisTimes left_out) {
  return {value_of<int>(axis, "maxSpeed"), value_of<int>(axis, "span"),      value_of<int>(axis, "angleRange"),
          value_of<int>(axis, "origin"),   value_of<int>(axis, "wideAngle"), value_of<int>(axis, "offset"),
          times_of(axis, left_out)};
}

LensProfile lens_of(const json& axis, AxisTimes left_out) {
  return {value_of<int>(axis, "minSpeed"), value_of<int>(axis, "maxSpeed"), value_of<int>(axis, "minPosition"),
          value_of<int>(axis, "maxPosition"), times_of(axis, left_out)};
}

PtzProfile ptz_of(const json& ptz) {
  // What an axis takes whose times are left out.
  constexpr AxisTimes kPan = {3600, 250};
  constexpr AxisTimes kTilt = {1500, 250};
  constexpr AxisTimes kZoom = {3000, 100};
  constexpr AxisTimes kFocus = {2000, 100};
  PtzProfile profile;
  profile.continuous = ptz.at("dialect") == "continuous";
  profile.pan = turn_of(ptz.at("pan"), kPan);
  profile.tilt = turn_of(ptz.at("tilt"), kTilt);
  profile.zoom = lens_of(ptz.at("zoom"), kZoom);
  for (const json& point : ptz.at("zoom").at("ratios")) {
    profile.ratios.push_back({point.at("ratio").get<int>(), point.at("position").get<int>()});
  }
  if (const json& focus = part_of(ptz, "focus"); !focus.is_null()) profile.focus = lens_of(focus, kFocus);
  profile.presets = value_of<int>(ptz, "presets");
  profile.tours = value_of<int>(ptz, "tours");
  profile.shadow_tours = value_of<int>(ptz, "shadowTours");
  return profile;
}

void take_io(const json& io, CameraProfile& profile) {
  if (io.is_null()) return;
  profile.io = true;
  profile.alarm_inputs = io.at("inputs").get<int>();
  profile.alarm_outputs = io.at("outputs").get<int>();
  profile.video_detection = value_of<std::string>(io, "videoDetection");
  profile.tampering_detection = value_of<bool>(io, "tamperingDetection");
  profile.audio_detection = value_of<bool>(io, "audioDetection");
}

CameraProfile camera_of(const json& root) {
  CameraProfile profile;
  profile.model = root.at("model").get<std::string>();
  profile.manual_iris_lens = root.at("driver") == "marlin";
  take_video(root.at("video"), profile);
  take_image(part_of(root, "image"), profile);
  if (const json& ptz = part_of(root, "ptz"); !ptz.is_null()) profile.ptz = ptz_of(ptz);
  profile.audio_inputs = list_of<std::string>(part_of(root, "audio"), "inputs");
  take_io(part_of(root, "io"), profile);
  profile.edge_storage = value_of<bool>(root, "edgeStorage");
  return profile;
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

std::variant<CameraProfile, std::string> parse_camera_profile(const std::string& text, const std::string& file) {
  Profile checked;
  ProfileError error;
  if (!ParseProfile(text, file, checked, error)) return error.Message();
  return camera_of(json::parse(text));
}

std::variant<CameraProfile, std::string> load_camera_profile(const std::string& path) {
  // LoadProfile() refuses what is no file, or too large a one. It keeps less of a profile than a camera needs, so the
  // text is read once more; ParseProfile() refuses it where the file has changed meanwhile.
  Profile checked;
  ProfileError error;
  if (!LoadProfile(path, checked, error)) return error.Message();
  const bool is_name = path.find('/') == std::string::npos && !path.ends_with(".json");
  std::ifstream file(is_name ? ProfileFolder() + "/" + path + ".json" : path, std::ios::binary);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  return parse_camera_profile(text, path);
}

}  // namespace vexa::camera
