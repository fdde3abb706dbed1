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
#include "transport/wire/packet_order.h"

namespace vexa {
namespace {

using Clock = std::chrono::steady_clock;

/// A report that waits at the port keeps the kernel's time of its arrival: looking seldom costs nothing.
constexpr std::chrono::milliseconds kControlInterval{250};
/// RFC 3550, 6.2: at least five seconds between reports.
constexpr std::chrono::seconds kReportInterval{5};
constexpr std::size_t kControlRoom = 1500;
/// More at one look is no camera's.
constexpr int kMostReportsALook = 8;

/// RTP time that went so much farther than the host's has jumped.
constexpr std::int64_t kTimeJump = 10 * kNanosecondsASecond;

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
  stream_ = {};
  stream_.control = std::move(control);
  stream_.camera = camera;
  stream_.reporter = random_number();
  stream_.lost_frames = pictures_lost(ledger_.collection());
}

void FrameChronicle::stamp(std::int64_t& moment, Arrivals& arrivals, int socket) {
  const auto arrival = arrival_of_latest(socket);
  if (!arrival) return;
  arrivals.source = FRAME_ARRIVAL_KERNEL;
  moment = *arrival - arrivals.real_ahead;
}

FrameChronicle::Arrivals* FrameChronicle::find(std::uint32_t timestamp) {
  auto& all = stream_.arrivals;
  const auto same = [timestamp](const Arrivals& known) { return known.used && known.timestamp == timestamp; };
  if (same(all[stream_.latest])) return &all[stream_.latest];
  const auto found = std::find_if(all.begin(), all.end(), same);
  return found != all.end() ? &*found : nullptr;
}

// A picture's first packet, or a packet out of order.
void FrameChronicle::arrived_elsewhere(const SPacketInfo& packet, int socket, Instant now) {
  const bool is_first = !stream_.arrivals[stream_.latest].used;
  const bool is_newest = is_first || timestamp_is_after(packet.timestamp, stream_.newest);
  Arrivals* const found = is_newest ? nullptr : find(packet.timestamp);
  if (found != nullptr) {
    found->last = nanoseconds_of(now);
    if (packet.marker) stamp(found->last, *found, socket);
    return;
  }
  if (is_newest) stream_.newest = packet.timestamp;
  stream_.latest = (stream_.latest + 1) % stream_.arrivals.size();
  Arrivals& opened = stream_.arrivals[stream_.latest];
  opened = {};
  opened.timestamp = packet.timestamp;
  opened.used = true;
  opened.first = nanoseconds_of(now);
  opened.real_ahead = nanoseconds_since_1970() - opened.first;
  stamp(opened.first, opened, socket);
  opened.last = opened.first;
}

void FrameChronicle::tend_control(int clock_rate, Instant now) {
  if (!stream_.control.valid() || now - stream_.looked < kControlInterval) return;
  stream_.looked = now;
  std::array<unsigned char, kControlRoom> room;
  for (int i = 0; i < kMostReportsALook; ++i) {
    const auto datagram = receive_control(stream_.control.get(), room);
    if (!datagram) break;
    if (datagram->address != stream_.camera) {
      ledger_.report_refused();
      continue;
    }
    stream_.peer_port = datagram->port;
    const std::int64_t real_ahead = nanoseconds_since_1970() - nanoseconds_of(Clock::now());
    take_control(Bytes(room).first(datagram->length), clock_rate, {datagram->arrival, datagram->arrival - real_ahead});
  }
  report_back(clock_rate, now);
}

void FrameChronicle::take_control(Bytes compound, int clock_rate, SenderClock::Arrival arrival) {
  const auto report = find_sender_report(compound);
  if (!report) return ledger_.report_refused();
  const auto media = ledger_.ssrc();
  if (!media) {
    stream_.waiting = *report;
    stream_.waiting_arrival = arrival;
    return;
  }
  if (report->ssrc != *media) return ledger_.report_refused();
  take_report(*report, arrival, clock_rate);
}

void FrameChronicle::take_report(const SenderReport& report, SenderClock::Arrival arrival, int clock_rate) {
  ledger_.report_taken();
  stream_.latest_ntp = report.ntp;
  stream_.latest_report =
      Instant(std::chrono::duration_cast<Instant::duration>(std::chrono::nanoseconds(arrival.monotonic)));
  stream_.clock.report(report, arrival, clock_rate);
}

// Only a camera that reports is reported to: others do not expect it.
void FrameChronicle::report_back(int clock_rate, Instant now) {
  if (stream_.peer_port == 0 || stream_.latest_report == Instant{} || now - stream_.reported < kReportInterval) return;
  const auto media = ledger_.ssrc();
  if (!media) return;
  stream_.reported = now;
  const SequenceLedger& sequence = ledger_.sequence();
  const std::uint64_t expected = sequence.expected() - std::exchange(stream_.reported_expected, sequence.expected());
  const auto lost =
      static_cast<std::int64_t>(sequence.missing() - std::exchange(stream_.reported_missing, sequence.missing()));
  ReceptionReport report;
  report.reporter = stream_.reporter;
  report.source = *media;
  if (expected > 0 && lost > 0) {
    report.fraction_lost =
        static_cast<std::uint8_t>(std::min<std::uint64_t>(static_cast<std::uint64_t>(lost) * 256 / expected, 255));
  }
  report.lost = static_cast<std::int32_t>(std::min<std::uint64_t>(sequence.missing(), 0x7fffff));
  report.highest_sequence = static_cast<std::uint32_t>(sequence.highest());
  report.jitter = static_cast<std::uint32_t>(ledger_.jitter() * static_cast<std::uint64_t>(std::max(clock_rate, 0)) /
                                             static_cast<std::uint64_t>(kNanosecondsASecond));
  report.last_report = static_cast<std::uint32_t>(stream_.latest_ntp >> 16);
  const auto since = std::chrono::duration_cast<std::chrono::microseconds>(now - stream_.latest_report).count();
  report.since_last_report = static_cast<std::uint32_t>(std::max<std::int64_t>(since, 0) * 65536 / 1'000'000);
  char name[32];
  std::snprintf(name, sizeof name, "%08" PRIx32 "@vexa", stream_.reporter);
  send_control(stream_.control.get(), stream_.camera, stream_.peer_port, receiver_report(report, name));
  ledger_.report_sent();
}

FrameFacts FrameChronicle::facts_of(const Picture& picture, Instant now) {
  FrameFacts facts;
  facts.valid = FRAME_FACTS_KEY_PICTURE | FRAME_FACTS_LOSS | FRAME_FACTS_CONTINUITY;
  facts.keyPicture = picture.key ? 1 : 0;
  facts.discontinuity = discontinuity_before(picture, now);
  const std::uint64_t lost = pictures_lost(ledger_.collection());
  facts.framesLostBefore = lost - std::exchange(stream_.lost_frames, lost);
  if (picture.first != nullptr) {
    add_packet_facts(picture, facts);
    add_clock_facts(picture, facts, now);
  } else {
    facts.valid |= FRAME_FACTS_ARRIVAL;
    facts.firstArrivalMonotonicTime = facts.lastArrivalMonotonicTime = nanoseconds_of(now);
    facts.firstArrivalRealTime = facts.lastArrivalRealTime = nanoseconds_since_1970();
  }
  if (picture.range_time) {
    facts.valid |= FRAME_FACTS_SENDER_TIME;
    facts.senderTimeSource = FRAME_SENDER_TIME_RANGE;
    facts.senderTime = *picture.range_time;
    facts.senderTimeUncertainty = 1000;  // it is given in microseconds
  }
  stream_.frame_time = now;
  stream_.started = true;
  return facts;
}

std::uint32_t FrameChronicle::discontinuity_before(const Picture& picture, Instant now) {
  std::uint32_t causes = 0;
  if (!stream_.started) {
    causes |= FRAME_DISCONTINUITY_START;
  } else if (stream_.codec != picture.codec) {
    causes |= FRAME_DISCONTINUITY_CODEC;
    stream_.format = 0;
  }
  stream_.codec = picture.codec;
  const std::uint64_t format = picture.key ? picture_format(picture.codec, picture.frame) : 0;
  if (format != 0) {
    const std::uint64_t before = std::exchange(stream_.format, format);
    if (before != 0 && before != format) causes |= FRAME_DISCONTINUITY_SIZE;
  }
  if (picture.first == nullptr) return causes;
  const auto ssrc = ledger_.ssrc();
  const std::uint64_t runs = ledger_.sequence().runs();
  const bool other_source = stream_.ssrc != ssrc;
  if (stream_.started && other_source) causes |= FRAME_DISCONTINUITY_SSRC;
  if (stream_.started && !other_source && runs != stream_.runs) causes |= FRAME_DISCONTINUITY_SEQUENCE_RESTART;
  if (stream_.started && !other_source && picture.clock_rate > 0) {
    const std::int64_t ticks = static_cast<std::int32_t>(picture.first->timestamp - stream_.timestamp);
    const std::int64_t passed = ticks * 1'000'000 / picture.clock_rate * 1000;
    if (ticks < 0 || passed > nanoseconds_of(now) - nanoseconds_of(stream_.frame_time) + kTimeJump) {
      causes |= FRAME_DISCONTINUITY_TIME_JUMP;
    }
  }
  if (!stream_.started || other_source) {
    stream_.unwrapped = picture.first->timestamp;
  } else {
    stream_.unwrapped += static_cast<std::int32_t>(picture.first->timestamp - stream_.timestamp);
  }
  stream_.ssrc = ssrc;
  stream_.timestamp = picture.first->timestamp;
  return causes;
}

void FrameChronicle::add_packet_facts(const Picture& picture, FrameFacts& facts) {
  facts.valid |= FRAME_FACTS_RTP_TIME | FRAME_FACTS_SEQUENCE;
  facts.rtpTime = picture.first->timestamp;
  facts.unwrappedRtpTime = stream_.unwrapped;
  facts.firstSequence = ledger_.extended(picture.first->sequence);
  facts.lastSequence = ledger_.extended(picture.last->sequence);
  const std::uint64_t runs = ledger_.sequence().runs();
  const std::uint64_t runs_before = std::exchange(stream_.runs, runs);
  const bool goes_on = stream_.started && runs == runs_before;
  if (goes_on && facts.firstSequence > stream_.last_sequence) {
    facts.packetsLostBefore = facts.firstSequence - stream_.last_sequence - 1;
  }
  stream_.last_sequence = facts.lastSequence;
  const Arrivals* const arrivals = find(picture.first->timestamp);
  if (arrivals == nullptr) return;
  facts.valid |= FRAME_FACTS_ARRIVAL;
  facts.arrivalSource = arrivals->source;
  facts.firstArrivalMonotonicTime = arrivals->first;
  facts.lastArrivalMonotonicTime = arrivals->last;
  facts.firstArrivalRealTime = arrivals->first + arrivals->real_ahead;
  facts.lastArrivalRealTime = arrivals->last + arrivals->real_ahead;
}

void FrameChronicle::add_clock_facts(const Picture& picture, FrameFacts& facts, Instant now) {
  SenderClock& clock = stream_.clock;
  if ((facts.discontinuity & FRAME_DISCONTINUITY_SSRC) != 0) clock.forget();
  const auto waiting = std::exchange(stream_.waiting, std::nullopt);
  if (waiting && waiting->ssrc == stream_.ssrc) take_report(*waiting, stream_.waiting_arrival, picture.clock_rate);
  facts.senderTimeEpoch = clock.epoch();
  facts.cameraClockSteps = clock.steps();
  if (const auto moment = clock.time_of(facts.rtpTime, picture.clock_rate)) {
    facts.valid |= FRAME_FACTS_SENDER_TIME;
    facts.senderTimeSource = FRAME_SENDER_TIME_REPORT;
    facts.senderTime = moment->time;
    facts.senderTimeUncertainty = moment->uncertainty;
  }
  if (clock.state() == SenderClock::State::kFrozen) {
    facts.valid |= FRAME_FACTS_CAMERA_CLOCK;
    facts.cameraClockState = FRAME_CAMERA_CLOCK_FROZEN;
  }
  const bool runs = clock.state() == SenderClock::State::kRunning;
  if (const auto offset = runs ? clock.offset({nanoseconds_since_1970(), nanoseconds_of(now)}) : std::nullopt) {
    facts.valid |= FRAME_FACTS_CAMERA_CLOCK;
    facts.cameraClockOffset = *offset;
    facts.cameraClockLocalTimeMinutes = local_time_minutes(*offset);
    if (facts.cameraClockLocalTimeMinutes != 0) facts.cameraClockState = FRAME_CAMERA_CLOCK_LOCAL_TIME;
  }
  if (const auto rate = clock.rate()) {
    facts.valid |= FRAME_FACTS_CLOCK_RATE;
    facts.cameraClockRate = *rate;
  }
}

}  // namespace vexa
