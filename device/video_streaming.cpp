// SPDX-License-Identifier: Apache-2.0
// Starting and stopping video, and the thread between.
#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <utility>

#include "device/driver_state.h"
#include "device/stream_watch.h"
#include "media/assembly/codec.h"
#include "media/frame_chronicle.h"
#include "runtime/base/text.h"
#include "runtime/handle.h"
#include "runtime/pages.h"
#include "transport/failure.h"
#include "transport/wire/http_request.h"
#include "vexa/failure.h"
#include "vexa/runtime.h"

namespace {

constexpr unsigned int kFrameCapacity = 1200000;
constexpr unsigned int kLargeFrameCapacity = 2000000;
constexpr int kRtspPort = 554;
constexpr std::size_t kPathRoom = 260;  // of a session's path, the terminator among it
constexpr int kRtspTransport = 1;
constexpr int kOpenTimeout = 40000;  // milliseconds
constexpr std::chrono::milliseconds kExitPoll{100};

}  // namespace

ELibDReturnCode CVexaCommon::StartVideoStreaming() {
  vexa::Operation operation(*m_State, __func__);
  return operation.returns(m_State->start_video(nullptr));
}

ELibDReturnCode CVexaCommon::StartEdgeStorageVideoStreaming(const SLibDEdgeStorageStreamingInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return operation.returns(m_State->start_video(&info));
}

namespace vexa {

// Live video, or the recording.
ELibDReturnCode DriverState::start_video(const SLibDEdgeStorageStreamingInfo* recording) {
  if (stop_is_requested()) return LIBD_FAILED;
  const Guard guard(start_stop_lock);
  driver.StopVideoStreaming();
  if (stop_is_requested()) return LIBD_FAILED;  // another thread's, which waits for the lock
  store_rtsp_port(kRtspPort);
  ELibDReturnCode started = LIBD_FAILED;
  const bool fitted =
      within_memory([&] { started = recording == nullptr ? start_live() : start_playback(*recording); });
  if (!fitted) started = abandon_start(ENOMEM);
  if (recorder.is_on()) {
    const char* what = recording == nullptr ? "live video" : "a recording";
    recorder.note("video", format_within(kPathRoom, "start of %s: %s", what, CodeName(started)).text);
  }
  return started;
}

ELibDReturnCode DriverState::start_live() {
  int stream = 0;
  std::string codec;
  {
    const Guard settings(driver.m_ConnectionLock);
    stream = driver.m_CameraInfo.streamNumber;
    codec = driver.m_CameraInfo.codecName;
  }
  const bool rtp_wanted = connection.copy().streamTransport == kRtspTransport;
  const ELibDReturnCode opened = rtp_wanted ? open_live_rtp(stream) : open_live_http(stream);
  if (opened != LIBD_OK) return opened;
  driver.m_LastFrameTime = now();
  return start_thread(codec);
}

ELibDReturnCode DriverState::open_live_http(int stream) {
  driver.m_RtpLiveMode = false;
  driver.m_EdgeStoragePlayback = false;
  if (!reset_stream_buffer()) return LIBD_FAILED;
  ledger.begin_stream(StreamTransport::kHttp);
  chronicle->begin_stream({}, 0);
  const ELibDReturnCode opened = errors.run([&]() -> Outcome {
    auto socket = camera.open(format_within(kRequestRoom, "/image%d", stream).text);
    set_stream_socket(socket ? socket->release() : -1);
    if (!socket) return socket.failure();
    return LIBD_OK;
  });
  if (opened != LIBD_OK) driver.ReleaseRtpPacketsPtr();
  return opened;
}

ELibDReturnCode DriverState::open_live_rtp(int stream) {
  if (!driver.InitEdgeStorageKeepAlivePeriod()) return LIBD_FAILED;
  driver.m_RtpLiveMode = true;
  driver.m_EdgeStoragePlayback = false;
  if (!allocate_packets()) return LIBD_FAILED;
  const RaisedTimeout slow = connection.raised(kOpenTimeout);
  return open_rtp_session(format_within(kPathRoom, "/media/video%d", stream).text);
}

// Opens the session at a path of the camera's, or leaves both sockets closed.
ELibDReturnCode DriverState::open_rtp_session(const std::string& path) {
  store_rtsp_port(kRtspPort);  // an inquiry by the host may have stored another meanwhile
  const std::string host = connection.copy().host;
  const std::string url = format_within(kRequestRoom, "rtsp://%s:%d%s", host.c_str(), kRtspPort, path.c_str()).text;
  const auto control = open_rtp_over_udp(url, kRtspPort);
  driver.m_RtspSocket = control ? *control : -1;
  if (control) return LIBD_OK;
  Failure failure = control.failure();
  if (stream_socket() != -1) {
    close_media();
    failure.code = LIBD_STREAM_OPEN_FAILED;
  }
  errors.record(failure);
  driver.ReleaseRtpPacketsPtr();
  return failure.code;
}

ELibDReturnCode DriverState::start_playback(const SLibDEdgeStorageStreamingInfo& recording) {
  // Safe: a name with blanks or line ends adds neither a header nor another request.
  const std::string name = as_one_word(recording.streamName, "");
  const std::string path = format_within(kPathRoom, "/media/%s", name.c_str()).text;
  if (!allocate_packets()) return LIBD_FAILED;
  driver.m_RtpLiveMode = true;  // pictures from RTP; m_EdgeStoragePlayback distinguishes a playback from live video
  driver.m_EdgeStoragePlayback = true;
  driver.m_FirstPlaybackFrame = true;
  driver.m_PlaybackScale = recording.scale;
  driver.m_EdgeStorageCodec = recording.codecName;
  // Kept: the silence of a playback counts from before its open, however long that takes.
  driver.m_LastFrameTime = now();
  {
    const RaisedTimeout slow = connection.raised(kOpenTimeout);
    if (!driver.InitEdgeStorageKeepAlivePeriod()) {
      driver.ReleaseRtpPacketsPtr();
      return LIBD_FAILED;
    }
    const ELibDReturnCode opened = open_rtp_session(path);
    if (opened != LIBD_OK) return opened;
  }
  return start_thread(driver.m_EdgeStorageCodec);
}

bool DriverState::allocate_packets() {
  driver.ReleaseRtpPacketsPtr();
  driver.m_RtpPacketBuffer = static_cast<unsigned char*>(std::malloc(PacketRing::kSize));
  if (driver.m_RtpPacketBuffer == nullptr) return false;
  driver.m_RtpPackets.clear();
  rtp = std::make_unique<RtpReception>(driver.m_RtpPackets, kH264Codec, ledger.collection());
  ledger.begin_stream(StreamTransport::kUdp);
  chronicle->begin_stream({}, 0);
  return true;
}

ELibDReturnCode DriverState::start_thread(const std::string& codec) {
  {
    const Guard guard(driver.m_FrameQueueLock);
    const Codec* known = codec_named(codec);
    if (known == nullptr || !known->large_frames) driver.m_LargeFrameBuffers = false;
    // Kept: the staging buffer is allocated and zeroed although no line here reads it; model classes may use it.
    delete[] std::exchange(driver.m_StagingBuffer, nullptr);
    driver.m_StagingBufferSize = driver.m_LargeFrameBuffers ? kLargeFrameCapacity : kFrameCapacity;
    driver.m_StagingBuffer = new unsigned char[driver.m_StagingBufferSize];
    clear_untouched({driver.m_StagingBuffer, driver.m_StagingBufferSize});
  }
  driver.m_StreamingThread = _beginthreadex(nullptr, 0, CVexaCommon::StreamingThread, &driver, 0, nullptr);
  return driver.m_StreamingThread != nullptr ? LIBD_OK : abandon_start(EAGAIN);
}

ELibDReturnCode DriverState::abandon_start(int error) {
  // There is no session to end.
  if (plays_rtp() && driver.m_RtspSocket == -1) driver.rtp_stream_socket_close_all();
  driver.CVexaCommon::StopVideoStreaming();
  driver.ReleaseRtpPacketsPtr();
  return errors.run([&]() -> Outcome { return system_failure(error); });
}

bool DriverState::plays_rtp() const { return driver.m_EdgeStoragePlayback || driver.m_RtpLiveMode; }

void DriverState::take_frame(CVexaCommon::VideoFrameInfo& frame) {
  const Guard guard(driver.m_FrameQueueLock);
  frame.capacity = driver.m_LargeFrameBuffers ? kLargeFrameCapacity : kFrameCapacity;
  frame.data = spare_frames.take(frame.capacity);
}

// A keep-alive is awaited while media are received: its answer may take a second, or never come.
ELibDReturnCode DriverState::read_frame(CVexaCommon::VideoFrameInfo& frame) {
  if (!plays_rtp()) return driver.GetCurrentFrameData(frame);
  for (;;) {
    const ELibDReturnCode result = driver.GetRtpCurrentVideoFrame(stream_codec(), frame);
    const bool answered = look_for_keep_alive();
    begin_keep_alive();
    // A read that ended early, because the answer had come, is no empty read.
    if (result != LIBD_NO_FRAME || !answered || stop_is_requested()) return result;
  }
}

std::string DriverState::stream_codec() {
  return driver.m_EdgeStoragePlayback ? driver.m_EdgeStorageCodec : codec_name();
}

ELibDReturnCode DriverState::nothing_yet() {
  return is_silent(now(), driver.m_LastFrameTime, whole_seconds(connection.timeout())) ? LIBD_TIMEOUT : LIBD_NO_FRAME;
}

void DriverState::end_thread() {
  SetEvent(driver.m_StopVideoEvent);
  unsigned long code = 0;
  while (GetExitCodeThread(driver.m_StreamingThread, &code) != 0 && code == STILL_ACTIVE) {
    wait_for_thread_end(driver.m_StreamingThread, kExitPoll);
  }
  ResetEvent(driver.m_StopVideoEvent);
  if (driver.m_StreamingThread != nullptr) CloseHandle(driver.m_StreamingThread);
  driver.m_StreamingThread = nullptr;
}

}  // namespace vexa

unsigned int CVexaCommon::StreamingThread(void* driver) {
  auto* self = static_cast<CVexaCommon*>(driver);
  if (self == nullptr || self->m_State->stop_is_requested()) return 0;
  vexa::DriverState& state = *self->m_State;
  bool wait_key = false;
  vexa::StreamWatch watch(state);
  do {
    const vexa::Operation reading(state, vexa::kStreamingThread);
    VideoFrameInfo frame;
    ELibDReturnCode result = LIBD_TIMEOUT;
    const bool fitted = vexa::within_memory([&] {
      state.take_frame(frame);
      result = state.read_frame(frame);
    });
    if (!fitted) state.ledger.settle_lost_packet();
    ProcessCurrentFrameData(self, frame, wait_key, fitted ? result : LIBD_TIMEOUT);
    watch.look(fitted ? result : LIBD_TIMEOUT);
    // After a picture from RTP the next read waits for a datagram and for the stop event in one: a wait of its own
    // would cost a wake-up a picture, which is most of what a slow stream costs.
    if (!fitted || result != LIBD_OK || !state.plays_rtp()) {
      WaitForSingleObject(self->m_StopVideoEvent, static_cast<unsigned long>(self->m_StreamWaitMs));
    }
  } while (!state.stop_is_requested());
  return 0;
}

ELibDReturnCode CVexaCommon::StopVideoStreaming() {
  vexa::Operation operation(*m_State, __func__);
  {
    const vexa::Guard guard(m_VideoStateLock);
    if (m_StreamSocket == -1) return LIBD_OK;
    if (m_StopVideoRequested) return operation.returns(LIBD_FAILED);
    m_StopVideoRequested = true;
  }
  // A start in another thread finishes first: what it opens is its own until then.
  const vexa::Guard turn(m_State->start_stop_lock);
  m_State->end_thread();
  if (m_State->plays_rtp()) {
    StopRtpVideoStreaming();
  } else {
    http_close(m_State->stream_socket());
    m_State->release_stream_buffer();
    m_State->ledger.end_stream();
    m_State->set_stream_socket(-1);
  }
  m_State->clear_frame_queue();
  m_State->recorder.note("video", "stopped");
  const vexa::Guard guard(m_VideoStateLock);
  m_StopVideoRequested = false;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::StopRtpVideoStreaming() {
  rtp_over_udp_close();
  const vexa::Guard guard(m_FrameQueueLock);
  ReleaseRtpPacketsPtr();
  return LIBD_OK;
}

void CVexaCommon::ReleaseRtpPacketsPtr() {
  if (m_State->rtp != nullptr) m_State->rtp->collector.discard_all();
  m_State->ledger.end_stream();
  m_State->rtp.reset();
  m_RtpPackets.clear();
  std::free(m_RtpPacketBuffer);
  m_RtpPacketBuffer = nullptr;
}
