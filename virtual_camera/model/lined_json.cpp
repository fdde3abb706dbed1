#include "virtual_camera/model/lined_json.h"

#include <cstddef>
#include <iterator>
#include <set>
#include <utility>
#include <vector>

namespace vexa::camera {
namespace {

using Json = nlohmann::ordered_json;

constexpr int kDeepest = 16;

// Hands the parser its characters and tells where the last one it took stands.
class TracedText {
 public:
  using iterator_category = std::input_iterator_tag;
  using value_type = char;
  using difference_type = std::ptrdiff_t;
  using pointer = const char*;
  using reference = const char&;

  TracedText(const char* at, const char** taken) : at_(at), taken_(taken) {}

  reference operator*() const {
    *taken_ = at_;
    return *at_;
  }
  TracedText& operator++() {
    ++at_;
    return *this;
  }
  bool operator==(const TracedText& other) const { return at_ == other.at_; }
  bool operator!=(const TracedText& other) const { return at_ != other.at_; }

 private:
  const char* at_;
  const char** taken_;
};

// Follows the parser: the line at which each value begins, in the order of the text.
class LineTracker {
 public:
  explicit LineTracker(std::string_view text) : counted_(text.data()), taken_(text.data()) {}

  const char** taken() { return &taken_; }

  int line() {
    for (; counted_ != taken_; ++counted_) line_ += *counted_ == '\n' ? 1 : 0;
    return line_;
  }

  void follow(int depth, Json::parse_event_t event, const Json& parsed) {
    using Event = Json::parse_event_t;
    const bool opens = event == Event::object_start || event == Event::array_start;
    if (opens && depth == kDeepest) refuse("", "nested too deeply");
    if (event == Event::object_start) keys_.emplace_back();
    if (event == Event::object_end) keys_.pop_back();
    if (event == Event::key) {
      const auto name = parsed.get<std::string>();
      if (!keys_.back().insert(name).second) refuse(name, "occurs twice");
    }
    if (event == Event::object_end || event == Event::array_end) return;
    if (!behind_key_) lines_.push_back(line());
    behind_key_ = event == Event::key;
  }

  void refuse(std::string key, std::string text) {
    if (!mistake_) mistake_ = JsonMistake{line(), std::move(key), std::move(text)};
  }

  [[nodiscard]] const std::optional<JsonMistake>& mistake() const { return mistake_; }
  [[nodiscard]] const std::vector<int>& lines() const { return lines_; }

 private:
  const char* counted_;
  const char* taken_;
  int line_ = 1;
  bool behind_key_ = false;  // a member's line is its key's
  std::vector<std::set<std::string>> keys_;
  std::vector<int> lines_;
  std::optional<JsonMistake> mistake_;
};

// Goes through the values in the order of the text.
void assign_lines(const Json& value, std::vector<int>::const_iterator& line, std::map<const Json*, int>& lines) {
  lines[&value] = *line++;
  if (!value.is_structured()) return;
  for (const Json& item : value) assign_lines(item, line, lines);
}

}  // namespace

LinedJson::LinedJson(std::string_view text) {
  LineTracker tracker(text);
  const TracedText begin(text.data(), tracker.taken());
  const TracedText end(text.data() + text.size(), tracker.taken());
  const auto follow = [&tracker](int depth, Json::parse_event_t event, const Json& parsed) {
    tracker.follow(depth, event, parsed);
    return true;
  };
  root_ = Json::parse(begin, end, follow, false);
  if (root_.is_discarded()) tracker.refuse("", "not JSON: something is missing, too many or misspelt here");
  mistake_ = tracker.mistake();
  if (mistake_) return;
  auto line = tracker.lines().cbegin();
  assign_lines(root_, line, lines_);
}

int LinedJson::line_of(const nlohmann::ordered_json& value) const { return lines_.at(&value); }

}  // namespace vexa::camera
