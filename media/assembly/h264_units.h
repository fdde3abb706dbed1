// H.264 pictures from RTP packets (RFC 6184): single NAL units and fragmentation units to an Annex B byte stream.
#pragma once

#include <cstdint>
#include <span>

#include "media/assembly/picture_rules.h"

namespace vexa {

enum class Assembly {
  kWhole,
  kUnsupported,  ///< a packet of a kind that is not offered (aggregation), or one cut short
  kTooLarge      ///< the picture does not fit the frame
};

struct AssembledPicture {
  Assembly outcome = Assembly::kWhole;
  std::uint32_t length = 0;      ///< bytes of frame
  std::int32_t frame_type = -1;  ///< an ELibDVideoFrameType value
};

/// Writes the picture into `frame`, a 4-byte start code before each NAL unit. The last unit that tells a type gives the
/// frame's. Packets without a payload add nothing.
AssembledPicture assemble_h264(PacketRun packets, std::span<unsigned char> frame);

/// A key picture has an IDR slice. It opens with the type of its first NAL unit.
extern const PictureRules kH264Rules;

}  // namespace vexa
