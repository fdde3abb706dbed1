// Recordings on the camera's card.
#include <utility>

#include "device/cgi/storage_text.h"
#include "device/driver_state.h"
#include "runtime/base/calendar.h"
#include "runtime/base/sync.h"
#include "runtime/base/undo.h"
#include "transport/http_receive.h"
#include "transport/wire/http_request.h"

namespace {

constexpr int kListTimeout = 10000;        // milliseconds
constexpr int kDeleteTimeout = 10000;      // milliseconds
constexpr int kDeleteAllTimeout = 20000;   // milliseconds
constexpr const char* kNextCommand = "&";  // what separates the commands of a request

}  // namespace

ELibDReturnCode CVexaCommon::GetEdgeStorageMode(SLibDEdgeStorageMode& mode) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (!m_EdgeStorageSupported) return LIBD_NOT_SUPPORTED;
    const vexa::Guard guard(m_ConnectionLock);
    vexa::put_whole(mode, m_EdgeStorageMode);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetEdgeStorageMode(const SLibDEdgeStorageMode& mode) {
  vexa::Operation operation(*m_State, __func__);
  if (!m_EdgeStorageSupported) return operation.returns(LIBD_NOT_SUPPORTED);
  SLibDEdgeStorageMode stored;
  const ELibDReturnCode sent = m_State->errors.run([&]() -> vexa::Outcome {
    stored = mode;
    // Safe: an address with blanks, line ends or "&" adds neither a header nor another command.
    const std::string address = vexa::as_one_word(mode.watchAddress, kNextCommand);
    return m_State->camera.send(
        "/command/edgestorage.cgi?Edgestorage=%s&EsOverWrite=off&EsRec1=image%d,off&EsAlmRec1Time=%d,%d"
        "&EsRec1Mode=alarm&EsAlmRec1WatchAddress=%s&EsAlmRec1Trigger=disconnected&EsRec1Period=always",
        mode.enabled ? "on" : "off", mode.imageNumber, mode.imageNumber == 1 ? mode.alarmTime1 : 0, mode.alarmTime2,
        address.c_str());
  });
  // Kept: whatever the reason, a mode that the camera does not take is a time-out.
  if (sent != LIBD_OK) return operation.returns(LIBD_TIMEOUT);
  bool was_enabled = false;
  {
    const vexa::Guard guard(m_ConnectionLock);
    was_enabled = m_EdgeStorageMode.enabled;
    std::swap(m_EdgeStorageMode, stored);
  }
  if (!mode.enabled || was_enabled) return LIBD_OK;
  // Kept: a card that cannot be asked for its space counts as one with room.
  const ELibDReturnCode result = CheckEdgeStorageFreeSize() == 0 ? LIBD_NO_FRAME : LIBD_OK;
  m_State->camera.send("/command/camera.cgi?RTPUserData=on");
  return result;
}

ELibDReturnCode CVexaCommon::GetEdgeStorageRecordList(SLibDEdgeStorageRecordList& list) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    std::string answer;
    {
      const vexa::RaisedTimeout slow = m_State->connection.raised(kListTimeout);
      const auto socket = m_State->camera.open("/command/search?Order=oldest");
      if (!socket) return socket.failure();
      const auto received = vexa::receive_text(socket->get(), answer, 0, m_State->limit());
      if (!received) return received.failure();
    }
    list.records = vexa::read_recordings(answer);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::DeleteAllEdgeStorageRecord() {
  vexa::Operation operation(*m_State, __func__);
  const vexa::RaisedTimeout slow = m_State->connection.raised(kDeleteAllTimeout);
  return m_State->camera.send("/command/edgestorage.cgi?delete=all");
}

ELibDReturnCode CVexaCommon::DeleteEdgeStorageRecordByName(const SLibDEdgeStorageStreamingInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    if (info.streamName.empty()) return LIBD_FAILED;
    // Safe: a name with blanks, line ends or "&" adds neither a header nor another command, such as "delete=all".
    const std::string name = vexa::as_one_word(info.streamName, kNextCommand);
    const vexa::RaisedTimeout slow = m_State->connection.raised(kDeleteTimeout);
    return m_State->camera.send("/command/edgestorage.cgi?DeletebyName=%s", name.c_str());
  });
}

ELibDReturnCode CVexaCommon::SetEdgeStorageNoTearDown(bool noTearDown) {
  vexa::Operation operation(*m_State, __func__);
  if (!m_EdgeStorageSupported) return operation.returns(LIBD_NOT_SUPPORTED);
  const vexa::Guard guard(m_VideoStateLock);
  m_NoTearDown = noTearDown;
  return LIBD_OK;
}

int CVexaCommon::CheckEdgeStorageFreeSize() {
  return m_State->errors.run([&]() -> vexa::Result<int> {
    std::string answer;
    return m_State->camera.inquire("a-slot", answer) == LIBD_OK ? vexa::free_kilobytes(answer) : -1;
  });
}

std::int64_t CVexaCommon::_ld_mkgmtime(std::tm* time) { return vexa::utc_seconds(*time); }

bool CVexaCommon::_ld_is_leap_year(int year) { return vexa::is_leap_year(year); }
