// What became of each packet and frame of a driver's streams.
#pragma once

#include <cstdint>
#include <map>
#include <string>

#include "vexa/export.h"

class CVexaCommon;

namespace vexa {

/// What a stream comes over (StreamStatistics::transport).
enum StreamTransportKind : std::uint32_t {
  STREAM_TRANSPORT_NONE = 0,  ///< no stream was started yet
  STREAM_TRANSPORT_UDP = 1,   ///< RTP over UDP
  STREAM_TRANSPORT_TCP = 2,   ///< RTP inside the RTSP connection
  STREAM_TRANSPORT_HTTP = 3   ///< frames over HTTP, which has no packets: their numbers stay, bytes and frames count
};

/// A moment's count of one driver, in the terms of RFC 3550, 7002 and 7004. Totals are of the driver's life and never
/// fall; what is "now" rises and falls. Durations and moments are microseconds. In every snapshot, while a stream runs
/// too:
///
///   packetsReceived = packetsUsed + packetsDuplicated + packetsDiscarded + packetsHeld
///   framesBegun     = framesHandedOut + framesDropped + framesHeldInAssembly + framesHeldInQueue
///   packetsExpected = packetsReceivedOnce + packetsMissing + packetsMissingInCamera
///
/// where packetsDiscarded and framesDropped are the sums of their reasons, which follow them. After each field stands
/// its name for Prometheus, as AsTable gives it.
struct StreamStatistics {
  /// In: the bytes of this record as the host was compiled; GetStreamStatistics fills no more. Out: those it filled.
  std::uint32_t size = sizeof(StreamStatistics);
  /// A StreamTransportKind, of the latest stream. vexa_stream_transport
  std::uint32_t transport = STREAM_TRANSPORT_NONE;

  std::uint64_t time = 0;        ///< of the snapshot, since 1970 UTC. vexa_stream_snapshot_time_microseconds
  std::uint64_t since = 0;       ///< start of the totals, since 1970 UTC. vexa_stream_since_microseconds
  std::uint64_t epoch = 0;       ///< raised by every start and every new SSRC. vexa_stream_epoch_total
  std::uint64_t epochSince = 0;  ///< start of the epoch, since 1970 UTC. vexa_stream_epoch_since_microseconds

  // Packets: RTP datagrams, or RTP packets inside the connection
  std::uint64_t packetsReceived = 0;    ///< vexa_stream_packets_received_total
  std::uint64_t bytesReceived = 0;      ///< whole datagrams; of HTTP frames' bytes. vexa_stream_bytes_received_total
  std::uint64_t packetsUsed = 0;        ///< left the order with their frame. vexa_stream_packets_used_total
  std::uint64_t packetsDuplicated = 0;  ///< had come before. vexa_stream_packets_duplicated_total
  std::uint64_t packetsHeld = 0;        ///< now, in order, for their frame. vexa_stream_packets_held
  std::uint64_t packetsDiscarded = 0;   ///< for one of the reasons below. vexa_stream_packets_discarded_total
  /// Came when their frame's turn was over. vexa_stream_packets_discarded_by_reason_total{reason="late"}
  std::uint64_t packetsDiscardedLate = 0;
  /// Their frame was given up, since other packets of it never came. ...{reason="incomplete"}
  std::uint64_t packetsDiscardedIncomplete = 0;
  /// Contradict themselves; inside the connection only. ...{reason="malformed"}
  std::uint64_t packetsDiscardedMalformed = 0;
  /// Shorter than an RTP header. ...{reason="not_rtp"}
  std::uint64_t packetsDiscardedNotRtp = 0;
  /// Of another address; with strict reception only. ...{reason="foreign_source"}
  std::uint64_t packetsDiscardedForeignSource = 0;
  /// Of another SSRC; with strict reception only. ...{reason="foreign_ssrc"}
  std::uint64_t packetsDiscardedForeignSsrc = 0;
  /// Of a payload type that the codec has not. ...{reason="wrong_payload_type"}
  std::uint64_t packetsDiscardedWrongPayloadType = 0;
  /// Longer than any datagram over IPv4. ...{reason="truncated"}
  std::uint64_t packetsDiscardedTruncated = 0;
  /// The packet buffer began again before their frame was complete. ...{reason="overwritten"}
  std::uint64_t packetsDiscardedOverwritten = 0;
  /// Held when the stream ended. ...{reason="after_stop"}
  std::uint64_t packetsDiscardedAfterStop = 0;
  std::uint64_t packetsDiscardedNoMemory = 0;  ///< ...{reason="no_memory"}
  /// Found no room in the socket's buffer; not among packetsReceived, and of UDP among packetsMissing. Read four times
  /// a second. vexa_stream_packets_dropped_by_kernel_total
  std::uint64_t packetsDroppedByKernel = 0;

  // By sequence numbers (RFC 3550, A.3)
  /// Extended highest - base + 1, summed over sources and starts. vexa_stream_packets_expected_total
  std::uint64_t packetsExpected = 0;
  std::uint64_t packetsReceivedOnce = 0;  ///< of the expected. vexa_stream_packets_received_once_total
  /// Now: of those expected over UDP, they have not come. vexa_stream_packets_missing
  std::uint64_t packetsMissing = 0;
  /// Now: of those expected over TCP, which loses none: the camera left them out. vexa_stream_packets_missing_in_camera
  std::uint64_t packetsMissingInCamera = 0;
  /// Were missing until they came after a later one; each counts once. vexa_stream_packets_late_total
  std::uint64_t packetsLate = 0;

  // Frames
  std::uint64_t framesBegun = 0;           ///< some of it has come. vexa_stream_frames_begun_total
  std::uint64_t framesAssembled = 0;       ///< whole, whatever became of it. vexa_stream_frames_assembled_total
  std::uint64_t framesHandedOut = 0;       ///< to the host. vexa_stream_frames_handed_out_total
  std::uint64_t framesHeldInAssembly = 0;  ///< now: some packets are there. vexa_stream_frames_held{place="assembly"}
  std::uint64_t framesHeldInQueue = 0;     ///< now: for the host. vexa_stream_frames_held{place="queue"}
  std::uint64_t keyFrames = 0;             ///< of the assembled. vexa_stream_key_frames_total
  std::uint64_t framesDropped = 0;         ///< for one of the reasons below. vexa_stream_frames_dropped_total
  /// Packets never came. vexa_stream_frames_dropped_by_reason_total{reason="incomplete"}
  std::uint64_t framesDroppedIncomplete = 0;
  std::uint64_t framesDroppedDamaged = 0;     ///< complete, and not to be read. ...{reason="damaged"}
  std::uint64_t framesDroppedWithoutKey = 0;  ///< whole, without what it refers to. ...{reason="without_key"}
  std::uint64_t framesDroppedTooLarge = 0;    ///< ...{reason="too_large"}
  std::uint64_t framesDroppedQueue = 0;       ///< the host read too slowly. ...{reason="queue"}
  std::uint64_t framesDroppedAfterStop = 0;   ///< begun or queued when the stream ended. ...{reason="after_stop"}
  std::uint64_t framesDroppedNoMemory = 0;    ///< ...{reason="no_memory"}

  // Requests, and their failures by the code that the operation returns
  std::uint64_t rtspRequests = 0;       ///< vexa_rtsp_requests_total
  std::uint64_t rtspFailed = 0;         ///< LIBD_FAILED. vexa_rtsp_failures_total{code="failed"}
  std::uint64_t rtspTimedOut = 0;       ///< LIBD_TIMEOUT. ...{code="timeout"}
  std::uint64_t rtspUnauthorized = 0;   ///< LIBD_UNAUTHORIZED. ...{code="unauthorized"}
  std::uint64_t httpRequests = 0;       ///< vexa_http_requests_total
  std::uint64_t httpFailed = 0;         ///< LIBD_FAILED. vexa_http_failures_total{code="failed"}
  std::uint64_t httpTimedOut = 0;       ///< LIBD_TIMEOUT. ...{code="timeout"}
  std::uint64_t httpUnauthorized = 0;   ///< LIBD_UNAUTHORIZED. ...{code="unauthorized"}
  std::uint64_t keepAlives = 0;         ///< sent, and among rtspRequests. vexa_rtsp_keep_alives_total
  std::uint64_t keepAlivesUnheard = 0;  ///< of them, without an answer. vexa_rtsp_keep_alives_unheard_total

  // RTCP
  /// Of this host, beside the media port; 0: taken by another, or the stream has none. vexa_rtcp_port
  std::uint64_t rtcpPort = 0;
  std::uint64_t rtcpSenderReports = 0;    ///< taken from the camera. vexa_rtcp_sender_reports_total
  std::uint64_t rtcpReceiverReports = 0;  ///< sent to it. vexa_rtcp_receiver_reports_total
  /// Of another address or SSRC, or not to be read. vexa_rtcp_refused_total
  std::uint64_t rtcpRefused = 0;

  // Time
  std::uint64_t wakeUps = 0;     ///< of the thread that reads packets, by a packet. vexa_stream_wake_ups_total
  std::uint64_t longestGap = 0;  ///< between two packets of a stream. vexa_stream_longest_gap_microseconds
  /// Until the snapshot; UINT64_MAX while none has come. vexa_stream_since_last_packet_microseconds
  std::uint64_t timeSinceLastPacket = UINT64_MAX;
  /// The same of the last whole frame. vexa_stream_since_last_frame_microseconds
  std::uint64_t timeSinceLastFrame = UINT64_MAX;
  /// Interarrival jitter (RFC 3550, 6.4.1) of each picture's first packet; of the epoch.
  /// vexa_stream_jitter_microseconds
  std::uint64_t jitter = 0;
};

/// Takes a snapshot. Any thread, at any time of the driver's life; takes no lock that the streaming thread waits for.
/// The counts of packets are those of when that thread last waited or finished a frame. Set `statistics.size` as its
/// constructor does; a size below 4 is filled with nothing.
VEXA_API void GetStreamStatistics(CVexaCommon& driver, StreamStatistics& statistics);

/// All numbers of a snapshot by their names for Prometheus; those that `statistics.size` covers.
VEXA_API std::map<std::string, std::uint64_t> AsTable(const StreamStatistics& statistics);

}  // namespace vexa
