// SPDX-License-Identifier: Apache-2.0
// The state of a driver object besides the fields of its class, and the steps that several of its members share.
#pragma once

#include <atomic>
#include <cstdint>
#include <ctime>
#include <deque>
#include <memory>
#include <optional>
#include <span>
#include <string>

#include "device/camera_link.h"
#include "device/cancellation.h"
#include "device/cgi/input_part.h"
#include "device/error_record.h"
#include "device/exchange_ledger.h"
#include "device/flight_recorder.h"
#include "device/operation.h"
#include "device/polled_stream.h"
#include "device/queue_counts.h"
#include "device/readiness.h"
#include "device/request_echo.h"
#include "media/assembly/picture_rules.h"
#include "media/frame_store.h"
#include "media/picture_reader.h"
#include "media/rtp_reception.h"
#include "media/stream_ledger.h"
#include "transport/interleaved_stream.h"
#include "transport/rtsp_session.h"
#include "vexa/vexa_common.h"

namespace vexa {

class FrameChronicle;

inline std::time_t system_seconds() { return std::time(nullptr); }

/// The room that a member is given as a pointer and a length; none for a negative length.
inline std::span<char> room_of(char* buffer, int length) {
  return {buffer, length < 0 ? 0 : static_cast<std::size_t>(length)};
}

/// Everything that a driver keeps and does without its class header showing it. Made by the driver's constructor and
/// destroyed with it; its parts refer to the driver's fields. The heading of each group names the thread that runs its
/// steps and the file with their bodies.
struct DriverState {
  explicit DriverState(CVexaCommon& owner);
  DriverState(const DriverState&) = delete;
  DriverState& operator=(const DriverState&) = delete;
  ~DriverState();

  /// For functions of the interface that are not the class's.
  static DriverState& of(CVexaCommon& driver) { return *driver.m_State; }

  CVexaCommon& driver;
  Cancellation cancellation;
  ErrorRecord errors;
  Connection connection;
  FlightRecorder recorder;
  RequestEcho echo;
  CgiLog log;
  ExchangeLedger exchanges;
  CameraLink camera;
  Readiness readiness;
  PolledStream audio;
  PolledStream alarms;
  PolledStream metadata;
  CSimpleLock start_stop_lock;  ///< held by a start or stop of video from begin to end; outermost
  SecondsClock now = system_seconds;
  std::atomic<bool> prompt_frames{false};
  int teardown_timeout = 15000;       ///< milliseconds for the answer to a TEARDOWN; tests put less in its place
  std::unique_ptr<RtpReception> rtp;  ///< the streaming thread's; null while no RTP streams
  StreamLedger ledger;                ///< the streaming thread's, or a starter's or stopper's while there is none
  std::unique_ptr<FrameChronicle> chronicle;  ///< as `ledger`; never null
  std::atomic<bool> strict_reception{false};  ///< any thread's
  QueuedFacts ready_frame;                    ///< assembled and on its way to the queue; as `ledger`
  std::size_t stream_part = SIZE_MAX;         ///< bytes in use at the start of m_StreamBuffer; the streaming thread's
  FrameStore spare_frames VEXA_GUARDED_BY(driver.m_FrameQueueLock);
  QueueCounts queue VEXA_GUARDED_BY(driver.m_FrameQueueLock);
  LostFrames lost_before_next VEXA_GUARDED_BY(driver.m_FrameQueueLock);           ///< of the next frame to be queued
  std::deque<QueuedFacts> queued_facts VEXA_GUARDED_BY(driver.m_FrameQueueLock);  ///< in the queue's order
  Published<QueueCounts> published_queue;  ///< published under the lock, read without it
  const std::int64_t created;              ///< nanoseconds since 1970

  /// A property has changed, and what is offered has not been filtered by it.
  bool offer_is_stale VEXA_GUARDED_BY(driver.m_ConnectionLock) = false;

  std::optional<AwaitedAnswer> keep_alive;  ///< sent and not answered yet; the RTSP session's owner's

  /// The connection's time-out, or another time, for waits of the call that the calling thread makes.
  WaitLimit limit() { return limit(connection.timeout()); }
  WaitLimit limit(int milliseconds) { return {milliseconds, Operation::cancels_of(errors)}; }

  // Copies of settings, each under its lock; any thread: device/driver_state.cpp
  std::string bright_mode();
  std::string codec_name();
  int rotation();
  int rtsp_port();
  void store_rtsp_port(int port);
  int vmd_type();
  ELibDVideoStandard video_standard();
  bool takes_continuous_ptz();
  bool takes_electronic_flip();
  bool stop_is_requested();
  bool wants_teardown();
  int stream_socket();
  /// The media socket together with the event of a stop.
  StoppableSocket stream_source();
  void set_stream_socket(int socket);
  /// Closes the media socket, and the control socket beside it.
  void close_media();

  // The RTSP session; the starter's, then the streaming thread's, then the stopper's: device/rtsp_session.cpp
  RtspSession session();
  StreamClock stream_clock();
  /// Counts a session's open that failed after so many requests.
  Failure count_rtsp(std::uint64_t requests, const Failure& failure);
  Result<int> open_rtp_over_udp(const std::string& url, int port);
  Result<int> open_rtp_over_tcp(const std::string& url, int port);
  /// Counts a datagram of `length` bytes that a model class reads itself; no header where it is shorter than one.
  void count_passed_on(std::size_t length, const std::optional<RtpHeader>& header);
  /// The same for a packet inside a connection; one of the control channel goes to the chronicle.
  void take_interleaved(const InterleavedPacket& packet, const char* payload);
  /// Sends a keep-alive when one is due and none is awaited.
  void begin_keep_alive();
  /// Takes the answer of a keep-alive if it has come or is too late. Waits for nothing. True when any of it had come,
  /// or it is given up.
  bool look_for_keep_alive();
  /// Waits for the answer of a keep-alive that is awaited.
  void finish_keep_alive();

  // Starting and stopping video, with the start-stop lock held: device/video_streaming.cpp
  ELibDReturnCode start_video(const SLibDEdgeStorageStreamingInfo* recording);
  ELibDReturnCode start_live();
  ELibDReturnCode start_playback(const SLibDEdgeStorageStreamingInfo& recording);
  ELibDReturnCode open_live_http(int stream);
  ELibDReturnCode open_live_rtp(int stream);
  ELibDReturnCode open_rtp_session(const std::string& path);
  bool allocate_packets();
  ELibDReturnCode start_thread(const std::string& codec);
  ELibDReturnCode abandon_start(int error);
  void end_thread();

  // Reading frames; the streaming thread: device/video_streaming.cpp, device/rtp_frames.cpp, device/http_frames.cpp
  bool plays_rtp() const;
  std::string stream_codec();
  void take_frame(CVexaCommon::VideoFrameInfo& frame);
  ELibDReturnCode read_frame(CVexaCommon::VideoFrameInfo& frame);
  /// LIBD_TIMEOUT once the stream is silent, LIBD_NO_FRAME before.
  ELibDReturnCode nothing_yet();
  ELibDReturnCode begin_rtp_frame(CVexaCommon::VideoFrameInfo& frame, const Codec& codec);
  ELibDReturnCode collect_picture(PacketRunPlace& run);
  /// What the streaming thread awaits besides media.
  std::optional<Errand> errand() const;
  ELibDReturnCode finish_rtp_frame(CVexaCommon::VideoFrameInfo& frame, PacketRunPlace run,
                                   const AssembledPicture& picture);
  /// The frame that was assembled before was read past the queue, if it is not in it.
  void begin_frame();
  void part_is_ready(const CVexaCommon::VideoFrameInfo& frame, const Codec& codec);
  void part_is_lost(const CVexaCommon::VideoFrameInfo& frame);
  /// `packets` are those of the frame; none of an HTTP stream's.
  FrameFacts facts_of(const CVexaCommon::VideoFrameInfo& frame, const Codec& codec, PacketRun packets,
                      StreamLedger::Instant assembled);
  void frame_is_ready(const CVexaCommon::VideoFrameInfo& frame, const Codec& codec, const FrameFacts& facts,
                      StreamLedger::Instant assembled);
  void stamp_picture(CVexaCommon::VideoFrameInfo& frame, std::uint32_t timestamp);
  ELibDReturnCode read_elementary_frame(CVexaCommon::VideoFrameInfo& frame, const Codec& codec, int& received);
  bool reset_stream_buffer();
  void release_stream_buffer();
  StreamWindow stream_window(std::size_t* part = nullptr);
  /// Looks for the camera's position in the whole data; true when it is there and stored.
  bool store_position(Bytes data);

  // The frame queue; the streaming thread and the host's: device/frame_queue.cpp
  void queue_frame(CVexaCommon::VideoFrameInfo& frame, bool& wait_key, ELibDReturnCode result);
  void append_frame(CVexaCommon::VideoFrameInfo& frame, bool& wait_key, bool is_notice)
      VEXA_REQUIRES(driver.m_FrameQueueLock);
  ELibDReturnCode take_oldest_frame(SLibDVideoFrameInfo& frame, FrameFacts& facts);
  /// What is known of a frame that comes to the queue; counts it unless it is a notice.
  QueuedFacts arrived_at_queue(const CVexaCommon::VideoFrameInfo& frame, bool is_notice)
      VEXA_REQUIRES(driver.m_FrameQueueLock);
  /// False when memory ran out, and the frame stays the caller's.
  bool enqueue(const CVexaCommon::VideoFrameInfo& frame, const QueuedFacts& facts)
      VEXA_REQUIRES(driver.m_FrameQueueLock);
  /// Frees the frame at the front and takes it out: what was known of it.
  QueuedFacts leave_front() VEXA_REQUIRES(driver.m_FrameQueueLock);
  void free_frame(CVexaCommon::VideoFrameInfo& frame) VEXA_REQUIRES(driver.m_FrameQueueLock);
  void clear_frame_queue();
  /// Ends each step that changes the queue or the report of a silence: hosts see the counts, and what is ready.
  void note_video() VEXA_REQUIRES(driver.m_FrameQueueLock);

  // Settings and the cached inquiry; any thread: device/video_settings.cpp, device/image_controls.cpp
  void store_camera_inquiry(const std::string& answer);
  ELibDReturnCode camera_inquiry(std::string& answer);
  ELibDReturnCode after_image_change(ELibDReturnCode sent);
  /// Stores the settings of a "camera" answer, narrows what is offered by them, and copies the settings to `info`.
  void read_camera_answer(const std::string& answer, SLibDCameraInfo& info);
  bool read_camera_properties(const std::string& answer) VEXA_REQUIRES(driver.m_ConnectionLock);
  void read_stream_settings(const std::string& answer, int stream) VEXA_REQUIRES(driver.m_ConnectionLock);
  /// Makes `stream` the one that is played, with what the answer says of it.
  ELibDReturnCode choose_stream(const std::string& answer, int stream);
  void read_video_ports(const std::string& answer) VEXA_REQUIRES(driver.m_ConnectionLock);
  void filter_by(const char* item, const std::string& value);

  // Alarms; any thread: device/alarm_io.cpp
  ELibDReturnCode open_alarms();
  /// 1 when a part came and `masks` is filled, 0 when none did.
  Result<int> read_alarm_part(int socket, PinMasks& masks);
  ELibDReturnCode watch_tampering(int state);

  // Models with an analog output; any thread: device/model_variants.cpp
  ELibDReturnCode bring_video_to_network(const std::string& system_answer);
  ELibDReturnCode read_system_bringing_video(SLibDSystemInfo& info);
  ELibDReturnCode ask_video_out_mode(ELibVideoOutMode& mode);
};

}  // namespace vexa
