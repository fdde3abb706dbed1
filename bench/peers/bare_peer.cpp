// SPDX-License-Identifier: Apache-2.0
// Loops that only receive: the least that a reader can do. One wakes for every datagram; two nap and drain, with
// recvmmsg and with recv.
#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <optional>
#include <string>
#include <thread>

#include "bench/peers/made_stream.h"
#include "bench/peers/peer.h"

namespace vexa_peers {
namespace {

constexpr std::size_t kHeader = 12;
constexpr unsigned kMost = 64;
constexpr std::chrono::milliseconds kNap{2};

struct BareSession {
  int control = -1;
  int media = -1;
};

/// The least that a client must send to get a stream.
std::optional<BareSession> open_session() {
  BareSession session{socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0), socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)};
  const int room = 524288;  // as the driver's
  setsockopt(session.media, SOL_SOCKET, SO_RCVBUF, &room, sizeof room);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  auto* place = reinterpret_cast<sockaddr*>(&address);
  socklen_t size = sizeof address;
  if (bind(session.media, place, size) != 0 || getsockname(session.media, place, &size) != 0) return std::nullopt;
  const int port = ntohs(address.sin_port);
  inet_pton(AF_INET, kAddress, &address.sin_addr);
  address.sin_port = htons(kRtspPort);
  if (connect(session.control, place, sizeof address) != 0) return std::nullopt;
  const std::string url = "rtsp://" + std::string(kAddress) + "/media/video1";
  const std::string requests[] = {
      "DESCRIBE " + url + " RTSP/1.0\r\nCSeq: 1\r\n\r\n",
      "SETUP " + url + "/video RTSP/1.0\r\nCSeq: 2\r\nTransport: RTP/AVP;unicast;client_port=" + std::to_string(port) +
          "-" + std::to_string(port + 1) + "\r\n\r\n",
      "PLAY " + url + " RTSP/1.0\r\nCSeq: 3\r\n\r\n"};
  for (const std::string& request : requests) {
    char answer[2048];
    if (send(session.control, request.data(), request.size(), MSG_NOSIGNAL) < 0) return std::nullopt;
    if (recv(session.control, answer, sizeof answer, 0) <= 0) return std::nullopt;
  }
  return session;
}

/// Counts the pictures whose datagrams have all come, in order.
class PictureCounter {
 public:
  void take(const unsigned char* datagram, std::size_t length) {
    if (length <= kHeader) return;
    const auto sequence = static_cast<std::uint16_t>(datagram[2] << 8 | datagram[3]);
    if (sequence != expected_) is_whole_ = false;
    expected_ = static_cast<std::uint16_t>(sequence + 1);
    if ((datagram[1] & 0x80) == 0) {
      received.bytes += length - kHeader;
      return;
    }
    ++ended;
    if (is_whole_) received.take(datagram + kHeader, length - kHeader);
    is_whole_ = true;
  }
  Received received;
  std::uint64_t ended = 0;

 private:
  std::uint16_t expected_ = 0;
  bool is_whole_ = true;
};

bool is_there(int media) {
  pollfd entry = {media, POLLIN, 0};
  return poll(&entry, 1, kSilence) > 0;
}

void receive_waking(int media, std::uint64_t pictures, PictureCounter& counter) {
  std::vector<unsigned char> buffer(65536);
  while (counter.ended < pictures && is_there(media)) {
    const ssize_t length = recv(media, buffer.data(), buffer.size(), 0);
    if (length > 0) counter.take(buffer.data(), static_cast<std::size_t>(length));
  }
}

/// Takes what waits at the socket, then naps, until all pictures have come or none does for some time.
template <typename Drain>
void receive_napping(int media, std::uint64_t pictures, PictureCounter& counter, Drain drain) {
  auto last = std::chrono::steady_clock::now();
  if (!is_there(media)) return;
  while (counter.ended < pictures) {
    if (drain() > 0) last = std::chrono::steady_clock::now();
    if (std::chrono::steady_clock::now() - last > std::chrono::milliseconds(kSilence)) return;
    std::this_thread::sleep_for(kNap);
  }
}

/// Many datagrams a system call.
void receive_by_recvmmsg(int media, std::uint64_t pictures, PictureCounter& counter) {
  constexpr std::size_t kRoom = 2048;
  std::vector<unsigned char> buffer(kMost * kRoom);
  mmsghdr messages[kMost] = {};
  iovec pieces[kMost];
  for (unsigned i = 0; i < kMost; ++i) {
    pieces[i] = {buffer.data() + i * kRoom, kRoom};
    messages[i].msg_hdr.msg_iov = &pieces[i];
    messages[i].msg_hdr.msg_iovlen = 1;
  }
  receive_napping(media, pictures, counter, [&] {
    int taken = 0;
    for (int count = kMost; count == static_cast<int>(kMost);) {
      count = recvmmsg(media, messages, kMost, MSG_DONTWAIT, nullptr);
      for (int i = 0; i < count; ++i)
        counter.take(buffer.data() + static_cast<std::size_t>(i) * kRoom, messages[i].msg_len);
      taken += std::max(count, 0);
    }
    return taken;
  });
}

/// One datagram a system call.
void receive_by_recv(int media, std::uint64_t pictures, PictureCounter& counter) {
  std::vector<unsigned char> buffer(65536);
  receive_napping(media, pictures, counter, [&] {
    int taken = 0;
    for (ssize_t length = 0; (length = recv(media, buffer.data(), buffer.size(), MSG_DONTWAIT)) > 0; ++taken)
      counter.take(buffer.data(), static_cast<std::size_t>(length));
    return taken;
  });
}

auto receiver_of(BareLoop loop) {
  switch (loop) {
    case BareLoop::kWaking:
      return receive_waking;
    case BareLoop::kNapping:
      return receive_by_recvmmsg;
    case BareLoop::kDraining:
      return receive_by_recv;
  }
  return receive_waking;
}

class BarePeer : public Peer {
 public:
  BarePeer(const Options& options, BareLoop loop) : options_(options), loop_(loop) {}

  bool start() override {
    for (std::size_t i = 0; i < options_.streams; ++i) {
      const auto session = open_session();
      if (!session) return false;
      sessions_.push_back(*session);
    }
    return true;
  }

  Received run() override {
    std::vector<PictureCounter> counters(options_.streams);
    std::vector<std::thread> threads;
    for (std::size_t i = 0; i < options_.streams; ++i) {
      threads.emplace_back(receiver_of(loop_), sessions_[i].media, options_.pictures(), std::ref(counters[i]));
    }
    for (std::thread& thread : threads) thread.join();
    Received received;
    for (const PictureCounter& counter : counters) received.add(counter.received);
    return received;
  }

  void stop() override {
    for (const BareSession& session : sessions_) {
      close(session.control);
      close(session.media);
    }
  }

 private:
  const Options options_;
  const BareLoop loop_;
  std::vector<BareSession> sessions_;
};

}  // namespace

std::unique_ptr<Peer> make_bare_peer(const Options& options, BareLoop loop) {
  return std::make_unique<BarePeer>(options, loop);
}

}  // namespace vexa_peers
