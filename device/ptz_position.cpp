// Where the camera looks, and what is known of its motion.
#include <cerrno>
#include <new>
#include <optional>
#include <utility>

#include "device/cgi/position_text.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kUpsideDown = 180;

}  // namespace

ELibDReturnCode CVexaCommon::GetCurrentPosition(SLibDPTZStatus& status) {
  std::optional<vexa::CameraPosition> position;
  {
    const vexa::Guard guard(m_CamPosLock);
    position = vexa::read_position_text(m_CamPosText);
  }
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

// Safe: here and below, a record that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetPTZControlInfo(SLibDPTZControlInfo& info) try {
  const vexa::Guard guard(m_ConnectionLock);
  info = m_PTZControlInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::SetPTZControlInfo(SLibDPTZControlInfo& info) try {
  SLibDPTZControlInfo stored = info;
  const vexa::Guard guard(m_ConnectionLock);
  m_PTZControlInfo = std::move(stored);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetFixedPTZControlInfo(SLibDFixedPTZControlInfo& info) try {
  if (!m_FixedPTZControlInfoAvailable) return LIBD_NOT_SUPPORTED;
  info = m_FixedPTZControlInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}
