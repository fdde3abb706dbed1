// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/rtp_pictures.h"

#include <algorithm>

#include "media/assembly/frame_writer.h"

namespace vexa {
namespace {

// NAL unit types of ITU-T H.264, table 7-1, and RFC 6184, table 1.
constexpr std::uint8_t kSlice = 1;
constexpr std::uint8_t kIdrSlice = 5;
constexpr std::uint8_t kSupplementalInformation = 6;
constexpr std::uint8_t kSequenceParameterSet = 7;
constexpr std::uint8_t kPictureParameterSet = 8;
constexpr std::uint8_t kAccessUnitDelimiter = 9;
constexpr std::uint8_t kLastSingleUnit = 23;
constexpr std::uint8_t kFragmentA = 28;
constexpr std::uint8_t kFragmentB = 29;

constexpr std::uint8_t kTypeBits = 0x1f;
constexpr std::uint8_t kReferenceBits = 0x60;
constexpr std::uint8_t kFragmentStart = 0x80;
constexpr unsigned char kStartCode[] = {0, 0, 0, 1};

constexpr bool is_fragment(std::uint8_t type) { return type == kFragmentA || type == kFragmentB; }

/// The type of the NAL unit that begins in this payload; 0 when none does.
std::uint8_t beginning_unit(Bytes payload) {
  if (payload.empty()) return 0;
  const std::uint8_t type = payload[0] & kTypeBits;
  if (type >= kSlice && type <= kLastSingleUnit) return type;
  const bool starts = is_fragment(type) && payload.size() > 1 && (payload[1] & kFragmentStart) != 0;
  return starts ? payload[1] & kTypeBits : 0;
}

constexpr std::int32_t frame_type_of(std::uint8_t unit) {
  if (unit == kSlice) return VIDEO_FRAME_H264_DELTA;
  return unit == kIdrSlice ? VIDEO_FRAME_H264_KEY : VIDEO_FRAME_INVALID;
}

bool is_key(PacketRun run) {
  return std::any_of(run.begin(), run.end(),
                     [](const SPacketInfo& packet) { return beginning_unit(payload_of(packet)) == kIdrSlice; });
}

/// A slice opens a picture when its first_mb_in_slice is 0: a single bit 1 (ITU-T H.264, 7.3.3 and 9.1).
std::uint8_t opening(const SPacketInfo& first) {
  const Bytes payload = payload_of(first);
  const std::uint8_t unit = beginning_unit(payload);
  if (unit != kSlice && unit != kIdrSlice) return unit;
  const std::size_t slice_header = is_fragment(payload[0] & kTypeBits) ? 2 : 1;
  return payload.size() > slice_header && (payload[slice_header] & 0x80) != 0 ? unit : 0;
}

bool is_preamble(const SPacketInfo& packet) {
  const std::uint8_t unit = beginning_unit(payload_of(packet));
  return unit == kSequenceParameterSet || unit == kPictureParameterSet;
}

/// A camera that sends parameter sets begins a key picture with them, or with a delimiter: one that begins otherwise
/// may have lost them.
bool opens_whole(PacketRun run, bool preamble_seen) {
  const std::uint8_t unit = beginning_unit(payload_of(run.front()));
  if (!preamble_seen) return unit != 0;
  return unit == kAccessUnitDelimiter || unit == kSequenceParameterSet;
}

/// One packet on its way into the frame.
class UnitWriter {
 public:
  explicit UnitWriter(std::span<unsigned char> frame) : frame_(frame) {}

  /// False for a packet that cannot be taken.
  bool add(Bytes payload) {
    if (payload.empty()) return true;
    const std::uint8_t type = payload[0] & kTypeBits;
    if (type >= kSlice && type <= kLastSingleUnit) {
      begin_unit(type);
      frame_.append(payload);
      return true;
    }
    return is_fragment(type) && add_fragment(payload);
  }

  AssembledPicture picture() const {
    return {frame_.fits() ? Assembly::kWhole : Assembly::kTooLarge, static_cast<std::uint32_t>(frame_.length()),
            frame_type_};
  }

 private:
  // Kept: a fragment of type 29 is read like one of type 28, its decoding order number stays in the unit.
  bool add_fragment(Bytes payload) {
    if (payload.size() < 2) return false;
    const std::uint8_t header = payload[1];
    if ((header & kFragmentStart) != 0) {
      const auto unit = static_cast<std::uint8_t>(header & kTypeBits);
      begin_unit(unit);
      const unsigned char rebuilt[] = {static_cast<unsigned char>(unit | (payload[0] & kReferenceBits))};
      frame_.append(rebuilt);
    }
    frame_.append(payload.subspan(2));
    return true;
  }

  void begin_unit(std::uint8_t unit) {
    frame_type_ = frame_type_of(unit);
    frame_.append(kStartCode);
  }

  FrameWriter frame_;
  std::int32_t frame_type_ = VIDEO_FRAME_INVALID;
};

}  // namespace

AssembledPicture assemble_h264(PacketRun packets, std::span<unsigned char> frame) {
  UnitWriter writer(frame);
  for (const SPacketInfo& packet : packets) {
    if (!writer.add(payload_of(packet))) return {Assembly::kUnsupported, 0, VIDEO_FRAME_INVALID};
  }
  return writer.picture();
}

Bytes supplemental_information(const SPacketInfo& packet) {
  const Bytes payload = payload_of(packet);
  return !payload.empty() && (payload[0] & kTypeBits) == kSupplementalInformation ? payload : Bytes{};
}

const PictureRules kH264Rules{kAnyPayloadType, is_key, opening, is_preamble, opens_whole};

}  // namespace vexa
