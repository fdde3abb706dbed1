// SPDX-License-Identifier: Apache-2.0
#include "media/stream_ledger.h"

#include <linux/sock_diag.h>
#include <sys/socket.h>

#include <algorithm>

namespace vexa {
namespace {

using Clock = std::chrono::steady_clock;

/// How often the kernel is asked for its drops: a count of the past, which no one reads oftener.
constexpr std::chrono::milliseconds kDropsInterval{250};

std::uint64_t nanoseconds_since_1970() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::nanoseconds>(now).count());
}

}  // namespace

void StreamLedger::begin_epoch() {
  ++counts_.epoch;
  counts_.epoch_since = nanoseconds_since_1970();
}

void StreamLedger::begin_stream(StreamTransport transport) {
  const bool in_camera = counts_.transport == static_cast<std::uint64_t>(StreamTransport::kTcp);
  (in_camera ? missing_in_camera_before_ : missing_before_) += sequence_.missing();
  expected_before_ += sequence_.expected();
  late_before_ += sequence_.late();
  sequence_ = SequenceLedger{};
  counts_.transport = static_cast<std::uint64_t>(transport);
  gap_counts_ = has_ssrc_ = has_candidate_ = has_timestamp_ = false;
  jitter_16_ = 0;
  counts_.control_port = 0;
  socket_ = -1;
  socket_drops_ = 0;
  begin_epoch();
  publish();
}

void StreamLedger::end_stream() {
  socket_ = -1;
  publish();
}

void StreamLedger::refuse(Refusal reason) {
  switch (reason) {
    case Refusal::kNotRtp:
      ++counts_.not_rtp;
      return;
    case Refusal::kForeignSource:
      ++counts_.foreign_source;
      return;
    case Refusal::kForeignSsrc:
      ++counts_.foreign_ssrc;
      return;
    case Refusal::kWrongPayloadType:
      ++counts_.wrong_payload_type;
      return;
    case Refusal::kTruncated:
      ++counts_.truncated;
      return;
    case Refusal::kMalformed:
      ++counts_.malformed;
      return;
    case Refusal::kNoMemory:
      ++counts_.no_memory;
      return;
  }
}

// Memory may run out before or after the collector has listed the packet: its sums tell which.
void StreamLedger::settle_lost_packet() {
  const CollectionCounts& c = counts_.collection;
  const std::uint64_t collected =
      c.used + c.duplicated + c.late + c.given_up + c.overwritten + c.stopped + c.held + counts_.packets_passed_on;
  const std::uint64_t refused = counts_.not_rtp + counts_.malformed + counts_.foreign_source + counts_.foreign_ssrc +
                                counts_.wrong_payload_type + counts_.truncated + counts_.no_memory;
  if (collected + refused != counts_.packets_received) refuse(Refusal::kNoMemory);
}

void StreamLedger::adopt(std::uint32_t ssrc) {
  if (has_ssrc_) begin_epoch();
  has_ssrc_ = true;
  ssrc_ = ssrc;
  has_candidate_ = has_timestamp_ = false;
  sequence_.begin_run();
}

// Two consecutive packets of another source are a camera that began anew; a single one is no part of the stream.
SequenceLedger::Arrival StreamLedger::place_other_source(std::uint32_t ssrc, std::uint16_t sequence) {
  if (!has_ssrc_) {
    adopt(ssrc);
    return sequence_.arrived(sequence);
  }
  const auto follows = static_cast<std::uint16_t>(candidate_sequence_ + 1);
  if (!has_candidate_ || ssrc != candidate_ssrc_ || sequence != follows) {
    has_candidate_ = true;
    candidate_ssrc_ = ssrc;
    candidate_sequence_ = sequence;
    return SequenceLedger::Arrival::kUnplaced;
  }
  adopt(ssrc);
  sequence_.arrived(static_cast<std::uint16_t>(sequence - 1));
  return sequence_.arrived(sequence);
}

void StreamLedger::restarted(std::uint16_t latest_sequence) {
  has_timestamp_ = false;              // jitter begins anew: the time stamps may have gone back
  constexpr std::uint16_t kProof = 3;  // packets that the collector takes for a proof
  if (static_cast<std::uint16_t>(sequence_.highest()) == latest_sequence) return;  // this ledger has followed already
  sequence_.begin_run();
  for (std::uint16_t i = kProof; i > 0; --i) sequence_.arrived(static_cast<std::uint16_t>(latest_sequence - i + 1));
}

// RFC 3550, A.8, but only where the timestamp changes: the packets of one picture leave the camera at one time stamp
// and one after the other, which is no jitter.
void StreamLedger::measure_jitter(std::uint32_t timestamp, int clock_rate, Instant now) {
  if (has_timestamp_ && !timestamp_is_after(timestamp, last_timestamp_)) return;
  if (has_timestamp_ && clock_rate > 0) {
    const std::int64_t sent =
        static_cast<std::int64_t>(timestamp - last_timestamp_) * 1'000'000'000 / static_cast<std::int64_t>(clock_rate);
    const std::int64_t came = std::chrono::nanoseconds(now - last_first_arrival_).count();
    const std::int64_t difference = came < sent ? sent - came : came - sent;
    jitter_16_ += static_cast<std::uint64_t>(difference) - (jitter_16_ + 8) / 16;
  }
  has_timestamp_ = true;
  last_timestamp_ = timestamp;
  last_first_arrival_ = now;
}

void StreamLedger::bytes(std::size_t count, Instant now) {
  counts_.bytes_received += count;
  counts_.last_packet = static_cast<std::uint64_t>(now.time_since_epoch().count());
}

void StreamLedger::part_assembled() {
  --counts_.collection.pictures_held;
  ++counts_.collection.pictures_assembled;
}

void StreamLedger::part_incomplete() {
  --counts_.collection.pictures_held;
  ++counts_.collection.pictures_incomplete;
}

void StreamLedger::part_too_large() {
  --counts_.collection.pictures_held;
  ++counts_.collection.pictures_too_large;
}

void StreamLedger::frame_ready(bool key, Instant now) {
  if (key) ++counts_.key_frames;
  counts_.last_frame = static_cast<std::uint64_t>(now.time_since_epoch().count());
  read_kernel_drops(now);
}

// SO_MEMINFO holds what SO_RXQ_OVFL would report with each datagram, for the price of a question now and then.
void StreamLedger::read_kernel_drops(Instant now) {
  if (socket_ == -1 || now - drops_read_ < kDropsInterval) return;
  drops_read_ = now;
  std::uint32_t memory[SK_MEMINFO_VARS] = {};
  socklen_t length = sizeof memory;
  if (getsockopt(socket_, SOL_SOCKET, SO_MEMINFO, memory, &length) != 0) return;
  if (length < (SK_MEMINFO_DROPS + 1) * sizeof memory[0]) return;
  counts_.kernel_drops += static_cast<std::uint32_t>(memory[SK_MEMINFO_DROPS] - socket_drops_);
  socket_drops_ = memory[SK_MEMINFO_DROPS];
}

void StreamLedger::about_to_wait() {
  read_kernel_drops(Clock::now());
  publish();
}

void StreamLedger::publish() {
  const bool in_camera = counts_.transport == static_cast<std::uint64_t>(StreamTransport::kTcp);
  counts_.expected = expected_before_ + sequence_.expected();
  counts_.late = late_before_ + sequence_.late();
  counts_.missing = missing_before_ + (in_camera ? 0 : sequence_.missing());
  counts_.missing_in_camera = missing_in_camera_before_ + (in_camera ? sequence_.missing() : 0);
  counts_.jitter = jitter();
  published_.publish(counts_);
}

}  // namespace vexa
