// What the camera says it is.
#include <cerrno>
#include <new>

#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "transport/wire/cgi_answer.h"
#include "vexa/vexa_common.h"

namespace {

constexpr const char* kMaker = "Vexa Corporation";

/// A missing key leaves the text as it is.
void take_value(std::string_view answer, std::string_view key, std::string& text) {
  if (const auto value = vexa::cgi_value(answer, key)) text = *value;
}

}  // namespace

// Safe: here and below, what memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetFixedSystemInfo(SLibDFixedSystemInfo& info) try {
  info = m_FixedSystemInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetFixedConnectionInfo(SLibDFixedConnectionInfo& info) try {
  info = m_FixedConnectionInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) try {
  std::string answer;
  if (SendInqCommand("system", answer) != LIBD_OK) return LatestErrorCode();
  GetCommonSystemInfo(info, answer);
  if (SendInqCommand("network", answer) != LIBD_OK) return LatestErrorCode();
  return GetCommonNetworkInfo(info, answer);
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetCommonSystemInfo(SLibDSystemInfo& info, const std::string& answer) {
  info.maker = kMaker;
  take_value(answer, "ModelName=", info.modelName);
  take_value(answer, "SoftVersion=", info.softwareVersion);
  take_value(answer, "Serial=", info.serialNumber);
  const vexa::Guard guard(m_ConnectionLock);
  if (const auto value = vexa::cgi_value(answer, "ContinuousPanTiltZoomFunc=")) m_ContinuousPTZ = *value == "1";
  if (const auto value = vexa::cgi_value(answer, "ChannelId=")) m_ChannelId = vexa::leading_int(std::string(*value));
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetCommonNetworkInfo(SLibDSystemInfo& info, const std::string& answer) {
  take_value(answer, "MacAddress=", info.macAddress);
  return LIBD_OK;
}
