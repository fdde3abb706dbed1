// CVexaCommon: collecting the packets of the next picture.
#include <algorithm>
#include <chrono>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/wait_budget.h"
#include "transport/wire/rtp_header.h"
#include "vexa/runtime.h"
#include "vexa/vexa_common.h"

namespace {

using Clock = std::chrono::steady_clock;

/// What has arrived is read for at least as long, whatever the time-out.
constexpr std::chrono::milliseconds kLeastReading{100};

int milliseconds_until(Clock::time_point moment) {
  return static_cast<int>(std::chrono::ceil<std::chrono::milliseconds>(moment - Clock::now()).count());
}

}  // namespace

ELibDReturnCode CVexaCommon::CollectPicture(vexa::PacketRunPlace& run) {
  vexa::PacketCollector& collector = m_State->rtp->collector;
  const int timeout = ConnectionTimeout();
  const auto give_up = Clock::now() + std::max(std::chrono::milliseconds(timeout), kLeastReading);
  for (;;) {
    const auto now = Clock::now();
    if (const auto next = collector.next_picture(now)) {
      run = *next;
      return LIBD_OK;
    }
    // Packets that never make a picture must not keep the thread from its keep-alive and its stop.
    if (now > give_up || IsStopRequested()) return NothingYet();
    const auto deadline = collector.deadline();
    const int until_look = deadline ? milliseconds_until(*deadline) : timeout;
    // A look at what stands complete falls due before the read would time out: that is no silence of the camera's.
    if (until_look < timeout && !PacketWaits(until_look)) continue;
    if (ReceivePacket(timeout) >= 0) continue;
    const ELibDReturnCode failure = LatestErrorCode();
    return failure == LIBD_TIMEOUT || IsStopRequested() ? NothingYet() : failure;
  }
}

// Also true when the read would fail at once.
bool CVexaCommon::PacketWaits(int timeout) {
  int stop = -1;
  eventFd(m_StopVideoEvent, stop);
  return vexa::WaitBudget(timeout).wait_readable_unless(m_StreamSocket, stop) != 0;
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
  if (packet.length < vexa::kRtpHeaderSize || !rtp.takes(packet)) return length;
  // Its bytes are its own before it is listed: should memory run out in between, it is lost like one on the wire.
  rtp.ring.keep(packet);
  if (!rtp.collector.add(packet, m_RtpClockRate, Clock::now())) rtp.ring.take_back();
  return length;
}

ELibDReturnCode CVexaCommon::NothingYet() {
  return m_State->now() - m_LastFrameTime > ConnectionTimeout() / 1000 ? LIBD_TIMEOUT : LIBD_NO_FRAME;
}

bool CVexaCommon::IsStopRequested() {
  const vexa::Guard guard(m_VideoStateLock);
  return m_StopVideoRequested;
}
