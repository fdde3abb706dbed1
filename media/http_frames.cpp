// CVexaCommon: frames from the camera's HTTP image stream.
#include <sys/time.h>

#include <new>
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/elementary_unit.h"
#include "media/assembly/start_code.h"
#include "transport/failure.h"
#include "vexa/vexa_common.h"

namespace {

/// Twice the largest frame and more, so that a frame under work is seldom moved.
constexpr std::size_t kStreamBuffer = std::size_t{4} << 20;

void stamp_now(CVexaCommon::VideoFrameInfo& frame) {
  timeval now{};
  gettimeofday(&now, nullptr);
  frame.seconds = static_cast<std::int32_t>(now.tv_sec);
  frame.microseconds = static_cast<std::int32_t>(now.tv_usec);
}

}  // namespace

bool CVexaCommon::ResetStreamBuffer() {
  if (m_StreamBuffer == nullptr) m_StreamBuffer = new (std::nothrow) unsigned char[kStreamBuffer];
  m_StreamBufferSize = m_StreamBuffer == nullptr ? 0 : kStreamBuffer;
  m_StreamFrameStart = m_StreamSearchPos = m_StreamWriteEnd = m_StreamBuffer;
  return m_StreamBuffer != nullptr;
}

void CVexaCommon::ReleaseStreamBuffer() {
  delete[] std::exchange(m_StreamBuffer, nullptr);
  m_StreamBufferSize = 0;
  m_StreamFrameStart = m_StreamSearchPos = m_StreamWriteEnd = nullptr;
}

ELibDReturnCode CVexaCommon::GetCurrentFrameData(VideoFrameInfo& frame) {
  if (m_StreamSocket == -1) return LIBD_FAILED;
  const std::string codec = StreamCodec();
  int received = 0;
  if (codec == "JPEG") return GetCurrentJPEGFrameData(frame, received);
  if (codec == "MPEG4") return GetCurrentMPEGFrameData(frame, received);
  if (codec == "H.264") return GetCurrentH264FrameData(frame, received);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetCurrentJPEGFrameData(VideoFrameInfo& frame, int& received) {
  frame.frameType = VIDEO_FRAME_JPEG;
  received = http_multipart_jpeg_recv(m_StreamSocket, reinterpret_cast<char*>(frame.data),
                                      static_cast<int>(frame.capacity), ConnectionTimeout());
  if (received == 0) return NothingYet();
  if (received > 0) {
    frame.length = static_cast<unsigned int>(received);
    m_LastFrameTime = m_State->now();
    return LIBD_OK;
  }
  std::string text;
  GetLatestErrorText(text);
  if (text != vexa::kBufferTooSmall.text) return LatestErrorCode();
  Fail({LIBD_BUFFER_TOO_SMALL, vexa::kBufferTooSmall.text});
  m_LastFrameTime = m_State->now();
  return LIBD_BUFFER_TOO_SMALL;
}

ELibDReturnCode CVexaCommon::GetCurrentH264FrameData(VideoFrameInfo& frame, int& received) {
  return GetElementaryFrame(frame, vexa::kH264Elementary, received);
}

ELibDReturnCode CVexaCommon::GetCurrentMPEGFrameData(VideoFrameInfo& frame, int& received) {
  return GetElementaryFrame(frame, vexa::kMpeg4Elementary, received);
}

// Kept: units in front of a picture are lost when the stream falls silent behind them; the next read begins anew.
ELibDReturnCode CVexaCommon::GetElementaryFrame(VideoFrameInfo& frame, const vexa::ElementaryCodec& codec,
                                                int& received) {
  frame.frameType = VIDEO_FRAME_INVALID;
  frame.length = 0;
  while (frame.length < frame.capacity) {
    unsigned char* place = frame.data + frame.length;
    received = http_stream_recv(m_StreamSocket, reinterpret_cast<char*>(place),
                                static_cast<int>(frame.capacity - frame.length), codec.start_code.find,
                                static_cast<int>(codec.start_code.length), ConnectionTimeout());
    if (received < 0) return LatestErrorCode();
    if (received == 0) return NothingYet();
    if (TakeUnit(frame, codec, static_cast<unsigned int>(received))) {
      m_LastFrameTime = m_State->now();
      return LIBD_OK;
    }
    if (NothingYet() == LIBD_TIMEOUT) return LIBD_TIMEOUT;
  }
  return LIBD_FAILED;
}

// The unit of `length` bytes behind the frame; true when it ends the picture.
bool CVexaCommon::TakeUnit(VideoFrameInfo& frame, const vexa::ElementaryCodec& codec, unsigned int length) {
  const vexa::Bytes unit(frame.data + frame.length, length);
  const vexa::UnitKind kind = codec.kind_of(unit);
  if (kind == vexa::UnitKind::kUserData) {
    const vexa::Bytes text = codec.text_of(unit);
    GetUserDataFromStream(text.data(), static_cast<unsigned int>(text.size()));
    return false;
  }
  frame.length += length;
  if (kind == vexa::UnitKind::kKeyHeader) frame.frameType = codec.key_frame;
  if (kind != vexa::UnitKind::kPicture) return false;
  if (frame.frameType != codec.key_frame) frame.frameType = codec.delta_frame;
  stamp_now(frame);
  return true;
}

const unsigned char* CVexaCommon::find_start_code_h264(const unsigned char* data, unsigned int length) {
  return vexa::find_start_code_h264(data, length);
}

const unsigned char* CVexaCommon::find_start_code_mpeg4(const unsigned char* data, unsigned int length) {
  return vexa::find_start_code_mpeg4(data, length);
}
