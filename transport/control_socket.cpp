#include "transport/control_socket.h"

#include <linux/sockios.h>
#include <netinet/in.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

#include <cerrno>
#include <chrono>
#include <cstring>

#include "transport/tcp_connect.h"

namespace vexa {
namespace {

constexpr int kLastPort = 65535;
constexpr std::int64_t kNanosecondsASecond = 1'000'000'000;

std::int64_t now_in_nanoseconds() {
  const auto now = std::chrono::system_clock::now().time_since_epoch();
  return std::chrono::duration_cast<std::chrono::nanoseconds>(now).count();
}

/// The time that the kernel put beside a datagram; this moment where it put none.
std::int64_t arrival_in(msghdr& message) {
  for (cmsghdr* part = CMSG_FIRSTHDR(&message); part != nullptr; part = CMSG_NXTHDR(&message, part)) {
    if (part->cmsg_level != SOL_SOCKET || part->cmsg_type != SCM_TIMESTAMPNS) continue;
    if (part->cmsg_len < CMSG_LEN(sizeof(timespec))) continue;
    timespec time{};
    std::memcpy(&time, CMSG_DATA(part), sizeof time);
    return std::int64_t{time.tv_sec} * kNanosecondsASecond + time.tv_nsec;
  }
  return now_in_nanoseconds();
}

sockaddr_in internet_address(std::uint32_t address, std::uint16_t port) {
  sockaddr_in full{};
  full.sin_family = AF_INET;
  full.sin_addr.s_addr = address;
  full.sin_port = port;
  return full;
}

}  // namespace

Socket bind_control_socket(int media_port) {
  if (media_port <= 0 || media_port >= kLastPort) {
    errno = EADDRNOTAVAIL;
    return {};
  }
  Socket control = make_socket(SOCK_DGRAM);
  if (!control.valid()) return {};
  const sockaddr_in address = internet_address(INADDR_ANY, htons(static_cast<std::uint16_t>(media_port + 1)));
  if (bind(control.get(), reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0) return {};
  const int on = 1;
  setsockopt(control.get(), SOL_SOCKET, SO_TIMESTAMPNS, &on, sizeof on);
  return control;
}

std::optional<ControlDatagram> receive_control(int socket, std::span<unsigned char> room) {
  sockaddr_in sender{};
  iovec piece{room.data(), room.size()};
  alignas(cmsghdr) unsigned char beside[CMSG_SPACE(sizeof(timespec))];
  msghdr message{};
  message.msg_name = &sender;
  message.msg_namelen = sizeof sender;
  message.msg_iov = &piece;
  message.msg_iovlen = 1;
  message.msg_control = beside;
  message.msg_controllen = sizeof beside;
  const ssize_t length = recvmsg(socket, &message, MSG_DONTWAIT);
  if (length < 0) return std::nullopt;
  return ControlDatagram{static_cast<std::size_t>(length), sender.sin_addr.s_addr, sender.sin_port,
                         arrival_in(message)};
}

void send_control(int socket, std::uint32_t address, std::uint16_t port, std::span<const unsigned char> bytes) {
  const sockaddr_in receiver = internet_address(address, port);
  (void)sendto(socket, bytes.data(), bytes.size(), MSG_DONTWAIT | MSG_NOSIGNAL,
               reinterpret_cast<const sockaddr*>(&receiver), sizeof receiver);
}

// SO_TIMESTAMPNS would put the time beside every datagram, where that of a picture's first and last is wanted.
std::optional<std::int64_t> arrival_of_latest(int socket) {
  long long time[2] = {};  // seconds and nanoseconds, of 64 bits on every target
  if (ioctl(socket, SIOCGSTAMPNS_NEW, time) != 0) return std::nullopt;
  return time[0] * kNanosecondsASecond + time[1];
}

}  // namespace vexa
