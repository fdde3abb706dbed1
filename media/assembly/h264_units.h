// H.264 pictures from RTP packets (RFC 6184): single NAL units and fragmentation units to an Annex B byte stream.
#pragma once

#include <span>

#include "media/assembly/assembled_picture.h"
#include "media/assembly/picture_rules.h"

namespace vexa {

/// Writes the picture into `frame`, a 4-byte start code before each NAL unit. The last unit that has a type gives the
/// frame's. Packets without a payload add nothing.
AssembledPicture assemble_h264(PacketRun packets, std::span<unsigned char> frame);

/// The packet's payload when it is a single unit of supplemental information (SEI), else an empty one.
Bytes supplemental_information(const SPacketInfo& packet);

/// A key picture has an IDR slice. It opens with the type of its first NAL unit.
extern const PictureRules kH264Rules;

}  // namespace vexa
