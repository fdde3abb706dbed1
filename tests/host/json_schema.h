// SPDX-License-Identifier: Apache-2.0
// The document that describes vexactl's JSON, and whether a text is as it says.
#pragma once

#include <algorithm>
#include <fstream>
#include <nlohmann/json.hpp>
#include <string>
#include <utility>

namespace vexa_test {

// The parts of JSON Schema that the document uses; any other key counts as a violation.
class JsonSchema {
 public:
  JsonSchema() { std::ifstream(VEXA_SOURCE_DIR "/docs/vexactl.schema.json") >> document_; }

  [[nodiscard]] const nlohmann::json& definitions() const { return document_.at("$defs"); }

  // Where the text breaks the definition of that name; empty when nowhere.
  [[nodiscard]] std::string violation(const std::string& text, const std::string& definition) const {
    const auto value = nlohmann::json::parse(text, nullptr, false);
    if (value.is_discarded()) return "not JSON: " + text;
    return check(value, definitions().at(definition), definition);
  }

 private:
  using Json = nlohmann::json;

  static bool has_type(const Json& value, const std::string& type) {
    if (type == "number") return value.is_number();
    if (type == "integer") return value.is_number_integer();
    if (type == "string") return value.is_string();
    if (type == "boolean") return value.is_boolean();
    if (type == "array") return value.is_array();
    if (type == "object") return value.is_object();
    return type == "null" && value.is_null();
  }

  static bool has_one_of_types(const Json& value, const Json& types) {
    if (types.is_string()) return has_type(value, types);
    for (const Json& type : types) {
      if (has_type(value, type)) return true;
    }
    return false;
  }

  [[nodiscard]] std::string check(const Json& value, const Json& schema, const std::string& place) const {
    for (const auto& [key, rule] : schema.items()) {
      std::string found;
      if (key == "type") {
        if (!has_one_of_types(value, rule)) found = place + " is not " + rule.dump() + ": " + value.dump();
      } else if (key == "enum") {
        if (std::find(rule.begin(), rule.end(), value) == rule.end()) found = place + " is none of " + rule.dump();
      } else if (key == "$ref") {
        found = check(value, document_.at(nlohmann::json::json_pointer(rule.get<std::string>().substr(1))), place);
      } else if (key == "items") {
        for (std::size_t i = 0; value.is_array() && i < value.size() && found.empty(); ++i) {
          found = check(value[i], rule, place + "[" + std::to_string(i) + "]");
        }
      } else if (key == "required") {
        for (const Json& name : rule) {
          if (!value.contains(name.get<std::string>())) found = place + " lacks " + name.dump();
        }
      } else if (key == "properties") {
        found = check_members(value, rule, place);
      } else if (key != "description" && key != "additionalProperties") {
        found = "the schema's " + key + " is not known here";
      }
      if (!found.empty()) return found;
    }
    return "";
  }

  [[nodiscard]] std::string check_members(const Json& value, const Json& members, const std::string& place) const {
    for (const auto& [name, member] : value.items()) {
      if (!members.contains(name)) return place + " has an unknown member " + name;
      if (const std::string found = check(member, members[name], place + "." + name); !found.empty()) return found;
    }
    return "";
  }

  Json document_;
};

}  // namespace vexa_test
