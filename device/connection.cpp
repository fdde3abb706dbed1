// The connection settings.
#include <utility>

#include "device/driver_state.h"
#include "runtime/base/sync.h"

ELibDReturnCode CVexaCommon::GetCurrentConnectionInfo(SLibDConnectionInfo& info) {
  return m_State->errors.run([&]() -> vexa::Outcome {
    info = m_State->connection.copy();
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetCurrentConnectionInfo(SLibDConnectionInfo& info) {
  return m_State->errors.run([&]() -> vexa::Outcome {
    SLibDConnectionInfo stored = info;
    const vexa::Guard guard(m_ConnectionLock);
    m_SavedTimeout = stored.timeout;
    m_ConnectionInfo = std::move(stored);
    // Kept: the log is opened on every call, also while logging is off; hosts look for its file.
    m_CGILogger.SetFileName(m_CGILogPath);
    m_CGILogger.OpenFile();
    return LIBD_OK;
  });
}
