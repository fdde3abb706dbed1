#include "transport/rtp_socket.h"

#include <cerrno>
#include <ctime>

#include "transport/failure.h"
#include "transport/socket.h"
#include "transport/wire/rtp_header.h"

namespace vexa {
namespace {

/// The longest datagram that UDP carries over IPv4, and one more.
constexpr std::size_t kLeastRoom = 65535;

bool is_empty(int error) { return error == EAGAIN || error == EWOULDBLOCK; }

bool is_signalled(int event) { return event != -1 && WaitBudget(0).wait_readable(event) == 1; }

void nap(std::chrono::microseconds length) {
  if (length.count() == 0) return;
  const timespec duration{0, static_cast<long>(std::chrono::nanoseconds(length).count())};
  nanosleep(&duration, nullptr);  // a signal may cut it short: the datagrams are read all the same
}

ssize_t read_waiting(int socket, std::span<char> room, const Gathering& gathering) {
  if (gathering.sender == nullptr) return receive_waiting(socket, room.data(), room.size());
  return receive_waiting_from(socket, room.data(), room.size(), *gathering.sender);
}

/// What is there after a nap in the middle of a picture; as receive_waiting.
ssize_t receive_after_nap(int socket, std::span<char> room, Gathering gathering) {
  if (gathering.gather == nullptr || !gathering.in_picture) return -1;
  const std::chrono::microseconds pause = gathering.gather->goes_on();
  if (pause.count() == 0) return -1;
  nap(pause);
  return read_waiting(socket, room, gathering);
}

}  // namespace

Result<int> receive_datagram(StoppableSocket source, std::span<char> room, WaitLimit limit, Gathering gathering) {
  ssize_t count = read_waiting(source.socket, room, gathering);
  if (count < 0 && is_empty(errno)) count = receive_after_nap(source.socket, room, gathering);
  if (count < 0 && is_empty(errno)) {
    if (gathering.observer != nullptr) gathering.observer->about_to_wait();
    const int ready = WaitBudget(limit).wait_readable_unless(source.socket, source.stop);
    if (ready == 0 && is_signalled(source.stop)) return kNoReason;
    if (ready == 0) return kReceiveTimedOut;
    if (ready < 0) return system_failure();
    if (gathering.observer != nullptr) gathering.observer->woken();
    if (gathering.gather != nullptr) nap(gathering.gather->woken());
    count = read_waiting(source.socket, room, gathering);
  }
  if (count < 0) return system_failure();
  if (gathering.gather != nullptr) gathering.gather->received(static_cast<std::size_t>(count));
  return static_cast<int>(count);
}

Result<int> receive_packet(StoppableSocket source, std::span<char> room, WaitLimit limit, Gathering gathering,
                           SPacketInfo& packet) {
  if (room.size() < kLeastRoom) return kInvalidArgument;
  const auto length = receive_datagram(source, room, limit, gathering);
  if (!length) return length;
  packet.received = true;
  auto* bytes = reinterpret_cast<unsigned char*>(room.data());
  if (const auto header = parse_rtp_header({bytes, static_cast<std::size_t>(*length)})) {
    packet.marker = header->marker;
    packet.payloadType = header->payload_type;
    packet.data = bytes;
    packet.length = static_cast<std::uint32_t>(*length);
    packet.timestamp = header->timestamp;
    packet.sequence = header->sequence;
  }
  return length;
}

}  // namespace vexa
