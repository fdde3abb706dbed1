// CVexaCommon: starting and stopping video, and the thread between.
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <new>
#include <utility>

#include "device/driver_state.h"
#include "device/raised_timeout.h"
#include "media/assembly/h264_units.h"
#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "transport/failure.h"
#include "transport/wire/http_request.h"
#include "vexa/runtime.h"
#include "vexa/vexa_common.h"

namespace {

constexpr unsigned int kFrameCapacity = 1200000;
constexpr unsigned int kLargeFrameCapacity = 2000000;
constexpr int kRtspPort = 554;
constexpr std::size_t kPathRoom = 260;  // of a session's path, the terminator among it
constexpr int kRtspTransport = 1;
constexpr int kOpenTimeout = 40000;       // milliseconds
constexpr useconds_t kExitPoll = 100000;  // microseconds

}  // namespace

ELibDReturnCode CVexaCommon::StartVideoStreaming() { return StartVideo(nullptr); }

ELibDReturnCode CVexaCommon::StartEdgeStorageVideoStreaming(const SLibDEdgeStorageStreamingInfo& info) {
  return StartVideo(&info);
}

// Live video, or the recording.
ELibDReturnCode CVexaCommon::StartVideo(const SLibDEdgeStorageStreamingInfo* recording) {
  if (IsStopRequested()) return LIBD_FAILED;
  const vexa::Guard guard(m_State->start_stop_lock);
  StopVideoStreaming();
  if (IsStopRequested()) return LIBD_FAILED;  // another thread's, which waits for the lock
  try {
    return recording == nullptr ? StartLiveVideo() : StartPlayback(*recording);
  } catch (const std::bad_alloc&) {
    return AbandonStart(ENOMEM);
  }
}

ELibDReturnCode CVexaCommon::StartLiveVideo() {
  const SLibDCameraInfo camera = PrepareCamera();
  const bool rtp = ConnectionInfo().streamTransport == kRtspTransport;
  if (rtp && !OpenLiveRtp(camera.streamNumber)) return LIBD_FAILED;
  if (!rtp && !OpenLiveHttp(camera.streamNumber)) return LIBD_FAILED;
  if (m_StreamSocket == -1) {
    ReleaseRtpPacketsPtr();
    return LatestErrorCode();
  }
  m_LastFrameTime = m_State->now();
  return StartStreamingThread(camera.codecName);
}

SLibDCameraInfo CVexaCommon::PrepareCamera() {
  const vexa::Guard guard(m_ConnectionLock);
  m_CameraInfo.rtspPort = kRtspPort;
  return m_CameraInfo;
}

bool CVexaCommon::OpenLiveHttp(int stream) {
  m_RtpLiveMode = false;
  m_EdgeStoragePlayback = false;
  if (!ResetStreamBuffer()) return false;
  SetStreamSocket(http_open("/image%d", stream));
  return true;
}

bool CVexaCommon::OpenLiveRtp(int stream) {
  if (!InitEdgeStorageKeepAlivePeriod()) return false;
  m_RtpLiveMode = true;
  m_EdgeStoragePlayback = false;
  if (!AllocateRtpPackets()) return false;
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kOpenTimeout, m_SavedTimeout});
  OpenRtpSession(vexa::format_within(kPathRoom, "/media/video%d", stream).text);
  return true;
}

// Opens the session at a path of the camera's, or leaves both sockets closed with the latest error set.
void CVexaCommon::OpenRtpSession(const std::string& path) {
  const SLibDConnectionInfo connection = ConnectionInfo();
  PrepareCamera();  // an inquiry of the host's may have stored another port meanwhile
  m_RtspSocket = rtp_over_udp_open("rtsp://%s:%d%s", connection.host.c_str(), kRtspPort, path.c_str());
  if (m_RtspSocket == -1 && m_StreamSocket != -1) {
    rtp_over_tcp_close(m_StreamSocket);
    SetStreamSocket(-1);
    Fail({LIBD_STREAM_OPEN_FAILED, LatestErrorText().c_str()});
  }
}

ELibDReturnCode CVexaCommon::StartPlayback(const SLibDEdgeStorageStreamingInfo& recording) {
  PrepareCamera();
  if (!OpenPlayback(recording)) {
    ReleaseRtpPacketsPtr();
    return LIBD_FAILED;
  }
  if (m_RtspSocket == -1) {
    ReleaseRtpPacketsPtr();
    return LatestErrorCode();
  }
  return StartStreamingThread(m_EdgeStorageCodec);
}

bool CVexaCommon::OpenPlayback(const SLibDEdgeStorageStreamingInfo& recording) {
  // Safe: a name with blanks or line ends adds neither a header nor another request.
  const std::string name = vexa::as_one_word(recording.streamName, "");
  const std::string path = vexa::format_within(kPathRoom, "/media/%s", name.c_str()).text;
  if (!AllocateRtpPackets()) return false;
  m_RtpLiveMode = true;
  m_EdgeStoragePlayback = true;
  m_FirstPlaybackFrame = true;
  m_PlaybackScale = recording.scale;
  m_EdgeStorageCodec = recording.codecName;
  // Kept: the silence of a playback counts from before its open, however long that takes.
  m_LastFrameTime = m_State->now();
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kOpenTimeout, m_SavedTimeout});
  if (!InitEdgeStorageKeepAlivePeriod()) return false;
  OpenRtpSession(path);
  return true;
}

bool CVexaCommon::AllocateRtpPackets() {
  ReleaseRtpPacketsPtr();
  m_RtpPacketBuffer = static_cast<unsigned char*>(std::malloc(vexa::PacketRing::kSize));
  if (m_RtpPacketBuffer == nullptr) return false;
  m_RtpPackets.clear();
  m_State->rtp = std::make_unique<vexa::RtpReception>(m_RtpPackets, vexa::kH264Rules);
  return true;
}

ELibDReturnCode CVexaCommon::StartStreamingThread(const std::string& codec) {
  {
    const vexa::Guard guard(m_FrameQueueLock);
    if (codec != "JPEG") m_LargeFrameBuffers = false;
    delete[] std::exchange(m_StagingBuffer, nullptr);
    m_StagingBufferSize = m_LargeFrameBuffers ? kLargeFrameCapacity : kFrameCapacity;
    m_StagingBuffer = new unsigned char[m_StagingBufferSize]();
  }
  m_StreamingThread = _beginthreadex(nullptr, 0, StreamingThread, this, 0, nullptr);
  return m_StreamingThread != nullptr ? LIBD_OK : AbandonStart(EAGAIN);
}

ELibDReturnCode CVexaCommon::AbandonStart(int error) {
  const bool rtp = m_EdgeStoragePlayback || m_RtpLiveMode;
  if (rtp && m_RtspSocket == -1) rtp_stream_socket_close_all();  // no session stands that could be ended
  CVexaCommon::StopVideoStreaming();
  ReleaseRtpPacketsPtr();
  FailSystem(error);
  return LIBD_FAILED;
}

unsigned int CVexaCommon::StreamingThread(void* driver) {
  auto* self = static_cast<CVexaCommon*>(driver);
  if (self == nullptr || self->IsStopRequested()) return 0;
  bool wait_key = false;
  do {
    VideoFrameInfo frame;
    ELibDReturnCode result = LIBD_TIMEOUT;
    try {
      self->TakeFrame(frame);
      result = self->ReadFrame(frame);
    } catch (const std::bad_alloc&) {
      result = LIBD_TIMEOUT;
    }
    ProcessCurrentFrameData(self, frame, wait_key, result);
    if (!self->NextReadWaits(result)) {
      WaitForSingleObject(self->m_StopVideoEvent, static_cast<unsigned long>(self->m_StreamWaitMs));
    }
  } while (!self->IsStopRequested());
  return 0;
}

// After a picture from RTP the next read waits for a datagram and for the stop event in one: a wait of its own would
// cost a wake-up a picture, which is most of what a slow stream costs.
bool CVexaCommon::NextReadWaits(ELibDReturnCode result) const {
  return result == LIBD_OK && (m_EdgeStoragePlayback || m_RtpLiveMode);
}

void CVexaCommon::TakeFrame(VideoFrameInfo& frame) {
  const vexa::Guard guard(m_FrameQueueLock);
  frame.capacity = m_LargeFrameBuffers ? kLargeFrameCapacity : kFrameCapacity;
  frame.data = m_State->spare_frames.take(frame.capacity);
}

ELibDReturnCode CVexaCommon::ReadFrame(VideoFrameInfo& frame) {
  if (!m_EdgeStoragePlayback && !m_RtpLiveMode) return GetCurrentFrameData(frame);
  const ELibDReturnCode result = GetRtpCurrentVideoFrame(StreamCodec(), frame);
  try {
    KeepAlive();
  } catch (const std::bad_alloc&) {
    // The next one is due soon; the picture must not be lost for it.
  }
  return result;
}

std::string CVexaCommon::StreamCodec() {
  if (m_EdgeStoragePlayback) return m_EdgeStorageCodec;
  const vexa::Guard guard(m_ConnectionLock);
  return m_CameraInfo.codecName;
}

ELibDReturnCode CVexaCommon::StopVideoStreaming() {
  {
    const vexa::Guard guard(m_VideoStateLock);
    if (m_StreamSocket == -1) return LIBD_OK;
    if (m_StopVideoRequested) return LIBD_FAILED;
    m_StopVideoRequested = true;
  }
  // A start in another thread is let finish: what it opens is its own until then.
  const vexa::Guard turn(m_State->start_stop_lock);
  EndStreamingThread();
  if (m_EdgeStoragePlayback || m_RtpLiveMode) {
    StopRtpVideoStreaming();
  } else {
    http_close(m_StreamSocket);
    ReleaseStreamBuffer();
    SetStreamSocket(-1);
  }
  ClearFrameQueue();
  const vexa::Guard guard(m_VideoStateLock);
  m_StopVideoRequested = false;
  return LIBD_OK;
}

// Another thread's stop looks at it at any time.
void CVexaCommon::SetStreamSocket(int socket) {
  const vexa::Guard guard(m_VideoStateLock);
  m_StreamSocket = socket;
}

void CVexaCommon::EndStreamingThread() {
  SetEvent(m_StopVideoEvent);
  unsigned long code = 0;
  while (GetExitCodeThread(m_StreamingThread, &code) != 0 && code == STILL_ACTIVE) usleep(kExitPoll);
  ResetEvent(m_StopVideoEvent);
  if (m_StreamingThread != nullptr) CloseHandle(m_StreamingThread);
  m_StreamingThread = nullptr;
}

ELibDReturnCode CVexaCommon::StopRtpVideoStreaming() {
  if (m_RtspSocket != -1 || m_StreamSocket != -1) rtp_over_udp_close();
  const vexa::Guard guard(m_FrameQueueLock);
  ReleaseRtpPacketsPtr();
  return LIBD_OK;
}

void CVexaCommon::ReleaseRtpPacketsPtr() {
  m_State->rtp.reset();
  m_RtpPackets.clear();
  std::free(m_RtpPacketBuffer);
  m_RtpPacketBuffer = nullptr;
}
