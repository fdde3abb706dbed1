// SPDX-License-Identifier: Apache-2.0
#include "media/frame_chronicle.h"

#include <sys/random.h>

#include <algorithm>
#include <cinttypes>
#include <cstdio>
#include <utility>
#include <vector>

#include "media/assembly/picture_format.h"
#include "transport/control_socket.h"

namespace vexa {
namespace {

using Clock = std::chrono::steady_clock;

constexpr std::int64_t kNanosecondsASecond = 1'000'000'000;

/// A report that waits at the port keeps the kernel's time of its arrival: looking seldom costs nothing.
constexpr std::chrono::milliseconds kControlInterval{250};
/// RFC 3550, 6.2: at least five seconds between reports.
constexpr std::chrono::seconds kReportInterval{5};
constexpr std::size_t kControlRoom = 1500;
/// More at one look is no camera's.
constexpr int kMostReportsALook = 8;

/// RTP time that went so much farther than the host's has jumped.
constexpr std::int64_t kTimeJump = 10 * kNanosecondsASecond;

std::int64_t count_of(FrameChronicle::Instant moment) {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(moment.time_since_epoch()).count();
}

std::int64_t real_now() {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(std::chrono::system_clock::now().time_since_epoch())
      .count();
}

std::uint32_t random_number() {
  std::uint32_t number = 0;
  if (getrandom(&number, sizeof number, GRND_NONBLOCK) != sizeof number) {
    number = static_cast<std::uint32_t>(Clock::now().time_since_epoch().count());
  }
  return number;
}

std::uint64_t pictures_lost(const CollectionCounts& counts) {
  return counts.pictures_incomplete + counts.pictures_damaged + counts.pictures_without_key + counts.pictures_too_large;
}

}  // namespace

void FrameChronicle::begin_stream(Socket control, std::uint32_t camera) {
  control_ = std::move(control);
  camera_ = camera;
  arrivals_ = {};
  latest_ = 0;
  started_ = false;
  format_ = 0;
  ssrc_.reset();
  lost_frames_ = pictures_lost(ledger_.collection());
  reporter_ = random_number();
  peer_port_ = 0;
  looked_ = reported_ = latest_report_ = Instant{};
  waiting_.reset();
  latest_ntp_ = 0;
  reported_expected_ = reported_missing_ = 0;
  clock_ = SenderClock{};
}

void FrameChronicle::stamp(std::int64_t& moment, Arrivals& arrivals, int socket) {
  const auto arrival = arrival_of_latest(socket);
  if (!arrival) return;
  arrivals.source = FRAME_ARRIVAL_KERNEL;
  moment = *arrival - arrivals.real_ahead;
}

FrameChronicle::Arrivals* FrameChronicle::find(std::uint32_t timestamp) {
  const auto same = [timestamp](const Arrivals& known) { return known.used && known.timestamp == timestamp; };
  if (same(arrivals_[latest_])) return &arrivals_[latest_];
  const auto found = std::find_if(arrivals_.begin(), arrivals_.end(), same);
  return found != arrivals_.end() ? &*found : nullptr;
}

// A picture's first packet, or a packet out of order.
void FrameChronicle::arrived_elsewhere(const SPacketInfo& packet, int socket, Instant now) {
  if (Arrivals* const found = find(packet.timestamp)) {
    found->last = count_of(now);
    if (packet.marker) stamp(found->last, *found, socket);
    return;
  }
  latest_ = (latest_ + 1) % arrivals_.size();
  Arrivals& opened = arrivals_[latest_];
  opened = {};
  opened.timestamp = packet.timestamp;
  opened.used = true;
  opened.first = count_of(now);
  opened.real_ahead = real_now() - count_of(Clock::now());
  stamp(opened.first, opened, socket);
  opened.last = std::max(opened.first, opened.source == FRAME_ARRIVAL_KERNEL ? opened.first : count_of(now));
}

void FrameChronicle::tend_control(int clock_rate, Instant now) {
  if (!control_.valid() || now - looked_ < kControlInterval) return;
  looked_ = now;
  std::array<unsigned char, kControlRoom> room;
  for (int i = 0; i < kMostReportsALook; ++i) {
    const auto datagram = receive_control(control_.get(), room);
    if (!datagram) break;
    if (datagram->address != camera_) {
      ledger_.report_refused();
      continue;
    }
    peer_port_ = datagram->port;
    const std::int64_t real_ahead = real_now() - count_of(Clock::now());
    take_control(Bytes(room).first(datagram->length), clock_rate, {datagram->arrival, datagram->arrival - real_ahead});
  }
  report_back(clock_rate, now);
}

void FrameChronicle::take_control(Bytes compound, int clock_rate, SenderClock::Arrival arrival) {
  const auto report = find_sender_report(compound);
  if (!report) return ledger_.report_refused();
  const auto media = ledger_.ssrc();
  if (!media) {
    waiting_ = *report;
    waiting_arrival_ = arrival;
    return;
  }
  if (report->ssrc != *media) return ledger_.report_refused();
  take_report(*report, arrival, clock_rate);
}

void FrameChronicle::take_report(const SenderReport& report, SenderClock::Arrival arrival, int clock_rate) {
  ledger_.report_taken();
  latest_ntp_ = report.ntp;
  latest_report_ = Instant(std::chrono::duration_cast<Instant::duration>(std::chrono::nanoseconds(arrival.monotonic)));
  clock_.report(report, arrival, clock_rate);
}

// Only a camera that reports is reported to: others do not expect it.
void FrameChronicle::report_back(int clock_rate, Instant now) {
  if (peer_port_ == 0 || latest_report_ == Instant{} || now - reported_ < kReportInterval) return;
  const auto media = ledger_.ssrc();
  if (!media) return;
  reported_ = now;
  const SequenceLedger& sequence = ledger_.sequence();
  const std::uint64_t expected = sequence.expected() - std::exchange(reported_expected_, sequence.expected());
  const auto lost =
      static_cast<std::int64_t>(sequence.missing() - std::exchange(reported_missing_, sequence.missing()));
  ReceptionReport report;
  report.reporter = reporter_;
  report.source = *media;
  if (expected > 0 && lost > 0) {
    report.fraction_lost =
        static_cast<std::uint8_t>(std::min<std::uint64_t>(static_cast<std::uint64_t>(lost) * 256 / expected, 255));
  }
  report.lost = static_cast<std::int32_t>(std::min<std::uint64_t>(sequence.missing(), 0x7fffff));
  report.highest_sequence = static_cast<std::uint32_t>(sequence.highest());
  report.jitter = static_cast<std::uint32_t>(ledger_.jitter() * static_cast<std::uint64_t>(std::max(clock_rate, 0)) /
                                             static_cast<std::uint64_t>(kNanosecondsASecond));
  report.last_report = static_cast<std::uint32_t>(latest_ntp_ >> 16);
  const auto since = std::chrono::duration_cast<std::chrono::microseconds>(now - latest_report_).count();
  report.since_last_report = static_cast<std::uint32_t>(std::max<std::int64_t>(since, 0) * 65536 / 1'000'000);
  char name[32];
  std::snprintf(name, sizeof name, "%08" PRIx32 "@vexa", reporter_);
  send_control(control_.get(), camera_, peer_port_, receiver_report(report, name));
  ledger_.report_sent();
}

FrameFacts FrameChronicle::facts_of(const Picture& picture) {
  const Instant now = Clock::now();
  FrameFacts facts;
  facts.valid = FRAME_FACTS_KEY_PICTURE | FRAME_FACTS_LOSS | FRAME_FACTS_CONTINUITY;
  facts.keyPicture = picture.key ? 1 : 0;
  facts.discontinuity = discontinuity_before(picture, now);
  const std::uint64_t lost = pictures_lost(ledger_.collection());
  facts.framesLostBefore = lost - std::exchange(lost_frames_, lost);
  if (picture.first != nullptr) {
    add_packet_facts(picture, facts);
    add_clock_facts(picture, facts);
  } else {
    facts.valid |= FRAME_FACTS_ARRIVAL;
    facts.firstArrivalMonotonicTime = facts.lastArrivalMonotonicTime = count_of(now);
    facts.firstArrivalRealTime = facts.lastArrivalRealTime = real_now();
  }
  if (picture.range_time) {
    facts.valid |= FRAME_FACTS_SENDER_TIME;
    facts.senderTimeSource = FRAME_SENDER_TIME_RANGE;
    facts.senderTime = *picture.range_time;
    facts.senderTimeUncertainty = 1000;  // it is given in microseconds
  }
  frame_time_ = now;
  started_ = true;
  return facts;
}

std::uint32_t FrameChronicle::discontinuity_before(const Picture& picture, Instant now) {
  std::uint32_t causes = 0;
  if (!started_) {
    causes |= FRAME_DISCONTINUITY_START;
  } else if (codec_ != picture.codec) {
    causes |= FRAME_DISCONTINUITY_CODEC;
    format_ = 0;
  }
  codec_ = picture.codec;
  const std::uint64_t format = picture.key ? picture_format(picture.codec, picture.frame) : 0;
  if (format != 0) {
    const std::uint64_t before = std::exchange(format_, format);
    if (before != 0 && before != format) causes |= FRAME_DISCONTINUITY_SIZE;
  }
  if (picture.first == nullptr) return causes;
  const auto ssrc = ledger_.ssrc();
  const std::uint64_t runs = ledger_.sequence().runs();
  const bool other_source = ssrc_ != ssrc;
  if (started_ && other_source) causes |= FRAME_DISCONTINUITY_SSRC;
  if (started_ && !other_source && runs != runs_) causes |= FRAME_DISCONTINUITY_SEQUENCE_RESTART;
  if (started_ && !other_source && picture.clock_rate > 0) {
    const std::int64_t ticks = static_cast<std::int32_t>(picture.first->timestamp - timestamp_);
    const std::int64_t passed = ticks * 1'000'000 / picture.clock_rate * 1000;
    if (ticks < 0 || passed > count_of(now) - count_of(frame_time_) + kTimeJump) {
      causes |= FRAME_DISCONTINUITY_TIME_JUMP;
    }
  }
  if (!started_ || other_source) {
    unwrapped_ = picture.first->timestamp;
  } else {
    unwrapped_ += static_cast<std::int32_t>(picture.first->timestamp - timestamp_);
  }
  ssrc_ = ssrc;
  timestamp_ = picture.first->timestamp;
  return causes;
}

void FrameChronicle::add_packet_facts(const Picture& picture, FrameFacts& facts) {
  facts.valid |= FRAME_FACTS_RTP_TIME | FRAME_FACTS_SEQUENCE;
  facts.rtpTime = picture.first->timestamp;
  facts.unwrappedRtpTime = unwrapped_;
  facts.firstSequence = ledger_.extended(picture.first->sequence);
  facts.lastSequence = ledger_.extended(picture.last->sequence);
  const std::uint64_t runs = ledger_.sequence().runs();
  const std::uint64_t runs_before = std::exchange(runs_, runs);
  const bool goes_on = started_ && runs == runs_before;
  if (goes_on && facts.firstSequence > last_sequence_) {
    facts.packetsLostBefore = facts.firstSequence - last_sequence_ - 1;
  }
  last_sequence_ = facts.lastSequence;
  const Arrivals* const arrivals = find(picture.first->timestamp);
  if (arrivals == nullptr) return;
  facts.valid |= FRAME_FACTS_ARRIVAL;
  facts.arrivalSource = arrivals->source;
  facts.firstArrivalMonotonicTime = arrivals->first;
  facts.lastArrivalMonotonicTime = arrivals->last;
  facts.firstArrivalRealTime = arrivals->first + arrivals->real_ahead;
  facts.lastArrivalRealTime = arrivals->last + arrivals->real_ahead;
}

void FrameChronicle::add_clock_facts(const Picture& picture, FrameFacts& facts) {
  if ((facts.discontinuity & FRAME_DISCONTINUITY_SSRC) != 0) clock_.forget();
  if (waiting_ && waiting_->ssrc == ssrc_) take_report(*waiting_, waiting_arrival_, picture.clock_rate);
  waiting_.reset();
  facts.senderTimeEpoch = clock_.epoch();
  facts.cameraClockSteps = clock_.steps();
  if (const auto moment = clock_.time_of(facts.rtpTime, picture.clock_rate)) {
    facts.valid |= FRAME_FACTS_SENDER_TIME;
    facts.senderTimeSource = FRAME_SENDER_TIME_REPORT;
    facts.senderTime = moment->time;
    facts.senderTimeUncertainty = moment->uncertainty;
  }
  if (clock_.state() == SenderClock::State::kFrozen) {
    facts.valid |= FRAME_FACTS_CAMERA_CLOCK;
    facts.cameraClockState = FRAME_CAMERA_CLOCK_FROZEN;
  }
  const bool runs = clock_.state() == SenderClock::State::kRunning;
  if (const auto offset = runs ? clock_.offset({real_now(), count_of(Clock::now())}) : std::nullopt) {
    facts.valid |= FRAME_FACTS_CAMERA_CLOCK;
    facts.cameraClockOffset = *offset;
    facts.cameraClockLocalTimeMinutes = local_time_minutes(*offset);
    if (facts.cameraClockLocalTimeMinutes != 0) facts.cameraClockState = FRAME_CAMERA_CLOCK_LOCAL_TIME;
  }
  if (const auto rate = clock_.rate()) {
    facts.valid |= FRAME_FACTS_CLOCK_RATE;
    facts.cameraClockRate = *rate;
  }
}

}  // namespace vexa
