// SPDX-License-Identifier: Apache-2.0
// What the reader of a stream counts, and what of it any thread can read.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>

#include "media/assembly/collection_counts.h"
#include "runtime/base/published.h"
#include "transport/rtp_socket.h"
#include "transport/wire/packet_order.h"
#include "transport/wire/sequence_ledger.h"

namespace vexa {

enum class StreamTransport : std::uint64_t { kNone = 0, kUdp = 1, kTcp = 2, kHttp = 3 };

/// Of the driver's life, but for those that are described as of now. Nanoseconds of the steady clock.
struct StreamRecord {
  std::uint64_t packets_received = 0;
  std::uint64_t bytes_received = 0;
  std::uint64_t packets_passed_on = 0;  ///< to a model class, which reads packets itself
  std::uint64_t not_rtp = 0;
  std::uint64_t malformed = 0;
  std::uint64_t foreign_source = 0;
  std::uint64_t foreign_ssrc = 0;
  std::uint64_t wrong_payload_type = 0;
  std::uint64_t truncated = 0;
  std::uint64_t no_memory = 0;
  CollectionCounts collection;
  std::uint64_t expected = 0;
  std::uint64_t missing = 0;            ///< now; over UDP
  std::uint64_t missing_in_camera = 0;  ///< now; over TCP
  std::uint64_t late = 0;
  std::uint64_t kernel_drops = 0;
  std::uint64_t frames_taken = 0;  ///< assembled, and read past the queue
  std::uint64_t key_frames = 0;
  std::uint64_t control_port = 0;  ///< of the epoch; 0: none
  std::uint64_t sender_reports = 0;
  std::uint64_t receiver_reports = 0;
  std::uint64_t reports_refused = 0;
  std::uint64_t wakeups = 0;
  std::uint64_t longest_gap = 0;
  std::uint64_t last_packet = 0;  ///< moment; 0: none yet
  std::uint64_t last_frame = 0;   ///< moment; 0: none yet
  std::uint64_t jitter = 0;       ///< of now
  std::uint64_t epoch = 0;
  std::uint64_t epoch_since = 0;  ///< nanoseconds since 1970
  std::uint64_t transport = 0;    ///< a StreamTransport, of the epoch
};

/// Keeps count for the streaming thread, which alone calls what is not const, and publishes the count when it is about
/// to wait and after each picture. Lives as long as the driver; totals never fall.
class StreamLedger final : public WaitObserver {
 public:
  using Instant = std::chrono::steady_clock::time_point;

  enum class Refusal { kNotRtp, kForeignSource, kForeignSsrc, kWrongPayloadType, kTruncated, kMalformed, kNoMemory };

  /// A stream starts: a new epoch.
  void begin_stream(StreamTransport transport);
  /// The socket that the stream is read from; asked for its drops until the stream ends.
  void use_socket(int socket) { socket_ = socket; }
  /// The stream ends; its socket may be closed already.
  void end_stream();

  void datagram(std::size_t bytes, Instant now) {
    ++counts_.packets_received;
    counts_.bytes_received += bytes;
    const auto moment = static_cast<std::uint64_t>(now.time_since_epoch().count());
    const std::uint64_t gap = moment - counts_.last_packet;
    if (gap > counts_.longest_gap && gap_counts_) counts_.longest_gap = gap;
    gap_counts_ = true;
    counts_.last_packet = moment;
  }
  void refuse(Refusal reason);
  /// What `reason` counts for a datagram that ran out of memory before anything else counted it.
  void settle_lost_packet();
  void passed_on() { ++counts_.packets_passed_on; }

  /// Takes the place of an RTP packet in its source's sequence.
  SequenceLedger::Arrival place(std::uint32_t ssrc, std::uint16_t sequence) {
    if (ssrc == ssrc_ && has_ssrc_) [[likely]] {
      return sequence_.arrived(sequence);
    }
    return place_other_source(ssrc, sequence);
  }
  /// The collector has followed a restart, whose latest packet this is.
  void restarted(std::uint16_t latest_sequence);

  /// A packet of the stream's own type: jitter is measured where a picture begins.
  void media(std::uint32_t timestamp, int clock_rate, Instant now) {
    if (timestamp == last_timestamp_ && has_timestamp_) return;
    measure_jitter(timestamp, clock_rate, now);
  }

  // Frames of a stream that has no packets.
  void part_begun() {
    ++counts_.collection.pictures_begun;
    ++counts_.collection.pictures_held;
  }
  void bytes(std::size_t count, Instant now);
  void part_assembled();
  void part_incomplete();
  void part_too_large();

  /// A frame stands assembled, of whatever transport; the one before it is out of the reader's hands.
  void frame_ready(bool key, Instant now);
  /// The frame that stood assembled was read past the queue.
  void frame_taken() { ++counts_.frames_taken; }

  // RTCP
  void control_port(int port) { counts_.control_port = static_cast<std::uint64_t>(port); }
  void report_taken() { ++counts_.sender_reports; }
  void report_sent() { ++counts_.receiver_reports; }
  void report_refused() { ++counts_.reports_refused; }

  CollectionCounts& collection() { return counts_.collection; }
  std::optional<std::uint32_t> ssrc() const { return has_ssrc_ ? std::optional(ssrc_) : std::nullopt; }
  const SequenceLedger& sequence() const { return sequence_; }
  /// Nanoseconds.
  std::uint64_t jitter() const { return jitter_16_ / 16; }
  std::uint64_t extended(std::uint16_t sequence) const { return sequence_.extended(sequence); }

  void publish();
  /// Any thread.
  StreamRecord read() const { return published_.read(); }

  void about_to_wait() override;
  void woken() override { ++counts_.wakeups; }

 private:
  SequenceLedger::Arrival place_other_source(std::uint32_t ssrc, std::uint16_t sequence);
  void adopt(std::uint32_t ssrc);
  void measure_jitter(std::uint32_t timestamp, int clock_rate, Instant now);
  void begin_epoch();
  void read_kernel_drops(Instant now);

  StreamRecord counts_;
  SequenceLedger sequence_;
  std::uint64_t expected_before_ = 0;  // in earlier streams
  std::uint64_t late_before_ = 0;
  std::uint64_t missing_before_ = 0;
  std::uint64_t missing_in_camera_before_ = 0;
  bool gap_counts_ = false;  // the time before a stream's first packet is no gap
  bool has_ssrc_ = false;
  std::uint32_t ssrc_ = 0;
  bool has_candidate_ = false;
  std::uint32_t candidate_ssrc_ = 0;
  std::uint16_t candidate_sequence_ = 0;
  bool has_timestamp_ = false;
  std::uint32_t last_timestamp_ = 0;
  Instant last_first_arrival_{};
  std::uint64_t jitter_16_ = 0;  // 16 times the nanoseconds
  int socket_ = -1;
  std::uint32_t socket_drops_ = 0;
  Instant drops_read_{};
  Published<StreamRecord> published_;
};

}  // namespace vexa
