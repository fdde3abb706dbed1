// What the camera says it is.

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "runtime/base/undo.h"
#include "transport/wire/http_answer.h"

namespace {

constexpr const char* kMaker = "Vexa Corporation";

/// A missing key leaves the text as it is.
void take_value(std::string_view answer, std::string_view key, std::string& text) {
  if (const auto value = vexa::cgi_value(answer, key)) text = *value;
}

}  // namespace

ELibDReturnCode CVexaCommon::GetFixedSystemInfo(SLibDFixedSystemInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    vexa::put_whole(info, m_FixedSystemInfo);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::GetFixedConnectionInfo(SLibDFixedConnectionInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    vexa::put_whole(info, m_FixedConnectionInfo);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::GetCurrentSystemInfo(SLibDSystemInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    if (const auto asked = m_State->camera.inquire("system", answer); asked != LIBD_OK) return asked;
    GetCommonSystemInfo(info, answer);
    if (const auto asked = m_State->camera.inquire("network", answer); asked != LIBD_OK) return asked;
    return GetCommonNetworkInfo(info, answer);
  });
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
