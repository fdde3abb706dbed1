// SPDX-License-Identifier: Apache-2.0
// Pictures from RTP packets, a file of each codec: H.264 (RFC 6184) in h264_units.cpp, MPEG-4 Visual (RFC 3016) in
// mpeg4_units.cpp, JPEG (RFC 2435) in rtp_jpeg.cpp.
#pragma once

#include <optional>
#include <span>

#include "media/assembly/picture_rules.h"

namespace vexa {

// H.264: single NAL units and fragmentation units become an Annex B byte stream.

/// Writes the picture into `frame`, a 4-byte start code before each NAL unit. The last unit that has a type gives the
/// frame's. Packets without a payload add nothing.
AssembledPicture assemble_h264(PacketRun packets, std::span<unsigned char> frame);

/// The packet's payload when it is a single unit of supplemental information (SEI), else an empty one.
Bytes supplemental_information(const SPacketInfo& packet);

/// A key picture has an IDR slice. It opens with the type of its first NAL unit.
extern const PictureRules kH264Rules;

// MPEG-4 Visual: the payloads joined as they are.

/// Writes the picture into `frame`. Its fourth byte, the one after the first start code, gives the frame's type.
AssembledPicture assemble_mpeg4(PacketRun packets, std::span<unsigned char> frame);

/// A key picture begins with a visual object sequence or a group of pictures.
extern const PictureRules kMpeg4Rules;

// JPEG: a JFIF header and the scan data of all packets.

/// The longest first packet of a picture, RTP header included, and the most room for the header and its scan data.
constexpr std::size_t kJpegFirstPacketRoom = 4096;

/// Whether the payload begins with a camera's block of user data instead of the JPEG header.
bool leads_with_user_data(Bytes payload);

/// Writes the header and the scan data of the picture's first payload into `out`: their length. Nullopt for a payload
/// cut short, tables of another length than two, or when there is no room.
std::optional<std::uint32_t> begin_jfif(std::span<unsigned char> out, Bytes payload);

/// The picture: `beginning`, as begin_jfif made it, and the scan data of `others`, the packets after the first.
AssembledPicture assemble_jpeg(Bytes beginning, PacketRun others, std::span<unsigned char> frame);

/// Every picture is a key picture. One that opens at fragment offset 0 is whole at its front.
extern const PictureRules kJpegRules;

}  // namespace vexa
