// SPDX-License-Identifier: Apache-2.0
// What a camera model can do, as a profile file states it (docs/model_profiles.md).
#ifndef VIRTUAL_CAMERA_MODEL_CAMERA_PROFILE_H_
#define VIRTUAL_CAMERA_MODEL_CAMERA_PROFILE_H_

#include <algorithm>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace vexa::camera {

struct PictureSize {
  int width = 0;
  int height = 0;

  bool operator==(const PictureSize&) const = default;
};

[[nodiscard]] bool fits(PictureSize size, PictureSize limit);
// Whether a capture of this size can give the picture: wide pictures, from 8:5 on, are cut out of a wide one only.
[[nodiscard]] bool can_be_cut(PictureSize size, PictureSize capture);
// "1920,1080", as commands and inquiries have it.
[[nodiscard]] std::string size_text(PictureSize size);

struct OfferedCodec {
  std::string word;  // the camera's: "jpeg", "mpeg4", "h264"
  std::vector<PictureSize> sizes;
  std::vector<int> frame_rates;
  std::vector<int> qualities;  // JPEG's
  std::vector<int> bit_rates;  // kbit/s; the others'
};

struct StreamDefaults {
  std::string codec;  // the camera's word
  PictureSize size;
  int frame_rate = 0;
  int quality = 0;   // 0 unless JPEG
  int bit_rate = 0;  // 0 for JPEG
};

// How long an axis takes, in milliseconds.
struct AxisTimes {
  int travel = 0;  // from end to end at the greatest speed
  int ramp = 0;    // from rest to the greatest speed
};

// Pan or tilt, in the camera's units.
struct TurnProfile {
  int max_speed = 1;
  int span = 2;         // twice the distance from the origin to the other end
  int angle_range = 1;  // degrees of the span
  int origin = 0;
  int wide_angle = 1;  // degrees that the picture spans at the wide end
  int offset = 0;      // position of the horizon
  AxisTimes times;

  [[nodiscard]] int end() const { return origin + span / 2; }
  [[nodiscard]] double degrees_of_unit() const { return static_cast<double>(angle_range) / span; }
};

// Zoom or focus, in the camera's units.
struct LensProfile {
  int min_speed = 1;
  int max_speed = 1;
  int min_position = 0;
  int max_position = 0;
  AxisTimes times;
};

struct ZoomPoint {
  int ratio = 1;
  int position = 0;
};

struct PtzProfile {
  TurnProfile pan;
  TurnProfile tilt;
  LensProfile zoom;
  std::vector<ZoomPoint> ratios;  // ascending by position, not descending by ratio
  std::optional<LensProfile> focus;
  bool continuous = false;  // takes signed speeds
  int presets = 0;
  int tours = 0;
  int shadow_tours = 0;

  // The greatest speed that moves of pan and tilt together take.
  [[nodiscard]] int shared_speed() const { return std::min(pan.max_speed, tilt.max_speed); }
};

// Lists begin with what the camera leaves the factory with; an empty list means that it lacks the setting.
struct CameraProfile {
  std::string model;
  bool manual_iris_lens = false;  // exposure is set by the lens and the automatic shutter
  std::vector<StreamDefaults> streams;
  std::vector<OfferedCodec> codecs;
  std::vector<std::string> standards;
  std::vector<PictureSize> capture_sizes;
  std::vector<PictureSize> max_sizes;
  std::optional<PictureSize> solid_ptz;  // the largest picture that it moves without a motor
  bool electronic_flip = false;
  std::vector<std::string> outputs;

  std::vector<std::string> day_night;  // "auto", "day", "night"
  bool back_light = false;
  bool noise_reduction = false;
  bool wide_dynamic_range = false;
  bool visibility_enhancer = false;
  int infrared_strength = 0;          // 0: no illuminator
  std::vector<std::string> exposure;  // the camera's words: "full", "shutter", "iris"
  std::vector<int> shutter_steps;
  std::vector<int> iris_steps;

  std::optional<PtzProfile> ptz;
  std::vector<std::string> audio_inputs;
  bool io = false;
  int alarm_inputs = 0;
  int alarm_outputs = 0;
  std::string video_detection;  // "motion", "object", "lod"; empty: none
  bool tampering_detection = false;
  bool audio_detection = false;
  bool edge_storage = false;

  [[nodiscard]] const OfferedCodec* codec(std::string_view word) const;
};

// The profile, or why the library's reader refuses it: "FILE:LINE: KEY: TEXT". `file` is used in that text only.
[[nodiscard]] std::variant<CameraProfile, std::string> parse_camera_profile(const std::string& text,
                                                                            const std::string& file);
// Of a file, or of the name of an installed profile (without "/" and ".json").
[[nodiscard]] std::variant<CameraProfile, std::string> load_camera_profile(const std::string& path);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_CAMERA_PROFILE_H_
