// The SDP text (RFC 4566) that answers DESCRIBE.
#ifndef VIRTUAL_CAMERA_SESSION_DESCRIPTION_H_
#define VIRTUAL_CAMERA_SESSION_DESCRIPTION_H_

#include <cstddef>
#include <string>

#include "virtual_camera/options.h"

namespace vexa::camera {

// At most `limit` characters: the parameter sets of the clip, which may be null, are left out where they would not fit.
[[nodiscard]] std::string describe_session(const CameraOptions& options, const PacketisedClip* clip, std::size_t limit);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SESSION_DESCRIPTION_H_
