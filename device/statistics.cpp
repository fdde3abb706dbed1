// What a host reads of a driver's counts.
#include "vexa/statistics.h"

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstring>

#include "device/driver_state.h"

namespace {

using vexa::StreamStatistics;

constexpr std::uint64_t kNanosecondsAMicrosecond = 1000;

struct Row {
  const char* name;
  std::uint64_t StreamStatistics::*field;
};

#define VEXA_DISCARDED(reason) "vexa_stream_packets_discarded_by_reason_total{reason=\"" reason "\"}"
#define VEXA_DROPPED(reason) "vexa_stream_frames_dropped_by_reason_total{reason=\"" reason "\"}"

constexpr Row kRows[] = {{"vexa_stream_snapshot_time_microseconds", &StreamStatistics::time},
                         {"vexa_stream_since_microseconds", &StreamStatistics::since},
                         {"vexa_stream_epoch_total", &StreamStatistics::epoch},
                         {"vexa_stream_epoch_since_microseconds", &StreamStatistics::epochSince},
                         {"vexa_stream_packets_received_total", &StreamStatistics::packetsReceived},
                         {"vexa_stream_bytes_received_total", &StreamStatistics::bytesReceived},
                         {"vexa_stream_packets_used_total", &StreamStatistics::packetsUsed},
                         {"vexa_stream_packets_duplicated_total", &StreamStatistics::packetsDuplicated},
                         {"vexa_stream_packets_held", &StreamStatistics::packetsHeld},
                         {"vexa_stream_packets_discarded_total", &StreamStatistics::packetsDiscarded},
                         {VEXA_DISCARDED("late"), &StreamStatistics::packetsDiscardedLate},
                         {VEXA_DISCARDED("incomplete"), &StreamStatistics::packetsDiscardedIncomplete},
                         {VEXA_DISCARDED("malformed"), &StreamStatistics::packetsDiscardedMalformed},
                         {VEXA_DISCARDED("not_rtp"), &StreamStatistics::packetsDiscardedNotRtp},
                         {VEXA_DISCARDED("foreign_source"), &StreamStatistics::packetsDiscardedForeignSource},
                         {VEXA_DISCARDED("foreign_ssrc"), &StreamStatistics::packetsDiscardedForeignSsrc},
                         {VEXA_DISCARDED("wrong_payload_type"), &StreamStatistics::packetsDiscardedWrongPayloadType},
                         {VEXA_DISCARDED("truncated"), &StreamStatistics::packetsDiscardedTruncated},
                         {VEXA_DISCARDED("overwritten"), &StreamStatistics::packetsDiscardedOverwritten},
                         {VEXA_DISCARDED("after_stop"), &StreamStatistics::packetsDiscardedAfterStop},
                         {VEXA_DISCARDED("no_memory"), &StreamStatistics::packetsDiscardedNoMemory},
                         {"vexa_stream_packets_dropped_by_kernel_total", &StreamStatistics::packetsDroppedByKernel},
                         {"vexa_stream_packets_expected_total", &StreamStatistics::packetsExpected},
                         {"vexa_stream_packets_received_once_total", &StreamStatistics::packetsReceivedOnce},
                         {"vexa_stream_packets_missing", &StreamStatistics::packetsMissing},
                         {"vexa_stream_packets_missing_in_camera", &StreamStatistics::packetsMissingInCamera},
                         {"vexa_stream_packets_late_total", &StreamStatistics::packetsLate},
                         {"vexa_stream_frames_begun_total", &StreamStatistics::framesBegun},
                         {"vexa_stream_frames_assembled_total", &StreamStatistics::framesAssembled},
                         {"vexa_stream_frames_handed_out_total", &StreamStatistics::framesHandedOut},
                         {"vexa_stream_frames_held{place=\"assembly\"}", &StreamStatistics::framesHeldInAssembly},
                         {"vexa_stream_frames_held{place=\"queue\"}", &StreamStatistics::framesHeldInQueue},
                         {"vexa_stream_key_frames_total", &StreamStatistics::keyFrames},
                         {"vexa_stream_frames_dropped_total", &StreamStatistics::framesDropped},
                         {VEXA_DROPPED("incomplete"), &StreamStatistics::framesDroppedIncomplete},
                         {VEXA_DROPPED("damaged"), &StreamStatistics::framesDroppedDamaged},
                         {VEXA_DROPPED("without_key"), &StreamStatistics::framesDroppedWithoutKey},
                         {VEXA_DROPPED("too_large"), &StreamStatistics::framesDroppedTooLarge},
                         {VEXA_DROPPED("queue"), &StreamStatistics::framesDroppedQueue},
                         {VEXA_DROPPED("after_stop"), &StreamStatistics::framesDroppedAfterStop},
                         {VEXA_DROPPED("no_memory"), &StreamStatistics::framesDroppedNoMemory},
                         {"vexa_rtsp_requests_total", &StreamStatistics::rtspRequests},
                         {"vexa_rtsp_failures_total{code=\"failed\"}", &StreamStatistics::rtspFailed},
                         {"vexa_rtsp_failures_total{code=\"timeout\"}", &StreamStatistics::rtspTimedOut},
                         {"vexa_rtsp_failures_total{code=\"unauthorized\"}", &StreamStatistics::rtspUnauthorized},
                         {"vexa_http_requests_total", &StreamStatistics::httpRequests},
                         {"vexa_http_failures_total{code=\"failed\"}", &StreamStatistics::httpFailed},
                         {"vexa_http_failures_total{code=\"timeout\"}", &StreamStatistics::httpTimedOut},
                         {"vexa_http_failures_total{code=\"unauthorized\"}", &StreamStatistics::httpUnauthorized},
                         {"vexa_rtsp_keep_alives_total", &StreamStatistics::keepAlives},
                         {"vexa_rtsp_keep_alives_unheard_total", &StreamStatistics::keepAlivesUnheard},
                         {"vexa_rtcp_port", &StreamStatistics::rtcpPort},
                         {"vexa_rtcp_sender_reports_total", &StreamStatistics::rtcpSenderReports},
                         {"vexa_rtcp_receiver_reports_total", &StreamStatistics::rtcpReceiverReports},
                         {"vexa_rtcp_refused_total", &StreamStatistics::rtcpRefused},
                         {"vexa_stream_wake_ups_total", &StreamStatistics::wakeUps},
                         {"vexa_stream_longest_gap_microseconds", &StreamStatistics::longestGap},
                         {"vexa_stream_since_last_packet_microseconds", &StreamStatistics::timeSinceLastPacket},
                         {"vexa_stream_since_last_frame_microseconds", &StreamStatistics::timeSinceLastFrame},
                         {"vexa_stream_jitter_microseconds", &StreamStatistics::jitter}};

#undef VEXA_DISCARDED
#undef VEXA_DROPPED

/// A record of as many bytes as the host's; members that its end cuts are not filled.
template <typename Record>
void hand_out(Record& filled, Record& out) {
  const std::size_t size = std::min<std::size_t>(out.size, sizeof filled);
  filled.size = static_cast<std::uint32_t>(size);
  std::memcpy(static_cast<void*>(&out), &filled, size);
}

void count_packets(const vexa::StreamRecord& stream, StreamStatistics& out) {
  const vexa::CollectionCounts& collection = stream.collection;
  out.packetsReceived = stream.packets_received;
  out.bytesReceived = stream.bytes_received;
  out.packetsUsed = collection.used + stream.packets_passed_on;
  out.packetsDuplicated = collection.duplicated;
  out.packetsHeld = collection.held;
  out.packetsDiscardedLate = collection.late;
  out.packetsDiscardedIncomplete = collection.given_up;
  out.packetsDiscardedMalformed = stream.malformed;
  out.packetsDiscardedNotRtp = stream.not_rtp;
  out.packetsDiscardedForeignSource = stream.foreign_source;
  out.packetsDiscardedForeignSsrc = stream.foreign_ssrc;
  out.packetsDiscardedWrongPayloadType = stream.wrong_payload_type;
  out.packetsDiscardedTruncated = stream.truncated;
  out.packetsDiscardedOverwritten = collection.overwritten;
  out.packetsDiscardedAfterStop = collection.stopped;
  out.packetsDiscardedNoMemory = stream.no_memory;
  out.packetsDiscarded = out.packetsDiscardedLate + out.packetsDiscardedIncomplete + out.packetsDiscardedMalformed +
                         out.packetsDiscardedNotRtp + out.packetsDiscardedForeignSource +
                         out.packetsDiscardedForeignSsrc + out.packetsDiscardedWrongPayloadType +
                         out.packetsDiscardedTruncated + out.packetsDiscardedOverwritten +
                         out.packetsDiscardedAfterStop + out.packetsDiscardedNoMemory;
  out.packetsDroppedByKernel = stream.kernel_drops;
  out.packetsExpected = stream.expected;
  out.packetsMissing = stream.missing;
  out.packetsMissingInCamera = stream.missing_in_camera;
  out.packetsReceivedOnce = stream.expected - stream.missing - stream.missing_in_camera;
  out.packetsLate = stream.late;
}

void count_frames(const vexa::StreamRecord& stream, const vexa::QueueCounts& queue, StreamStatistics& out) {
  const vexa::CollectionCounts& collection = stream.collection;
  // Assembled since the queue was counted: on their way to it, or past it already.
  const std::uint64_t on_the_way = collection.pictures_assembled - stream.frames_taken - queue.from_reader;
  out.framesBegun = collection.pictures_begun + queue.from_elsewhere;
  out.framesAssembled = collection.pictures_assembled;
  out.framesHandedOut = queue.handed_out + stream.frames_taken;
  out.framesHeldInAssembly = collection.pictures_held;
  out.framesHeldInQueue = queue.held() + on_the_way;
  out.keyFrames = stream.key_frames;
  out.framesDroppedIncomplete = collection.pictures_incomplete;
  out.framesDroppedDamaged = collection.pictures_damaged;
  out.framesDroppedWithoutKey = collection.pictures_without_key + queue.dropped_without_key;
  out.framesDroppedTooLarge = collection.pictures_too_large;
  out.framesDroppedQueue = queue.dropped_full;
  out.framesDroppedAfterStop = collection.pictures_stopped + queue.dropped_at_stop;
  out.framesDroppedNoMemory = queue.dropped_no_memory;
  out.framesDropped = out.framesDroppedIncomplete + out.framesDroppedDamaged + out.framesDroppedWithoutKey +
                      out.framesDroppedTooLarge + out.framesDroppedQueue + out.framesDroppedAfterStop +
                      out.framesDroppedNoMemory;
}

void count_reports(const vexa::StreamRecord& stream, StreamStatistics& out) {
  out.rtcpPort = stream.control_port;
  out.rtcpSenderReports = stream.sender_reports;
  out.rtcpReceiverReports = stream.receiver_reports;
  out.rtcpRefused = stream.reports_refused;
}

void count_requests(const vexa::ExchangeCounts& exchanges, StreamStatistics& out) {
  out.rtspRequests = exchanges.rtsp.requests;
  out.rtspFailed = exchanges.rtsp.failed;
  out.rtspTimedOut = exchanges.rtsp.timed_out;
  out.rtspUnauthorized = exchanges.rtsp.unauthorized;
  out.httpRequests = exchanges.http.requests;
  out.httpFailed = exchanges.http.failed;
  out.httpTimedOut = exchanges.http.timed_out;
  out.httpUnauthorized = exchanges.http.unauthorized;
  out.keepAlives = exchanges.keep_alives;
  out.keepAlivesUnheard = exchanges.keep_alives_unheard;
}

std::uint64_t microseconds_since(std::uint64_t moment, std::uint64_t now) {
  if (moment == 0) return UINT64_MAX;
  return now > moment ? (now - moment) / kNanosecondsAMicrosecond : 0;
}

template <typename Clock>
std::uint64_t nanoseconds_on() {
  return static_cast<std::uint64_t>(
      std::chrono::duration_cast<std::chrono::nanoseconds>(Clock::now().time_since_epoch()).count());
}

void take_times(const vexa::StreamRecord& stream, StreamStatistics& out) {
  const std::uint64_t now = nanoseconds_on<std::chrono::steady_clock>();
  out.time = nanoseconds_on<std::chrono::system_clock>() / kNanosecondsAMicrosecond;
  out.epoch = stream.epoch;
  out.epochSince = stream.epoch_since / kNanosecondsAMicrosecond;
  out.wakeUps = stream.wakeups;
  out.longestGap = stream.longest_gap / kNanosecondsAMicrosecond;
  out.timeSinceLastPacket = microseconds_since(stream.last_packet, now);
  out.timeSinceLastFrame = microseconds_since(stream.last_frame, now);
  out.jitter = stream.jitter / kNanosecondsAMicrosecond;
}

}  // namespace

namespace vexa {

void GetStreamStatistics(CVexaCommon& driver, StreamStatistics& statistics) {
  const DriverState& state = DriverState::of(driver);
  // The queue first: what the reader counts afterwards includes every frame that the queue has counted.
  const QueueCounts queue = state.published_queue.read();
  const StreamRecord stream = state.ledger.read();
  StreamStatistics filled;
  filled.transport = static_cast<std::uint32_t>(stream.transport);
  filled.since = static_cast<std::uint64_t>(state.created) / kNanosecondsAMicrosecond;
  count_packets(stream, filled);
  count_frames(stream, queue, filled);
  count_reports(stream, filled);
  count_requests(state.exchanges.read(), filled);
  take_times(stream, filled);
  hand_out(filled, statistics);
}

std::map<std::string, std::uint64_t> AsTable(const StreamStatistics& statistics) {
  StreamStatistics read;
  std::memcpy(static_cast<void*>(&read), &statistics, std::min<std::size_t>(statistics.size, sizeof read));
  std::map<std::string, std::uint64_t> table;
  for (const Row& row : kRows) {
    const auto* end = reinterpret_cast<const unsigned char*>(&(read.*row.field) + 1);
    if (static_cast<std::size_t>(end - reinterpret_cast<const unsigned char*>(&read)) > statistics.size) continue;
    table.emplace(row.name, read.*row.field);
  }
  table.emplace("vexa_stream_transport", read.transport);
  return table;
}

}  // namespace vexa
