// MPEG-4 Visual pictures from RTP packets (RFC 3016): the payloads joined as they are.
#pragma once

#include <span>

#include "media/assembly/assembled_picture.h"
#include "media/assembly/picture_rules.h"

namespace vexa {

/// Writes the picture into `frame`. Its fourth byte, the one behind the first start code, tells the frame's type.
AssembledPicture assemble_mpeg4(PacketRun packets, std::span<unsigned char> frame);

/// A key picture is led by a visual object sequence or a group of pictures.
extern const PictureRules kMpeg4Rules;

}  // namespace vexa
