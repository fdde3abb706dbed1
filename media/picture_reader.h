// From the datagrams of an RTP stream to the packets of its next picture.
#pragma once

#include <chrono>
#include <functional>
#include <optional>
#include <span>

#include "media/assembly/codec.h"
#include "media/frame_chronicle.h"
#include "media/rtp_reception.h"
#include "media/stream_ledger.h"
#include "runtime/base/result.h"
#include "transport/socket.h"
#include "transport/wire/stream_window.h"

namespace vexa {

/// Something that the reader's thread awaits besides media: what becomes readable when it comes (-1: none), and when it
/// is too late.
struct Errand {
  int descriptor;
  std::chrono::steady_clock::time_point deadline;
};

/// A picture is a run of packets in the list; a frame is what is assembled of them in a host's buffer.
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
    bool strict;  ///< takes packets of the camera's address and of the stream's SSRC alone
    std::optional<Errand> errand = {};  ///< ends the wait for a datagram, with no picture yet
  };

  PictureReader(RtpReception& rtp, StreamLedger& ledger, FrameChronicle& chronicle, Source source)
      : rtp_(rtp), ledger_(ledger), chronicle_(chronicle), source_(std::move(source)) {}

  /// The next picture. None when there is none yet and the stream goes on: packets have come that made no picture, or
  /// it is to end. LIBD_TIMEOUT when no datagram came in time.
  Result<std::optional<PacketRunPlace>> next();

  /// The same for JPEG, where a picture that was refused is taken out when it is met again.
  Result<std::optional<PacketRunPlace>> next_jpeg();

 private:
  Result<int> receive(int timeout);
  struct Datagram {
    std::uint32_t length;
    std::uint32_t sender;  ///< with strict reception alone
    StreamLedger::Instant arrival;
  };
  void take(const SPacketInfo& packet, const Datagram& datagram);
  std::optional<StreamLedger::Refusal> refusal_of(const SPacketInfo& packet, const Datagram& datagram) const;
  bool packet_waits(int timeout) const;
  bool errand_is_due() const;

  RtpReception& rtp_;
  StreamLedger& ledger_;
  FrameChronicle& chronicle_;
  Source source_;
};

/// A frame that grows by units, in its owner's fields.
struct GrowingFrame {
  std::span<unsigned char> room;
  unsigned int& length;      ///< bytes of frame so far
  std::int32_t& frame_type;  ///< an ELibDVideoFrameType value
};

struct UnitRead {
  enum class Kind {
    kPart,     ///< a unit that does not end the picture, or one of user data
    kPicture,  ///< the unit that ends the picture; the frame is whole
    kSilence   ///< no whole unit came in time, or the stream is to end
  };
  Kind kind;
  int length;  ///< bytes of the unit
};

/// Reads the next unit, waiting `timeout` milliseconds for it, and appends it to the frame. User data is no part of the
/// frame: its text goes to `user_data`.
Result<UnitRead> read_unit(StoppableSocket source, StreamWindow& window, const Codec& codec, GrowingFrame frame,
                           int timeout, const std::function<void(Bytes)>& user_data);

}  // namespace vexa
