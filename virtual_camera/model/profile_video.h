// The part "video" of a profile.
#ifndef VIRTUAL_CAMERA_MODEL_PROFILE_VIDEO_H_
#define VIRTUAL_CAMERA_MODEL_PROFILE_VIDEO_H_

#include <string_view>

#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/model/profile_place.h"

namespace vexa::camera {

// Throws a ProfileMistake. `driver` is the profile's word.
void read_video_part(const ProfilePlace& video, std::string_view driver, CameraProfile& profile);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_MODEL_PROFILE_VIDEO_H_
