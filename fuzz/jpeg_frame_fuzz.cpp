// SPDX-License-Identifier: Apache-2.0
// The JPEG file that the driver makes of a picture's first RTP payload: another reader of JPEG files finds the size,
// the tables and the scan data of the payload in it.
#include <vector>

#include "fuzz/check.h"
#include "media/assembly/rtp_pictures.h"
#include "virtual_camera/codec/jpeg_picture.h"

namespace {

using vexa_fuzz::check;

constexpr std::size_t kTypeAt = 4;
constexpr std::size_t kWidthAt = 6;  // in units of 8 pixels, as the height after it

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::vector<unsigned char> payload(data, data + size);
  std::vector<unsigned char> file(vexa::kJpegFirstPacketRoom);
  const auto length = vexa::begin_jfif(file, payload);
  if (!length) return 0;
  check(*length <= file.size());
  file.resize(*length);
  check(file.size() > 4 && file[0] == 0xff && file[1] == 0xd8);
  const auto picture = vexa::camera::read_jpeg(file);
  if (!picture || vexa::leads_with_user_data(payload)) return 0;
  check(picture->width == 8U * payload[kWidthAt] && picture->height == 8U * payload[kWidthAt + 1]);
  check((payload[kTypeAt] >= 64) == (picture->restart_interval != 0) || picture->restart_interval == 0);
  check(picture->scan.size() <= payload.size());
  return 0;
}
