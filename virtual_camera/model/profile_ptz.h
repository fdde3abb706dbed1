// The part "ptz" of a profile.
#ifndef VIRTUAL_CAMERA_MODEL_PROFILE_PTZ_H_
#define VIRTUAL_CAMERA_MODEL_PROFILE_PTZ_H_

#include <optional>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/model/profile_place.h"

namespace vexa::camera {

// Nothing where the part is left out. Throws a ProfileMistake.
[[nodiscard]] std::optional<PtzProfile> ptz_part(const ProfilePlace& ptz);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_PROFILE_PTZ_H_
