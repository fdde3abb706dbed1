// The switches of the CGI log.
#include <cstring>

#include "device/driver_state.h"

// The file is opened by the next SetCurrentConnectionInfo.
ELibDReturnCode CVexaCommon::SetCGILogPath(const char* path) {
  if (path == nullptr) return LIBD_OK;
  const vexa::Guard guard(m_ConnectionLock);
  std::strncpy(m_CGILogPath, path, sizeof m_CGILogPath);
  m_CGILogPath[sizeof m_CGILogPath - 1] = '\0';
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetCGILogLevel(bool on) {
  m_CGILogEnabled = on;
  return LIBD_OK;
}

void CVexaCommon::Log(const char* direction, const char* message) {
  if (direction == nullptr || message == nullptr) return;
  m_State->log.write(direction, message);
}
