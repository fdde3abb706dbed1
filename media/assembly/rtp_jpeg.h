// JPEG pictures from RTP packets (RFC 2435): a JFIF header and the scan data of all packets.
#pragma once

#include <optional>
#include <span>

#include "media/assembly/assembled_picture.h"
#include "media/assembly/picture_rules.h"

namespace vexa {

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
