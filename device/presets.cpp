// Stored positions. The host counts them from 0, the camera from 1.

#include "device/cgi/ptz_text.h"
#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/wire/http_answer.h"

namespace {

constexpr int kStoreTimeout = 10000;  // milliseconds

bool is_one_of(int count, int index) { return index >= 0 && index < count; }

}  // namespace

ELibDReturnCode CVexaCommon::SetPreset(SLibDPresetInfo& preset) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    const std::string name = AddUrlEncoding(preset.name, true);
    if (!is_one_of(m_FixedPTZControlInfo.presetCount, preset.index) || name.empty()) return LIBD_INVALID_ARGUMENT;
    const vexa::RaisedTimeout slow = m_State->connection.raised(kStoreTimeout);
    return m_State->camera.send("/command/presetposition.cgi?PresetSet=%d,%s,on", preset.index + 1, name.c_str());
  });
}

ELibDReturnCode CVexaCommon::RecallPreset(int index) {
  vexa::Operation operation(*m_State, __func__);
  if (!is_one_of(m_FixedPTZControlInfo.presetCount, index)) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/presetposition.cgi?PresetCall=%d,%d", index + 1,
                              vexa::recall_speed(m_FixedPTZControlInfo.panTilt));
}

ELibDReturnCode CVexaCommon::ClearPreset(int index) {
  vexa::Operation operation(*m_State, __func__);
  if (!is_one_of(m_FixedPTZControlInfo.presetCount, index)) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/presetposition.cgi?PresetClear=%d", index + 1);
}

ELibDReturnCode CVexaCommon::GetPresets(std::vector<SLibDPresetInfo>& presets) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    presets = vexa::unnamed_presets(m_FixedPTZControlInfo.presetCount);
    std::string answer;
    if (const auto asked = m_State->camera.inquire("presetposition", answer); asked != LIBD_OK) return asked;
    const auto names = vexa::cgi_value(answer, "PresetName=");
    return names && vexa::name_presets(*names, presets) ? LIBD_OK : LIBD_FAILED;
  });
}
