// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/rtp/datagram_batch.h"

#include <sys/uio.h>

#include <cerrno>
#include <chrono>
#include <cstdint>
#include <span>

namespace vexa::camera {
namespace {

// The system's records take pointers to non-constant bytes, which a send leaves alone.
iovec piece_of(std::span<const std::uint8_t> bytes) { return {const_cast<std::uint8_t*>(bytes.data()), bytes.size()}; }

}  // namespace

void DatagramBatch::add(const Outgoing& packet) {
  iovec* pieces = &pieces_[2 * count_];
  pieces[0] = piece_of(packet.header);
  pieces[1] = piece_of(packet.payload_to_send());
  messages_[count_] = {};
  messages_[count_].msg_hdr.msg_iov = pieces;
  messages_[count_].msg_hdr.msg_iovlen = 2;
  record_of_[count_] = records_.size() - 1;
  ++count_;
}

void DatagramBatch::flush(int socket) {
  // A client whose port is closed makes one send fail with what an earlier datagram met; that send is tried again.
  constexpr int kTries = 3;
  std::size_t done = 0;
  int tries = 0;
  while (done < count_) {
    const int sent = ::sendmmsg(socket, &messages_[done], static_cast<unsigned>(count_ - done), MSG_NOSIGNAL);
    if (sent > 0) {
      done += static_cast<std::size_t>(sent);
      tries = 0;
    } else if (++tries == kTries) {
      records_[record_of_[done++]].lost = true;
      tries = 0;
    }
  }
  count_ = 0;
}

const std::vector<SentPacket>& DatagramBatch::send(int socket, const std::vector<Outgoing>& packets,
                                                   PacketPort::Hashing hashing) {
  records_.clear();
  const auto now = std::chrono::steady_clock::now();
  for (const Outgoing& packet : packets) {
    if (records_.emplace_back(record_of(packet, now, hashing)).lost) continue;
    add(packet);
    if (count_ == kMost) flush(socket);
  }
  flush(socket);
  return records_;
}

}  // namespace vexa::camera
