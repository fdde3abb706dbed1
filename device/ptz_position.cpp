// Where the camera looks, and what is known of its motion.
#include "device/cgi/position_text.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kUpsideDown = 180;

}  // namespace

ELibDReturnCode CVexaCommon::GetCurrentPosition(SLibDPTZStatus& status) {
  std::string text;
  {
    const vexa::Guard guard(m_CamPosLock);
    text = m_CamPosText;
  }
  const auto position = vexa::read_position_text(text);
  if (!position) return LIBD_FAILED;
  // Kept: the flag is set and never cleared, as the host clears it when it has seen it.
  if (position->moving) status.moving = true;
  const int flip = ImageRotation() == kUpsideDown ? -1 : 1;
  if (!GetViewingAngles(position->zoom_valid ? position->zoom : 0, status.horizontalAngle, status.verticalAngle)) {
    return LIBD_FAILED;
  }
  const SLibDFixedPanTiltInfo& camera = m_FixedPTZControlInfo.panTilt;
  const std::int64_t tilt_offset = static_cast<std::int64_t>(camera.tiltOffset) * flip;
  const int pan = vexa::axis_angle(position->pan, camera.panSpan, camera.panAngleRange, 0);
  const int tilt = vexa::axis_angle(position->tilt, camera.tiltSpan, camera.tiltAngleRange, tilt_offset);
  status.panPosition = position->pan_valid ? pan * flip : 0;
  status.tiltPosition = position->tilt_valid ? tilt * flip : 0;
  return LIBD_OK;
}

int CVexaCommon::ImageRotation() {
  const vexa::Guard guard(m_ConnectionLock);
  return m_CameraInfo.rotation;
}

bool CVexaCommon::GetViewingAngles(int zoom, int& horizontal, int& vertical) {
  const auto angles = vexa::viewing_angles(m_ZoomRatios, m_FixedPTZControlInfo.panTilt, zoom);
  if (!angles) return false;
  horizontal = angles->horizontal;
  vertical = angles->vertical;
  return true;
}

ELibDReturnCode CVexaCommon::GetPTZControlInfo(SLibDPTZControlInfo& info) {
  const vexa::Guard guard(m_ConnectionLock);
  info = m_PTZControlInfo;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetPTZControlInfo(SLibDPTZControlInfo& info) {
  const vexa::Guard guard(m_ConnectionLock);
  m_PTZControlInfo = info;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetFixedPTZControlInfo(SLibDFixedPTZControlInfo& info) {
  if (!m_FixedPTZControlInfoAvailable) return LIBD_NOT_SUPPORTED;
  info = m_FixedPTZControlInfo;
  return LIBD_OK;
}
