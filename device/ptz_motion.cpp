// Pan, tilt, zoom and focus. Every motion is one request; cameras take speeds in one of two dialects.
#include "device/cgi/ptz_text.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kLargestZoomStep = 100;

bool is_turned(int speed) { return speed < 0; }

}  // namespace

bool CVexaCommon::TakesContinuousPtz() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_ContinuousPTZ;
}

ELibDReturnCode CVexaCommon::PanTilt(int pan, int tilt) {
  if (!vexa::is_host_speed(pan) || !vexa::is_host_speed(tilt)) return LIBD_INVALID_ARGUMENT;
  const SLibDFixedPanTiltInfo& camera = m_FixedPTZControlInfo.panTilt;
  const bool continuous = TakesContinuousPtz();
  const int pan_speed = continuous ? vexa::continuous_speed(pan) : vexa::move_speed(pan, camera.panMaxSpeed);
  const int tilt_speed = continuous ? vexa::continuous_speed(tilt) : vexa::move_speed(tilt, camera.tiltMaxSpeed);
  ELibDPanTiltDirection direction = LIBD_DIRECTION_STOP;
  GetDirectionFromPanTiltSpeed(is_turned(pan) ? -pan_speed : pan_speed, is_turned(tilt) ? -tilt_speed : tilt_speed,
                               direction);
  const int failed = direction == LIBD_DIRECTION_STOP ? SendPTZCommandForCenterDirection()
                                                      : SendPTZCommands(pan_speed, tilt_speed, direction);
  return failed == 0 ? LIBD_OK : LatestErrorCode();
}

void CVexaCommon::GetDirectionFromPanTiltSpeed(int pan, int tilt, ELibDPanTiltDirection& direction) {
  direction = vexa::direction_of(pan, tilt, direction);
}

int CVexaCommon::SendPTZCommands(int pan, int tilt, const ELibDPanTiltDirection& direction) {
  if (TakesContinuousPtz()) {
    return SendCommand("/command/ptzf.cgi?ContinuousPanTiltZoom=%d,%d,", pan, tilt) == LIBD_OK ? 0 : 1;
  }
  const char* word = vexa::word_of(vexa::kDirectionWords, direction);
  // Safe: a direction without a word is not sent.
  if (word == nullptr) return 1;
  const int speed = m_FixedPTZControlInfo.noMoveSpeed ? 0 : vexa::larger_amount(pan, tilt);
  return SendCommand("/command/ptzf.cgi?Move=%s,%d", word, speed) == LIBD_OK ? 0 : 1;
}

int CVexaCommon::SendPTZCommandForCenterDirection() {
  const ELibDReturnCode sent = TakesContinuousPtz() ? SendCommand("/command/ptzf.cgi?ContinuousPanTiltZoom=0,0,")
                                                    : SendCommand("/command/ptzf.cgi?Move=stop,motor");
  return sent == LIBD_OK ? 0 : 1;
}

ELibDReturnCode CVexaCommon::PanTiltAbsolute(int pan, int tilt) {
  if (!vexa::is_host_position(pan) || !vexa::is_host_position(tilt)) return LIBD_INVALID_ARGUMENT;
  const SLibDFixedPanTiltInfo& camera = m_FixedPTZControlInfo.panTilt;
  // Kept: a negative position is eight digits long, as its sign is widened; cameras read the last four.
  return SendCommand("/command/ptzf.cgi?AbsolutePanTilt=%04X,%04X,%d",
                     static_cast<unsigned>(vexa::axis_position(pan, camera.panSpan, camera.panOrigin)),
                     static_cast<unsigned>(vexa::axis_position(tilt, camera.tiltSpan, camera.tiltOrigin)),
                     vexa::recall_speed(camera));
}

ELibDReturnCode CVexaCommon::PanTiltDirect(int x, int y, const SLibDResolutionInfo& picture) {
  if (!vexa::is_host_position(x) || !vexa::is_host_position(y)) return LIBD_INVALID_ARGUMENT;
  if (!vexa::has_size(picture)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/ptzf.cgi?AreaZoom=%d,%d,0,0,%s", vexa::centre_offset(x, picture.width),
                     vexa::centre_offset(y, picture.height), vexa::kAreaImage);
}

ELibDReturnCode CVexaCommon::Zoom(int speed) {
  if (!vexa::is_host_speed(speed)) return LIBD_INVALID_ARGUMENT;
  const bool continuous = TakesContinuousPtz();
  if (speed == 0) {
    return continuous ? SendCommand("/command/ptzf.cgi?ContinuousPanTiltZoom=,,0")
                      : SendCommand("/command/ptzf.cgi?Move=stop,zoom");
  }
  if (continuous) return SendCommand("/command/ptzf.cgi?ContinuousPanTiltZoom=,,%d", vexa::continuous_speed(speed));
  const SLibDFixedZoomInfo& camera = m_FixedPTZControlInfo.zoom;
  return SendCommand("/command/ptzf.cgi?Move=%s,%d", speed > 0 ? "tele" : "wide",
                     vexa::share_between(speed, camera.minSpeed, camera.maxSpeed));
}

ELibDReturnCode CVexaCommon::ZoomAbsolute(int position) {
  if (!vexa::is_host_position(position)) return LIBD_INVALID_ARGUMENT;
  const SLibDFixedZoomInfo& camera = m_FixedPTZControlInfo.zoom;
  return SendCommand("/command/ptzf.cgi?AbsoluteZoom=%04X",
                     static_cast<unsigned>(vexa::share_between(position, camera.minPosition, camera.maxPosition)));
}

ELibDReturnCode CVexaCommon::ZoomRelative(int step) {
  if (step < -kLargestZoomStep || step > kLargestZoomStep) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/ptzf.cgi?RelativeZoom=%04X", static_cast<unsigned>(vexa::zoom_step(step)));
}

// Kept: the first pair is the centre of the area, not its corner.
ELibDReturnCode CVexaCommon::ZoomArea(int x, int y, int width, int height, const SLibDResolutionInfo& picture) {
  for (const int place : {x, y, width, height}) {
    if (!vexa::is_host_position(place)) return LIBD_INVALID_ARGUMENT;
  }
  if (!vexa::has_size(picture)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/ptzf.cgi?AreaZoom=%d,%d,%d,%d,%s", vexa::centre_offset(x, picture.width),
                     vexa::centre_offset(y, picture.height), vexa::area_extent(width, picture.width),
                     vexa::area_extent(height, picture.height), vexa::kAreaImage);
}

ELibDReturnCode CVexaCommon::SetFocusMode(bool automatic) {
  return SendCommand("/command/camera.cgi?FocusMode=%s", automatic ? "auto" : "manual");
}

ELibDReturnCode CVexaCommon::Focus(int speed) {
  if (!vexa::is_host_speed(speed)) return LIBD_INVALID_ARGUMENT;
  if (speed == 0) return SendCommand("/command/ptzf.cgi?Move=stop,focus");
  const SLibDFixedFocusInfo& camera = m_FixedPTZControlInfo.focus;
  return SendCommand("/command/ptzf.cgi?Move=%s,%d", speed > 0 ? "near" : "far",
                     vexa::share_between(speed, camera.minSpeed, camera.maxSpeed));
}

ELibDReturnCode CVexaCommon::FocusAbsolute(int position) {
  if (!vexa::is_host_position(position)) return LIBD_INVALID_ARGUMENT;
  const SLibDFixedFocusInfo& camera = m_FixedPTZControlInfo.focus;
  return SendCommand("/command/ptzf.cgi?AbsoluteFocus=%04X",
                     static_cast<unsigned>(vexa::share_between(position, camera.minPosition, camera.maxPosition)));
}
