// CVexaCommon: collecting the packets of the next picture.
#include <algorithm>
#include <chrono>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/wire/rtp_header.h"
#include "vexa/vexa_common.h"

namespace {

using Clock = std::chrono::steady_clock;

int milliseconds_until(Clock::time_point moment) {
  return static_cast<int>(std::chrono::ceil<std::chrono::milliseconds>(moment - Clock::now()).count());
}

}  // namespace

ELibDReturnCode CVexaCommon::CollectPicture(vexa::PacketRunPlace& run) {
  vexa::PacketCollector& collector = m_State->rtp->collector;
  const int timeout = ConnectionTimeout();
  const auto give_up = Clock::now() + std::chrono::milliseconds(timeout);
  for (;;) {
    const auto now = Clock::now();
    if (const auto next = collector.next_picture(now)) {
      run = *next;
      return LIBD_OK;
    }
    // Packets that never make a picture must not keep the thread from its keep-alive and its stop.
    if (now > give_up || IsStopRequested()) return NothingYet();
    const auto deadline = collector.deadline();
    const int wait = deadline ? std::min(timeout, milliseconds_until(*deadline)) : timeout;
    if (ReceivePacket(wait) >= 0) continue;
    if (LatestErrorCode() != LIBD_TIMEOUT) return LatestErrorCode();
    if (!deadline) return NothingYet();
  }
}

int CVexaCommon::ReceivePacket(int timeout) {
  vexa::RtpReception& rtp = *m_State->rtp;
  if (rtp.collector.is_empty()) rtp.ring.restart();
  unsigned char* place = m_RtpPacketBuffer + rtp.ring.next_offset();
  SPacketInfo packet;
  const int length = rtp_over_udp_payload_recv_h264(m_StreamSocket, reinterpret_cast<char*>(place),
                                                    vexa::PacketRing::kDatagramRoom, timeout, packet);
  if (length < 0) return length;
  rtp.overwritten.clear();
  rtp.ring.written(static_cast<std::uint32_t>(length), rtp.overwritten);
  if (!rtp.overwritten.empty()) rtp.collector.drop_overwritten(rtp.overwritten);
  if (packet.length >= vexa::kRtpHeaderSize && rtp.takes(packet) &&
      rtp.collector.add(packet, m_RtpClockRate, Clock::now())) {
    rtp.ring.keep(packet);
  }
  return length;
}

ELibDReturnCode CVexaCommon::NothingYet() {
  return m_State->now() - m_LastFrameTime > ConnectionTimeout() / 1000 ? LIBD_TIMEOUT : LIBD_NO_FRAME;
}

bool CVexaCommon::IsStopRequested() {
  const vexa::Guard guard(m_VideoStateLock);
  return m_StopVideoRequested;
}
