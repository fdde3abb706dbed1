// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/tour_text.h"

#include <algorithm>

#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

const char* const g_TourSelector[5] = {"A", "B", "C", "D", "E"};

namespace vexa {
namespace {

constexpr std::size_t kNumberRoom = 8;
constexpr std::size_t kSequenceRoom = 256;

std::string short_number(int number) { return format_within(kNumberRoom, "%d", number).text; }

SLibDCameraTourEachSetting read_tour(const std::string& answer, const std::string& key) {
  SLibDCameraTourEachSetting tour;
  tour.sequence.reserve(kSequenceRoom);
  tour.enabled = is_switched_on(answer, key + "=");
  if (const auto text = cgi_value(answer, key + "Sequence=")) read_tour_sequence(std::string(*text), tour.sequence);
  tour.stayTime = answered_number(answer, key + "Staytime=").value_or(tour.stayTime);
  tour.speed = answered_number(answer, key + "Speed=").value_or(tour.speed);
  return tour;
}

bool append_tour(const SLibDCameraTourEachSetting& tour, const std::string& key, int preset_count,
                 std::string& request) {
  const auto sequence = tour_sequence_text(tour.sequence, preset_count);
  if (tour.sequence.empty() || !sequence) return false;
  request += key + "=" + switch_word(tour.enabled);
  request += key + "Sequence=" + *sequence;
  request += key + "Staytime=" + short_number(tour.stayTime);
  request += key + "Period=always";
  request += key + "Speed=" + short_number(tour.speed);
  return true;
}

std::string shadow_key(int number) { return std::string("&STour") + tour_letter(number); }

}  // namespace

int lettered_tours(int count) { return std::clamp(count, 0, static_cast<int>(std::size(g_TourSelector))); }

const char* tour_letter(int number) { return g_TourSelector[number - 1]; }

const char* switch_word(bool on) { return on ? "on" : "off"; }

bool is_switched_on(std::string_view answer, std::string_view key) { return cgi_value(answer, key) == "on"; }

std::optional<int> answered_number(std::string_view answer, std::string_view key) {
  const auto text = cgi_value(answer, key);
  if (!text || text->empty()) return std::nullopt;
  return leading_int(std::string(*text));
}

int resume_time_of(std::string_view answer, std::string_view switch_key, std::string_view time_key) {
  return is_switched_on(answer, switch_key) ? answered_number(answer, time_key).value_or(0) : 0;
}

bool read_tour_sequence(const std::string& text, std::vector<int>& sequence) {
  if (text.empty()) return true;
  // Kept: a single preset does not count as a sequence; cameras list at least two.
  if (text.find(',') == std::string::npos) return false;
  for (std::optional<std::string_view> rest = text; rest; rest = text_after(*rest, ",")) {
    sequence.push_back(leading_int(std::string(text_before(*rest, ','))));
  }
  return true;
}

std::optional<std::string> tour_sequence_text(const std::vector<int>& sequence, int preset_count) {
  std::string text;
  for (const int preset : sequence) {
    // Kept: only a negative number is compared with the count; cameras judge the others.
    if (preset < 0 && preset > preset_count) return std::nullopt;
    if (!text.empty()) text += ',';
    text += short_number(preset);
  }
  return text;
}

SLibDCameraTourInfo read_camera_tours(const std::string& answer, int tour_count) {
  SLibDCameraTourInfo info;
  info.enabled = is_switched_on(answer, "&Tour=");
  info.resumeTime = resume_time_of(answer, "&TourResume=", "&TourRsmTime=");
  for (int number = 1; number <= lettered_tours(tour_count); ++number) {
    info.tours.emplace(number, read_tour(answer, std::string("&Tour") + tour_letter(number)));
  }
  return info;
}

std::optional<std::string> camera_tour_request(const SLibDCameraTourInfo& info, int tour_count, int preset_count) {
  const int count = lettered_tours(tour_count);
  if (count == 0 || info.tours.size() != static_cast<std::size_t>(count)) return std::nullopt;
  std::string request = std::string("Tour=") + switch_word(info.enabled);
  request += info.resumeTime == 0 ? "&TourResume=off" : "&TourResume=on&TourRsmTime=" + short_number(info.resumeTime);
  bool one_is_on = false;
  for (int number = 1; number <= count; ++number) {
    const auto tour = info.tours.find(number);
    if (tour == info.tours.end() || (one_is_on && tour->second.enabled)) return std::nullopt;
    one_is_on = one_is_on || tour->second.enabled;
    if (!append_tour(tour->second, std::string("&Tour") + tour_letter(number), preset_count, request)) {
      return std::nullopt;
    }
  }
  return request;
}

bool is_shadow_tour(int number, int count) { return number >= 1 && number <= lettered_tours(count); }

std::string shadow_tour_start(int number, int count) {
  std::string request = "STour=on";
  for (int each = 1; each <= lettered_tours(count); ++each) {
    request += shadow_key(each) + "=" + switch_word(each == number);
  }
  return request;
}

SLibDShadowTourInfo read_shadow_tours(const std::string& answer, int count) {
  SLibDShadowTourInfo info;
  info.enabled = is_switched_on(answer, "&STour=");
  info.resumeTime = resume_time_of(answer, "&STourResume=", "&STourRsmTime=");
  info.maxRecordTime = answered_number(answer, "&STourMaxRecordTime=").value_or(0);
  for (int number = 1; number <= lettered_tours(count); ++number) {
    SLibDShadowTourEachSetting tour;
    tour.enabled = is_switched_on(answer, shadow_key(number) + "=");
    tour.recordedTime = answered_number(answer, shadow_key(number) + "RecordedTime=").value_or(0);
    info.tours.emplace(number, tour);
  }
  return info;
}

std::optional<std::string> shadow_tour_request(const SLibDShadowTourInfo& info, int count) {
  if (info.tours.size() != static_cast<std::size_t>(lettered_tours(count))) return std::nullopt;
  std::string request = std::string("STour=") + switch_word(info.enabled);
  request +=
      info.resumeTime == 0 ? "&STourResume=off" : "&STourResume=on&STourRsmTime=" + std::to_string(info.resumeTime);
  bool one_is_on = false;
  int number = 0;
  // Kept: letters go by the order of the entries, whatever their keys; hosts number them as they like.
  for (const auto& [key, tour] : info.tours) {
    if (one_is_on && tour.enabled) return std::nullopt;
    one_is_on = one_is_on || tour.enabled;
    const std::string letter_key = shadow_key(++number);
    request.append(letter_key).append("=").append(switch_word(tour.enabled)).append(letter_key).append("Period=always");
  }
  return request;
}

}  // namespace vexa
