// Stored positions. The host counts them from 0, the camera from 1.
#include <cerrno>
#include <new>

#include "device/cgi/preset_text.h"
#include "device/cgi/ptz_text.h"
#include "device/raised_timeout.h"
#include "runtime/base/sync.h"
#include "transport/wire/cgi_answer.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kStoreTimeout = 10000;  // milliseconds

}  // namespace

bool CVexaCommon::IsPreset(int index) const { return index >= 0 && index < m_FixedPTZControlInfo.presetCount; }

// Safe: a request that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::SetPreset(SLibDPresetInfo& preset) try {
  const std::string name = AddUrlEncoding(preset.name, true);
  if (!IsPreset(preset.index) || name.empty()) return LIBD_INVALID_ARGUMENT;
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kStoreTimeout, m_SavedTimeout});
  return SendCommand("/command/presetposition.cgi?PresetSet=%d,%s,on", preset.index + 1, name.c_str());
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::RecallPreset(int index) {
  if (!IsPreset(index)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?PresetCall=%d,%d", index + 1,
                     vexa::recall_speed(m_FixedPTZControlInfo.panTilt));
}

ELibDReturnCode CVexaCommon::ClearPreset(int index) {
  if (!IsPreset(index)) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/presetposition.cgi?PresetClear=%d", index + 1);
}

// Safe: an answer that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetPresets(std::vector<SLibDPresetInfo>& presets) try {
  presets = vexa::unnamed_presets(m_FixedPTZControlInfo.presetCount);
  std::string answer;
  if (SendInqCommand("presetposition", answer) != LIBD_OK) return LatestErrorCode();
  const auto names = vexa::cgi_value(answer, "PresetName=");
  return names && vexa::name_presets(*names, presets) ? LIBD_OK : LIBD_FAILED;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}
