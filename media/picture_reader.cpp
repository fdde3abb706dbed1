#include "media/picture_reader.h"

#include <algorithm>
#include <chrono>
#include <utility>

#include "runtime/base/deadline.h"
#include "transport/http_stream.h"
#include "transport/rtp_socket.h"
#include "transport/wait_budget.h"
#include "transport/wire/rtp_header.h"

namespace vexa {
namespace {

using Clock = std::chrono::steady_clock;

/// What has arrived is read for at least as long, whatever the time-out.
constexpr std::chrono::milliseconds kLeastReading{100};

}  // namespace

Result<std::optional<PacketRunPlace>> PictureReader::next() {
  ledger_.use_socket(source_.socket.socket);
  chronicle_.tend_control(source_.clock_rate, Clock::now());
  const auto give_up = Clock::now() + std::max(std::chrono::milliseconds(source_.timeout), kLeastReading);
  for (;;) {
    const auto now = Clock::now();
    if (const auto place = rtp_.collector.next_picture(now)) return place;
    // Packets that never make a picture must not keep the thread from its keep-alive and its stop.
    if (now > give_up || source_.is_stopped()) return std::optional<PacketRunPlace>();
    const auto deadline = rtp_.collector.deadline();
    int until_look = deadline ? milliseconds_until(*deadline) : source_.timeout;
    if (source_.errand) until_look = std::min(until_look, std::max(milliseconds_until(source_.errand->deadline), 0));
    // A look at what stands complete falls due before the read would time out: that is no silence of the camera's.
    if (until_look < source_.timeout && !packet_waits(until_look)) {
      if (errand_is_due()) return std::optional<PacketRunPlace>();
      continue;
    }
    if (const auto received = receive(source_.timeout); !received) return received.failure();
  }
}

// Kept: a picture whose first packet is too long is reported damaged while it stays listed, and is taken out when it is
// met again, one read later.
Result<std::optional<PacketRunPlace>> PictureReader::next_jpeg() {
  const auto refused = std::exchange(rtp_.refused, std::nullopt);
  if (refused) (void)receive(0);
  auto place = next();
  if (!place || !*place || !refused) return place;
  if (name_of(rtp_.collector.packets(**place).front()) != *refused) return place;
  rtp_.collector.abandon(**place);
  return next();
}

// Also true when the read would fail at once.
bool PictureReader::packet_waits(int timeout) const {
  const int errand = source_.errand ? source_.errand->descriptor : -1;
  const WaitBudget budget({timeout, {nullptr, nullptr, errand}});
  return budget.wait_readable_unless(source_.socket.socket, source_.socket.stop) != 0;
}

bool PictureReader::errand_is_due() const {
  if (!source_.errand) return false;
  const auto& [descriptor, deadline] = *source_.errand;
  return Clock::now() >= deadline || (descriptor >= 0 && WaitBudget(0).wait_readable(descriptor) != 0);
}

Result<int> PictureReader::receive(int timeout) {
  if (rtp_.collector.is_empty()) rtp_.ring.restart();
  auto* place = reinterpret_cast<char*>(source_.buffer + rtp_.ring.next_offset());
  SPacketInfo packet;
  std::uint32_t sender = 0;
  const auto length =
      receive_packet(source_.socket, {place, PacketRing::kDatagramRoom}, timeout,
                     {&rtp_.gather, !rtp_.collector.is_empty(), &ledger_, source_.strict ? &sender : nullptr}, packet);
  if (!length) return length;
  const auto now = Clock::now();
  ledger_.datagram(static_cast<std::size_t>(*length), now);
  take(packet, {static_cast<std::uint32_t>(*length), sender, now});
  return length;
}

// By default a packet is taken whoever sent it and whatever its SSRC.
std::optional<StreamLedger::Refusal> PictureReader::refusal_of(const SPacketInfo& packet,
                                                               const Datagram& datagram) const {
  const std::uint32_t camera = chronicle_.camera();
  if (source_.strict && camera != 0 && datagram.sender != camera) return StreamLedger::Refusal::kForeignSource;
  if (packet.length < kRtpHeaderSize) return StreamLedger::Refusal::kNotRtp;
  if (datagram.length >= PacketRing::kDatagramRoom) return StreamLedger::Refusal::kTruncated;
  if (!source_.strict) return std::nullopt;
  const auto learnt = ledger_.ssrc();
  if (learnt && source_of({packet.data, packet.length}) != *learnt) return StreamLedger::Refusal::kForeignSsrc;
  return std::nullopt;
}

void PictureReader::take(const SPacketInfo& packet, const Datagram& datagram) {
  rtp_.overwritten.clear();
  rtp_.ring.written(datagram.length, rtp_.overwritten);
  if (!rtp_.overwritten.empty()) rtp_.collector.drop_overwritten(rtp_.overwritten);
  if (const auto refusal = refusal_of(packet, datagram)) return ledger_.refuse(*refusal);
  const auto arrival = ledger_.place(source_of({packet.data, packet.length}), packet.sequence);
  if (!rtp_.takes(packet)) return ledger_.refuse(StreamLedger::Refusal::kWrongPayloadType);
  ledger_.media(packet.timestamp, source_.clock_rate, datagram.arrival);
  chronicle_.arrived(packet, source_.socket.socket, datagram.arrival);
  // Its bytes are its own before it is listed: should memory run out in between, it is lost like one on the wire.
  rtp_.ring.keep(packet);
  const std::uint64_t restarts = rtp_.collector.counts().restarts;
  if (!rtp_.collector.add(packet, source_.clock_rate, datagram.arrival, arrival)) rtp_.ring.take_back();
  if (rtp_.collector.counts().restarts != restarts) ledger_.restarted(packet.sequence);
}

Result<UnitRead> read_unit(StoppableSocket source, StreamWindow& window, const Codec& codec, GrowingFrame frame,
                           int timeout, const std::function<void(Bytes)>& user_data) {
  const ElementaryCodec& stream = *codec.elementary;
  const auto length = receive_unit(source, window, stream.start_code, frame.room.subspan(frame.length), timeout);
  if (!length) return length.failure();
  if (*length == 0) return UnitRead{UnitRead::Kind::kSilence, 0};
  const Bytes unit = frame.room.subspan(frame.length, static_cast<std::size_t>(*length));
  const UnitKind kind = stream.kind_of(unit);
  if (kind == UnitKind::kUserData) {
    user_data(stream.text_of(unit));
    return UnitRead{UnitRead::Kind::kPart, *length};
  }
  frame.length += static_cast<unsigned int>(*length);
  if (kind == UnitKind::kKeyHeader) frame.frame_type = codec.key_frame;
  if (kind != UnitKind::kPicture) return UnitRead{UnitRead::Kind::kPart, *length};
  if (frame.frame_type != codec.key_frame) frame.frame_type = codec.delta_frame;
  return UnitRead{UnitRead::Kind::kPicture, *length};
}

}  // namespace vexa
