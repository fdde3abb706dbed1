// SPDX-License-Identifier: Apache-2.0
#include "host/recording/lost_pictures.h"

#include <fmt/format.h>

#include <nlohmann/json.hpp>

namespace vexa::host {
const std::array<LostPictures::Reason, 7>& LostPictures::reasons() {
  static constexpr std::array<Reason, 7> kReasons = {
      {{"incomplete", "some packets of which never came", &StreamStatistics::framesDroppedIncomplete},
       {"damaged", "damaged", &StreamStatistics::framesDroppedDamaged},
       {"withoutKey", "without the key picture before them", &StreamStatistics::framesDroppedWithoutKey},
       {"tooLarge", "too large", &StreamStatistics::framesDroppedTooLarge},
       {"queue", "because this program was too slow", &StreamStatistics::framesDroppedQueue},
       {"afterStop", "cut off by an outage", &StreamStatistics::framesDroppedAfterStop},
       {"noMemory", "for want of memory", &StreamStatistics::framesDroppedNoMemory}}};
  return kReasons;
}

LostPictures::LostPictures(const StreamStatistics& statistics)
    : pictures_(statistics.framesBegun), packets_(statistics.packetsMissing + statistics.packetsMissingInCamera) {
  for (std::size_t i = 0; i < by_reason_.size(); ++i) {
    by_reason_[i] = statistics.*reasons()[i].count;
    lost_ += by_reason_[i];
  }
}

LostPictures LostPictures::since(const LostPictures& earlier) const {
  LostPictures rest;
  rest.pictures_ = rise(earlier.pictures_, pictures_);
  rest.packets_ = packets_ >= earlier.packets_ ? packets_ - earlier.packets_ : 0;  // late ones are missing no more
  for (std::size_t i = 0; i < by_reason_.size(); ++i) {
    rest.by_reason_[i] = rise(earlier.by_reason_[i], by_reason_[i]);
    rest.lost_ += rest.by_reason_[i];
  }
  return rest;
}

std::string LostPictures::text() const {
  std::string text = fmt::format("{} of {} pictures were lost", lost_, pictures_);
  const char* between = ": ";
  for (std::size_t i = 0; i < by_reason_.size(); ++i) {
    if (by_reason_[i] == 0) continue;
    text += fmt::format("{}{} {}", between, by_reason_[i], reasons()[i].text);
    between = ", ";
  }
  if (packets_ > 0) text += fmt::format("; {} packet{} never came", packets_, packets_ == 1 ? "" : "s");
  return text;
}

nlohmann::ordered_json json_of(const LostPictures& lost) {
  nlohmann::ordered_json json = {
      {"pictures", lost.pictures()}, {"lost", lost.lost()}, {"packetsMissing", lost.packets()}};
  for (std::size_t i = 0; i < LostPictures::reasons().size(); ++i) json[LostPictures::reasons()[i].word] = lost.of(i);
  return json;
}

}  // namespace vexa::host
