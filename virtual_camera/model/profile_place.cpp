#include "virtual_camera/model/profile_place.h"

#include <fmt/format.h>

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <limits>
#include <nlohmann/json.hpp>
#include <utility>

namespace vexa::camera {
namespace {

constexpr std::size_t kMostItems = 32;
constexpr std::size_t kMostDigits = 4;

// Takes a number of one to four digits that do not begin with 0.
bool take_pixels(std::string_view& text, int& pixels) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), pixels);
  const auto digits = static_cast<std::size_t>(end - text.data());
  const bool taken = error == std::errc() && digits <= kMostDigits && pixels > 0 && text.front() != '0';
  text.remove_prefix(digits);
  return taken;
}

// A list's item that an earlier one equals is refused.
template <typename Value>
void add_new(const ProfilePlace& item, Value value, std::vector<Value>& values) {
  if (std::find(values.begin(), values.end(), value) != values.end()) item.refuse("occurs twice in its list");
  values.push_back(std::move(value));
}

}  // namespace

ProfilePlace::ProfilePlace(const nlohmann::ordered_json* json, std::string key) : json_(json), key_(std::move(key)) {}

void ProfilePlace::refuse(std::string text) const { throw ProfileMistake{json_, key_, std::move(text)}; }

const ProfilePlace& ProfilePlace::with_only(std::initializer_list<std::string_view> keys) const {
  if (json_ == nullptr) return *this;
  if (!json_->is_object()) refuse("must be an object");
  for (const auto& [key, value] : json_->items()) {
    if (std::find(keys.begin(), keys.end(), key) != keys.end()) continue;
    optional(key.c_str()).refuse(fmt::format("is not known here; known are: {}", fmt::join(keys, ", ")));
  }
  return *this;
}

ProfilePlace ProfilePlace::optional(const char* key) const {
  const std::string path = key_.empty() ? key : fmt::format("{}.{}", key_, key);
  if (json_ == nullptr || !json_->is_object()) return {nullptr, path};
  const auto found = json_->find(key);
  return {found == json_->end() ? nullptr : &*found, path};
}

ProfilePlace ProfilePlace::required(const char* key) const {
  ProfilePlace place = optional(key);
  if (!place) throw ProfileMistake{json_, place.key_, "is missing"};
  return place;
}

void ProfilePlace::forbid(const char* key, const char* text) const {
  if (const ProfilePlace place = optional(key)) place.refuse(text);
}

std::vector<ProfilePlace> ProfilePlace::items(std::size_t most) const {
  std::vector<ProfilePlace> places;
  if (json_ == nullptr) return places;
  if (!json_->is_array()) refuse("must be a list");
  if (json_->empty() || json_->size() > most) refuse(fmt::format("must have 1 to {} items", most));
  for (const auto& item : *json_) places.emplace_back(&item, fmt::format("{}[{}]", key_, places.size()));
  return places;
}

std::string ProfilePlace::text() const {
  if (json_ == nullptr) return {};
  if (!json_->is_string()) refuse("must be a text");
  return json_->get<std::string>();
}

std::string ProfilePlace::text(std::size_t most) const {
  std::string word = text();
  if (word.empty() || word.size() > most) refuse(fmt::format("must have 1 to {} characters", most));
  return word;
}

std::string ProfilePlace::one_of(std::initializer_list<std::string_view> words) const {
  std::string word = text();
  if (json_ != nullptr && std::find(words.begin(), words.end(), word) == words.end()) {
    refuse(fmt::format("must be one of \"{}\"", fmt::join(words, "\", \"")));
  }
  return word;
}

int ProfilePlace::number(int least, int most) const {
  if (json_ == nullptr) return 0;
  if (!json_->is_number_integer()) refuse("must be a whole number");
  constexpr auto kLargest = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
  const bool too_large = json_->is_number_unsigned() && json_->get<std::uint64_t>() > kLargest;
  const auto value = json_->get<std::int64_t>();
  if (too_large || value < least || value > most) refuse(fmt::format("must be from {} to {}", least, most));
  return static_cast<int>(value);
}

bool ProfilePlace::flag() const {
  if (json_ == nullptr) return false;
  if (!json_->is_boolean()) refuse("must be true or false");
  return json_->get<bool>();
}

PictureSize ProfilePlace::size() const {
  const std::string word = text();
  std::string_view rest = word;
  PictureSize size;
  bool right = take_pixels(rest, size.width) && rest.starts_with('x');
  if (right) {
    rest.remove_prefix(1);
    right = take_pixels(rest, size.height) && rest.empty();
  }
  if (!right) refuse("must be WIDTHxHEIGHT in pixels, for instance \"640x480\"");
  return size;
}

std::vector<int> ProfilePlace::ascending(std::size_t most_items, int most) const {
  std::vector<int> numbers;
  for (const ProfilePlace& item : items(most_items)) {
    const int number = item.number(1, most);
    if (!numbers.empty() && number <= numbers.back()) item.refuse("must be above the one before it");
    numbers.push_back(number);
  }
  return numbers;
}

std::vector<PictureSize> ProfilePlace::sizes() const {
  std::vector<PictureSize> sizes;
  for (const ProfilePlace& item : items(kMostItems)) add_new(item, item.size(), sizes);
  return sizes;
}

std::vector<std::string> ProfilePlace::words(std::initializer_list<std::string_view> known) const {
  std::vector<std::string> words;
  for (const ProfilePlace& item : items(kMostItems)) add_new(item, item.one_of(known), words);
  return words;
}

}  // namespace vexa::camera
