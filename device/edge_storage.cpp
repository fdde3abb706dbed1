// Recordings on the camera's card.
#include <cerrno>
#include <new>
#include <utility>

#include "device/cgi/storage_text.h"
#include "device/raised_timeout.h"
#include "runtime/base/calendar.h"
#include "runtime/base/sync.h"
#include "transport/socket.h"
#include "transport/wire/http_request.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kListTimeout = 10000;        // milliseconds
constexpr int kDeleteTimeout = 10000;      // milliseconds
constexpr int kDeleteAllTimeout = 20000;   // milliseconds
constexpr const char* kNextCommand = "&";  // what separates the commands of a request

}  // namespace

// Safe: a mode that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::GetEdgeStorageMode(SLibDEdgeStorageMode& mode) try {
  if (!m_EdgeStorageSupported) return LIBD_NOT_SUPPORTED;
  const vexa::Guard guard(m_ConnectionLock);
  mode = m_EdgeStorageMode;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::SetEdgeStorageMode(const SLibDEdgeStorageMode& mode) try {
  if (!m_EdgeStorageSupported) return LIBD_NOT_SUPPORTED;
  SLibDEdgeStorageMode stored = mode;
  // Safe: an address with blanks, line ends or "&" adds neither a header nor another command.
  const std::string address = vexa::as_one_word(mode.watchAddress, kNextCommand);
  // Kept: whatever the reason, a camera that does not take the mode is told as a time-out.
  if (SendCommand("/command/edgestorage.cgi?Edgestorage=%s&EsOverWrite=off&EsRec1=image%d,off&EsAlmRec1Time=%d,%d"
                  "&EsRec1Mode=alarm&EsAlmRec1WatchAddress=%s&EsAlmRec1Trigger=disconnected&EsRec1Period=always",
                  mode.enabled ? "on" : "off", mode.imageNumber, mode.imageNumber == 1 ? mode.alarmTime1 : 0,
                  mode.alarmTime2, address.c_str()) != LIBD_OK) {
    return LIBD_TIMEOUT;
  }
  const bool enable = stored.enabled;
  {
    const vexa::Guard guard(m_ConnectionLock);
    std::swap(m_EdgeStorageMode, stored);
  }
  if (!enable || stored.enabled) return LIBD_OK;
  // Kept: a card that cannot be asked for its space counts as one with room.
  const ELibDReturnCode result = CheckEdgeStorageFreeSize() == 0 ? LIBD_NO_FRAME : LIBD_OK;
  SendCommand("/command/camera.cgi?RTPUserData=on");
  return result;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);  // before anything was sent
  return LIBD_TIMEOUT;
}

// Safe: an answer that memory does not hold is a failure and not an exception; the list stays.
ELibDReturnCode CVexaCommon::GetEdgeStorageRecordList(SLibDEdgeStorageRecordList& list) try {
  std::string answer;
  {
    const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kListTimeout, m_SavedTimeout});
    const vexa::Socket socket(http_open("/command/search?Order=oldest"));
    if (!socket.valid()) return LatestErrorCode();
    if (http_recvn(socket.get(), answer, 0, ConnectionTimeout()) < 0) return LatestErrorCode();
  }
  list.records = vexa::read_recordings(answer);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::DeleteAllEdgeStorageRecord() {
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kDeleteAllTimeout, m_SavedTimeout});
  return SendCommand("/command/edgestorage.cgi?delete=all");
}

// Safe: a name that memory does not hold is a failure and not an exception.
ELibDReturnCode CVexaCommon::DeleteEdgeStorageRecordByName(const SLibDEdgeStorageStreamingInfo& info) try {
  if (info.streamName.empty()) return LIBD_FAILED;
  // Safe: a name with blanks, line ends or "&" adds neither a header nor another command, such as "delete=all".
  const std::string name = vexa::as_one_word(info.streamName, kNextCommand);
  const vexa::RaisedTimeout slow(m_ConnectionInfo.timeout, m_ConnectionLock, {kDeleteTimeout, m_SavedTimeout});
  return SendCommand("/command/edgestorage.cgi?DeletebyName=%s", name.c_str());
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::SetEdgeStorageNoTearDown(bool noTearDown) {
  if (!m_EdgeStorageSupported) return LIBD_NOT_SUPPORTED;
  const vexa::Guard guard(m_VideoStateLock);
  m_NoTearDown = noTearDown;
  return LIBD_OK;
}

bool CVexaCommon::InitEdgeStorageKeepAlivePeriod() {
  if (SendCommand("/command/camera.cgi?RTSPTimeout=60") != LIBD_OK) return false;
  if (SendCommand("/command/edgestorage.cgi?EsRTSPRec1Timeout=60") != LIBD_OK) return false;
  std::string answer;
  if (SendInqCommand("edgestorage", answer) != LIBD_OK) return false;
  int period = 0;
  if (GetUrlParameter(answer, "EsRTSPRec1Timeout=", period) && period != 0) m_KeepAlivePeriod = period;
  return true;
}

// Safe: a size that memory does not hold is a failed inquiry and not an exception.
int CVexaCommon::CheckEdgeStorageFreeSize() try {
  std::string answer;
  return SendInqCommand("a-slot", answer) == LIBD_OK ? vexa::free_kilobytes(answer) : -1;
} catch (const std::bad_alloc&) {
  FailSystem(ENOMEM);
  return -1;
}

std::int64_t CVexaCommon::_ld_mkgmtime(std::tm* time) { return vexa::utc_seconds(*time); }

bool CVexaCommon::_ld_is_leap_year(int year) { return vexa::is_leap_year(year); }
