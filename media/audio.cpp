// Sound from the camera: its settings, and the stream that the host polls.
#include <cerrno>
#include <new>
#include <utility>

#include "device/cgi/audio_text.h"
#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/wire/cgi_answer.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kAudioWait = 1000;  // milliseconds, whatever the connection's time-out
constexpr const char* kSamplingRateLabel = "8 kHz";
constexpr std::int32_t kSamplingRate = 8000;

}  // namespace

// Safe: lists that memory does not hold are a failure and not an exception.
ELibDReturnCode CVexaCommon::GetFixedAudioInfo(SLibDFixedAudioInfo& info) try {
  if (m_FixedSystemInfo.capability3 == 0 && m_FixedSystemInfo.capability4 == 0) return LIBD_NOT_SUPPORTED;
  const vexa::Guard guard(m_ConnectionLock);
  m_FixedAudioInfo.available = 1;
  info = m_FixedAudioInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Safe: an answer that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetAudioInfo(SLibDAudioInfo& info) try {
  std::string answer;
  if (SendInqCommand("camera", answer) != LIBD_OK) return LatestErrorCode();
  info = AudioInfo();
  info.samplingRateLabel = kSamplingRateLabel;
  info.samplingRate = kSamplingRate;
  if (const auto value = vexa::cgi_value(answer, "AudInCodec=")) vexa::take_audio_codec(*value, info);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Safe: a record that memory does not hold is a failure and not an exception; nothing is sent that cannot be stored.
ELibDReturnCode CVexaCommon::SetAudioInfo(SLibDAudioInfo& info) try {
  SLibDAudioInfo stored = info;
  const ELibDReturnCode sent =
      SendCommand("/command/camera.cgi?AudInCodec=%s&AudioIn=on", vexa::audio_codec_word(info).c_str());
  if (sent != LIBD_OK) return sent;
  const vexa::Guard guard(m_ConnectionLock);
  m_AudioInfo = std::move(stored);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::StartAudioStreaming() {
  StopAudioStreaming();
  const vexa::TurnGuard guard(m_AudioLock, m_State->audio_turn);
  // Safe: what a start in another thread has opened meanwhile is not lost open.
  if (m_AudioSocket != -1) http_close(m_AudioSocket);
  m_AudioSocket = http_open("/audio");
  if (m_AudioSocket == -1) return LatestErrorCode();
  m_LastAudioTime = m_State->now();
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::StopAudioStreaming() {
  const vexa::TurnGuard guard(m_AudioLock, m_State->audio_turn);
  if (m_AudioSocket != -1) http_close(m_AudioSocket);
  m_AudioSocket = -1;
  return LIBD_OK;
}

// Hands on what one read gives: no frame is looked for in it.
ELibDReturnCode CVexaCommon::GetCurrentAudioFrame(SLibDAudioFrameInfo& frame) {
  const vexa::TurnGuard guard(m_AudioLock, m_State->audio_turn);
  if (m_AudioSocket == -1) return LIBD_FAILED;
  {
    const vexa::Guard settings(m_ConnectionLock);
    frame.codecType = vexa::audio_codec_type(m_AudioInfo.codec);
  }
  const int received = http_recv(m_AudioSocket, reinterpret_cast<char*>(frame.data), frame.capacity, kAudioWait);
  if (received < 0) return LatestErrorCode();
  if (received == 0) {
    return m_State->now() - m_LastAudioTime > ConnectionTimeout() / 1000 ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }
  frame.length = received;
  m_LastAudioTime = m_State->now();
  return LIBD_OK;
}

SLibDAudioInfo CVexaCommon::AudioInfo() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_AudioInfo;
}
