// What a camera model can do, as a profile file says it (docs/model_profiles.md).
#ifndef VIRTUAL_CAMERA_CAMERA_PROFILE_H_
#define VIRTUAL_CAMERA_CAMERA_PROFILE_H_

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

// Lists begin with what the camera leaves the factory with; an empty list says that it lacks the setting.
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

  bool ptz = false;
  bool continuous_ptz = false;
  bool focus = false;
  int presets = 0;
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

// The profile, or what is wrong: "FILE:LINE: KEY: TEXT". `file` stands in that text only.
[[nodiscard]] std::variant<CameraProfile, std::string> parse_camera_profile(std::string_view text,
                                                                            const std::string& file);
[[nodiscard]] std::variant<CameraProfile, std::string> load_camera_profile(const std::string& path);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CAMERA_PROFILE_H_
