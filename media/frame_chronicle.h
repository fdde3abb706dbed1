// SPDX-License-Identifier: Apache-2.0
// What is known of each picture beside its bytes: when its packets came, what is missing before it, the sender's time.
#pragma once

#include <array>
#include <chrono>
#include <cstdint>
#include <optional>

#include "media/assembly/codec.h"
#include "media/stream_ledger.h"
#include "runtime/base/bytes.h"
#include "transport/socket.h"
#include "transport/wire/sender_clock.h"
#include "vexa/frame_facts.h"
#include "vexa/video_info.h"

namespace vexa {

/// Follows one driver's streams, one after the other; the streaming thread's, as the ledger that it reads. Speaks RTCP
/// with the camera where the camera does. Decides nothing: every frame goes its way whatever stands here.
class FrameChronicle {
 public:
  using Instant = std::chrono::steady_clock::time_point;

  explicit FrameChronicle(StreamLedger& ledger) : ledger_(ledger) {}

  /// A stream starts. `control` is the RTCP socket, invalid where there is none; `camera` the camera's address in
  /// network order, from which alone reports are taken.
  void begin_stream(Socket control, std::uint32_t camera);
  void end_stream() { control_ = {}; }
  /// The camera's address in network order; 0 where it is not known.
  std::uint32_t camera() const { return camera_; }

  /// A packet of the stream came, through `socket`.
  void arrived(const SPacketInfo& packet, int socket, Instant now) {
    Arrivals& latest = arrivals_[latest_];
    if (packet.timestamp != latest.timestamp || !latest.used) return arrived_elsewhere(packet, socket, now);
    latest.last = now.time_since_epoch().count();
    if (packet.marker) stamp(latest.last, latest, socket);
  }

  /// Reads what has come on the control port and reports back, both now and then.
  void tend_control(int clock_rate, Instant now);
  /// The same for bytes that came on the control channel of a connection.
  void take_control(Bytes compound, int clock_rate, SenderClock::Arrival arrival);

  struct Picture {
    CodecKind codec;
    const SPacketInfo* first;  ///< null where the stream has no packets
    const SPacketInfo* last;
    Bytes frame;
    bool key;
    int clock_rate;
    std::optional<std::int64_t> range_time;  ///< of a recording, nanoseconds since 1970
  };

  /// The facts of a frame that stands assembled; its run has not left the list yet.
  FrameFacts facts_of(const Picture& picture);

 private:
  struct Arrivals {
    std::uint32_t timestamp = 0;
    bool used = false;
    FrameArrivalSource source = FRAME_ARRIVAL_HOST;
    std::int64_t first = 0;  ///< monotonic
    std::int64_t last = 0;
    std::int64_t real_ahead = 0;  ///< of the monotonic clock
  };

  /// Those of the picture of this time stamp; null when it is not among the latest.
  Arrivals* find(std::uint32_t timestamp);
  void arrived_elsewhere(const SPacketInfo& packet, int socket, Instant now);
  static void stamp(std::int64_t& moment, Arrivals& arrivals, int socket);
  void take_report(const SenderReport& report, SenderClock::Arrival arrival, int clock_rate);
  void report_back(int clock_rate, Instant now);
  std::uint32_t discontinuity_before(const Picture& picture, Instant now);
  void add_packet_facts(const Picture& picture, FrameFacts& facts);
  void add_clock_facts(const Picture& picture, FrameFacts& facts);

  StreamLedger& ledger_;
  // Arrivals, of the latest pictures
  std::array<Arrivals, 64> arrivals_{};
  std::size_t latest_ = 0;
  // The frame before
  bool started_ = false;
  CodecKind codec_ = CodecKind::kJpeg;
  std::uint64_t format_ = 0;
  std::optional<std::uint32_t> ssrc_;
  std::uint64_t runs_ = 0;
  std::uint64_t last_sequence_ = 0;
  std::uint64_t lost_frames_ = 0;  ///< of the driver's life, when it was handed on
  std::uint32_t timestamp_ = 0;
  std::int64_t unwrapped_ = 0;
  Instant frame_time_{};
  // RTCP
  Socket control_;
  std::uint32_t camera_ = 0;
  std::uint32_t reporter_ = 0;  ///< SSRC of this side
  std::uint16_t peer_port_ = 0;
  Instant looked_{};
  Instant reported_{};
  std::optional<SenderReport> waiting_;  ///< came before media told whose it is
  SenderClock::Arrival waiting_arrival_{};
  std::uint64_t latest_ntp_ = 0;
  Instant latest_report_{};
  std::uint64_t reported_expected_ = 0;
  std::uint64_t reported_missing_ = 0;
  SenderClock clock_;
};

}  // namespace vexa
