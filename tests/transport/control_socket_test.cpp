#include "transport/control_socket.h"

#include <gtest/gtest.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <array>
#include <chrono>
#include <cstdlib>

#include "transport/rtsp_session.h"

namespace vexa {
namespace {

constexpr std::int64_t kMinute = 60'000'000'000;

std::int64_t now() {
  return std::chrono::duration_cast<std::chrono::nanoseconds>(std::chrono::system_clock::now().time_since_epoch())
      .count();
}

int port_of(int socket) {
  sockaddr_in address{};
  socklen_t length = sizeof address;
  getsockname(socket, reinterpret_cast<sockaddr*>(&address), &length);
  return ntohs(address.sin_port);
}

/// A media socket whose next port is free, and that port's socket.
struct Pair {
  Socket media;
  Socket control;
  int port = 0;
};

Pair bound_pair() {
  Pair pair;
  while (!pair.control.valid()) {
    pair.media = make_media_socket();
    const auto port = bind_media_socket(pair.media.get());
    if (!port) break;
    pair.port = *port;
    pair.control = bind_control_socket(*port);
  }
  return pair;
}

TEST(ControlSocket, StandsOnThePortAfterTheMediaPort) {
  const Pair pair = bound_pair();
  EXPECT_EQ(port_of(pair.control.get()), pair.port + 1);
}

TEST(ControlSocket, IsInvalidWhereThePortIsTakenOrThereIsNone) {
  const Pair pair = bound_pair();
  EXPECT_FALSE(bind_control_socket(pair.port).valid());
  EXPECT_EQ(errno, EADDRINUSE);
  for (const int port : {65535, 70000, 0, -1}) {
    EXPECT_FALSE(bind_control_socket(port).valid()) << port;
    EXPECT_EQ(errno, EADDRNOTAVAIL) << port;
  }
}

TEST(ControlSocket, ReceivesWithTheSenderAndTheTimeOfArrival) {
  const Pair one = bound_pair();
  const Pair other = bound_pair();
  std::array<unsigned char, 16> room{};
  EXPECT_FALSE(receive_control(one.control.get(), room));
  const unsigned char bytes[] = {1, 2, 3};
  send_control(other.control.get(), htonl(INADDR_LOOPBACK), htons(static_cast<std::uint16_t>(one.port + 1)), bytes);
  const auto datagram = receive_control(one.control.get(), room);
  ASSERT_TRUE(datagram);
  EXPECT_EQ(datagram->length, sizeof bytes);
  EXPECT_EQ(datagram->address, htonl(INADDR_LOOPBACK));
  EXPECT_EQ(datagram->port, htons(static_cast<std::uint16_t>(other.port + 1)));
  EXPECT_EQ(room[2], 3);
  EXPECT_LT(std::abs(datagram->arrival - now()), kMinute);
}

TEST(ArrivalOfLatest, IsTheKernelsWhereTheSocketHasSuchTimes) {
  const Pair pair = bound_pair();
  const unsigned char byte = 1;
  const sockaddr_in own{AF_INET, htons(static_cast<std::uint16_t>(pair.port)), {htonl(INADDR_LOOPBACK)}, {}};
  ASSERT_EQ(sendto(pair.control.get(), &byte, 1, 0, reinterpret_cast<const sockaddr*>(&own), sizeof own), 1);
  char room[1];
  ASSERT_EQ(recv(pair.media.get(), room, sizeof room, 0), 1);
  const auto arrival = arrival_of_latest(pair.media.get());
  ASSERT_TRUE(arrival);
  EXPECT_LT(std::abs(*arrival - now()), kMinute);
  int ends[2];
  ASSERT_EQ(socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends), 0);
  const Socket first(ends[0]);
  const Socket second(ends[1]);
  EXPECT_FALSE(arrival_of_latest(ends[0]));
  EXPECT_FALSE(arrival_of_latest(-1));
}

}  // namespace
}  // namespace vexa
