// Motion metadata: the polled stream of detection values.
#include "device/cgi/input_part.h"
#include "device/driver_state.h"
#include "transport/http_stream.h"

namespace {

constexpr int kMetadataRoom = 65;  // bytes: a part and its terminator

}  // namespace

ELibDReturnCode CVexaCommon::StartModRawData() {
  vexa::Operation operation(*m_State, __func__);
  StopModRawData();
  return m_State->errors.run([&] {
    return m_State->metadata.start([&] { return m_State->camera.open("/mddata.cgi"); }, m_State->now,
                                   m_State->connection.timeout());
  });
}

ELibDReturnCode CVexaCommon::GetCurrentPosition(SLibDRawMDFrameInfo& frame) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&] {
    const int timeout = m_State->connection.timeout();
    const auto read = [&](int socket) {
      char body[kMetadataRoom];
      m_State->errors.clear();
      const auto received = vexa::receive_metadata_part(socket, body, m_State->limit(timeout));
      if (received && *received > 0) vexa::take_metadata({body, static_cast<std::size_t>(*received)}, frame);
      return received;
    };
    return m_State->metadata.poll(read, m_State->now, timeout);
  });
}

ELibDReturnCode CVexaCommon::StopModRawData() {
  m_State->metadata.stop();
  return LIBD_OK;
}
