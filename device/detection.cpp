// Detection settings, and the switches of the detectors.
#include "device/cgi/detection_text.h"

#include <new>

#include "device/cgi/alarm_text.h"
#include "device/raised_timeout.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kDetectionTimeout = 10000;  // milliseconds

}  // namespace

// Safe: settings that memory does not hold are a failure and not an exception.
ELibDReturnCode CVexaCommon::GetObjectDetectionSetting(std::vector<SLibDDetectionParam>& params,
                                                       ELibDPositionMode& mode) try {
  return m_LodDetection ? AskLodDetection(params) : AskObjectDetection(params, mode);
} catch (const std::bad_alloc&) {
  return FailMemory();
}

ELibDReturnCode CVexaCommon::AskLodDetection(std::vector<SLibDDetectionParam>& params) {
  std::string answer;
  if (SendInqCommand("lod", answer) != LIBD_OK) return LatestErrorCode();
  ClearCachedObjectDetectionSetting(params);
  params = vexa::lod_settings(answer);
  return params.empty() ? LIBD_FAILED : LIBD_OK;
}

ELibDReturnCode CVexaCommon::AskObjectDetection(std::vector<SLibDDetectionParam>& params, ELibDPositionMode& mode) {
  std::string answer;
  {
    const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kDetectionTimeout, m_SavedTimeout});
    if (SendInqCommand("objectdetection", answer) != LIBD_OK) return LatestErrorCode();
  }
  ClearCachedObjectDetectionSetting(params);
  mode = vexa::position_mode_of(answer).value_or(mode);
  params = vexa::object_settings(answer, m_FixedPTZControlInfo.presetCount > 0);
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetDetectionParam(SLibDDetectionParam& param) {
  if (!m_LodDetection) {
    int socket = -1;
    if (CheckDetectionParamDetectionArea(param) != LIBD_OK) return LIBD_INVALID_ARGUMENT;
    return SetObjectDetectionParameter(param, socket);
  }
  std::string size;
  if (CheckDetectionParamSensitivity(param) != LIBD_OK) return LIBD_INVALID_ARGUMENT;
  if (ConverObjectWidthValueToString(param, size) != LIBD_OK) return LIBD_INVALID_ARGUMENT;
  return SendCommand("/command/lod.cgi?LODMinObjectSize=%s&LODSensitivity=%d", size.c_str(),
                     param.windows[0].sensitivity);
}

// Safe: as GetObjectDetectionSetting.
ELibDReturnCode CVexaCommon::SetObjectDetectionParameter(SLibDDetectionParam& param, int& socket) try {
  // Safe: a model class may bring areas that nobody has looked at; corners that are not there are not read.
  if (CheckDetectionParamDetectionArea(param) != LIBD_OK) return LIBD_INVALID_ARGUMENT;
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kDetectionTimeout, m_SavedTimeout});
  for (const auto request : {vexa::object_size_request, vexa::first_windows_request, vexa::last_windows_request}) {
    socket = http_open("%s", request(param).c_str());
    if (socket == -1) return LatestErrorCode();
    http_close(socket);
  }
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
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
  // Kept: any mode but preset is the current view; there is no wrong mode.
  const char* word = mode != LIBD_POSITION_PRESET ? "current" : "preset";
  return SendCommand("/command/objectdetection.cgi?PositionMode=%s", word);
}

ELibDReturnCode CVexaCommon::SetTamperingAlarm(bool on, ELibDTamperLevel level) {
  const char* word = vexa::word_of(vexa::kTamperWords, level);
  if (word == nullptr) return LIBD_INVALID_ARGUMENT;
  {
    const vexa::Guard guard(m_ConnectionLock);
    // Kept: the level is stored before the camera is asked, and stays when it refuses.
    m_IoBoxInfo.tamperLevel = level;
  }
  return SendCommand("/command/system.cgi?TamperingFunc=%s&TamperingLevel=%s", on ? "on" : "off", word);
}

ELibDReturnCode CVexaCommon::SetAudioDetection(bool on) {
  if (!m_FixedIoBoxInfo.audioDetection) return LIBD_NOT_SUPPORTED;
  return SendCommand("/command/audiodetection.cgi?ADFunc=%s", on ? "on" : "off");
}

ELibDReturnCode CVexaCommon::SetVMDtype(ELibDVMDType type) {
  if (type != LIBD_VMD_WINDOW && type != LIBD_VMD_VMF) return LIBD_INVALID_ARGUMENT;
  const vexa::Guard guard(m_ConnectionLock);
  m_IoBoxInfo.vmdType = type;
  return LIBD_OK;
}
