// Recordings on the camera's card.
#include "runtime/base/calendar.h"
#include "vexa/vexa_common.h"

bool CVexaCommon::InitEdgeStorageKeepAlivePeriod() {
  if (SendCommand("/command/camera.cgi?RTSPTimeout=60") != LIBD_OK) return false;
  if (SendCommand("/command/edgestorage.cgi?EsRTSPRec1Timeout=60") != LIBD_OK) return false;
  std::string answer;
  if (SendInqCommand("edgestorage", answer) != LIBD_OK) return false;
  int period = 0;
  if (GetUrlParameter(answer, "EsRTSPRec1Timeout=", period) && period != 0) m_KeepAlivePeriod = period;
  return true;
}

std::int64_t CVexaCommon::_ld_mkgmtime(std::tm* time) { return vexa::utc_seconds(*time); }

bool CVexaCommon::_ld_is_leap_year(int year) { return vexa::is_leap_year(year); }
