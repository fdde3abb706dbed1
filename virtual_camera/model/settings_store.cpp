// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/model/settings_store.h"

#include <fmt/format.h>

#include <algorithm>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/values/number_text.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

struct Default {
  const char* section;
  const char* key;
  const char* value;
};

constexpr Default kDefaults[] = {
    {"system", "ModelName", "VX-2000"},
    {"system", "SoftVersion", "1.02.00"},
    {"system", "Serial", "100001"},
    {"system", "ContinuousPanTiltZoomFunc", "1"},
    {"system", "ChannelId", "1"},
    {"system", "VideoOutMode", "ip"},
    {"system", "TamperingFunc", "off"},
    {"system", "TamperingLevel", "middle"},
    {"network", "MacAddress", "02:00:00:00:00:01"},
    {"network", "Address", "127.0.0.2"},
    {"network", "HttpPort", "80"},
    {"camera", "VideoStd", "pal"},
    {"camera", "VidCapSize", "1920,1080"},
    {"camera", "SolidPTZ", "off"},
    {"camera", "ImageMaxSize", "1920,1080"},
    {"camera", "ImageCodec1", "h264"},
    {"camera", "ImageSize1", "1920,1080"},
    {"camera", "FrameRate1", "25"},
    {"camera", "BitRate1", "8000"},
    {"camera", "Quality1", "5"},
    {"camera", "ImageCodec2", "off"},
    {"camera", "UcVideoPort", "50000"},
    {"camera", "UcVideoPort1", "50002"},
    {"camera", "UcVideoPort2", "50004"},
    {"camera", "RTSPPort", "554"},
    {"camera", "RTSPTimeout", "60"},
    {"camera", "DayNightMode", "auto"},
    {"camera", "DayNight", "off"},
    {"camera", "AudInCodec", "off"},
    {"edgestorage", "Edgestorage", "off"},
    {"edgestorage", "EsRTSPRec1Timeout", "60"},
    {"presetposition", "PresetNum", "0"},
    {"sensor", "Sensor1", "0"},
    {"lod", "LODMinObjectSize", "middle"},
    {"lod", "LODSensitivity", "50"},
    {"objectdetection", "PositionMode", "current"},
    {"objectdetection", "ODPreDef", "0"},
    {"a-slot", "Status", "none"},
    {"audiodetection", "ADFunc", "off"},
};

int number_in(std::string_view text) { return leading_number(text).value_or(0); }

constexpr std::string_view kFolder = "/command/";
constexpr std::string_view kExtension = ".cgi";

Answer answer_inquiry(std::string_view query, const SettingsStore& settings) {
  constexpr std::string_view kKey = "inq=";
  if (!query.starts_with(kKey) || query.size() == kKey.size()) return http_answer("400 Bad Request", "");
  const std::optional<std::string> text = settings.answer(query.substr(kKey.size()));
  return text ? http_answer("200 OK", *text) : http_answer("404 Not Found", "");
}

}  // namespace

SettingsStore::SettingsStore() {
  for (const Default& entry : kDefaults) sections_[entry.section].pairs.emplace_back(entry.key, entry.value);
}

const SettingsStore::Section* SettingsStore::find_locked(std::string_view section) const {
  const auto found = sections_.find(section);
  return found == sections_.end() ? nullptr : &found->second;
}

std::optional<std::string> SettingsStore::get(std::string_view section, std::string_view key) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const Section* found = find_locked(section);
  if (found == nullptr) return std::nullopt;
  for (const auto& [name, value] : found->pairs) {
    if (name == key) return value;
  }
  return std::nullopt;
}

void SettingsStore::set_locked(Section& section, std::string_view key, std::string_view value) {
  for (auto& [name, present] : section.pairs) {
    if (name != key) continue;
    present = value;
    return;
  }
  section.pairs.emplace_back(key, value);
}

void SettingsStore::set(std::string_view section, std::string_view key, std::string_view value) {
  const std::lock_guard<std::mutex> lock(mutex_);
  set_locked(sections_[std::string(section)], key, value);
}

void SettingsStore::erase(std::string_view section, std::string_view key) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto found = sections_.find(section);
  if (found == sections_.end()) return;
  std::erase_if(found->second.pairs, [key](const auto& pair) { return pair.first == key; });
}

void SettingsStore::erase_section(std::string_view section) {
  const std::lock_guard<std::mutex> lock(mutex_);
  const auto found = sections_.find(section);
  if (found != sections_.end()) sections_.erase(found);
}

void SettingsStore::set_answer(std::string_view section, std::optional<std::string> text) {
  const std::lock_guard<std::mutex> lock(mutex_);
  sections_[std::string(section)].whole_answer = std::move(text);
}

std::optional<std::string> SettingsStore::answer(std::string_view section) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  const Section* found = find_locked(section);
  if (found == nullptr) return std::nullopt;
  if (found->whole_answer) return found->whole_answer;
  std::string text;
  for (const auto& [key, value] : found->pairs) {
    if (!text.empty()) text += '&';
    text += key;
    text += '=';
    text += value;
  }
  return text;
}

bool SettingsStore::apply(std::string_view section, std::string_view query) {
  const SettingRules::Pairs changes = query_pairs(query);
  const std::lock_guard<std::mutex> lock(mutex_);
  if (rules_) {
    const Section* present = find_locked(section);
    SettingRules::Pairs settings = present == nullptr ? SettingRules::Pairs() : present->pairs;
    if (!rules_->change(section, changes, settings)) return false;
    sections_[std::string(section)].pairs = std::move(settings);
    return true;
  }
  Section& target = sections_[std::string(section)];
  for (const auto& [key, value] : changes) set_locked(target, key, value);
  return true;
}

void SettingsStore::obey(std::shared_ptr<const SettingRules> rules) {
  const std::lock_guard<std::mutex> lock(mutex_);
  for (auto& [section, pairs] : rules->factory()) sections_[section].pairs = std::move(pairs);
  for (const std::string& section : rules->lacking()) sections_.erase(section);
  rules_ = std::move(rules);
}

std::optional<StreamSettings> stream_settings(const SettingsStore& settings, int number) {
  const auto value = [&](const char* name) { return settings.get("camera", fmt::format("{}{}", name, number)); };
  const auto codec = value("ImageCodec");
  if (!codec) return std::nullopt;
  StreamSettings stream;
  stream.codec = codec_of(*codec);
  const std::string size = value("ImageSize").value_or("");
  stream.width = number_in(size);
  stream.height = number_in(std::string_view(size).substr(std::min(size.find(',') + 1, size.size())));
  stream.frame_rate = number_in(value("FrameRate").value_or(""));
  stream.bit_rate = number_in(value("BitRate").value_or(""));
  stream.quality = number_in(value("Quality").value_or(""));
  return stream;
}

Answer answer_command(const RequestHead& request, SettingsStore& settings) {
  if (!request.version.starts_with("HTTP/")) return http_answer("400 Bad Request", "");
  if (request.method != "GET") return http_answer("501 Not Implemented", "");
  std::string_view name = request.path;
  if (!name.starts_with(kFolder) || !name.ends_with(kExtension)) return http_answer("404 Not Found", "");
  name.remove_prefix(kFolder.size());
  name.remove_suffix(kExtension.size());
  if (name.empty() || name.find('/') != std::string_view::npos) return http_answer("404 Not Found", "");
  if (name == "inquiry") return answer_inquiry(request.query, settings);
  if (request.query.find('=') == std::string::npos) return http_answer("400 Bad Request", "");
  if (!settings.apply(name, request.query)) return http_answer("400 Bad Request", "");
  return no_content();
}

}  // namespace vexa::camera
