// SPDX-License-Identifier: Apache-2.0
#include "models/json_text.h"

#include <algorithm>
#include <cstddef>
#include <limits>
#include <nlohmann/json.hpp>
#include <optional>
#include <utility>

#include "models/counted_text.h"

namespace vexa::models {
namespace {

constexpr std::size_t kDeepest = 16;

Node node_of(Node::Kind kind) {
  Node node;
  node.kind = kind;
  return node;
}

// Takes the parser's events and builds the tree. The parser asks for these names.
class TreeBuilder {
 public:
  using number_integer_t = nlohmann::json::number_integer_t;
  using number_unsigned_t = nlohmann::json::number_unsigned_t;
  using number_float_t = nlohmann::json::number_float_t;
  using string_t = nlohmann::json::string_t;
  using binary_t = nlohmann::json::binary_t;

  explicit TreeBuilder(const int& line) : line_(line) {}

  bool null() { return put(node_of(Node::Kind::kNull)); }
  bool boolean(bool value) {
    Node node = node_of(Node::Kind::kBoolean);
    node.flag = value;
    return put(std::move(node));
  }
  bool number_integer(number_integer_t value) {
    Node node = node_of(Node::Kind::kInteger);
    node.number = value;
    return put(std::move(node));
  }
  bool number_unsigned(number_unsigned_t value) {
    if (value > static_cast<number_unsigned_t>(std::numeric_limits<std::int64_t>::max())) return refuse("too large");
    return number_integer(static_cast<std::int64_t>(value));
  }
  bool number_float(number_float_t, const string_t& text) {
    Node node = node_of(Node::Kind::kFraction);
    node.text = text;
    return put(std::move(node));
  }
  bool string(string_t& value) {
    Node node = node_of(Node::Kind::kString);
    node.text = value;
    return put(std::move(node));
  }
  bool binary(binary_t&) { return refuse("not JSON"); }

  bool start_object(std::size_t) { return open(node_of(Node::Kind::kObject)); }
  bool end_object() { return close(); }
  bool start_array(std::size_t) { return open(node_of(Node::Kind::kArray)); }
  bool end_array() { return close(); }

  bool key(string_t& name) {
    Node& object = *open_.back();
    if (object.find(name) != nullptr) {
      problem_ = JsonProblem{line_, name, "occurs twice"};
      return false;
    }
    object.members.emplace_back().key = name;
    object.members.back().value.line = line_;
    return true;
  }

  bool parse_error(std::size_t, const std::string&, const nlohmann::json::exception&) {
    return refuse("not JSON: something is missing, too many or misspelt here");
  }

  [[nodiscard]] std::optional<JsonProblem> take_problem() { return std::exchange(problem_, std::nullopt); }
  [[nodiscard]] Node take() { return std::move(root_); }

 private:
  bool refuse(std::string text) {
    problem_ = JsonProblem{line_, {}, std::move(text)};
    return false;
  }

  // Where the next value belongs, with its line.
  Node& place() {
    if (open_.empty()) {
      root_.line = line_;
      return root_;
    }
    Node& holder = *open_.back();
    if (holder.kind == Node::Kind::kObject) return holder.members.back().value;
    holder.items.emplace_back().line = line_;
    return holder.items.back();
  }

  Node& put_node(Node value) {
    Node& at = place();
    value.line = at.line;
    at = std::move(value);
    return at;
  }

  bool put(Node value) {
    put_node(std::move(value));
    return true;
  }

  // Open objects are in lists that grow at their ends only, and none is open after the end: the pointers stay valid.
  bool open(Node value) {
    if (open_.size() == kDeepest) return refuse("nested too deeply");
    open_.push_back(&put_node(std::move(value)));
    return true;
  }

  bool close() {
    open_.pop_back();
    return true;
  }

  const int& line_;
  Node root_;
  std::vector<Node*> open_;
  std::optional<JsonProblem> problem_;
};

}  // namespace

const Node* Node::find(std::string_view key) const {
  const auto found = std::find_if(members.begin(), members.end(), [key](const Member& m) { return m.key == key; });
  return found == members.end() ? nullptr : &found->value;
}

std::variant<Node, JsonProblem> parse_json(std::string_view text) {
  int line = 1;
  TreeBuilder builder(line);
  const CountedText begin(text.data(), &line);
  const CountedText end(text.data() + text.size(), &line);
  const bool whole = nlohmann::json::sax_parse(begin, end, &builder);
  if (auto problem = builder.take_problem()) return *std::move(problem);
  if (!whole) return JsonProblem{line, {}, "not JSON"};
  return builder.take();
}

}  // namespace vexa::models
