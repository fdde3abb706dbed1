// Camera tours: sequences of presets.

#include "device/cgi/tour_text.h"
#include "device/driver_state.h"

ELibDReturnCode CVexaCommon::GetCameraTourInfo(SLibDCameraTourInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera.inquire("presetposition", answer); asked != LIBD_OK) return asked;
    info = vexa::read_camera_tours(answer, m_FixedPTZControlInfo.tourCount);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetCameraTourInfo(SLibDCameraTourInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    const auto request =
        vexa::camera_tour_request(info, m_FixedPTZControlInfo.tourCount, m_FixedPTZControlInfo.presetCount);
    if (!request) return LIBD_INVALID_ARGUMENT;
    return m_State->camera.send("/command/presetposition.cgi?%s", request->c_str());
  });
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
