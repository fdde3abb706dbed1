// Shadow tours: movements that the camera records and plays back.
#include <cerrno>
#include <new>

#include "device/cgi/shadow_tour_text.h"
#include "device/cgi/tour_text.h"
#include "vexa/vexa_common.h"

// Safe: an answer that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetShadowTourInfo(SLibDShadowTourInfo& info) try {
  if (m_FixedPTZControlInfo.shadowTourCount < 1) return LIBD_NOT_SUPPORTED;
  std::string answer;
  if (SendInqCommand("presetposition", answer) != LIBD_OK) return LatestErrorCode();
  info = vexa::read_shadow_tours(answer, m_FixedPTZControlInfo.shadowTourCount);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Safe: a request that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::SetShadowTourInfo(SLibDShadowTourInfo& info) try {
  if (m_FixedPTZControlInfo.shadowTourCount < 1) return LIBD_NOT_SUPPORTED;
  const auto request = vexa::shadow_tour_request(info, m_FixedPTZControlInfo.shadowTourCount);
  if (!request) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?%s", request->c_str());
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Safe: a request that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::StartShadowTour(int number) try {
  const int count = m_FixedPTZControlInfo.shadowTourCount;
  if (!vexa::is_shadow_tour(number, count)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?%s", vexa::shadow_tour_start(number, count).c_str());
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Kept: four shadow tours are named, however many there are; cameras pass over those they lack.
ELibDReturnCode CVexaCommon::StopShadowTour() {
  return SendCommand("/command/presetposition.cgi?STour=off&STourA=off&STourB=off&STourC=off&STourD=off");
}

ELibDReturnCode CVexaCommon::StartRecordShadowTour(int number) {
  if (!vexa::is_shadow_tour(number, m_FixedPTZControlInfo.shadowTourCount)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?STourRecord=%s", vexa::tour_letter(number));
}

ELibDReturnCode CVexaCommon::StopRecordShadowTour() {
  return SendCommand("/command/presetposition.cgi?STourRecord=stop");
}

ELibDReturnCode CVexaCommon::StartPreviewShadowTour(int number) {
  if (!vexa::is_shadow_tour(number, m_FixedPTZControlInfo.shadowTourCount)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?STourPreview=%s", vexa::tour_letter(number));
}

ELibDReturnCode CVexaCommon::StopPreviewShadowTour() {
  return SendCommand("/command/presetposition.cgi?STourPreview=stop");
}
