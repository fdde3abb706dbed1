// SPDX-License-Identifier: Apache-2.0
// Reads pictures from a socket once, for valgrind to count the instructions: scripts/check_performance.
//   receive_cost driver|bare PICTURES PAYLOAD     each picture has 8 datagrams, of PAYLOAD bytes and a header
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <vector>

#include "device/driver_state.h"
#include "vexa/vexa_common.h"

namespace {

constexpr int kDatagrams = 8;  // fewer than a pair of sockets holds
constexpr std::size_t kHeader = 12;

/// Sends pictures as H.264 in fragments; each is a key picture.
class Sender {
 public:
  Sender(int socket, std::size_t payload) : socket_(socket), datagram_(kHeader + payload, 0x55) { datagram_[0] = 0x80; }

  void send_picture() {
    for (int i = 0; i < kDatagrams; ++i) {
      const bool first = i == 0;
      const bool last = i + 1 == kDatagrams;
      datagram_[1] = static_cast<unsigned char>(96 | (last ? 0x80 : 0));
      datagram_[2] = static_cast<unsigned char>(sequence_ >> 8);
      datagram_[3] = static_cast<unsigned char>(sequence_ & 255);
      for (std::size_t k = 0; k < 4; ++k) datagram_[4 + k] = static_cast<unsigned char>(time_ >> (24 - 8 * k));
      datagram_[kHeader] = 0x7c;
      datagram_[kHeader + 1] = static_cast<unsigned char>(5 | (first ? 0x80 : 0) | (last ? 0x40 : 0));
      if (send(socket_, datagram_.data(), datagram_.size(), 0) < 0) std::abort();
      ++sequence_;
    }
    time_ += 3600;
  }

 private:
  const int socket_;
  std::vector<unsigned char> datagram_;
  std::uint16_t sequence_ = 0;
  std::uint32_t time_ = 100000000;
};

class Reader : public CVexaCommon {
 public:
  explicit Reader(int socket) : buffer_(1200000) {
    m_ConnectionInfo.timeout = 60000;  // a loaded machine is no silence
    m_RtpClockRate = 90000;
    m_StreamSocket = socket;
    if (!m_State->allocate_packets()) std::abort();
    frame_.data = buffer_.data();
    frame_.capacity = static_cast<unsigned int>(buffer_.size());
  }
  ~Reader() override {
    m_StreamSocket = -1;
    ReleaseRtpPacketsPtr();
  }
  void read_picture() {
    if (GetRtpCurrentVideoFrame("H.264", frame_) != LIBD_OK) std::abort();
  }

 private:
  std::vector<unsigned char> buffer_;
  VideoFrameInfo frame_;
};

}  // namespace

int main(int argc, char** argv) {
  if (argc != 4) return 2;
  const bool whole = std::string(argv[1]) == "driver";
  const long pictures = std::strtol(argv[2], nullptr, 10);
  const auto payload = static_cast<std::size_t>(std::strtoul(argv[3], nullptr, 10));
  int ends[2];
  if (payload < 2 || socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends) != 0) return 1;
  Sender sender(ends[0], payload);
  Reader reader(ends[1]);
  std::vector<unsigned char> room(65536);
  for (long i = 0; i < pictures; ++i) {
    sender.send_picture();
    if (whole) reader.read_picture();
    for (int k = 0; !whole && k < kDatagrams; ++k) {
      if (recv(ends[1], room.data(), room.size(), 0) < 0) return 1;
    }
  }
  close(ends[0]);
  close(ends[1]);
  return 0;
}
