// SPDX-License-Identifier: Apache-2.0
// JPEG as RTP payloads (RFC 2435).
#include <algorithm>
#include <utility>

#include "virtual_camera/codec/rtp_packetiser.h"

namespace vexa::camera {
namespace {

constexpr std::uint8_t kType420 = 1;
constexpr std::uint8_t kWithRestart = 64;
constexpr std::uint8_t kTablesInBand = 255;
constexpr std::uint8_t kTablesLength = 128;

void put_number(std::vector<std::uint8_t>& to, unsigned value) {
  to.push_back(static_cast<std::uint8_t>(value >> 8U));
  to.push_back(static_cast<std::uint8_t>(value));
}

std::vector<std::uint8_t> jpeg_header(const JpegPicture& picture, std::size_t offset) {
  const bool restart = picture.restart_interval != 0;
  std::vector<std::uint8_t> header = {0, static_cast<std::uint8_t>(offset >> 16U)};
  put_number(header, static_cast<unsigned>(offset & 0xFFFFU));
  header.push_back(static_cast<std::uint8_t>(kType420 + (restart ? kWithRestart : 0)));
  header.push_back(kTablesInBand);
  header.push_back(static_cast<std::uint8_t>(picture.width / 8));
  header.push_back(static_cast<std::uint8_t>(picture.height / 8));
  if (restart) {
    put_number(header, picture.restart_interval);
    put_number(header, 0xFFFF);  // packets hold no whole intervals
  }
  return header;
}

}  // namespace

PacketisedPicture packetise_jpeg(const JpegPicture& picture, std::span<const std::uint8_t> user_data,
                                 std::size_t max_payload) {
  PacketisedPicture packets;
  std::size_t offset = 0;
  while (offset < picture.scan.size()) {
    std::vector<std::uint8_t> head = jpeg_header(picture, offset);
    if (offset == 0) {
      head.insert(head.begin(), user_data.begin(), user_data.end());
      put_number(head, 0);
      put_number(head, kTablesLength);
      head.insert(head.end(), picture.tables.begin(), picture.tables.end());
    }
    const std::size_t room = std::max(max_payload, head.size() + 1) - head.size();
    const std::size_t size = std::min(room, picture.scan.size() - offset);
    packets.add_payload(head, std::span(picture.scan).subspan(offset, size));
    offset += size;
  }
  return packets;
}

}  // namespace vexa::camera
