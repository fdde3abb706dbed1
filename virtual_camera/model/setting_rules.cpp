// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/model/setting_rules.h"

#include <fmt/format.h>

#include <algorithm>
#include <optional>

#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

const std::vector<std::string> kSwitch = {"off", "on"};
const std::vector<std::string> kStrengths = {"off", "low", "mid", "high"};
constexpr int kOften = 100000;

std::optional<PictureSize> size_of(std::string_view text) {
  const std::size_t comma = text.find(',');
  if (comma == std::string_view::npos) return std::nullopt;
  const auto width = whole_number(text.substr(0, comma));
  const auto height = whole_number(text.substr(comma + 1));
  if (!width || !height) return std::nullopt;
  return PictureSize{*width, *height};
}

std::string_view value_in(const SettingRules::Pairs& settings, std::string_view key) {
  const auto found =
      std::find_if(settings.begin(), settings.end(), [key](const auto& pair) { return pair.first == key; });
  return found == settings.end() ? std::string_view() : std::string_view(found->second);
}

void put(SettingRules::Pairs& settings, std::string_view key, std::string_view value) {
  const auto found =
      std::find_if(settings.begin(), settings.end(), [key](const auto& pair) { return pair.first == key; });
  if (found == settings.end()) {
    settings.emplace_back(key, value);
  } else {
    found->second = value;
  }
}

bool holds(const std::vector<int>& offered, std::string_view value) {
  const auto number = whole_number(value);
  return number && std::find(offered.begin(), offered.end(), *number) != offered.end();
}

std::vector<std::string> texts_of(const std::vector<PictureSize>& sizes) {
  std::vector<std::string> texts;
  texts.reserve(sizes.size());
  for (const PictureSize size : sizes) texts.push_back(size_text(size));
  return texts;
}

std::vector<std::string> texts_of(const std::vector<int>& numbers) {
  std::vector<std::string> texts;
  texts.reserve(numbers.size());
  for (const int number : numbers) texts.push_back(fmt::format("{}", number));
  return texts;
}

}  // namespace

SettingRules::SettingRules(CameraProfile profile) : profile_(std::move(profile)) {
  add_video();
  add_streams();
  add_image();
  add_exposure();
  add_system();
  add_card();
  find_lacking();
}

void SettingRules::add(Section& section, const std::string& key, const std::string& factory, Values values) {
  section.factory.emplace_back(key, factory);
  section.values.emplace(key, std::move(values));
}

void SettingRules::add_choice(Section& section, const std::string& key, const std::vector<std::string>& words) {
  if (!words.empty()) add(section, key, words.front(), {.words = words});
}

void SettingRules::add_switch(Section& section, const std::string& key, bool present) {
  if (present) add_choice(section, key, kSwitch);
}

void SettingRules::add_video() {
  add_choice(camera_, "VideoStd", profile_.standards);
  add_choice(camera_, "VidCapSize", texts_of(profile_.capture_sizes));
  add_switch(camera_, "SolidPTZ", profile_.solid_ptz.has_value());
  add_choice(camera_, "ImageMaxSize", texts_of(profile_.max_sizes));
}

void SettingRules::add_streams() {
  std::vector<std::string> codecs = {"off"};
  std::vector<int> bit_rates;
  std::vector<int> qualities;
  for (const OfferedCodec& codec : profile_.codecs) {
    codecs.push_back(codec.word);
    if (!codec.bit_rates.empty()) bit_rates = codec.bit_rates;
    if (!codec.qualities.empty()) qualities = codec.qualities;
  }
  if (profile_.streams.size() == 1) codecs.erase(codecs.begin());
  for (std::size_t i = 0; i < profile_.streams.size(); ++i) {
    const StreamDefaults& stream = profile_.streams[i];
    const auto key = [number = i + 1](const char* name) { return fmt::format("{}{}", name, number); };
    add(camera_, key("ImageCodec"), stream.codec, {.words = codecs});
    // Their lists depend on the codec: agree() checks them.
    add(camera_, key("ImageSize"), size_text(stream.size), {.words = {}, .least = 1, .most = kOften});
    add(camera_, key("FrameRate"), fmt::format("{}", stream.frame_rate), {.words = {}, .least = 1, .most = kOften});
    const int bit_rate = stream.bit_rate != 0 || bit_rates.empty() ? stream.bit_rate : bit_rates.front();
    const int quality = stream.quality != 0 || qualities.empty() ? stream.quality : qualities.front();
    if (!bit_rates.empty()) {
      add(camera_, key("BitRate"), fmt::format("{}", bit_rate), {.words = {}, .least = 1, .most = kOften});
    }
    if (!qualities.empty()) {
      add(camera_, key("Quality"), fmt::format("{}", quality), {.words = {}, .least = 1, .most = kOften});
    }
  }
  add_switch(camera_, "Eflip", profile_.electronic_flip);
  for (const auto& [key, port] :
       {std::pair("UcVideoPort", "50000"), {"UcVideoPort1", "50002"}, {"UcVideoPort2", "50004"}}) {
    add(camera_, key, port, {.words = {}, .least = 1024, .most = 65534});
  }
  add(camera_, "RTSPPort", "554", {.words = {}, .least = 1, .most = 65535});
  add(camera_, "RTSPTimeout", "60", {.words = {}, .least = 0, .most = 600});
  add_switch(camera_, "RTPUserData", true);
}

void SettingRules::add_image() {
  if (!profile_.day_night.empty()) {
    const auto offers = [this](std::string_view mode) {
      return std::find(profile_.day_night.begin(), profile_.day_night.end(), mode) != profile_.day_night.end();
    };
    std::vector<std::string> modes;
    if (offers("auto")) modes.emplace_back("auto");
    if (offers("day") || offers("night")) modes.emplace_back("manual");
    if (profile_.day_night.front() != "auto") std::reverse(modes.begin(), modes.end());
    add_choice(camera_, "DayNightMode", modes);
    add_choice(camera_, "DayNight",
               profile_.day_night.front() == "night" ? std::vector<std::string>{"on", "off"} : kSwitch);
  }
  if (profile_.noise_reduction) add_choice(camera_, "XDNR", kStrengths);
  add_switch(camera_, "ViewDR", profile_.wide_dynamic_range);
  if (profile_.visibility_enhancer) add_choice(camera_, "VisibilityEnhancer", kStrengths);
  if (profile_.infrared_strength > 0) {
    add_choice(camera_, "IRLed", {"off", "daynight"});
    add(camera_, "IRLedMaxStrength", fmt::format("{}", profile_.infrared_strength),
        {.words = {}, .least = 0, .most = profile_.infrared_strength});
  }
  add_switch(camera_, "BLComp", profile_.back_light);
  if (profile_.ptz && profile_.ptz->focus) add_choice(camera_, "FocusMode", {"auto", "manual"});
  add_choice(camera_, "AudInCodec", profile_.audio_inputs);
  add_switch(camera_, "AudioIn", !profile_.audio_inputs.empty());
}

void SettingRules::add_exposure() {
  if (profile_.exposure.empty()) return;
  if (profile_.manual_iris_lens) {
    add_choice(camera_, "ExpMode", {"manualirislens", "autoirislens"});
    add_choice(camera_, "AutoShutter", {"on", "off"});
    add_choice(camera_, "AutoSlowShutter", {"on", "off"});
  } else {
    add_choice(camera_, "ExpMode", profile_.exposure);
  }
  add_choice(camera_, "Shutter", texts_of(profile_.shutter_steps));
  add_choice(camera_, "Iris", texts_of(profile_.iris_steps));
}

void SettingRules::add_system() {
  add(system_, "ModelName", profile_.model, {});
  add(system_, "SoftVersion", "1.02.00", {});
  add(system_, "Serial", "100001", {});
  if (profile_.ptz) add(system_, "ContinuousPanTiltZoomFunc", profile_.ptz->continuous ? "1" : "0", {});
  add(system_, "ChannelId", "1", {.words = {}, .least = 0, .most = 255});
  add_choice(system_, "VideoOutMode", profile_.outputs);
  add_switch(system_, "TamperingFunc", profile_.tampering_detection);
  if (profile_.tampering_detection) {
    add_choice(system_, "TamperingLevel", {"middle", "low", "high"});
    add_choice(system_, "TamperingStatusClear", kSwitch);
  }
  add_switch(system_, "AlarmData", profile_.io);
}

// Hosts set the time-out of sessions here, also where there is no card.
void SettingRules::add_card() {
  if (profile_.edge_storage) return;
  add(bound_["edgestorage"], "EsRTSPRec1Timeout", "60", {.words = {}, .least = 0, .most = 600});
}

void SettingRules::find_lacking() {
  const bool windowed = profile_.video_detection == "motion" || profile_.video_detection == "object";
  const struct {
    const char* section;
    bool present;
  } sections[] = {{"ptzf", profile_.ptz.has_value()},
                  {"presetposition", profile_.ptz && profile_.ptz->presets > 0},
                  {"sensor", profile_.io},
                  {"main", profile_.alarm_outputs > 0},
                  {"lod", profile_.video_detection == "lod"},
                  {"objectdetection", windowed},
                  {"audiodetection", profile_.audio_detection},
                  {"a-slot", profile_.edge_storage}};
  for (const auto& entry : sections) {
    if (!entry.present) lacking_.emplace_back(entry.section);
  }
}

std::map<std::string, SettingRules::Pairs> SettingRules::factory() const {
  std::map<std::string, Pairs> sections;
  for (const auto& [name, section] : bound_) sections[name] = section.factory;
  return sections;
}

bool SettingRules::allow(std::string_view section, std::string_view key, std::string_view value) const {
  if (std::find(lacking_.begin(), lacking_.end(), section) != lacking_.end()) return false;
  if (section == "ptzf") return profile_.ptz->continuous || key != "ContinuousPanTiltZoom";
  const auto bound = bound_.find(section);
  if (bound == bound_.end()) return true;
  const auto found = bound->second.values.find(key);
  if (found == bound->second.values.end()) return false;
  const Values& values = found->second;
  if (!values.words.empty()) return std::find(values.words.begin(), values.words.end(), value) != values.words.end();
  if (key.starts_with("ImageSize")) return size_of(value).has_value();
  const auto number = whole_number(value);
  return number && *number >= values.least && *number <= values.most;
}

bool SettingRules::change(std::string_view section, const Pairs& changes, Pairs& settings) const {
  for (const auto& [key, value] : changes) {
    if (!allow(section, key, value)) return false;
  }
  Pairs after = settings;
  for (const auto& [key, value] : changes) put(after, key, value);
  if (section == "camera") {
    for (std::size_t number = 1; number <= profile_.streams.size(); ++number) {
      shrink(changes, after, number);
      if (!stream_agrees(after, number)) return false;
    }
  }
  settings = std::move(after);
  return true;
}

void SettingRules::shrink(const Pairs& changes, Pairs& settings, std::size_t number) const {
  const std::string key = fmt::format("ImageSize{}", number);
  const OfferedCodec* codec = profile_.codec(value_in(settings, fmt::format("ImageCodec{}", number)));
  const bool chosen = !value_in(changes, key).empty();
  const auto size = size_of(value_in(settings, key));
  if (codec == nullptr || chosen || !size || size_agrees(settings, *codec, *size)) return;
  for (const PictureSize smaller : codec->sizes) {
    if (!size_agrees(settings, *codec, smaller)) continue;
    put(settings, key, size_text(smaller));
    return;
  }
}

bool SettingRules::stream_agrees(const Pairs& settings, std::size_t number) const {
  const auto value = [&settings, number](const char* name) {
    return value_in(settings, fmt::format("{}{}", name, number));
  };
  const std::string_view word = value("ImageCodec");
  if (word == "off") return true;
  const OfferedCodec* codec = profile_.codec(word);
  if (codec == nullptr || !holds(codec->frame_rates, value("FrameRate"))) return false;
  const bool rate =
      word == "jpeg" ? holds(codec->qualities, value("Quality")) : holds(codec->bit_rates, value("BitRate"));
  const auto size = size_of(value("ImageSize"));
  return rate && size && size_agrees(settings, *codec, *size);
}

bool SettingRules::size_agrees(const Pairs& settings, const OfferedCodec& codec, PictureSize size) const {
  if (std::find(codec.sizes.begin(), codec.sizes.end(), size) == codec.sizes.end()) return false;
  const auto capture = size_of(value_in(settings, "VidCapSize"));
  const auto largest = size_of(value_in(settings, "ImageMaxSize"));
  if (capture && !can_be_cut(size, *capture)) return false;
  if (largest && !fits(size, *largest)) return false;
  return value_in(settings, "SolidPTZ") != "on" || !profile_.solid_ptz || fits(size, *profile_.solid_ptz);
}

}  // namespace vexa::camera
