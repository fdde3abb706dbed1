// Motion metadata: the polled stream of detection values.
#include "device/cgi/metadata_frame.h"
#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kMetadataRoom = 65;  // bytes: a part and its terminator

}  // namespace

ELibDReturnCode CVexaCommon::StartModRawData() {
  StopModRawData();
  const vexa::TurnGuard guard(m_MdStreamLock, m_State->md_turn);
  // Safe: what a start in another thread has opened meanwhile is not lost open.
  if (m_MdStreamSocket != -1) http_close(m_MdStreamSocket);
  m_MdStreamSocket = http_open("/mddata.cgi");
  if (m_MdStreamSocket == -1) return LatestErrorCode();
  m_LastMdDataTime = m_State->now();
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetCurrentPosition(SLibDRawMDFrameInfo& frame) {
  const vexa::TurnGuard guard(m_MdStreamLock, m_State->md_turn);
  if (m_MdStreamSocket == -1) return LIBD_FAILED;
  char body[kMetadataRoom];
  const int read = http_multipart_mddata_recv(m_MdStreamSocket, body, kMetadataRoom, ConnectionTimeout());
  if (read < 0) return LatestErrorCode();
  const std::time_t now = m_State->now();
  if (read == 0) {
    return vexa::metadata_stream_is_silent(now, m_LastMdDataTime, ConnectionTimeout()) ? LIBD_TIMEOUT : LIBD_NO_FRAME;
  }
  vexa::take_metadata({body, static_cast<std::size_t>(read)}, frame);
  m_LastMdDataTime = now;
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::StopModRawData() {
  const vexa::TurnGuard guard(m_MdStreamLock, m_State->md_turn);
  if (m_MdStreamSocket != -1) http_close(m_MdStreamSocket);
  m_MdStreamSocket = -1;
  return LIBD_OK;
}
