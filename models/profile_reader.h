// A profile's JSON as the records that a driver hands out.
#ifndef MODELS_PROFILE_READER_H_
#define MODELS_PROFILE_READER_H_

#include <variant>

#include "models/json_text.h"
#include "models/schema.h"
#include "vexa/models.h"

namespace vexa::models {

/// `root` obeys the schema; what the schema cannot express is checked here. The profile has no name yet.
[[nodiscard]] std::variant<Profile, Complaint> read_profile(const Node& root);

}  // namespace vexa::models

#endif  // MODELS_PROFILE_READER_H_
