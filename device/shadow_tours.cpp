// Shadow tours: movements that the camera records and plays back.

#include "device/cgi/tour_text.h"
#include "device/driver_state.h"

ELibDReturnCode CVexaCommon::GetShadowTourInfo(SLibDShadowTourInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (m_FixedPTZControlInfo.shadowTourCount < 1) return LIBD_NOT_SUPPORTED;
    std::string answer;
    if (const auto asked = m_State->camera.inquire("presetposition", answer); asked != LIBD_OK) return asked;
    info = vexa::read_shadow_tours(answer, m_FixedPTZControlInfo.shadowTourCount);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetShadowTourInfo(SLibDShadowTourInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (m_FixedPTZControlInfo.shadowTourCount < 1) return LIBD_NOT_SUPPORTED;
    const auto request = vexa::shadow_tour_request(info, m_FixedPTZControlInfo.shadowTourCount);
    if (!request) return LIBD_INVALID_ARGUMENT;
    return m_State->camera.send("/command/presetposition.cgi?%s", request->c_str());
  });
}

ELibDReturnCode CVexaCommon::StartShadowTour(int number) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    const int count = m_FixedPTZControlInfo.shadowTourCount;
    if (!vexa::is_shadow_tour(number, count)) return LIBD_INVALID_ARGUMENT;
    return m_State->camera.send("/command/presetposition.cgi?%s", vexa::shadow_tour_start(number, count).c_str());
  });
}

// Kept: four shadow tours are named, however many there are; cameras pass over those they lack.
ELibDReturnCode CVexaCommon::StopShadowTour() {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.send("/command/presetposition.cgi?STour=off&STourA=off&STourB=off&STourC=off&STourD=off");
}

ELibDReturnCode CVexaCommon::StartRecordShadowTour(int number) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_shadow_tour(number, m_FixedPTZControlInfo.shadowTourCount))
    return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/presetposition.cgi?STourRecord=%s", vexa::tour_letter(number));
}

ELibDReturnCode CVexaCommon::StopRecordShadowTour() {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.send("/command/presetposition.cgi?STourRecord=stop");
}

ELibDReturnCode CVexaCommon::StartPreviewShadowTour(int number) {
  vexa::Operation operation(*m_State, __func__);
  if (!vexa::is_shadow_tour(number, m_FixedPTZControlInfo.shadowTourCount))
    return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/presetposition.cgi?STourPreview=%s", vexa::tour_letter(number));
}

ELibDReturnCode CVexaCommon::StopPreviewShadowTour() {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.send("/command/presetposition.cgi?STourPreview=stop");
}
