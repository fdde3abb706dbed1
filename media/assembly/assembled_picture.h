// The result of assembling a picture's packets.
#pragma once

#include <algorithm>
#include <cstdint>

#include "runtime/base/bytes.h"
#include "transport/wire/rtp_header.h"
#include "vexa/video_info.h"

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

/// The packet's bytes after its RTP header.
inline Bytes payload_of(const SPacketInfo& packet) {
  return Bytes(packet.data, packet.length).subspan(std::min<std::size_t>(kRtpHeaderSize, packet.length));
}

}  // namespace vexa
