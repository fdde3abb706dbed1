// SPDX-License-Identifier: Apache-2.0
// The connection settings, and the switches of the CGI log.
#include <cstring>
#include <utility>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "runtime/base/wipe.h"

ELibDReturnCode CVexaCommon::GetCurrentConnectionInfo(SLibDConnectionInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    info = m_State->connection.copy();
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetCurrentConnectionInfo(SLibDConnectionInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    vexa::PrivateConnection stored = info;
    const vexa::Guard guard(m_ConnectionLock);
    m_SavedTimeout = stored.timeout;
    vexa::wipe(m_ConnectionInfo.password);
    m_ConnectionInfo = std::move(stored);
    // A log that cannot be opened is no failure.
    // Kept: the log is opened on every call, also while logging is off; hosts look for its file.
    m_CGILogger.SetFileName(m_CGILogPath);
    m_CGILogger.OpenFile();
    return LIBD_OK;
  });
}

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
  m_State->log.enter(direction, message);
}
