// Where a session's RTP packets leave the camera.
#ifndef VIRTUAL_CAMERA_RTP_PACKET_PORT_H_
#define VIRTUAL_CAMERA_RTP_PACKET_PORT_H_

#include <chrono>
#include <cstdint>
#include <span>
#include <vector>

#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/rtp/sent_log.h"

namespace vexa::camera {

// Datagrams or an RTSP connection, behind one interface for RtpSender, which owns it; on the loop's thread. Never
// waits.
class PacketPort {
 public:
  enum class Hashing { kOff, kOn };

  PacketPort() = default;
  virtual ~PacketPort() = default;
  PacketPort(const PacketPort&) = delete;
  PacketPort& operator=(const PacketPort&) = delete;

  // Sends the packets in order, without those marked lost. Returns a record for each; one that cannot leave is marked
  // lost. The result stays valid until the next call.
  virtual const std::vector<SentPacket>& send(const std::vector<Outgoing>& packets, Hashing hashing) = 0;
  // Sends an RTCP packet of at least 12 bytes beside the stream; one that cannot leave is lost.
  virtual void send_control(std::span<const std::uint8_t> packet) = 0;
  // RTCP packets that have come from the host since the last call.
  virtual std::uint64_t take_heard() { return 0; }
  // Nothing leaves any more.
  virtual void close() = 0;
};

// What the log keeps of a packet that is about to leave, or was lost on purpose.
[[nodiscard]] SentPacket record_of(const Outgoing& packet, std::chrono::steady_clock::time_point time,
                                   PacketPort::Hashing hashing);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_PACKET_PORT_H_
