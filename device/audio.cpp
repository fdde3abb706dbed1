// Sound from the camera: its settings, and the stream that the host polls.
#include <algorithm>
#include <utility>

#include "device/cgi/audio_text.h"
#include "device/driver_state.h"
#include "transport/http_receive.h"
#include "transport/wire/http_answer.h"

namespace {

constexpr int kAudioWait = 1000;  // milliseconds, whatever the connection's time-out
constexpr const char* kSamplingRateLabel = "8 kHz";
constexpr std::int32_t kSamplingRate = 8000;

}  // namespace

ELibDReturnCode CVexaCommon::GetFixedAudioInfo(SLibDFixedAudioInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (m_FixedSystemInfo.capability3 == 0 && m_FixedSystemInfo.capability4 == 0) return LIBD_NOT_SUPPORTED;
    const vexa::Guard guard(m_ConnectionLock);
    SLibDFixedAudioInfo copy = m_FixedAudioInfo;
    copy.available = m_FixedAudioInfo.available = 1;
    info = std::move(copy);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::GetAudioInfo(SLibDAudioInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera.inquire("camera", answer); asked != LIBD_OK) return asked;
    SLibDAudioInfo read;
    {
      const vexa::Guard guard(m_ConnectionLock);
      read = m_AudioInfo;
    }
    read.samplingRateLabel = kSamplingRateLabel;
    read.samplingRate = kSamplingRate;
    if (const auto value = vexa::cgi_value(answer, "AudInCodec=")) vexa::take_audio_codec(*value, read);
    info = std::move(read);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetAudioInfo(SLibDAudioInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    SLibDAudioInfo stored = info;  // first, so that nothing is sent that cannot be stored
    const ELibDReturnCode sent =
        m_State->camera.send("/command/camera.cgi?AudInCodec=%s&AudioIn=on", vexa::audio_codec_word(info).c_str());
    if (sent != LIBD_OK) return sent;
    const vexa::Guard guard(m_ConnectionLock);
    m_AudioInfo = std::move(stored);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::StartAudioStreaming() {
  vexa::Operation operation(*m_State, __func__);
  StopAudioStreaming();
  return m_State->errors.run([&] {
    return m_State->audio.start([&] { return m_State->camera.open("/audio"); }, m_State->now,
                                vexa::whole_seconds(m_State->connection.timeout()));
  });
}

ELibDReturnCode CVexaCommon::StopAudioStreaming() {
  m_State->audio.stop();
  return LIBD_OK;
}

// Returns what one read gives, and looks for no frame in it.
ELibDReturnCode CVexaCommon::GetCurrentAudioFrame(SLibDAudioFrameInfo& frame) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&] {
    const auto read = [&](int socket) -> vexa::Result<int> {
      {
        const vexa::Guard settings(m_ConnectionLock);
        frame.codecType = vexa::audio_codec_type(m_AudioInfo.codec);
      }
      m_State->errors.clear();
      const auto room = static_cast<std::size_t>(std::max(frame.capacity, 0));
      const auto received =
          vexa::receive_some(socket, {reinterpret_cast<char*>(frame.data), room}, m_State->limit(kAudioWait));
      if (received && *received > 0) frame.length = *received;
      return received;
    };
    return m_State->audio.poll(read, m_State->now, vexa::whole_seconds(m_State->connection.timeout()));
  });
}
