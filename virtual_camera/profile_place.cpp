#include "virtual_camera/profile_place.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <nlohmann/json.hpp>
#include <utility>

namespace vexa::camera {

ProfilePlace::ProfilePlace(const nlohmann::ordered_json* json, std::string key) : json_(json), key_(std::move(key)) {}

void ProfilePlace::refuse(std::string text) const { throw ProfileMistake{key_, std::move(text)}; }

const ProfilePlace& ProfilePlace::with_only(std::initializer_list<std::string_view> keys) const {
  if (json_ == nullptr) return *this;
  if (!json_->is_object()) refuse("must be an object");
  for (const auto& [key, value] : json_->items()) {
    if (std::find(keys.begin(), keys.end(), key) == keys.end()) refuse(fmt::format("\"{}\" is not known here", key));
  }
  return *this;
}

ProfilePlace ProfilePlace::optional(const char* key) const {
  const std::string path = key_.empty() ? key : fmt::format("{}.{}", key_, key);
  if (json_ == nullptr || !json_->is_object() || !json_->contains(key)) return {nullptr, path};
  return {&(*json_)[key], path};
}

ProfilePlace ProfilePlace::required(const char* key) const {
  ProfilePlace place = optional(key);
  if (!place) place.refuse("is missing");
  return place;
}

std::vector<ProfilePlace> ProfilePlace::items() const {
  std::vector<ProfilePlace> places;
  if (json_ == nullptr) return places;
  if (!json_->is_array() || json_->empty()) refuse("must be a list that is not empty");
  for (const auto& item : *json_) places.emplace_back(&item, fmt::format("{}[{}]", key_, places.size()));
  return places;
}

std::string ProfilePlace::text() const {
  if (json_ == nullptr) return {};
  if (!json_->is_string()) refuse("must be a text");
  return json_->get<std::string>();
}

std::string ProfilePlace::one_of(std::initializer_list<std::string_view> words) const {
  std::string word = text();
  if (json_ != nullptr && std::find(words.begin(), words.end(), word) == words.end()) {
    refuse(fmt::format("must be one of {}", fmt::join(words, ", ")));
  }
  return word;
}

int ProfilePlace::number(int least, int most) const {
  if (json_ == nullptr) return 0;
  if (!json_->is_number_integer()) refuse("must be a whole number");
  const auto value = json_->get<std::int64_t>();
  if (value < least || value > most) refuse(fmt::format("must be from {} to {}", least, most));
  return static_cast<int>(value);
}

bool ProfilePlace::flag() const {
  if (json_ == nullptr) return false;
  if (!json_->is_boolean()) refuse("must be true or false");
  return json_->get<bool>();
}

PictureSize ProfilePlace::size() const {
  const std::string word = text();
  const char* end = word.data() + word.size();
  PictureSize size;
  const auto [middle, first] = std::from_chars(word.data(), end, size.width);
  if (first != std::errc() || middle == end || *middle != 'x') refuse("must be WIDTHxHEIGHT");
  const auto [last, second] = std::from_chars(middle + 1, end, size.height);
  const bool in_range = size.width > 0 && size.width < 10000 && size.height > 0 && size.height < 10000;
  if (second != std::errc() || last != end || !in_range) refuse("must be WIDTHxHEIGHT");
  return size;
}

}  // namespace vexa::camera
