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
  const auto give_up = Clock::now() + std::max(std::chrono::milliseconds(source_.timeout), kLeastReading);
  for (;;) {
    const auto now = Clock::now();
    if (const auto place = rtp_.collector.next_picture(now)) return place;
    // Packets that never make a picture must not keep the thread from its keep-alive and its stop.
    if (now > give_up || source_.is_stopped()) return std::optional<PacketRunPlace>();
    const auto deadline = rtp_.collector.deadline();
    const int until_look = deadline ? milliseconds_until(*deadline) : source_.timeout;
    // The collector has to be asked again before the read would time out: that is no silence of the camera.
    if (until_look < source_.timeout && !packet_waits(until_look)) continue;
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
  return WaitBudget(timeout).wait_readable_unless(source_.socket.socket, source_.socket.stop) != 0;
}

Result<int> PictureReader::receive(int timeout) {
  if (rtp_.collector.is_empty()) rtp_.ring.restart();
  auto* place = reinterpret_cast<char*>(source_.buffer + rtp_.ring.next_offset());
  SPacketInfo packet;
  const auto length = receive_packet(source_.socket, {place, PacketRing::kDatagramRoom}, timeout,
                                     {&rtp_.gather, !rtp_.collector.is_empty()}, packet);
  if (!length) return length;
  rtp_.overwritten.clear();
  rtp_.ring.written(static_cast<std::uint32_t>(*length), rtp_.overwritten);
  if (!rtp_.overwritten.empty()) rtp_.collector.drop_overwritten(rtp_.overwritten);
  if (packet.length < kRtpHeaderSize || !rtp_.takes(packet)) return length;
  // The ring keeps its bytes before it is listed: should memory run out in between, it is lost like one on the wire.
  rtp_.ring.keep(packet);
  if (!rtp_.collector.add(packet, source_.clock_rate, Clock::now())) rtp_.ring.take_back();
  return length;
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
