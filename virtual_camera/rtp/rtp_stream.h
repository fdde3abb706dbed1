// SPDX-License-Identifier: Apache-2.0
// The RTP packets of an endless (or ended) run of pictures: sequence numbers, timestamps, markers (RFC 3550).
#ifndef VIRTUAL_CAMERA_RTP_RTP_STREAM_H_
#define VIRTUAL_CAMERA_RTP_RTP_STREAM_H_

#include <array>
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <random>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/rtp/sent_log.h"
#include "virtual_camera/source/picture_source.h"
#include "virtual_camera/values/options.h"

namespace vexa::camera {

// One datagram that is to leave.
struct Outgoing {
  std::array<std::uint8_t, 12> header{};
  std::shared_ptr<const PacketisedPicture> picture;  // keeps the payload
  std::span<const std::uint8_t> payload;
  std::vector<std::uint8_t> changed_payload;  // takes the payload's place when not empty
  SentPacket record;

  [[nodiscard]] std::span<const std::uint8_t> payload_to_send() const {
    return changed_payload.empty() ? payload : std::span<const std::uint8_t>(changed_payload);
  }
  // Makes the record's header fields those of the header.
  void read_header();
};

// The options' payload type; JPEG has a static one (RFC 3551, table 5).
[[nodiscard]] std::uint8_t payload_type_of(const CameraOptions& options, Codec codec);

// Turns pictures into packets. Owned by RtpSender, on the loop's thread; opens no socket and reads no clock.
class RtpStream {
 public:
  // What makes a stream differ from those beside it.
  struct Identity {
    std::uint32_t session = 0;
    std::uint64_t seed = 1;  // draws restarts without a value, and the SSRC
  };

  // `source` is not null.
  RtpStream(std::unique_ptr<PictureSource> source, const CameraOptions& options, const PacketFaults& faults,
            Identity identity);
  // Of `options.clip`, which is set.
  RtpStream(const CameraOptions& options, const PacketFaults& faults, std::uint32_t session, std::uint64_t seed);

  // Takes up the next picture, where none is taken up yet. False when there is none: not yet, or at the stream's end.
  [[nodiscard]] bool load();
  [[nodiscard]] bool ended() const;
  // When load() found no picture and the stream has not ended: as the source's.
  void wait(const std::function<void()>& ready) { source_->wait(ready); }
  // The picture taken up; only after load() has found one.
  [[nodiscard]] const SourcePicture& loaded() const { return *loaded_; }
  [[nodiscard]] const SourceFormat& format() const { return source_->format(); }
  [[nodiscard]] std::uint64_t next_picture() const { return picture_; }  // its running index
  // Appends the packets of the next picture, with the text in its user data where that is not empty; none when there
  // is none.
  void take_picture(std::vector<Outgoing>& packets, const std::string& text = {});

 private:
  void restart_if_due();
  [[nodiscard]] std::uint32_t timestamp() const;
  [[nodiscard]] std::shared_ptr<const PacketisedPicture> payloads(const std::string& text) const;
  void append(std::vector<Outgoing>& packets, const std::shared_ptr<const PacketisedPicture>& picture);

  std::unique_ptr<PictureSource> source_;
  std::optional<SourcePicture> loaded_;
  std::vector<SequenceRestart> sequence_restarts_;
  std::vector<TimestampRestart> timestamp_restarts_;
  std::mt19937_64 random_;
  const std::uint32_t clock_rate_;
  const std::size_t max_payload_;
  const std::uint64_t last_picture_;
  const std::uint32_t session_;
  const std::uint32_t ssrc_;
  const std::uint8_t payload_type_;
  std::uint16_t sequence_;
  std::uint32_t timestamp_base_;
  std::chrono::nanoseconds base_stamp_{0};  // of the picture that has timestamp_base_
  std::uint64_t picture_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_RTP_STREAM_H_
