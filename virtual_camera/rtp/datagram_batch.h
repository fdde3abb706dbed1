// SPDX-License-Identifier: Apache-2.0
// Sends many datagrams with few system calls, and notes what became of each.
#ifndef VIRTUAL_CAMERA_RTP_DATAGRAM_BATCH_H_
#define VIRTUAL_CAMERA_RTP_DATAGRAM_BATCH_H_

#include <sys/socket.h>

#include <array>
#include <cstddef>
#include <vector>

#include "virtual_camera/rtp/packet_port.h"
#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/rtp/sent_log.h"

namespace vexa::camera {

// Owned by a port and used on the loop's thread. Keeps its memory from one batch to the next; never waits for the
// socket.
class DatagramBatch {
 public:
  // Sends the packets on a connected socket, in order, without those marked lost. Returns a record for each; a packet
  // the system refuses is marked lost. The result stays valid until the next call.
  const std::vector<SentPacket>& send(int socket, const std::vector<Outgoing>& packets, PacketPort::Hashing hashing);

 private:
  static constexpr std::size_t kMost = 64;

  void add(const Outgoing& packet);
  void flush(int socket);

  std::vector<SentPacket> records_;
  std::array<std::size_t, kMost> record_of_{};
  std::array<iovec, 2 * kMost> pieces_{};
  std::array<mmsghdr, kMost> messages_{};
  std::size_t count_ = 0;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_DATAGRAM_BATCH_H_
