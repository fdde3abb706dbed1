// SPDX-License-Identifier: Apache-2.0
// Reading a profile that obeys the schema into the records that a driver hands out: values by key, and the first thing
// found that is wrong.
#ifndef MODELS_READING_H_
#define MODELS_READING_H_

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <variant>
#include <vector>

#include "models/json_text.h"
#include "models/schema.h"
#include "vexa/common_types.h"
#include "vexa/models.h"

namespace vexa::models {

/// One value of the profile with its path. A part that is missing reads as empty, false and 0. Refers to the parsed
/// document, which outlives it; one thread.
class Part {
 public:
  Part(const Node* node, std::string path) : node_(node), path_(std::move(path)) {}

  explicit operator bool() const { return node_ != nullptr; }
  [[nodiscard]] Part operator[](const char* key) const {
    return {node_ == nullptr ? nullptr : node_->find(key), member_path(path_, key)};
  }
  [[nodiscard]] std::vector<Part> items() const {
    std::vector<Part> parts;
    for (std::size_t i = 0; node_ != nullptr && i < node_->items.size(); ++i) {
      parts.emplace_back(&node_->items[i], item_path(path_, i));
    }
    return parts;
  }
  [[nodiscard]] std::string text() const { return node_ == nullptr ? "" : node_->text; }
  [[nodiscard]] std::int32_t number() const {
    return node_ == nullptr ? 0 : static_cast<std::int32_t>(node_->number);  // the schema bounds every number
  }
  [[nodiscard]] bool flag() const { return node_ != nullptr && node_->flag; }
  [[nodiscard]] Complaint complain(std::string text) const {
    return {node_ == nullptr ? 0 : node_->line, path_, std::move(text)};
  }
  /// The same for a member that this part should have.
  [[nodiscard]] Complaint complain_of(const char* key, std::string text) const {
    const Part part = (*this)[key];
    const Node* place = part ? part.node_ : node_;
    return {place == nullptr ? 0 : place->line, part.path_, std::move(text)};
  }

 private:
  const Node* node_;
  std::string path_;
};

/// Keeps the first complaint of one profile; those after it are dropped. One thread.
class Complaints {
 public:
  void add(Complaint complaint) {
    if (!first_) first_ = std::move(complaint);
  }
  /// Adds it unless the condition holds.
  void demand(bool condition, const Part& part, const char* text) {
    if (!condition) add(part.complain(text));
  }
  [[nodiscard]] const std::optional<Complaint>& first() const { return first_; }

 private:
  std::optional<Complaint> first_;
};

/// The items' numbers; each must be above the one before.
[[nodiscard]] std::vector<std::int32_t> read_ascending(const Part& list, Complaints& complaints);

/// "1920x1080".
[[nodiscard]] SLibDResolutionInfo read_size(const Part& size, Complaints& complaints);

/// Fills codecs, streams, counts, flip and outputs from the "video" part: video_reader.cpp.
void read_video(const Part& video, Profile& profile, Complaints& complaints);

/// The whole profile, which has no name yet; what the schema cannot say is checked here: profile_reader.cpp.
[[nodiscard]] std::variant<Profile, Complaint> read_profile(const Node& root);

}  // namespace vexa::models

#endif  // MODELS_READING_H_
