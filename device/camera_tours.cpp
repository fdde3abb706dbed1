// Camera tours: sequences of presets.
#include <cerrno>
#include <new>

#include "device/cgi/tour_text.h"
#include "vexa/vexa_common.h"

// Safe: an answer that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetCameraTourInfo(SLibDCameraTourInfo& info) try {
  std::string answer;
  if (SendInqCommand("presetposition", answer) != LIBD_OK) return LatestErrorCode();
  info = vexa::read_camera_tours(answer, m_FixedPTZControlInfo.tourCount);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

// Safe: a request that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::SetCameraTourInfo(SLibDCameraTourInfo& info) try {
  const auto request =
      vexa::camera_tour_request(info, m_FixedPTZControlInfo.tourCount, m_FixedPTZControlInfo.presetCount);
  if (!request) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?%s", request->c_str());
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

bool CVexaCommon::GetTextByTourSequenceList(const std::vector<int>& sequence, std::string& text) {
  const auto written = vexa::tour_sequence_text(sequence, m_FixedPTZControlInfo.presetCount);
  text = written.value_or("");
  return written.has_value();
}

// NOLINTNEXTLINE(performance-unnecessary-value-param): the operation is called with its text by value
bool CVexaCommon::GetTourSequenceListByText(std::string text, std::vector<int>& sequence) {
  return vexa::read_tour_sequence(text, sequence);
}
