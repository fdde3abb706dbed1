// Pan, tilt, zoom and focus. Every motion is one request; cameras take speeds in one of two dialects.
#include "device/cgi/ptz_text.h"
#include "device/driver_state.h"
#include "runtime/base/sync.h"

namespace {

constexpr int kLargestZoomStep = 100;

bool is_turned(int speed) { return speed < 0; }

ELibDReturnCode send_continuous(vexa::CameraLink& camera, int pan, int tilt) {
  return camera.send("/command/ptzf.cgi?ContinuousPanTiltZoom=%d,%d,", pan, tilt);
}

ELibDReturnCode send_move(vexa::CameraLink& camera, ELibDPanTiltDirection direction, int speed) {
  const char* word = vexa::word_of(vexa::kDirectionWords, direction);
  // Safe: a direction without a word is not sent.
  if (word == nullptr) return LIBD_FAILED;
  return camera.send("/command/ptzf.cgi?Move=%s,%d", word, speed);
}

ELibDReturnCode send_stop(vexa::CameraLink& camera, bool continuous) {
  return continuous ? camera.send("/command/ptzf.cgi?ContinuousPanTiltZoom=0,0,")
                    : camera.send("/command/ptzf.cgi?Move=stop,motor");
}

}  // namespace

ELibDReturnCode CVexaCommon::PanTilt(int pan, int tilt) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_speed(pan) || !vexa::is_host_speed(tilt)) return operation.returns(LIBD_INVALID_ARGUMENT);
  const SLibDFixedPanTiltInfo& camera = m_FixedPTZControlInfo.panTilt;
  const bool continuous = m_State->takes_continuous_ptz();
  const int pan_speed = continuous ? vexa::continuous_speed(pan) : vexa::move_speed(pan, camera.panMaxSpeed);
  const int tilt_speed = continuous ? vexa::continuous_speed(tilt) : vexa::move_speed(tilt, camera.tiltMaxSpeed);
  ELibDPanTiltDirection direction = LIBD_DIRECTION_STOP;
  GetDirectionFromPanTiltSpeed(is_turned(pan) ? -pan_speed : pan_speed, is_turned(tilt) ? -tilt_speed : tilt_speed,
                               direction);
  if (direction == LIBD_DIRECTION_STOP) return send_stop(m_State->camera, continuous);
  if (continuous) return send_continuous(m_State->camera, pan_speed, tilt_speed);
  return send_move(m_State->camera, direction,
                   m_FixedPTZControlInfo.noMoveSpeed ? 0 : vexa::larger_amount(pan_speed, tilt_speed));
}

void CVexaCommon::GetDirectionFromPanTiltSpeed(int pan, int tilt, ELibDPanTiltDirection& direction) {
  direction = vexa::direction_of(pan, tilt, direction);
}

int CVexaCommon::SendPTZCommands(int pan, int tilt, const ELibDPanTiltDirection& direction) {
  const int speed = m_FixedPTZControlInfo.noMoveSpeed ? 0 : vexa::larger_amount(pan, tilt);
  const ELibDReturnCode sent = m_State->takes_continuous_ptz() ? send_continuous(m_State->camera, pan, tilt)
                                                               : send_move(m_State->camera, direction, speed);
  return sent == LIBD_OK ? 0 : 1;
}

int CVexaCommon::SendPTZCommandForCenterDirection() {
  return send_stop(m_State->camera, m_State->takes_continuous_ptz()) == LIBD_OK ? 0 : 1;
}

ELibDReturnCode CVexaCommon::PanTiltAbsolute(int pan, int tilt) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_position(pan) || !vexa::is_host_position(tilt)) return operation.returns(LIBD_INVALID_ARGUMENT);
  const SLibDFixedPanTiltInfo& camera = m_FixedPTZControlInfo.panTilt;
  // Kept: a negative position is eight digits long, as its sign is widened; cameras read the last four.
  return m_State->camera.send("/command/ptzf.cgi?AbsolutePanTilt=%04X,%04X,%d",
                              static_cast<unsigned>(vexa::axis_position(pan, camera.panSpan, camera.panOrigin)),
                              static_cast<unsigned>(vexa::axis_position(tilt, camera.tiltSpan, camera.tiltOrigin)),
                              vexa::recall_speed(camera));
}

ELibDReturnCode CVexaCommon::PanTiltDirect(int x, int y, const SLibDResolutionInfo& picture) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_position(x) || !vexa::is_host_position(y)) return operation.returns(LIBD_INVALID_ARGUMENT);
  if (!vexa::has_size(picture)) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/ptzf.cgi?AreaZoom=%d,%d,0,0,%s", vexa::centre_offset(x, picture.width),
                              vexa::centre_offset(y, picture.height), vexa::kAreaImage);
}

ELibDReturnCode CVexaCommon::Zoom(int speed) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_speed(speed)) return operation.returns(LIBD_INVALID_ARGUMENT);
  const bool continuous = m_State->takes_continuous_ptz();
  if (speed == 0) {
    return continuous ? m_State->camera.send("/command/ptzf.cgi?ContinuousPanTiltZoom=,,0")
                      : m_State->camera.send("/command/ptzf.cgi?Move=stop,zoom");
  }
  if (continuous)
    return m_State->camera.send("/command/ptzf.cgi?ContinuousPanTiltZoom=,,%d", vexa::continuous_speed(speed));
  const SLibDFixedZoomInfo& camera = m_FixedPTZControlInfo.zoom;
  return m_State->camera.send("/command/ptzf.cgi?Move=%s,%d", speed > 0 ? "tele" : "wide",
                              vexa::share_between(speed, camera.minSpeed, camera.maxSpeed));
}

ELibDReturnCode CVexaCommon::ZoomAbsolute(int position) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_position(position)) return operation.returns(LIBD_INVALID_ARGUMENT);
  const SLibDFixedZoomInfo& camera = m_FixedPTZControlInfo.zoom;
  return m_State->camera.send(
      "/command/ptzf.cgi?AbsoluteZoom=%04X",
      static_cast<unsigned>(vexa::share_between(position, camera.minPosition, camera.maxPosition)));
}

ELibDReturnCode CVexaCommon::ZoomRelative(int step) {
  vexa::Operation operation(*m_State, __func__);
  if (step < -kLargestZoomStep || step > kLargestZoomStep) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/ptzf.cgi?RelativeZoom=%04X", static_cast<unsigned>(vexa::zoom_step(step)));
}

// Kept: the first pair is the centre of the area, not its corner.
ELibDReturnCode CVexaCommon::ZoomArea(int x, int y, int width, int height, const SLibDResolutionInfo& picture) {
  vexa::Operation operation(*m_State, __func__);
  for (const int place : {x, y, width, height}) {
    if (!vexa::is_host_position(place)) return operation.returns(LIBD_INVALID_ARGUMENT);
  }
  if (!vexa::has_size(picture)) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/ptzf.cgi?AreaZoom=%d,%d,%d,%d,%s", vexa::centre_offset(x, picture.width),
                              vexa::centre_offset(y, picture.height), vexa::area_extent(width, picture.width),
                              vexa::area_extent(height, picture.height), vexa::kAreaImage);
}

ELibDReturnCode CVexaCommon::SetFocusMode(bool automatic) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.send("/command/camera.cgi?FocusMode=%s", automatic ? "auto" : "manual");
}

ELibDReturnCode CVexaCommon::Focus(int speed) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_speed(speed)) return operation.returns(LIBD_INVALID_ARGUMENT);
  if (speed == 0) return m_State->camera.send("/command/ptzf.cgi?Move=stop,focus");
  const SLibDFixedFocusInfo& camera = m_FixedPTZControlInfo.focus;
  return m_State->camera.send("/command/ptzf.cgi?Move=%s,%d", speed > 0 ? "near" : "far",
                              vexa::share_between(speed, camera.minSpeed, camera.maxSpeed));
}

ELibDReturnCode CVexaCommon::FocusAbsolute(int position) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_host_position(position)) return operation.returns(LIBD_INVALID_ARGUMENT);
  const SLibDFixedFocusInfo& camera = m_FixedPTZControlInfo.focus;
  return m_State->camera.send(
      "/command/ptzf.cgi?AbsoluteFocus=%04X",
      static_cast<unsigned>(vexa::share_between(position, camera.minPosition, camera.maxPosition)));
}
