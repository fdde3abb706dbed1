// SPDX-License-Identifier: Apache-2.0
// JSON text as a tree whose every value knows its line, so that what is wrong can be pointed at.
#ifndef MODELS_JSON_TEXT_H_
#define MODELS_JSON_TEXT_H_

#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace vexa::models {

struct Member;

struct Node {
  enum class Kind { kNull, kBoolean, kInteger, kFraction, kString, kArray, kObject };

  Kind kind = Kind::kNull;
  int line = 0;  ///< counted from 1; of a member its key's, else where the value ends (a list or object: begins)
  bool flag = false;
  std::int64_t number = 0;
  std::string text = {};         ///< of a string; of a fraction, as it is written
  std::vector<Node> items = {};  ///< of an array
  std::vector<Member> members;   ///< of an object, each key once

  /// Null when there is no such member.
  [[nodiscard]] const Node* find(std::string_view key) const;
};

struct Member {
  std::string key;
  Node value;
};

struct JsonProblem {
  int line;
  std::string key;  ///< of a member that occurs twice
  std::string text;
};

/// Refuses also what JSON leaves open: a key that occurs twice, an integer that 64 bits do not hold, nesting deeper
/// than 16.
[[nodiscard]] std::variant<Node, JsonProblem> parse_json(std::string_view text);

}  // namespace vexa::models

#endif  // MODELS_JSON_TEXT_H_
