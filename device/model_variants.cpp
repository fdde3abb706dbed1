// What the model variants do in their own way: exposure modes, and the output that the picture goes to.
#include <algorithm>
#include <string_view>

#include "device/cgi/image_text.h"
#include "device/driver_state.h"
#include "transport/wire/http_answer.h"
#include "vexa/vexa_variants.h"

namespace {

constexpr std::string_view kSimpleHdOutputModels[] = {"LMX-A100", "LMX-A200", "LMX-A201"};
// Kept: one of the three keeps its output without ever being asked for it.
constexpr std::string_view kSimpleHdAskedModels[] = {"LMX-A100", "LMX-A200"};
constexpr std::string_view kSimplePtzModels[] = {"LMX-C100", "LMX-C200"};

template <std::size_t kModels>
bool is_one_of(const std::string_view (&models)[kModels], const std::string& model) {
  return std::find(std::begin(models), std::end(models), model) != std::end(models);
}

}  // namespace

CVexaHeronCommon::~CVexaHeronCommon() = default;
CVexaMarlinCommon::~CVexaMarlinCommon() = default;
CVexaSimpleHDCommon::~CVexaSimpleHDCommon() = default;
CVexaSimplePTZCommon::~CVexaSimplePTZCommon() = default;

namespace vexa {

ELibDReturnCode DriverState::bring_video_to_network(const std::string& system_answer) {
  const auto output = cgi_value(system_answer, "VideoOutMode=");
  if (!output || output->find("ip") != std::string_view::npos) return LIBD_OK;
  return camera.send("/command/system.cgi?VideoOutMode=ip");
}

ELibDReturnCode DriverState::read_system_bringing_video(SLibDSystemInfo& info) {
  return errors.run([&]() -> Outcome {
    std::string answer;
    if (const auto asked = camera.inquire("system", answer); asked != LIBD_OK) return asked;
    driver.GetCommonSystemInfo(info, answer);
    if (const auto brought = bring_video_to_network(answer); brought != LIBD_OK) return brought;
    if (const auto asked = camera.inquire("network", answer); asked != LIBD_OK) return asked;
    return driver.GetCommonNetworkInfo(info, answer);
  });
}

ELibDReturnCode DriverState::ask_video_out_mode(ELibVideoOutMode& mode) {
  return errors.run([&]() -> Outcome {
    std::string answer;
    if (const auto asked = camera.inquire("system", answer); asked != LIBD_OK) return asked;
    const auto word = cgi_value(answer, "VideoOutMode=");
    if (!word) return LIBD_FAILED;
    const auto read = value_of(kVideoOutWords, *word);
    if (!read) return LIBD_FAILED;
    mode = *read;
    return LIBD_OK;
  });
}

}  // namespace vexa

ELibDReturnCode CVexaHeronCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string system;
    if (const auto asked = m_State->camera.inquire("system", system); asked != LIBD_OK) return asked;
    GetCommonSystemInfo(info, system);
    std::string network;
    if (const auto asked = m_State->camera.inquire("network", network); asked != LIBD_OK) return asked;
    GetCommonNetworkInfo(info, network);
    return m_State->bring_video_to_network(system);
  });
}

ELibDReturnCode CVexaHeronCommon::SetBrightMode(std::string&) {
  vexa::Operation operation(*m_State, __func__);
  return operation.returns(LIBD_NOT_SUPPORTED);
}

ELibDReturnCode CVexaMarlinCommon::SetBrightMode(std::string& mode) {
  vexa::Operation operation(*m_State, __func__);
  constexpr char kRequest[] = "/command/camera.cgi?ExpMode=%s&AutoShutter=%s&AutoSlowShutter=%s";
  if (mode.empty()) return operation.returns(LIBD_INVALID_ARGUMENT);
  // Kept: full automation goes with the manual iris lens: such a camera regulates by its shutter alone.
  if (mode == vexa::kFullAuto) return m_State->camera.send(kRequest, "manualirislens", "on", "on");
  if (mode == vexa::kShutterPriority) return m_State->camera.send(kRequest, "autoirislens", "off", "off");
  return operation.returns(LIBD_FAILED);
}

ELibDReturnCode CVexaSimpleHDCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return GetCurrentSystemInfo(info, !is_one_of(kSimpleHdOutputModels, m_FixedSystemInfo.modelName));
}

ELibDReturnCode CVexaSimpleHDCommon::GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe) {
  vexa::Operation operation(*m_State, __func__);
  return probe ? m_State->read_system_bringing_video(info) : CVexaCommon::GetCurrentSystemInfo(info);
}

ELibDReturnCode CVexaSimpleHDCommon::SetBrightMode(std::string&) {
  vexa::Operation operation(*m_State, __func__);
  return operation.returns(LIBD_NOT_SUPPORTED);
}

ELibDReturnCode CVexaSimpleHDCommon::GetVideoOutMode(ELibVideoOutMode& mode) {
  vexa::Operation operation(*m_State, __func__);
  if (is_one_of(kSimpleHdAskedModels, m_FixedSystemInfo.modelName)) return m_State->ask_video_out_mode(mode);
  mode = LIB_VIDEO_OUT_IP;
  return LIBD_OK;
}

ELibDReturnCode CVexaSimplePTZCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return GetCurrentSystemInfo(info, !is_one_of(kSimplePtzModels, m_FixedSystemInfo.modelName));
}

ELibDReturnCode CVexaSimplePTZCommon::GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe) {
  vexa::Operation operation(*m_State, __func__);
  return probe ? m_State->read_system_bringing_video(info) : CVexaCommon::GetCurrentSystemInfo(info);
}

ELibDReturnCode CVexaSimplePTZCommon::GetVideoOutMode(ELibVideoOutMode& mode) {
  vexa::Operation operation(*m_State, __func__);
  if (is_one_of(kSimplePtzModels, m_FixedSystemInfo.modelName)) return m_State->ask_video_out_mode(mode);
  mode = LIB_VIDEO_OUT_IP;
  return LIBD_OK;
}
