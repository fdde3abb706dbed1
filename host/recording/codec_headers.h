// What a container keeps of a stream's first picture, to be read before any picture.
#ifndef HOST_RECORDING_CODEC_HEADERS_H_
#define HOST_RECORDING_CODEC_HEADERS_H_

#include <cstdint>
#include <string>
#include <vector>

namespace vexa::host {

// The parameter sets of an H.264 key picture, start codes included; the headers in front of the first plane of an
// MPEG-4 key picture; nothing of JPEG, or where there is none. `codec` is the camera's name for it.
[[nodiscard]] std::vector<std::uint8_t> codec_headers(const std::string& codec,
                                                      const std::vector<std::uint8_t>& key_picture);

}  // namespace vexa::host

#endif  // HOST_RECORDING_CODEC_HEADERS_H_
