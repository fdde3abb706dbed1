// SPDX-License-Identifier: Apache-2.0
// What the packet collector has to know about a codec.
#pragma once

#include <algorithm>
#include <cstdint>
#include <span>

#include "runtime/base/bytes.h"
#include "transport/wire/rtp_header.h"
#include "vexa/video_info.h"

namespace vexa {

/// The packets of one picture, in sequence order; each holds at least an RTP header.
using PacketRun = std::span<const SPacketInfo>;

constexpr int kAnyPayloadType = -1;

struct PictureRules {
  /// The RTP payload type of the packets that are collected, or kAnyPayloadType.
  int payload_type;
  /// The picture can be shown without those before it.
  bool (*is_key)(PacketRun run);
  /// How the picture's first packet begins it: a code of the codec's own, 0 when it can only continue one.
  std::uint8_t (*opening)(const SPacketInfo& first);
  /// The packet holds what key pictures of this camera open with (parameter sets).
  bool (*is_preamble)(const SPacketInfo& packet);
  /// Whether a key picture that opens this way is whole at its front, judged by itself alone; `preamble_seen`:
  /// the camera sends preambles.
  bool (*opens_whole)(PacketRun run, bool preamble_seen);
};

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
