// Alarm pins: what the camera has, the polled stream of their states, and the outputs.
#include <chrono>
#include <new>
#include <thread>
#include <utility>

#include "device/cgi/alarm_text.h"
#include "device/driver_state.h"
#include "device/raised_timeout.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kAlarmRequestTimeout = 10000;  // milliseconds
constexpr int kFailedStreamTimeout = 3000;   // milliseconds
constexpr std::chrono::milliseconds kAlarmDataSettles{100};
constexpr int kSensorAnswer = 512;  // bytes

}  // namespace

ELibDReturnCode CVexaCommon::GetFixedIoboxInfo(SLibDFixedIoBoxInfo& info) {
  if (!m_FixedIoBoxInfoAvailable) return LIBD_NOT_SUPPORTED;
  info = m_FixedIoBoxInfo;
  return LIBD_OK;
}

// Safe: pins that memory does not hold are a failure and not an exception; the stored record is whole all the same.
ELibDReturnCode CVexaCommon::GetIoBoxInfo(SLibDIoBoxInfo& info) try {
  // Kept: the list is not emptied first; hosts hand in an empty one.
  vexa::append_pins(m_FixedIoBoxInfo, info.pins);
  int number = vexa::first_detector_number(m_FixedIoBoxInfo);
  if (m_FixedIoBoxInfo.tamperingDetection) {
    const ELibDReturnCode asked = AskTampering(number++, info);
    if (asked != LIBD_OK) return asked;
  }
  if (m_FixedIoBoxInfo.audioDetection) {
    const ELibDReturnCode asked = AskAudioDetection(number, info);
    if (asked != LIBD_OK) return asked;
  }
  SLibDIoBoxInfo stored = info;
  const vexa::Guard guard(m_ConnectionLock);
  info.vmdType = stored.vmdType = m_IoBoxInfo.vmdType;
  std::swap(m_IoBoxInfo, stored);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

ELibDReturnCode CVexaCommon::AskTampering(int number, SLibDIoBoxInfo& info) {
  std::string answer;
  if (SendInqCommand("system", answer) != LIBD_OK) return LatestErrorCode();
  info.pins.push_back(vexa::pin_of(number, PIN_TYPE_TAMPERING, vexa::detector_enabled(answer, "TamperingFunc=")));
  info.tamperLevel = vexa::tamper_level_of(answer).value_or(info.tamperLevel);
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::AskAudioDetection(int number, SLibDIoBoxInfo& info) {
  std::string answer;
  if (SendInqCommand("audiodetection", answer) != LIBD_OK) return LatestErrorCode();
  info.pins.push_back(vexa::pin_of(number, PIN_TYPE_AUDIO_DETECTION, vexa::detector_enabled(answer, "ADFunc=")));
  return LIBD_OK;
}

// Safe: as GetIoBoxInfo; a stream whose first states memory does not hold is stopped again.
ELibDReturnCode CVexaCommon::StartIoStreaming() try {
  StopIoStreaming();
  {
    const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kAlarmRequestTimeout, m_SavedTimeout});
    const ELibDReturnCode sent = SendCommand("/command/system.cgi?AlarmData=on");
    if (sent != LIBD_OK) return sent;
  }
  std::this_thread::sleep_for(kAlarmDataSettles);
  const ELibDReturnCode opened = OpenIoStream();
  if (opened != LIBD_OK) return opened;
  std::string answer;
  if (!AskSensors(answer)) {
    // Kept: the stop has an exchange of its own, and its outcome is what is told.
    StopIoStreaming();
    return LatestErrorCode();
  }
  const vexa::TurnGuard guard(m_IoStreamLock, m_State->io_turn);
  m_PendingPins = vexa::sensor_pins(answer);
  m_LastIoDataTime = m_State->now();
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  StopIoStreaming();
  return FailMemory();
}

ELibDReturnCode CVexaCommon::OpenIoStream() {
  const vexa::TurnGuard guard(m_IoStreamLock, m_State->io_turn);
  // Safe: what a start in another thread has opened meanwhile is not lost open.
  if (m_IoStreamSocket != -1) http_close(m_IoStreamSocket);
  {
    const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kAlarmRequestTimeout, m_SavedTimeout});
    m_IoStreamSocket = http_open("/command/alarmdata.cgi?interval=1");
  }
  if (m_IoStreamSocket != -1) return LIBD_OK;
  const vexa::Guard connection(m_ConnectionLock);
  // Kept: a camera that takes no alarm stream is asked with this time-out until the connection is set anew.
  m_ConnectionInfo.timeout = kFailedStreamTimeout;
  return LatestErrorCode();
}

bool CVexaCommon::AskSensors(std::string& answer) {
  const int socket = http_open("/command/inquiry.cgi?inq=sensor");
  if (socket == -1) return false;
  char bytes[kSensorAnswer + 1] = {};
  const int received = http_recvn(socket, bytes, kSensorAnswer, ConnectionTimeout());
  http_close(socket);
  answer = bytes;
  return received >= 0;
}

ELibDReturnCode CVexaCommon::StopIoStreaming() {
  {
    const vexa::TurnGuard guard(m_IoStreamLock, m_State->io_turn);
    m_PendingPins.clear();
    if (m_IoStreamSocket == -1) return LIBD_OK;
    http_close(m_IoStreamSocket);
    m_IoStreamSocket = -1;
  }
  return SendCommand("/command/system.cgi?AlarmData=off");
}

// Safe: as GetIoBoxInfo; room for the pins is there before a part is read, so that none is lost for the want of it.
ELibDReturnCode CVexaCommon::GetCurrentIoStatusDetail(std::vector<SLibDPinInfo>& pins) try {
  const vexa::TurnGuard guard(m_IoStreamLock, m_State->io_turn);
  if (m_IoStreamSocket == -1) return LIBD_FAILED;
  if (!m_PendingPins.empty()) {
    pins = std::exchange(m_PendingPins, {});
    m_LastIoDataTime = m_State->now();
    return LIBD_OK;
  }
  pins.reserve(vexa::kMostStatusPins);
  unsigned int present = 0;
  unsigned int state = 0;
  const int read = http_multipart_input_recv(m_IoStreamSocket, present, state);
  if (read < 0) return LatestErrorCode();
  const std::time_t now = m_State->now();
  if (read == 0) {
    return vexa::alarm_stream_is_silent(now, m_LastIoDataTime, ConnectionTimeout()) ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }
  vexa::take_status_pins({present, state}, m_FixedIoBoxInfo, pins);
  m_LastIoDataTime = now;
  return pins.empty() ? LIBD_NO_FRAME : LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

ELibDReturnCode CVexaCommon::GetCurrentIoStatus(std::vector<SLibDPinInfo>& pins) {
  const ELibDReturnCode read = GetCurrentIoStatusDetail(pins);
  if (read != LIBD_OK) return read;
  for (const SLibDPinInfo& pin : pins) {
    if (pin.type != PIN_TYPE_TAMPERING) continue;
    const ELibDReturnCode watched = WatchTampering(pin.state);
    if (watched != LIBD_OK) return watched;
  }
  return LIBD_OK;
}

// The clearing is not sent under the lock, so that a stop waits for a read alone. Meanwhile the alarm counts as not
// seen, which lets no other thread clear it too.
ELibDReturnCode CVexaCommon::WatchTampering(int state) {
  std::time_t since = 0;
  {
    const vexa::Guard guard(m_IoStreamLock);
    if (!vexa::tampering_is_due(state, m_State->now(), m_TamperingActiveSince)) return LIBD_OK;
    since = std::exchange(m_TamperingActiveSince, 0);
  }
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kAlarmRequestTimeout, m_SavedTimeout});
  const ELibDReturnCode sent = SendCommand("/command/system.cgi?TamperingStatusClear=on");
  if (sent == LIBD_OK) return LIBD_OK;
  const vexa::Guard guard(m_IoStreamLock);
  m_TamperingActiveSince = since;
  return sent;
}

ELibDReturnCode CVexaCommon::SetOutput(SLibDPinInfo& pin) {
  return SendCommand("/command/main.cgi?Trigger=alarmout%d%s", pin.number, pin.state != 0 ? "on" : "off");
}

int CVexaCommon::StoredVmdType() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_IoBoxInfo.vmdType;
}
