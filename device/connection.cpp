// How the camera is reached.
#include <cerrno>
#include <new>
#include <utility>

#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

// Safe: here and below, a record that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetCurrentConnectionInfo(SLibDConnectionInfo& info) try {
  info = ConnectionInfo();
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::SetCurrentConnectionInfo(SLibDConnectionInfo& info) try {
  SLibDConnectionInfo stored = info;
  const vexa::Guard guard(m_ConnectionLock);
  m_SavedTimeout = stored.timeout;
  m_ConnectionInfo = std::move(stored);
  // Kept: the log is opened on every call, also while logging is off; hosts look for its file.
  m_CGILogger.SetFileName(m_CGILogPath);
  m_CGILogger.OpenFile();
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}
