// From the datagrams of an RTP stream to the packets of its next picture.
#pragma once

#include <functional>
#include <optional>

#include "media/rtp_reception.h"
#include "runtime/base/result.h"
#include "transport/socket.h"

namespace vexa {

/// A picture is a run of packets in the list; a frame is the bytes assembled from them in a buffer.
///
/// Collects one picture at a time into the reception that it is given. Holds nothing between two pictures. Made and
/// used by the streaming thread; waits for datagrams and for the stop event together.
class PictureReader {
 public:
  struct Source {
    StoppableSocket socket;
    unsigned char* buffer;  ///< PacketRing::kSize bytes
    int clock_rate;         ///< ticks a second
    int timeout;            ///< milliseconds that a read may take
    std::function<bool()> is_stopped;
  };

  PictureReader(RtpReception& rtp, Source source) : rtp_(rtp), source_(std::move(source)) {}

  /// The next picture. None when there is none yet and the stream goes on: packets have come that made no picture, or
  /// it is to end. LIBD_TIMEOUT when no datagram came in time.
  Result<std::optional<PacketRunPlace>> next();

  /// The same for JPEG, where a picture that was refused is taken out when it is met again.
  Result<std::optional<PacketRunPlace>> next_jpeg();

 private:
  Result<int> receive(int timeout);
  bool packet_waits(int timeout) const;

  RtpReception& rtp_;
  Source source_;
};

}  // namespace vexa
