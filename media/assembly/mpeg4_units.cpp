// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/rtp_pictures.h"

#include <algorithm>

#include "media/assembly/frame_writer.h"

namespace vexa {
namespace {

// Start codes of ISO/IEC 14496-2, table 6-3.
constexpr std::uint8_t kSecondVideoObject = 0x01;
constexpr std::uint8_t kVisualObjectSequence = 0xb0;
constexpr std::uint8_t kGroupOfPictures = 0xb3;
constexpr std::uint8_t kVideoObjectPlane = 0xb6;

constexpr unsigned char kStartCodePrefix[] = {0, 0, 1};
constexpr std::size_t kCodePlace = sizeof kStartCodePrefix;

constexpr std::int32_t type_of_code(std::uint8_t code) {
  switch (code) {
    case kSecondVideoObject:
    case kVideoObjectPlane:
      return VIDEO_FRAME_MPEG4_DELTA;
    case kVisualObjectSequence:
    case kGroupOfPictures:
      return VIDEO_FRAME_MPEG4_KEY;
    default:
      return VIDEO_FRAME_INVALID;
  }
}

/// The type that the picture's fourth byte gives, in whichever packet that is.
std::int32_t frame_type_of(PacketRun run) {
  std::size_t before = 0;
  for (const SPacketInfo& packet : run) {
    const Bytes payload = payload_of(packet);
    if (payload.size() > kCodePlace - before) return type_of_code(payload[kCodePlace - before]);
    before += payload.size();
  }
  return VIDEO_FRAME_INVALID;
}

bool is_key(PacketRun run) { return frame_type_of(run) == VIDEO_FRAME_MPEG4_KEY; }

/// The start code that the payload begins with; 0 when it begins with none.
std::uint8_t opening(const SPacketInfo& first) {
  const Bytes payload = payload_of(first);
  if (payload.size() <= kCodePlace ||
      !std::equal(std::begin(kStartCodePrefix), std::end(kStartCodePrefix), payload.begin()))
    return 0;
  return payload[kCodePlace];
}

bool is_sequence_header(const SPacketInfo& packet) { return opening(packet) == kVisualObjectSequence; }

/// A camera that sends sequence headers begins a key picture with one.
bool opens_with_header(PacketRun run, bool preamble_seen) {
  const std::uint8_t code = opening(run.front());
  return code == kVisualObjectSequence || (!preamble_seen && code == kGroupOfPictures);
}

}  // namespace

AssembledPicture assemble_mpeg4(PacketRun packets, std::span<unsigned char> frame) {
  FrameWriter writer(frame);
  for (const SPacketInfo& packet : packets) writer.append(payload_of(packet));
  return {writer.fits() ? Assembly::kWhole : Assembly::kTooLarge, static_cast<std::uint32_t>(writer.length()),
          frame_type_of(packets)};
}

const PictureRules kMpeg4Rules{kAnyPayloadType, is_key, opening, is_sequence_header, opens_with_header};

}  // namespace vexa
