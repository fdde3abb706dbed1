// Where the camera looks, and what is known of its motion.
#include <optional>
#include <utility>

#include "device/cgi/position_text.h"
#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "runtime/base/undo.h"

namespace {

constexpr int kUpsideDown = 180;

}  // namespace

ELibDReturnCode CVexaCommon::GetCurrentPosition(SLibDPTZStatus& status) {
  vexa::Operation operation(*m_State, __func__);
  std::optional<vexa::CameraPosition> position;
  {
    const vexa::Guard guard(m_CamPosLock);
    position = vexa::read_position_text(m_CamPosText);
  }
  if (!position) return operation.returns(LIBD_FAILED);
  // Kept: the flag is set and never cleared, as the host clears it when it has seen it.
  if (position->moving) status.moving = true;
  const int flip = m_State->rotation() == kUpsideDown ? -1 : 1;
  if (!GetViewingAngles(position->zoom_valid ? position->zoom : 0, status.horizontalAngle, status.verticalAngle)) {
    return operation.returns(LIBD_FAILED);
  }
  const SLibDFixedPanTiltInfo& camera = m_FixedPTZControlInfo.panTilt;
  const std::int64_t tilt_offset = static_cast<std::int64_t>(camera.tiltOffset) * flip;
  const int pan = vexa::axis_angle(position->pan, camera.panSpan, camera.panAngleRange, 0);
  const int tilt = vexa::axis_angle(position->tilt, camera.tiltSpan, camera.tiltAngleRange, tilt_offset);
  status.panPosition = position->pan_valid ? pan * flip : 0;
  status.tiltPosition = position->tilt_valid ? tilt * flip : 0;
  return LIBD_OK;
}

bool CVexaCommon::GetViewingAngles(int zoom, int& horizontal, int& vertical) {
  const auto angles = vexa::viewing_angles(m_ZoomRatios, m_FixedPTZControlInfo.panTilt, zoom);
  if (!angles) return false;
  horizontal = angles->horizontal;
  vertical = angles->vertical;
  return true;
}

ELibDReturnCode CVexaCommon::GetPTZControlInfo(SLibDPTZControlInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    const vexa::Guard guard(m_ConnectionLock);
    vexa::put_whole(info, m_PTZControlInfo);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetPTZControlInfo(SLibDPTZControlInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    SLibDPTZControlInfo stored = info;
    const vexa::Guard guard(m_ConnectionLock);
    m_PTZControlInfo = std::move(stored);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::GetFixedPTZControlInfo(SLibDFixedPTZControlInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (!m_FixedPTZControlInfoAvailable) return LIBD_NOT_SUPPORTED;
    vexa::put_whole(info, m_FixedPTZControlInfo);
    return LIBD_OK;
  });
}
