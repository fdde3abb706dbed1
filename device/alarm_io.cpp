// Alarm pins.
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

ELibDReturnCode CVexaCommon::StopIoStreaming() {
  {
    const vexa::Guard guard(m_IoStreamLock);
    m_PendingPins.clear();
    if (m_IoStreamSocket == -1) return LIBD_OK;
    http_close(m_IoStreamSocket);
    m_IoStreamSocket = -1;
  }
  return SendCommand("/command/system.cgi?AlarmData=off");
}
