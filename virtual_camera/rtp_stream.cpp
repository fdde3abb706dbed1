#include "virtual_camera/rtp_stream.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace vexa::camera {
namespace {

std::uint64_t end_of(const CameraOptions& options) {
  std::uint64_t end = options.pictures == 0 ? std::numeric_limits<std::uint64_t>::max() : options.pictures;
  if (!options.loop) end = std::min<std::uint64_t>(end, options.clip->pictures().size());
  return end;
}

void put_u16(std::uint8_t* to, std::uint32_t value) {
  to[0] = static_cast<std::uint8_t>(value >> 8U);
  to[1] = static_cast<std::uint8_t>(value);
}

void put_u32(std::uint8_t* to, std::uint32_t value) {
  put_u16(to, value >> 16U);
  put_u16(to + 2, value);
}

}  // namespace

std::uint8_t payload_type_of(const CameraOptions& options) {
  constexpr std::uint8_t kJpeg = 26;
  if (options.clip && options.clip->codec() == ImageKind::kJpeg) return kJpeg;
  return options.payload_type & 0x7FU;
}

void Outgoing::read_header() {
  record.marker = (header[1] & 0x80U) != 0;
  record.sequence = static_cast<std::uint16_t>(header[2] << 8U | header[3]);
  record.timestamp = 0;
  for (std::size_t i = 4; i < 8; ++i) record.timestamp = record.timestamp << 8U | header[i];
}

RtpStream::RtpStream(const CameraOptions& options, const PacketFaults& faults, std::uint32_t session,
                     std::uint64_t seed)
    : clip_(options.clip),
      sequence_restarts_(faults.sequence_restarts),
      timestamp_restarts_(faults.timestamp_restarts),
      random_(seed),
      ticks_per_picture_(options.clock_rate / options.frames_per_second),
      last_picture_(end_of(options)),
      session_(session),
      ssrc_(static_cast<std::uint32_t>(random_())),
      payload_type_(payload_type_of(options)),
      sequence_(options.start_sequence),
      timestamp_base_(options.start_timestamp) {}

bool RtpStream::ended() const { return picture_ >= last_picture_; }

std::uint32_t RtpStream::timestamp() const {
  const auto ticks = [this](std::uint64_t picture) {
    return static_cast<std::uint64_t>(std::llround(static_cast<double>(picture) * ticks_per_picture_));
  };
  return static_cast<std::uint32_t>(timestamp_base_ + ticks(picture_) - ticks(base_picture_));
}

void RtpStream::restart_if_due() {
  for (const SequenceRestart& restart : sequence_restarts_) {
    if (restart.picture == picture_) sequence_ = restart.value.value_or(static_cast<std::uint16_t>(random_()));
  }
  for (const TimestampRestart& restart : timestamp_restarts_) {
    if (restart.picture != picture_) continue;
    timestamp_base_ = restart.value.value_or(static_cast<std::uint32_t>(random_()));
    base_picture_ = picture_;
  }
}

void RtpStream::take_picture(std::vector<Outgoing>& packets) {
  restart_if_due();
  const std::size_t clip_picture = static_cast<std::size_t>(picture_ % clip_->pictures().size());
  const PacketisedPicture& picture = clip_->pictures()[clip_picture];
  for (std::size_t i = 0; i < picture.packets(); ++i) {
    Outgoing& packet = packets.emplace_back();
    const bool last = i + 1 == picture.packets();
    packet.header[0] = 0x80;  // version 2
    packet.header[1] = static_cast<std::uint8_t>((last ? 0x80U : 0U) | payload_type_);
    put_u16(&packet.header[2], sequence_++);
    put_u32(&packet.header[4], timestamp());
    put_u32(&packet.header[8], ssrc_);
    packet.payload = picture.payload(i);
    packet.record.session = session_;
    packet.record.picture = picture_;
    packet.record.clip_picture = clip_picture;
    packet.record.packet = i;
    packet.record.picture_packets = picture.packets();
    packet.record.size = packet.header.size() + packet.payload.size();
    packet.read_header();
  }
  ++picture_;
}

}  // namespace vexa::camera
