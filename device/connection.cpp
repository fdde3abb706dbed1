// How the camera is reached.
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

ELibDReturnCode CVexaCommon::GetCurrentConnectionInfo(SLibDConnectionInfo& info) {
  info = ConnectionInfo();
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetCurrentConnectionInfo(SLibDConnectionInfo& info) {
  const vexa::Guard guard(m_ConnectionLock);
  m_ConnectionInfo = info;
  // Kept: the log is opened on every call, also while logging is off; hosts look for its file.
  m_CGILogger.SetFileName(m_CGILogPath);
  m_CGILogger.OpenFile();
  m_SavedTimeout = info.timeout;
  return LIBD_OK;
}
