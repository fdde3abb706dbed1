// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/rtp_stream.h"

#include <cmath>
#include <limits>

#include "virtual_camera/source/clip_source.h"

namespace vexa::camera {
namespace {

std::uint64_t end_of(const CameraOptions& options) {
  return options.pictures == 0 ? std::numeric_limits<std::uint64_t>::max() : options.pictures;
}

std::unique_ptr<PictureSource> clip_of(const CameraOptions& options) {
  const auto at_end = options.loop ? ClipSource::AtEnd::kStartOver : ClipSource::AtEnd::kStop;
  return std::make_unique<ClipSource>(options.clip, options.frames_per_second, at_end);
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

std::uint8_t payload_type_of(const CameraOptions& options, Codec codec) {
  constexpr std::uint8_t kJpeg = 26;
  return codec == Codec::kJpeg ? kJpeg : options.payload_type & 0x7FU;
}

void Outgoing::read_header() {
  record.marker = (header[1] & 0x80U) != 0;
  record.sequence = static_cast<std::uint16_t>(header[2] << 8U | header[3]);
  record.timestamp = 0;
  for (std::size_t i = 4; i < 8; ++i) record.timestamp = record.timestamp << 8U | header[i];
}

RtpStream::RtpStream(std::unique_ptr<PictureSource> source, const CameraOptions& options, const PacketFaults& faults,
                     Identity identity)
    : source_(std::move(source)),
      sequence_restarts_(faults.sequence_restarts),
      timestamp_restarts_(faults.timestamp_restarts),
      random_(identity.seed),
      clock_rate_(options.clock_rate),
      max_payload_(options.max_payload),
      last_picture_(end_of(options)),
      session_(identity.session),
      ssrc_(static_cast<std::uint32_t>(random_())),
      payload_type_(payload_type_of(options, source_->format().codec)),
      sequence_(options.start_sequence),
      timestamp_base_(options.start_timestamp) {}

RtpStream::RtpStream(const CameraOptions& options, const PacketFaults& faults, std::uint32_t session,
                     std::uint64_t seed)
    : RtpStream(clip_of(options), options, faults, {session, seed}) {}

bool RtpStream::load() {
  if (!loaded_ && picture_ < last_picture_) loaded_ = source_->next();
  return loaded_.has_value();
}

bool RtpStream::ended() const { return picture_ >= last_picture_ || (!loaded_ && source_->ended()); }

std::uint32_t RtpStream::timestamp() const {
  const auto ticks = [this](std::chrono::nanoseconds time) {
    return std::llround(static_cast<double>(time.count()) * 1e-9 * clock_rate_);
  };
  return static_cast<std::uint32_t>(timestamp_base_ + ticks(loaded_->stamp) - ticks(base_stamp_));
}

void RtpStream::restart_if_due() {
  for (const SequenceRestart& restart : sequence_restarts_) {
    if (restart.picture == picture_) sequence_ = restart.value.value_or(static_cast<std::uint16_t>(random_()));
  }
  for (const TimestampRestart& restart : timestamp_restarts_) {
    if (restart.picture != picture_) continue;
    timestamp_base_ = restart.value.value_or(static_cast<std::uint32_t>(random_()));
    base_stamp_ = loaded_->stamp;
  }
}

std::shared_ptr<const PacketisedPicture> RtpStream::payloads(const std::string& text) const {
  if (loaded_->packets && text.empty()) return loaded_->packets;
  auto cut = packetise(loaded_->codec, *loaded_->bytes, text, max_payload_);
  return std::make_shared<const PacketisedPicture>(cut ? std::move(*cut) : PacketisedPicture());
}

void RtpStream::take_picture(std::vector<Outgoing>& packets, const std::string& text) {
  if (!load()) return;
  if (picture_ == 0) base_stamp_ = loaded_->stamp;
  restart_if_due();
  append(packets, payloads(text));
  loaded_.reset();
  ++picture_;
}

void RtpStream::append(std::vector<Outgoing>& packets, const std::shared_ptr<const PacketisedPicture>& picture) {
  const std::uint32_t time = timestamp();
  for (std::size_t i = 0; i < picture->packets(); ++i) {
    Outgoing& packet = packets.emplace_back();
    const bool last = i + 1 == picture->packets();
    packet.header[0] = 0x80;  // version 2
    packet.header[1] = static_cast<std::uint8_t>((last ? 0x80U : 0U) | payload_type_);
    put_u16(&packet.header[2], sequence_++);
    put_u32(&packet.header[4], time);
    put_u32(&packet.header[8], ssrc_);
    packet.picture = picture;
    packet.payload = picture->payload(i);
    packet.record.session = session_;
    packet.record.picture = picture_;
    packet.record.clip_picture = loaded_->place;
    packet.record.packet = i;
    packet.record.picture_packets = picture->packets();
    packet.record.size = packet.header.size() + packet.payload.size();
    packet.read_header();
  }
}

}  // namespace vexa::camera
