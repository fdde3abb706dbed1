// Sound from the camera: its settings, and the stream that the host polls.
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

ELibDReturnCode CVexaCommon::GetFixedAudioInfo(SLibDFixedAudioInfo& info) {
  if (m_FixedSystemInfo.capability3 == 0 && m_FixedSystemInfo.capability4 == 0) return LIBD_NOT_SUPPORTED;
  const vexa::Guard guard(m_ConnectionLock);
  m_FixedAudioInfo.available = 1;
  info = m_FixedAudioInfo;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetAudioInfo(SLibDAudioInfo& info) {
  std::string answer;
  if (SendInqCommand("camera", answer) != LIBD_OK) return LatestErrorCode();
  info = AudioInfo();
  info.samplingRateLabel = kSamplingRateLabel;
  info.samplingRate = kSamplingRate;
  if (const auto value = vexa::cgi_value(answer, "AudInCodec=")) vexa::take_audio_codec(*value, info);
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetAudioInfo(SLibDAudioInfo& info) {
  const ELibDReturnCode sent =
      SendCommand("/command/camera.cgi?AudInCodec=%s&AudioIn=on", vexa::audio_codec_word(info).c_str());
  if (sent != LIBD_OK) return sent;
  const vexa::Guard guard(m_ConnectionLock);
  m_AudioInfo = info;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::StartAudioStreaming() {
  StopAudioStreaming();
  const vexa::Guard guard(m_AudioLock);
  m_AudioSocket = http_open("/audio");
  if (m_AudioSocket == -1) return LatestErrorCode();
  m_LastAudioTime = m_State->now();
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::StopAudioStreaming() {
  const vexa::Guard guard(m_AudioLock);
  if (m_AudioSocket != -1) http_close(m_AudioSocket);
  m_AudioSocket = -1;
  return LIBD_OK;
}

// Hands on what one read gives: no frame is looked for in it.
ELibDReturnCode CVexaCommon::GetCurrentAudioFrame(SLibDAudioFrameInfo& frame) {
  const vexa::Guard guard(m_AudioLock);
  if (m_AudioSocket == -1) return LIBD_FAILED;
  frame.codecType = vexa::audio_codec_type(AudioInfo().codec);
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
