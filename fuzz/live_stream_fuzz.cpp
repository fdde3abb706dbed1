// SPDX-License-Identifier: Apache-2.0
// A whole live stream over UDP: the RTSP session's answers, then datagrams of media and of control, then the stream's
// end. The first byte of the input chooses the codec; of the records after the first three, one that begins with an odd
// byte goes to the control port, without that byte.
#include <arpa/inet.h>
#include <netinet/in.h>

#include <vector>

#include "fuzz/in_process_camera.h"
#include "runtime/base/sync.h"
#include "tests/support/test_driver.h"
#include "vexa/trace.h"

namespace {

constexpr int kTimeout = 1000;  // milliseconds; the driver looks for an answer once a second
constexpr const char* kCodecs[] = {"H.264", "MPEG4", "JPEG"};
constexpr std::size_t kMostDatagrams = 200;  // the socket has room for them

int port_of(int socket) {
  sockaddr_in address{};
  socklen_t length = sizeof address;
  getsockname(socket, reinterpret_cast<sockaddr*>(&address), &length);
  return ntohs(address.sin_port);
}

void send_to_port(int from, int port, vexa::Bytes bytes) {
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  sendto(from, bytes.data(), bytes.size(), MSG_DONTWAIT, reinterpret_cast<const sockaddr*>(&address), sizeof address);
}

void send_datagrams(int media, vexa_fuzz::Records& records) {
  static const int sender = socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0);
  const int port = port_of(media);
  for (std::size_t sent = 0; sent < kMostDatagrams; ++sent) {
    const auto record = records.next();
    if (!record) return;
    const bool control = !record->empty() && ((*record)[0] & 1) != 0;
    send_to_port(sender, control ? port + 1 : port, control ? record->subspan(1) : *record);
  }
}

void take_pictures(vexa_test::TestDriver& driver, const char* codec) {
  static std::vector<unsigned char> room(100000);
  CVexaCommon::VideoFrameInfo frame;
  frame.data = room.data();
  frame.capacity = static_cast<unsigned int>(room.size());
  for (std::size_t reads = 0; reads < 2 * kMostDatagrams; ++reads) {
    const ELibDReturnCode code = driver.GetRtpCurrentVideoFrame(codec, frame);
    if (code == LIBD_OK) vexa_fuzz::check(frame.length <= frame.capacity);
    if (code == LIBD_NO_FRAME || code == LIBD_TIMEOUT) return;
  }
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  if (size == 0) return 0;
  vexa_fuzz::Records records({data + 1, size - 1});
  vexa_fuzz::InProcessCamera camera(records);
  vexa_test::TestDriver driver;
  vexa::SetTrace(driver, [](const char*) {});
  driver.use("127.0.0.1", 554, kTimeout);
  driver.m_RtspSocket = driver.rtp_over_udp_open("rtsp://127.0.0.1/media/video1");
  if (driver.m_RtspSocket >= 0 && driver.state().allocate_packets()) {
    send_datagrams(driver.state().stream_socket(), records);
    camera.send_rest(driver.m_RtspSocket);
    take_pictures(driver, kCodecs[data[0] % std::size(kCodecs)]);
    driver.ReleaseRtpPacketsPtr();
  }
  driver.rtp_over_udp_close();
  return 0;
}
