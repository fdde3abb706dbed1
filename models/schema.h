// SPDX-License-Identifier: Apache-2.0
// Checks a JSON value against a JSON schema: the part of the language that the profiles' schema uses.
#ifndef MODELS_SCHEMA_H_
#define MODELS_SCHEMA_H_

#include <optional>
#include <string>

#include "models/json_text.h"

namespace vexa::models {

/// What is wrong with a value of a profile.
struct Complaint {
  int line;
  std::string key;  ///< its path, for instance "video.codecs[1].sizes[0]"
  std::string text;
};

/// The path of a member, or of an item, of what stands at `path`.
[[nodiscard]] std::string member_path(const std::string& path, const std::string& key);
[[nodiscard]] std::string item_path(const std::string& path, std::size_t index);

/// The first thing found that the schema forbids. Knows type, enum, minimum, maximum, minLength, maxLength, required,
/// properties, additionalProperties (false), items, minItems, maxItems, uniqueItems (of texts) and $ref into $defs; of
/// a schema that comes from elsewhere the rest is not looked at.
[[nodiscard]] std::optional<Complaint> check_against(const Node& schema, const Node& value);

/// The profiles' schema. The build makes its .cpp of model_profile.schema.json, so that the two cannot differ.
extern const char* const kSchemaText;

}  // namespace vexa::models

#endif  // MODELS_SCHEMA_H_
