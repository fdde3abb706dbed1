// SPDX-License-Identifier: Apache-2.0
// The SDP text (RFC 4566) that answers DESCRIBE.
#ifndef VIRTUAL_CAMERA_SERVER_SESSION_DESCRIPTION_H_
#define VIRTUAL_CAMERA_SERVER_SESSION_DESCRIPTION_H_

#include <cstddef>
#include <string>

#include "virtual_camera/source/picture_source.h"
#include "virtual_camera/values/options.h"

namespace vexa::camera {

// At most `limit` characters: H.264's parameter sets are left out where they would not fit.
[[nodiscard]] std::string describe_session(const CameraOptions& options, const SourceFormat& format, std::size_t limit);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_SESSION_DESCRIPTION_H_
