// SPDX-License-Identifier: Apache-2.0
#include "transport/tcp_connect.h"

#include <arpa/inet.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <netdb.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <thread>

#include "tests/support/process_state.h"
#include "tests/support/scripted_camera.h"

namespace vexa {
namespace {

TEST(ResolveHost, TakesADottedAddressAndThePort) {
  const ResolvedHost host = resolve_host("127.1.2.3", 8080);
  ASSERT_TRUE(host.address);
  EXPECT_EQ(ntohl(host.address->sin_addr.s_addr), 0x7f010203U);
  EXPECT_EQ(ntohs(host.address->sin_port), 8080);
  EXPECT_EQ(host.address->sin_family, AF_INET);
}

TEST(ResolveHost, TakesANameOfTheHostsTable) {
  const ResolvedHost host = resolve_host("localhost", 1);
  ASSERT_TRUE(host.address);
  EXPECT_EQ(ntohl(host.address->sin_addr.s_addr), 0x7f000001U);
}

TEST(ResolveHost, ReportsTheResolversNumber) {
  const ResolvedHost host = resolve_host("256.256.256.256", 80);
  EXPECT_FALSE(host.address);
  EXPECT_EQ(host.error, HOST_NOT_FOUND);
}

TEST(ResolveHost, RefusesANameThatDoesNotFitItsBuffer) {
  EXPECT_TRUE(resolve_host(std::string(900, '0') + "177.1", 80).address);
  const ResolvedHost host = resolve_host(std::string(1100, '0') + "177.1", 80);
  EXPECT_FALSE(host.address);
  EXPECT_EQ(host.error, NETDB_INTERNAL);
}

class ConnectWithin : public testing::Test {
 protected:
  ConnectWithin() : socket_(make_socket(SOCK_STREAM)) { EXPECT_TRUE(fcntl(socket_.get(), F_SETFL, O_NONBLOCK) == 0); }

  int connect_to(const std::string& host, int port, int timeout) {
    return connect_within(socket_.get(), *resolve_host(host, port).address, timeout);
  }

  const Socket socket_;
};

TEST_F(ConnectWithin, Connects) {
  vexa_test::ScriptedCamera camera({});
  EXPECT_EQ(connect_to(camera.host(), camera.port(), 10000), 1);
  sockaddr_in peer{};
  socklen_t length = sizeof peer;
  EXPECT_EQ(getpeername(socket_.get(), reinterpret_cast<sockaddr*>(&peer), &length), 0);
}

TEST_F(ConnectWithin, GivesUpWhenNobodyAnswers) {
  const vexa_test::FullListener camera;
  EXPECT_EQ(connect_to(camera.host(), camera.port(), 30), 0);
}

TEST_F(ConnectWithin, CountsARefusalDuringTheWaitAsConnected) {
  vexa_test::FullListener camera;
  const long thread = vexa_test::kernel_thread_id();
  std::thread vanishing([&camera, thread] {
    EXPECT_TRUE(vexa_test::eventually([thread] { return vexa_test::is_sleeping(thread); }));
    camera.vanish();
  });
  EXPECT_EQ(connect_to(camera.host(), camera.port(), 20000), 1);
  vanishing.join();
  EXPECT_FALSE(send_once(socket_.get(), "x", 1));
  EXPECT_EQ(errno, ECONNREFUSED);
}

TEST_F(ConnectWithin, ReportsASystemError) {
  EXPECT_EQ(connect_to("255.255.255.255", 80, 10000), -1);
  EXPECT_NE(errno, EINPROGRESS);
}

TEST(MakeSocket, IsClosedInChildrenAndTakesABuffer) {
  const Socket socket = make_socket(SOCK_DGRAM);
  EXPECT_NE(fcntl(socket.get(), F_GETFD) & FD_CLOEXEC, 0);
  EXPECT_TRUE(set_receive_buffer(socket.get(), 8192));
  EXPECT_FALSE(make_socket(-1).valid());
  EXPECT_FALSE(set_receive_buffer(-1, 8192));
}

}  // namespace
}  // namespace vexa
