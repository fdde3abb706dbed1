// SPDX-License-Identifier: Apache-2.0
// A whole RTSP session inside its connection: the answers to DESCRIBE, SETUP, PLAY and a keep-alive, and then packets.
// The input's records are the answers in turn.
#include <cstring>
#include <vector>

#include "fuzz/in_process_camera.h"
#include "tests/support/test_driver.h"
#include "vexa/trace.h"

namespace {

constexpr int kTimeout = 1000;  // milliseconds; the driver looks for an answer once a second

void read_packets(vexa_test::TestDriver& driver, int socket) {
  static std::vector<char> room(65535);
  for (int packets = 0; packets < 1000; ++packets) {
    bool marker = false;
    unsigned char type = 0;
    unsigned int timestamp = 0;
    const int length = driver.rtp_over_tcp_payload_recv(socket, room.data(), static_cast<int>(room.size()), &marker,
                                                        &type, kTimeout, &timestamp);
    if (length < 0) return;
    vexa_fuzz::check(length <= static_cast<int>(room.size()) && type < 128);
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  vexa_fuzz::Records records({data, size});
  vexa_fuzz::InProcessCamera camera(records);
  vexa_test::TestDriver driver;
  vexa::SetTrace(driver, [](const char*) {});
  driver.use("127.0.0.1", 554, kTimeout);
  const int opened = driver.rtp_over_tcp_open("rtsp://127.0.0.1/media/video1");
  if (opened < 0) {
    // The media socket is the driver's own, and only set once the session is open.
    vexa_fuzz::check(driver.state().stream_socket() == -1);
    return 0;
  }
  driver.m_RtspSocket = opened;
  driver.KeepAlive();
  camera.send_rest(opened);
  read_packets(driver, opened);
  driver.state().set_stream_socket(-1);  // the same connection
  driver.rtp_over_udp_close();
  return 0;
}
