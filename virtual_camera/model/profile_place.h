// A value in a profile, read strictly: whatever is not as it should be ends the reading with a ProfileMistake.
#ifndef VIRTUAL_CAMERA_MODEL_PROFILE_PLACE_H_
#define VIRTUAL_CAMERA_MODEL_PROFILE_PLACE_H_

#include <cstddef>
#include <initializer_list>
#include <nlohmann/json_fwd.hpp>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/model/camera_profile.h"

namespace vexa::camera {

struct ProfileMistake {
  const nlohmann::ordered_json* at;  // what is wrong, or lacks something
  std::string key;
  std::string text;
};

class ProfilePlace {
 public:
  // Null stands for what is left out; it reads as empty, 0 or false.
  ProfilePlace(const nlohmann::ordered_json* json, std::string key);

  explicit operator bool() const { return json_ != nullptr; }
  // An object with no other members than these.
  const ProfilePlace& with_only(std::initializer_list<std::string_view> keys) const;
  [[nodiscard]] ProfilePlace optional(const char* key) const;
  [[nodiscard]] ProfilePlace required(const char* key) const;
  void forbid(const char* key, const char* text) const;

  [[nodiscard]] std::vector<ProfilePlace> items(std::size_t most) const;
  [[nodiscard]] std::string text() const;
  [[nodiscard]] std::string text(std::size_t most) const;  // of at least one character
  [[nodiscard]] std::string one_of(std::initializer_list<std::string_view> words) const;
  [[nodiscard]] int number(int least, int most) const;
  [[nodiscard]] bool flag() const;
  [[nodiscard]] PictureSize size() const;  // "1920x1080"

  // Lists.
  [[nodiscard]] std::vector<int> ascending(std::size_t most_items, int most) const;
  [[nodiscard]] std::vector<PictureSize> sizes() const;
  [[nodiscard]] std::vector<std::string> words(std::initializer_list<std::string_view> known) const;

  [[noreturn]] void refuse(std::string text) const;

 private:
  const nlohmann::ordered_json* json_;
  std::string key_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_PROFILE_PLACE_H_
