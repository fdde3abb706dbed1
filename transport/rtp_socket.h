// Datagrams of an RTP stream over UDP.
#pragma once

#include <cstdint>
#include <span>

#include "runtime/base/result.h"
#include "transport/burst_gather.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "vexa/video_info.h"

namespace vexa {

/// Learns when a reader waits. Called by the reading thread.
class WaitObserver {
 public:
  /// No datagram is there: the thread is about to sleep until one comes, or the time is up.
  virtual void about_to_wait() = 0;
  /// A datagram has ended the wait.
  virtual void woken() = 0;

 protected:
  ~WaitObserver() = default;
};

/// How a stream's reader lets datagrams gather.
struct Gathering {
  BurstGather* gather = nullptr;  ///< null: reads each datagram as it comes
  bool in_picture = false;        ///< some packets of a picture are there and the others are on their way
  WaitObserver* observer = nullptr;
  std::uint32_t* sender = nullptr;  ///< out: the datagram's sender, an IPv4 address in network order; null: not asked
};

/// Reads the next datagram into `room`: its length. Reads first and waits only when nothing is there, so that a
/// datagram costs one system call while data keep coming. Fails without a text when the stream is to end.
Result<int> receive_datagram(StoppableSocket source, std::span<char> room, WaitLimit limit, Gathering gathering);

/// The same for an RTP packet, whose header's fields go to `packet`; one too short for a header leaves them but for
/// `received`. `room` has 65535 bytes or more.
Result<int> receive_packet(StoppableSocket source, std::span<char> room, WaitLimit limit, Gathering gathering,
                           SPacketInfo& packet);

}  // namespace vexa
