// Detection settings, and the switches of the detectors.
#include "device/cgi/detection_text.h"

#include <utility>

#include "device/cgi/alarm_text.h"
#include "device/driver_state.h"
#include "runtime/base/text.h"
#include "transport/wire/http_request.h"

namespace {

constexpr int kDetectionTimeout = 10000;  // milliseconds

ELibDReturnCode ask_object_detection(vexa::DriverState& state, std::string& answer) {
  const vexa::RaisedTimeout slow = state.connection.raised(kDetectionTimeout);
  return state.camera.inquire("objectdetection", answer);
}

}  // namespace

ELibDReturnCode CVexaCommon::GetObjectDetectionSetting(std::vector<SLibDDetectionParam>& params,
                                                       ELibDPositionMode& mode) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    const ELibDReturnCode asked =
        m_LodDetection ? m_State->camera.inquire("lod", answer) : ask_object_detection(*m_State, answer);
    if (asked != LIBD_OK) return asked;
    auto settings = m_LodDetection ? vexa::lod_settings(answer)
                                   : vexa::object_settings(answer, m_FixedPTZControlInfo.presetCount > 0);
    ClearCachedObjectDetectionSetting(params);
    params = std::move(settings);
    if (m_LodDetection) return params.empty() ? LIBD_FAILED : LIBD_OK;
    mode = vexa::position_mode_of(answer).value_or(mode);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetDetectionParam(SLibDDetectionParam& param) {
  vexa::Operation operation(*m_State, __func__);
  if (!m_LodDetection) {
    int socket = -1;
    if (CheckDetectionParamDetectionArea(param) != LIBD_OK) return operation.returns(LIBD_INVALID_ARGUMENT);
    return SetObjectDetectionParameter(param, socket);
  }
  std::string size;
  if (CheckDetectionParamSensitivity(param) != LIBD_OK) return operation.returns(LIBD_INVALID_ARGUMENT);
  if (ConverObjectWidthValueToString(param, size) != LIBD_OK) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/lod.cgi?LODMinObjectSize=%s&LODSensitivity=%d", size.c_str(),
                              param.windows[0].sensitivity);
}

ELibDReturnCode CVexaCommon::SetObjectDetectionParameter(SLibDDetectionParam& param, int& socket) {
  return m_State->errors.run([&]() -> vexa::Outcome {
    // Safe: a model class may bring areas that nobody has looked at; corners that are not there are not read.
    if (CheckDetectionParamDetectionArea(param) != LIBD_OK) return LIBD_INVALID_ARGUMENT;
    const vexa::RaisedTimeout slow = m_State->connection.raised(kDetectionTimeout);
    for (const auto request : {vexa::object_size_request, vexa::first_windows_request, vexa::last_windows_request}) {
      auto opened = m_State->camera.open(vexa::format_within(vexa::kRequestRoom, "%s", request(param).c_str()).text);
      socket = opened ? opened->release() : -1;
      if (!opened) return opened.failure();
      http_close(socket);
    }
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::ConverObjectWidthValueToString(SLibDDetectionParam& param, std::string& text) {
  const char* word = vexa::word_of(vexa::kLodSizes, static_cast<int>(param.windows[0].minObjectWidth));
  if (word == nullptr) return LIBD_INVALID_ARGUMENT;
  text = word;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::CheckDetectionParamSensitivity(SLibDDetectionParam& param) {
  return vexa::has_sensitivity(param) ? LIBD_OK : LIBD_INVALID_ARGUMENT;
}

ELibDReturnCode CVexaCommon::CheckDetectionParamDetectionArea(SLibDDetectionParam& param) {
  return vexa::has_areas(param) ? LIBD_OK : LIBD_INVALID_ARGUMENT;
}

ELibDReturnCode CVexaCommon::SetPositionMode(ELibDPositionMode mode) {
  vexa::Operation operation(*m_State, __func__);
  // Kept: any mode but preset is the current view; there is no wrong mode.
  const char* word = mode != LIBD_POSITION_PRESET ? "current" : "preset";
  return m_State->camera.send("/command/objectdetection.cgi?PositionMode=%s", word);
}

ELibDReturnCode CVexaCommon::SetTamperingAlarm(bool on, ELibDTamperLevel level) {
  vexa::Operation operation(*m_State, __func__);
  const char* word = vexa::word_of(vexa::kTamperWords, level);
  if (word == nullptr) return operation.returns(LIBD_INVALID_ARGUMENT);
  {
    const vexa::Guard guard(m_ConnectionLock);
    // Kept: the level is stored before the camera is asked, and stays when it refuses.
    m_IoBoxInfo.tamperLevel = level;
  }
  return m_State->camera.send("/command/system.cgi?TamperingFunc=%s&TamperingLevel=%s", on ? "on" : "off", word);
}

ELibDReturnCode CVexaCommon::SetAudioDetection(bool on) {
  vexa::Operation operation(*m_State, __func__);
  if (!m_FixedIoBoxInfo.audioDetection) return operation.returns(LIBD_NOT_SUPPORTED);
  return m_State->camera.send("/command/audiodetection.cgi?ADFunc=%s", on ? "on" : "off");
}

ELibDReturnCode CVexaCommon::SetVMDtype(ELibDVMDType type) {
  vexa::Operation operation(*m_State, __func__);
  if (type != LIBD_VMD_WINDOW && type != LIBD_VMD_VMF) return operation.returns(LIBD_INVALID_ARGUMENT);
  const vexa::Guard guard(m_ConnectionLock);
  m_IoBoxInfo.vmdType = type;
  return LIBD_OK;
}
