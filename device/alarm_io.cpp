// SPDX-License-Identifier: Apache-2.0
// Alarm pins: what the camera has, the polled stream of their states, and the outputs.
#include <cerrno>
#include <utility>

#include "device/cgi/alarm_text.h"
#include "device/cgi/input_part.h"
#include "device/driver_state.h"
#include "transport/failure.h"
#include "transport/http_receive.h"
#include "transport/http_stream.h"

namespace {

constexpr int kAlarmRequestTimeout = 10000;  // milliseconds
constexpr int kFailedStreamTimeout = 3000;   // milliseconds
constexpr int kSilenceGrace = 15000;         // milliseconds
constexpr int kAlarmDataSettles = 100;       // milliseconds

std::int64_t patience_of(vexa::Connection& connection) {
  return vexa::whole_seconds(connection.timeout()) + kSilenceGrace;
}

ELibDReturnCode ask_tampering(vexa::CameraLink& camera, int number, SLibDIoBoxInfo& info) {
  std::string answer;
  if (const auto asked = camera.inquire("system", answer); asked != LIBD_OK) return asked;
  info.pins.push_back(vexa::pin_of(number, PIN_TYPE_TAMPERING, vexa::detector_enabled(answer, "TamperingFunc=")));
  info.tamperLevel = vexa::tamper_level_of(answer).value_or(info.tamperLevel);
  return LIBD_OK;
}

ELibDReturnCode ask_audio_detection(vexa::CameraLink& camera, int number, SLibDIoBoxInfo& info) {
  std::string answer;
  if (const auto asked = camera.inquire("audiodetection", answer); asked != LIBD_OK) return asked;
  info.pins.push_back(vexa::pin_of(number, PIN_TYPE_AUDIO_DETECTION, vexa::detector_enabled(answer, "ADFunc=")));
  return LIBD_OK;
}

}  // namespace

ELibDReturnCode CVexaCommon::GetFixedIoboxInfo(SLibDFixedIoBoxInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  if (!m_FixedIoBoxInfoAvailable) return operation.returns(LIBD_NOT_SUPPORTED);
  info = m_FixedIoBoxInfo;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetIoBoxInfo(SLibDIoBoxInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    // Kept: the list is not emptied first; hosts hand in an empty one.
    vexa::append_pins(m_FixedIoBoxInfo, info.pins);
    int number = vexa::first_detector_number(m_FixedIoBoxInfo);
    if (m_FixedIoBoxInfo.tamperingDetection) {
      const ELibDReturnCode asked = ask_tampering(m_State->camera, number++, info);
      if (asked != LIBD_OK) return asked;
    }
    if (m_FixedIoBoxInfo.audioDetection) {
      const ELibDReturnCode asked = ask_audio_detection(m_State->camera, number, info);
      if (asked != LIBD_OK) return asked;
    }
    SLibDIoBoxInfo stored = info;
    const vexa::Guard guard(m_ConnectionLock);
    info.vmdType = stored.vmdType = m_IoBoxInfo.vmdType;
    std::swap(m_IoBoxInfo, stored);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::StartIoStreaming() {
  vexa::Operation operation(*m_State, __func__);
  StopIoStreaming();
  {
    const vexa::RaisedTimeout slow = m_State->connection.raised(kAlarmRequestTimeout);
    const ELibDReturnCode sent = m_State->camera.send("/command/system.cgi?AlarmData=on");
    if (sent != LIBD_OK) return sent;
  }
  vexa::WaitBudget(m_State->limit(kAlarmDataSettles)).pause();
  const ELibDReturnCode opened = m_State->open_alarms();
  if (opened != LIBD_OK) return opened;
  std::string answer;
  if (m_State->camera.inquire("sensor", answer) != LIBD_OK) {
    // Kept: the stop has an exchange of its own, and its outcome is the one that is returned.
    const ELibDReturnCode stopped = StopIoStreaming();
    return operation.returns(stopped == LIBD_OK ? LIBD_FAILED : stopped);
  }
  std::vector<SLibDPinInfo> pins;
  if (!vexa::within_memory([&] { pins = vexa::sensor_pins(answer); })) {
    StopIoStreaming();
    return m_State->errors.out_of_memory();
  }
  const vexa::TurnGuard guard(m_IoStreamLock, m_State->alarms.turn());
  m_PendingPins = std::move(pins);
  m_State->alarms.note_other_data(!m_PendingPins.empty(), m_State->now, patience_of(m_State->connection));
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::StopIoStreaming() {
  vexa::Operation operation(*m_State, __func__);
  const bool was_open = m_State->alarms.stop();
  {
    const vexa::TurnGuard guard(m_IoStreamLock, m_State->alarms.turn());
    m_PendingPins.clear();
  }
  return was_open ? m_State->camera.send("/command/system.cgi?AlarmData=off") : LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetCurrentIoStatusDetail(std::vector<SLibDPinInfo>& pins) {
  return m_State->errors.run([&]() -> vexa::Outcome {
    {
      const vexa::TurnGuard guard(m_IoStreamLock, m_State->alarms.turn());
      if (m_IoStreamSocket != -1 && !m_PendingPins.empty()) {
        pins = std::exchange(m_PendingPins, {});
        m_State->alarms.note_other_data(false, m_State->now, patience_of(m_State->connection));
        return LIBD_OK;
      }
    }
    // Before a part is read, so that none is lost when memory runs out.
    pins.reserve(vexa::kMostStatusPins);
    const auto read = [&](int socket) -> vexa::Result<int> {
      vexa::PinMasks masks;
      const auto part = m_State->read_alarm_part(socket, masks);
      if (part && *part > 0) vexa::take_status_pins(masks, m_FixedIoBoxInfo, pins);
      return part;
    };
    const vexa::Outcome polled = m_State->alarms.poll(read, m_State->now, patience_of(m_State->connection));
    return polled && *polled == LIBD_OK && pins.empty() ? vexa::Outcome(LIBD_NO_FRAME) : polled;
  });
}

int CVexaCommon::http_multipart_input_recv(int socket, unsigned int& mask, unsigned int& state) {
  return m_State->errors.run([&] {
    vexa::PinMasks masks;
    const auto part = m_State->read_alarm_part(socket, masks);
    if (part && *part > 0) {
      mask = masks.present;
      state = masks.state;
    }
    return part;
  });
}

ELibDReturnCode CVexaCommon::GetCurrentIoStatus(std::vector<SLibDPinInfo>& pins) {
  vexa::Operation operation(*m_State, __func__);
  const ELibDReturnCode read = GetCurrentIoStatusDetail(pins);
  if (read != LIBD_OK) return read;
  for (const SLibDPinInfo& pin : pins) {
    if (pin.type != PIN_TYPE_TAMPERING) continue;
    const ELibDReturnCode watched = m_State->watch_tampering(pin.state);
    if (watched != LIBD_OK) return watched;
  }
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetOutput(SLibDPinInfo& pin) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.send("/command/main.cgi?Trigger=alarmout%d%s", pin.number, pin.state != 0 ? "on" : "off");
}

namespace vexa {

ELibDReturnCode DriverState::open_alarms() {
  const ELibDReturnCode opened = errors.run([&] {
    const std::int64_t patience = patience_of(connection);
    const RaisedTimeout slow = connection.raised(kAlarmRequestTimeout);
    return alarms.start([&] { return camera.open("/command/alarmdata.cgi?interval=1"); }, now, patience);
  });
  if (opened == LIBD_OK || limit().cancels.raised()) return opened;
  const Guard guard(driver.m_ConnectionLock);
  // Kept: a camera that takes no alarm stream is asked with this time-out until the connection is set anew.
  driver.m_ConnectionInfo.timeout = kFailedStreamTimeout;
  return opened;
}

Result<int> DriverState::read_alarm_part(int socket, PinMasks& masks) {
  errors.clear();
  char part[kPartHeaderRoom];
  const auto length = receive_header(socket, part, limit());
  if (!length || *length == 0) return length;
  const MotionReport motion{vmd_type() != LIBD_VMD_WINDOW, driver.m_UseMotionDetection};
  masks = parse_input_part({part, static_cast<std::size_t>(*length)}, motion);
  return 1;
}

// The clearing is not sent under the lock, so that a stop waits for a read alone. Meanwhile the alarm counts as not
// seen, which lets no other thread clear it too.
ELibDReturnCode DriverState::watch_tampering(int state) {
  std::time_t since = 0;
  {
    const Guard guard(driver.m_IoStreamLock);
    if (!tampering_is_due(state, now(), driver.m_TamperingActiveSince)) return LIBD_OK;
    since = std::exchange(driver.m_TamperingActiveSince, 0);
  }
  const RaisedTimeout slow = connection.raised(kAlarmRequestTimeout);
  const ELibDReturnCode sent = camera.send("/command/system.cgi?TamperingStatusClear=on");
  if (sent == LIBD_OK) return LIBD_OK;
  const Guard guard(driver.m_IoStreamLock);
  driver.m_TamperingActiveSince = since;
  return sent;
}

}  // namespace vexa
