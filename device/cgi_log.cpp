#include <cstring>
#include <string>

#include "runtime/base/sync.h"
#include "vexa/real_time.h"
#include "vexa/vexa_common.h"

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

// A line begins with its line break, so that the file ends without one.
void CVexaCommon::Log(const char* direction, const char* message) {
  if (direction == nullptr || message == nullptr) return;
  std::string line = CRealTime::GetTheCurrentTime().Format("\r\n%D-%O-%Y\t%H:%M:%S.%03L\t", false);
  line.append("CGI\t").append(direction).append("\t").append(message);
  m_CGILogger.Log(line.c_str());
}
