// Exposure and image controls. Setters send one request; getters read the cached answer of the camera inquiry.

#include "device/cgi/image_text.h"
#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "transport/wire/http_answer.h"

namespace {

constexpr unsigned kLargestLevel = 10000;
constexpr int kLargestStep = 10000;

// Kept: keys are searched with the "&" before them, so one that begins the answer is not found; cameras begin theirs
// with the video settings.
/// Reads the word of `key`; the value stays when the answer lacks the key or the word is not known.
template <typename Value, std::size_t kRows>
ELibDReturnCode read_word(const std::string& answer, const char* key, const vexa::Word<Value> (&table)[kRows],
                          Value& value) {
  const auto word = vexa::cgi_value(answer, key);
  if (!word) return LIBD_FAILED;
  const std::optional<Value> read = vexa::value_of(table, *word);
  if (!read) return LIBD_FAILED;
  value = *read;
  return LIBD_OK;
}

bool read_number(const std::string& answer, const char* key, int& value) {
  const auto text = vexa::cgi_value(answer, key);
  if (!text) return false;
  value = vexa::leading_int(std::string(*text));
  return true;
}

/// Takes an entry's place for a caller that counts without a sign; false when there is no such entry.
bool take_entry(int found, unsigned& entry) {
  if (found < 0) return false;
  entry = static_cast<unsigned>(found);
  return true;
}

bool step_along(const vexa::ExposureSteps& steps, int step, int& value) {
  const std::optional<int> next = vexa::next_exposure_value(steps, value, step);
  if (!next) return false;
  value = *next;
  return true;
}

}  // namespace

ELibDReturnCode CVexaCommon::SetBrightMode(std::string& mode) {
  vexa::Operation operation(*m_State, __func__);
  if (mode.empty()) return operation.returns(LIBD_INVALID_ARGUMENT);
  const char* word = vexa::exposure_word_of(mode);
  if (word == nullptr) return operation.returns(LIBD_FAILED);
  // Kept: the stored mode stays; the host stores it with SetPTZControlInfo once the camera has taken it.
  return m_State->camera.send("/command/camera.cgi?ExpMode=%s", word);
}

ELibDReturnCode CVexaCommon::SetBackLightCompMode(bool on) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.send("/command/camera.cgi?BLComp=%s", on ? "on" : "off");
}

ELibDReturnCode CVexaCommon::Bright(int step) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    const ELibDReturnCode amount = CheckAmountOfBrightness(step);
    if (amount != LIBD_OK) return amount;
    const ELibDReturnCode mode = CheckCurrentBrightMode();
    if (mode != LIBD_OK) return mode;
    std::string answer;
    // Kept: what the camera says here does not enter the cache; the getters' values stay those of one moment.
    if (const auto asked = m_State->camera.inquire("camera", answer); asked != LIBD_OK) return asked;
    int value = 0;
    unsigned entry = 0;
    // Another thread may have stored a mode without a control while the camera answered.
    const auto control = vexa::exposure_control_of(m_State->bright_mode());
    if (!control) return LIBD_INVALID_MODE;
    if (*control == vexa::ExposureControl::kShutter) {
      const bool moves = GetShutterSpeedFromCameraData(answer, value, entry) &&
                         GetShutterSpeedFromShutterSpeedList(step, value, entry);
      return moves ? m_State->camera.send("/command/camera.cgi?Shutter=%d", value) : LIBD_OK;
    }
    const bool moves =
        GetIrisPositionFromCameraData(answer, value, entry) && GetIrisPositionFromIrisList(step, value, entry);
    return moves ? m_State->camera.send("/command/camera.cgi?Iris=%d", value) : LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::CheckAmountOfBrightness(int step) {
  return step == 0 || step < -kLargestStep || step > kLargestStep ? LIBD_INVALID_ARGUMENT : LIBD_OK;
}

ELibDReturnCode CVexaCommon::CheckCurrentBrightMode() {
  return vexa::exposure_control_of(m_State->bright_mode()) ? LIBD_OK : LIBD_INVALID_MODE;
}

void CVexaCommon::GetShutterAndIrisMode(int& shutterEntry, int& irisEntry) {
  shutterEntry = vexa::exposure_entry(m_FixedPTZControlInfo.brightModes, vexa::kShutterPriority);
  irisEntry = vexa::exposure_entry(m_FixedPTZControlInfo.brightModes, vexa::kIrisPriority);
}

bool CVexaCommon::GetShutterSpeedFromCameraData(const std::string& answer, int& value, unsigned& entry) {
  int shutter_entry = -1;
  int iris_entry = -1;
  GetShutterAndIrisMode(shutter_entry, iris_entry);
  return read_number(answer, "&Shutter=", value) && take_entry(shutter_entry, entry);
}

bool CVexaCommon::GetIrisPositionFromCameraData(std::string& answer, int& value, unsigned& entry) {
  int shutter_entry = -1;
  int iris_entry = -1;
  GetShutterAndIrisMode(shutter_entry, iris_entry);
  return read_number(answer, "&Iris=", value) && take_entry(iris_entry, entry);
}

bool CVexaCommon::GetShutterSpeedFromShutterSpeedList(int step, int& value, unsigned entry) {
  const vexa::ExposureModes& modes = m_FixedPTZControlInfo.brightModes;
  return entry < modes.size() && step_along(modes[entry].shutterSpeeds, step, value);
}

bool CVexaCommon::GetIrisPositionFromIrisList(int step, int& value, unsigned entry) {
  const vexa::ExposureModes& modes = m_FixedPTZControlInfo.brightModes;
  return entry < modes.size() && step_along(modes[entry].irisPositions, step, value);
}

ELibDReturnCode CVexaCommon::BrightAbsolute(int level) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (static_cast<unsigned>(level) > kLargestLevel) return LIBD_INVALID_ARGUMENT;
    const std::string mode = m_State->bright_mode();
    const auto control = vexa::exposure_control_of(mode);
    if (!control) return LIBD_INVALID_MODE;
    const vexa::ExposureModes& modes = m_FixedPTZControlInfo.brightModes;
    unsigned entry = 0;
    if (!take_entry(vexa::exposure_entry(modes, mode), entry)) return LIBD_OK;
    const bool shutter = *control == vexa::ExposureControl::kShutter;
    const vexa::ExposureSteps& steps = shutter ? modes[entry].shutterSpeeds : modes[entry].irisPositions;
    // Safe: a list without steps has no largest value to read.
    if (steps.empty()) return LIBD_OK;
    const int value = vexa::exposure_value(level, steps.back().value);
    return shutter ? m_State->camera.send("/command/camera.cgi?Shutter=%d", value)
                   : m_State->camera.send("/command/camera.cgi?Iris=%d", value);
  });
}

namespace vexa {

// Asks the camera only when no answer is cached.
ELibDReturnCode DriverState::camera_inquiry(std::string& answer) {
  {
    const Guard guard(driver.m_CameraInquiryLock);
    answer = driver.m_CameraInquiryCache;
  }
  if (!answer.empty()) return LIBD_OK;
  if (const auto asked = camera.inquire("camera", answer); asked != LIBD_OK) return asked;
  store_camera_inquiry(answer);
  return LIBD_OK;
}

// Kept: the cached answer outlives the change, so getters return the value before it until GetCameraInfo asks anew. The
// lock is only waited for: a getter that is storing an answer finishes first.
ELibDReturnCode DriverState::after_image_change(ELibDReturnCode sent) {
  if (sent != LIBD_OK) return sent;
  const Guard guard(driver.m_CameraInquiryLock);
  return LIBD_OK;
}

}  // namespace vexa

ELibDReturnCode CVexaCommon::GetDayNightMode(ELibDDayNightType& mode) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera_inquiry(answer); asked != LIBD_OK) return asked;
    const auto read = vexa::day_night_of(answer);
    if (!read) return LIBD_FAILED;
    mode = *read;
    return mode == LIBD_DAYNIGHT_UNKNOWN ? LIBD_FAILED : LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetDayNightMode(ELibDDayNightType mode) {
  vexa::Operation operation(*m_State, __func__);
  const char* request = vexa::word_of(vexa::kDayNightRequests, mode);
  if (request == nullptr) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->camera.send("/command/camera.cgi?DayNightMode=%s", request);
}

ELibDReturnCode CVexaCommon::GetVisibilityEnhancerMode(ELibDVisibilityEnhancerType& mode) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera_inquiry(answer); asked != LIBD_OK) return asked;
    return read_word(answer, "&VisibilityEnhancer=", vexa::kVisibilityWords, mode);
  });
}

ELibDReturnCode CVexaCommon::SetVisibilityEnhancerMode(ELibDVisibilityEnhancerType mode) {
  vexa::Operation operation(*m_State, __func__);
  const char* word = vexa::word_of(vexa::kVisibilityWords, mode);
  if (word == nullptr) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->after_image_change(m_State->camera.send("/command/camera.cgi?VisibilityEnhancer=%s", word));
}

ELibDReturnCode CVexaCommon::GetXdnrMode(ELibDXdnrType& mode) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera_inquiry(answer); asked != LIBD_OK) return asked;
    return read_word(answer, "&XDNR=", vexa::kXdnrWords, mode);
  });
}

ELibDReturnCode CVexaCommon::SetXdnrMode(ELibDXdnrType mode) {
  vexa::Operation operation(*m_State, __func__);
  const char* word = vexa::word_of(vexa::kXdnrWords, mode);
  if (word == nullptr) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->after_image_change(m_State->camera.send("/command/camera.cgi?XDNR=%s", word));
}

ELibDReturnCode CVexaCommon::GetViewDR(ELibDViewDRMode& mode) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera_inquiry(answer); asked != LIBD_OK) return asked;
    return read_word(answer, "&ViewDR=", vexa::kViewDrWords, mode);
  });
}

ELibDReturnCode CVexaCommon::SetViewDR(ELibDViewDRMode mode) {
  vexa::Operation operation(*m_State, __func__);
  const char* word = vexa::word_of(vexa::kViewDrWords, mode);
  if (word == nullptr) return operation.returns(LIBD_INVALID_ARGUMENT);
  return m_State->after_image_change(m_State->camera.send("/command/camera.cgi?ViewDR=%s", word));
}

ELibDReturnCode CVexaCommon::GetIRIlluminator(ELibIRIlluminatorMode& mode, int& strength) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera_inquiry(answer); asked != LIBD_OK) return asked;
    if (read_word(answer, "&IRLed=", vexa::kIlluminatorWords, mode) != LIBD_OK) return LIBD_FAILED;
    return read_number(answer, "&IRLedMaxStrength=", strength) ? LIBD_OK : LIBD_FAILED;
  });
}

// Kept: any mode that is not day/night switches the illuminator off; there is no wrong mode.
ELibDReturnCode CVexaCommon::SetIRIlluminator(ELibIRIlluminatorMode mode, int strength) {
  vexa::Operation operation(*m_State, __func__);
  const char* word = mode == LIB_IR_DAYNIGHT ? "daynight" : "off";
  return m_State->after_image_change(
      m_State->camera.send("/command/camera.cgi?IRLed=%s&IRLedMaxStrength=%d", word, strength));
}
