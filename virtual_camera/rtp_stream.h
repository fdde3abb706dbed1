// The RTP packets of an endless (or ended) run of pictures: sequence numbers, timestamps, markers (RFC 3550).
#ifndef VIRTUAL_CAMERA_RTP_STREAM_H_
#define VIRTUAL_CAMERA_RTP_STREAM_H_

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <random>
#include <span>
#include <vector>

#include "virtual_camera/options.h"
#include "virtual_camera/rtp_packetiser.h"
#include "virtual_camera/sent_log.h"

namespace vexa::camera {

// One datagram on its way out.
struct Outgoing {
  std::array<std::uint8_t, 12> header{};
  std::span<const std::uint8_t> payload;      // in the clip
  std::vector<std::uint8_t> changed_payload;  // takes the payload's place when not empty
  SentPacket record;

  [[nodiscard]] std::span<const std::uint8_t> payload_to_send() const {
    return changed_payload.empty() ? payload : std::span<const std::uint8_t>(changed_payload);
  }
  // Makes the record's header fields those of the header.
  void read_header();
};

// The payload type of the options' clip: JPEG has a static one (RFC 3551, table 5).
[[nodiscard]] std::uint8_t payload_type_of(const CameraOptions& options);

class RtpStream {
 public:
  // `options.clip` is set and outlives the packets handed out. `seed` draws restarts without a value, and the SSRC.
  RtpStream(const CameraOptions& options, const PacketFaults& faults, std::uint32_t session, std::uint64_t seed);

  [[nodiscard]] bool ended() const;
  [[nodiscard]] std::uint64_t next_picture() const { return picture_; }  // its running index
  // Appends the packets of the next picture.
  void take_picture(std::vector<Outgoing>& packets);

 private:
  void restart_if_due();
  [[nodiscard]] std::uint32_t timestamp() const;

  std::shared_ptr<const PacketisedClip> clip_;
  std::vector<SequenceRestart> sequence_restarts_;
  std::vector<TimestampRestart> timestamp_restarts_;
  std::mt19937_64 random_;
  const double ticks_per_picture_;
  const std::uint64_t last_picture_;
  const std::uint32_t session_;
  const std::uint32_t ssrc_;
  const std::uint8_t payload_type_;
  std::uint16_t sequence_;
  std::uint32_t timestamp_base_;
  std::uint64_t base_picture_ = 0;
  std::uint64_t picture_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_STREAM_H_
