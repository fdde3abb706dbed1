// The profiles' schema as text. The build makes its .cpp from model_profile.schema.json, so both are always the same.
#ifndef MODELS_SCHEMA_TEXT_H_
#define MODELS_SCHEMA_TEXT_H_

namespace vexa::models {

extern const char* const kSchemaText;

}  // namespace vexa::models

#endif  // MODELS_SCHEMA_TEXT_H_
