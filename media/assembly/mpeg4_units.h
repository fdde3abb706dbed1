// MPEG-4 Visual pictures from RTP packets (RFC 3016): the payloads joined as they are.
#pragma once

#include <span>

#include "media/assembly/assembled_picture.h"
#include "media/assembly/picture_rules.h"

namespace vexa {

/// Writes the picture into `frame`. Its fourth byte, the one after the first start code, gives the frame's type.
AssembledPicture assemble_mpeg4(PacketRun packets, std::span<unsigned char> frame);

/// A key picture begins with a visual object sequence or a group of pictures.
extern const PictureRules kMpeg4Rules;

}  // namespace vexa
