// SPDX-License-Identifier: Apache-2.0
// What the benches of streaming share: a stream without a driver, beside which a driver is measured.
#pragma once

#include <arpa/inet.h>
#include <fcntl.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <vector>

#include "vexa/common_types.h"
#include "virtual_camera/codec/rtp_packetiser.h"

namespace vexa_bench {

/// The driver's trace of its requests goes to standard output: the report, which is returned, keeps it to itself.
inline FILE* take_standard_output() {
  FILE* report = fdopen(dup(STDOUT_FILENO), "w");
  const int nowhere = open("/dev/null", O_WRONLY);
  dup2(nowhere, STDOUT_FILENO);
  close(nowhere);
  return report;
}

/// Access units of one size, each a key picture: what a camera of that bit rate would send.
inline std::shared_ptr<const vexa::camera::PacketisedClip> made_clip(std::size_t picture_size) {
  std::vector<std::uint8_t> bytes;
  for (int picture = 0; picture < 4; ++picture) {
    const std::uint8_t sets[] = {0, 0, 0, 1, 0x67, 0x42, 0, 0x1e, 0, 0, 0, 1, 0x68, 0xce, 0, 0, 0, 1, 0x65, 0x88};
    bytes.insert(bytes.end(), std::begin(sets), std::end(sets));
    bytes.insert(bytes.end(), picture_size, static_cast<std::uint8_t>(0x51 + picture));
  }
  return std::make_shared<const vexa::camera::PacketisedClip>(vexa::camera::Clip::from_annex_b(bytes), 1400);
}

struct Usage {
  double cpu = 0;
  long wakeups = 0;
};

inline Usage usage_now() {
  rusage usage = {};
  getrusage(RUSAGE_SELF, &usage);
  const auto seconds = [](timeval time) {
    return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_usec) / 1e6;
  };
  return {seconds(usage.ru_utime) + seconds(usage.ru_stime), usage.ru_nvcsw};
}

/// Counts what the driver hands over; the bytes are dropped.
class CountingSink : public CDataSink {
 public:
  void Write(const unsigned char*, unsigned int length) override { bytes += length; }
  std::uint64_t bytes = 0;
};

/// The least that a client must say to a camera to get a stream; answers the media socket.
inline int open_bare_stream(const std::string& address) {
  const int control = socket(AF_INET, SOCK_STREAM, 0);
  const int media = socket(AF_INET, SOCK_DGRAM, 0);
  const int room = 524288;
  setsockopt(media, SOL_SOCKET, SO_RCVBUF, &room, sizeof room);
  sockaddr_in place = {};
  place.sin_family = AF_INET;
  bind(media, reinterpret_cast<sockaddr*>(&place), sizeof place);
  socklen_t size = sizeof place;
  getsockname(media, reinterpret_cast<sockaddr*>(&place), &size);
  const int port = ntohs(place.sin_port);
  inet_pton(AF_INET, address.c_str(), &place.sin_addr);
  place.sin_port = htons(554);
  if (connect(control, reinterpret_cast<sockaddr*>(&place), sizeof place) != 0) std::exit(1);
  const std::string url = "rtsp://" + address + ":554/media/video1";
  const std::string credentials = "Authorization: Basic YWRtaW46YWRtaW4=\r\n";
  std::string session;
  const auto exchange = [&](const std::string& request) {
    if (send(control, request.data(), request.size(), MSG_NOSIGNAL) < 0) std::exit(1);
    char answer[1024];
    const ssize_t length = recv(control, answer, sizeof answer, 0);
    const std::string text(answer, length > 0 ? static_cast<std::size_t>(length) : 0);
    if (const auto at = text.find("Session: "); at != std::string::npos) {
      session = text.substr(at + 9, text.find_first_of(";\r", at) - at - 9);
    }
  };
  exchange("DESCRIBE " + url + " RTSP/1.0\r\nCSeq: 1\r\n" + credentials + "\r\n");
  exchange("SETUP " + url + "/video RTSP/1.0\r\nCSeq: 2\r\nTransport: RTP/AVP;unicast;client_port=" +
           std::to_string(port) + "-" + std::to_string(port + 1) + "\r\n" + credentials + "\r\n");
  exchange("PLAY " + url + " RTSP/1.0\r\nCSeq: 3\r\nSession: " + session + "\r\n" + credentials + "\r\n");
  return media;
}

/// Wakes for each datagram until the last of so many pictures has ended, or none has come for 2 s.
inline void bare_loop(int media, std::uint64_t pictures, std::uint64_t* bytes) {
  std::vector<char> buffer(65536);
  pollfd entry = {media, POLLIN, 0};
  while (pictures > 0 && poll(&entry, 1, 2000) > 0) {
    const ssize_t length = recvfrom(media, buffer.data(), buffer.size(), 0, nullptr, nullptr);
    if (length <= 12) continue;
    *bytes += static_cast<std::uint64_t>(length - 12);
    const bool marker = (static_cast<unsigned char>(buffer[1]) & 0x80) != 0;
    if (marker) --pictures;
  }
}

}  // namespace vexa_bench
