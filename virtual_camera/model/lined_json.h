// JSON text of which every value knows its line.
#ifndef VIRTUAL_CAMERA_MODEL_LINED_JSON_H_
#define VIRTUAL_CAMERA_MODEL_LINED_JSON_H_

#include <map>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <string_view>

namespace vexa::camera {

// What is wrong with the text itself.
struct JsonMistake {
  int line = 0;
  std::string key;  // that occurs twice
  std::string text;
};

class LinedJson {
 public:
  // Refuses also a key that occurs twice in its object, and nesting deeper than 16.
  explicit LinedJson(std::string_view text);
  LinedJson(const LinedJson&) = delete;
  LinedJson& operator=(const LinedJson&) = delete;

  [[nodiscard]] const std::optional<JsonMistake>& mistake() const { return mistake_; }
  [[nodiscard]] const nlohmann::ordered_json& root() const { return root_; }
  // Counted from 1; of a member its key's.
  [[nodiscard]] int line_of(const nlohmann::ordered_json& value) const;

 private:
  nlohmann::ordered_json root_;
  std::map<const nlohmann::ordered_json*, int> lines_;
  std::optional<JsonMistake> mistake_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_LINED_JSON_H_
