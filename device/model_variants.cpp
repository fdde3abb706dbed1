// What the model variants do in their own way: exposure modes, and the output that the picture goes to.
#include <algorithm>
#include <new>
#include <string_view>

#include "device/cgi/image_text.h"
#include "transport/wire/cgi_answer.h"
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

ELibDReturnCode CVexaCommon::BringVideoToNetwork(const std::string& systemAnswer) {
  const auto output = vexa::cgi_value(systemAnswer, "VideoOutMode=");
  if (!output || output->find("ip") != std::string_view::npos) return LIBD_OK;
  return SendCommand("/command/system.cgi?VideoOutMode=ip");
}

// Safe: as CVexaCommon::GetCurrentSystemInfo.
ELibDReturnCode CVexaCommon::ReadSystemBringingVideo(SLibDSystemInfo& info) try {
  std::string answer;
  if (SendInqCommand("system", answer) != LIBD_OK) return LatestErrorCode();
  GetCommonSystemInfo(info, answer);
  const ELibDReturnCode brought = BringVideoToNetwork(answer);
  if (brought != LIBD_OK) return brought;
  if (SendInqCommand("network", answer) != LIBD_OK) return LatestErrorCode();
  return GetCommonNetworkInfo(info, answer);
} catch (const std::bad_alloc&) {
  return FailMemory();
}

ELibDReturnCode CVexaCommon::AskVideoOutMode(ELibVideoOutMode& mode) {
  std::string answer;
  if (SendInqCommand("system", answer) != LIBD_OK) return LatestErrorCode();
  const auto word = vexa::cgi_value(answer, "VideoOutMode=");
  if (!word) return LIBD_FAILED;
  const auto read = vexa::value_of(vexa::kVideoOutWords, *word);
  if (!read) return LIBD_FAILED;
  mode = *read;
  return LIBD_OK;
}

// Safe: as CVexaCommon::GetCurrentSystemInfo.
ELibDReturnCode CVexaHeronCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) try {
  std::string system;
  if (SendInqCommand("system", system) != LIBD_OK) return LatestErrorCode();
  GetCommonSystemInfo(info, system);
  std::string network;
  if (SendInqCommand("network", network) != LIBD_OK) return LatestErrorCode();
  GetCommonNetworkInfo(info, network);
  return BringVideoToNetwork(system);
} catch (const std::bad_alloc&) {
  return FailMemory();
}

ELibDReturnCode CVexaHeronCommon::SetBrightMode(std::string&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CVexaMarlinCommon::SetBrightMode(std::string& mode) {
  constexpr char kRequest[] = "/command/camera.cgi?ExpMode=%s&AutoShutter=%s&AutoSlowShutter=%s";
  if (mode.empty()) return LIBD_INVALID_ARGUMENT;
  // Kept: full automation goes with the manual iris lens: such a camera regulates by its shutter alone.
  if (mode == vexa::kFullAuto) return SendCommand(kRequest, "manualirislens", "on", "on");
  if (mode == vexa::kShutterPriority) return SendCommand(kRequest, "autoirislens", "off", "off");
  return LIBD_FAILED;
}

ELibDReturnCode CVexaSimpleHDCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) {
  return GetCurrentSystemInfo(info, !is_one_of(kSimpleHdOutputModels, m_FixedSystemInfo.modelName));
}

ELibDReturnCode CVexaSimpleHDCommon::GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe) {
  return probe ? ReadSystemBringingVideo(info) : CVexaCommon::GetCurrentSystemInfo(info);
}

ELibDReturnCode CVexaSimpleHDCommon::SetBrightMode(std::string&) { return LIBD_NOT_SUPPORTED; }

ELibDReturnCode CVexaSimpleHDCommon::GetVideoOutMode(ELibVideoOutMode& mode) {
  if (is_one_of(kSimpleHdAskedModels, m_FixedSystemInfo.modelName)) return AskVideoOutMode(mode);
  mode = LIB_VIDEO_OUT_IP;
  return LIBD_OK;
}

ELibDReturnCode CVexaSimplePTZCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) {
  return GetCurrentSystemInfo(info, !is_one_of(kSimplePtzModels, m_FixedSystemInfo.modelName));
}

ELibDReturnCode CVexaSimplePTZCommon::GetCurrentSystemInfo(SLibDSystemInfo& info, bool probe) {
  return probe ? ReadSystemBringingVideo(info) : CVexaCommon::GetCurrentSystemInfo(info);
}

ELibDReturnCode CVexaSimplePTZCommon::GetVideoOutMode(ELibVideoOutMode& mode) {
  if (is_one_of(kSimplePtzModels, m_FixedSystemInfo.modelName)) return AskVideoOutMode(mode);
  mode = LIB_VIDEO_OUT_IP;
  return LIBD_OK;
}
