#include "device/cgi/shadow_tour_text.h"

#include "device/cgi/tour_text.h"

namespace vexa {
namespace {

std::string shadow_key(int number) { return std::string("&STour") + tour_letter(number); }

}  // namespace

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
