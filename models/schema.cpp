// SPDX-License-Identifier: Apache-2.0
#include "models/schema.h"

#include <algorithm>
#include <cstddef>
#include <string_view>

namespace vexa::models {
namespace {

using Kind = Node::Kind;
using Found = std::optional<Complaint>;

struct TypeName {
  std::string_view word;
  Kind kind;
  const char* text;
};

constexpr TypeName kTypes[] = {{"object", Kind::kObject, "an object"},
                               {"array", Kind::kArray, "a list"},
                               {"string", Kind::kString, "a text"},
                               {"integer", Kind::kInteger, "a whole number"},
                               {"boolean", Kind::kBoolean, "true or false"}};

std::string words_of(const Node& list) {
  std::string text;
  for (const Node& item : list.items) text += (text.empty() ? "\"" : ", \"") + item.text + "\"";
  return text;
}

class Checker {
 public:
  explicit Checker(const Node& root) : root_(root) {}

  Found check(const Node& schema, const Node& value, const std::string& path) const {
    if (const Node* reference = schema.find("$ref")) {
      if (const Node* named = resolve(reference->text)) {
        if (Found found = check(*named, value, path)) return found;
      }
    }
    if (Found found = check_type(schema, value, path)) return found;
    switch (value.kind) {
      case Kind::kObject:
        return check_object(schema, value, path);
      case Kind::kArray:
        return check_array(schema, value, path);
      case Kind::kString:
        return check_text(schema, value, path);
      case Kind::kInteger:
        return check_number(schema, value, path);
      case Kind::kNull:
      case Kind::kBoolean:
      case Kind::kFraction:
        break;
    }
    return std::nullopt;
  }

 private:
  // "#/$defs/NAME"
  [[nodiscard]] const Node* resolve(std::string_view reference) const {
    constexpr std::string_view kPlace = "#/$defs/";
    const Node* definitions = root_.find("$defs");
    if (definitions == nullptr || !reference.starts_with(kPlace)) return nullptr;
    return definitions->find(reference.substr(kPlace.size()));
  }

  static Found check_type(const Node& schema, const Node& value, const std::string& path) {
    const Node* type = schema.find("type");
    if (type == nullptr) return std::nullopt;
    for (const TypeName& name : kTypes) {
      if (type->text == name.word && value.kind != name.kind) {
        return Complaint{value.line, path, std::string("must be ") + name.text};
      }
    }
    return std::nullopt;
  }

  static bool is_below(const Node& schema, std::string_view key, std::int64_t value) {
    const Node* limit = schema.find(key);
    return limit != nullptr && value < limit->number;
  }

  static bool is_above(const Node& schema, std::string_view key, std::int64_t value) {
    const Node* limit = schema.find(key);
    return limit != nullptr && value > limit->number;
  }

  static std::string range(const Node& schema, std::string_view least, std::string_view most) {
    const Node* low = schema.find(least);
    const Node* high = schema.find(most);
    if (high == nullptr) return "at least " + std::to_string(low->number);
    if (low == nullptr) return "at most " + std::to_string(high->number);
    return std::to_string(low->number) + " to " + std::to_string(high->number);
  }

  static Found check_number(const Node& schema, const Node& value, const std::string& path) {
    if (!is_below(schema, "minimum", value.number) && !is_above(schema, "maximum", value.number)) return std::nullopt;
    return Complaint{value.line, path, "must be from " + range(schema, "minimum", "maximum")};
  }

  static Found check_text(const Node& schema, const Node& value, const std::string& path) {
    const auto length = static_cast<std::int64_t>(value.text.size());
    if (is_below(schema, "minLength", length) || is_above(schema, "maxLength", length)) {
      return Complaint{value.line, path, "must have " + range(schema, "minLength", "maxLength") + " characters"};
    }
    const Node* words = schema.find("enum");
    if (words == nullptr) return std::nullopt;
    const bool known = std::any_of(words->items.begin(), words->items.end(),
                                   [&value](const Node& word) { return word.text == value.text; });
    if (known) return std::nullopt;
    return Complaint{value.line, path, "must be one of " + words_of(*words)};
  }

  Found check_array(const Node& schema, const Node& value, const std::string& path) const {
    const auto count = static_cast<std::int64_t>(value.items.size());
    if (is_below(schema, "minItems", count) || is_above(schema, "maxItems", count)) {
      return Complaint{value.line, path, "must have " + range(schema, "minItems", "maxItems") + " items"};
    }
    const Node* items = schema.find("items");
    for (std::size_t i = 0; items != nullptr && i < value.items.size(); ++i) {
      if (Found found = check(*items, value.items[i], item_path(path, i))) return found;
    }
    return schema.find("uniqueItems") == nullptr ? std::nullopt : check_unique(value, path);
  }

  static Found check_unique(const Node& value, const std::string& path) {
    for (std::size_t i = 0; i < value.items.size(); ++i) {
      for (std::size_t j = 0; j < i; ++j) {
        if (value.items[i].text != value.items[j].text) continue;
        return Complaint{value.items[i].line, item_path(path, i), "occurs twice in its list"};
      }
    }
    return std::nullopt;
  }

  Found check_object(const Node& schema, const Node& value, const std::string& path) const {
    const Node* properties = schema.find("properties");
    for (const Member& member : value.members) {
      const Node* property = properties == nullptr ? nullptr : properties->find(member.key);
      Found found = property == nullptr ? check_additional(schema, member, path)
                                        : check(*property, member.value, member_path(path, member.key));
      if (found) return found;
    }
    const Node* required = schema.find("required");
    for (std::size_t i = 0; required != nullptr && i < required->items.size(); ++i) {
      const std::string& key = required->items[i].text;
      if (value.find(key) == nullptr) return Complaint{value.line, member_path(path, key), "is missing"};
    }
    return std::nullopt;
  }

  static Found check_additional(const Node& schema, const Member& member, const std::string& path) {
    const Node* additional = schema.find("additionalProperties");
    if (additional == nullptr || additional->flag) return std::nullopt;
    const Node* properties = schema.find("properties");
    std::string known;
    for (std::size_t i = 0; properties != nullptr && i < properties->members.size(); ++i) {
      known += (i == 0 ? "" : ", ") + properties->members[i].key;
    }
    return Complaint{member.value.line, member_path(path, member.key), "is not known here; known are: " + known};
  }

  const Node& root_;
};

}  // namespace

std::string member_path(const std::string& path, const std::string& key) {
  return path.empty() ? key : path + "." + key;
}

std::string item_path(const std::string& path, std::size_t index) { return path + "[" + std::to_string(index) + "]"; }

std::optional<Complaint> check_against(const Node& schema, const Node& value) {
  return Checker(schema).check(schema, value, "");
}

}  // namespace vexa::models
