#include "bench/peers/media_server.h"

#include <arpa/inet.h>
#include <netinet/in.h>
#include <netinet/udp.h>
#include <sys/epoll.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstring>
#include <map>
#include <memory>
#include <queue>
#include <random>
#include <string>
#include <vector>

#include "bench/peers/made_stream.h"

namespace vexa_peers {
namespace {

using Clock = std::chrono::steady_clock;
using std::chrono::nanoseconds;

constexpr std::size_t kHeader = 12;
constexpr std::size_t kMostSegments = 40;  // of one call with GSO: together less than 64 KB

int listen_at(int port) {
  const int listener = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
  const int yes = 1;
  setsockopt(listener, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
  sockaddr_in address{};
  address.sin_family = AF_INET;
  address.sin_port = htons(static_cast<std::uint16_t>(port));
  inet_pton(AF_INET, kAddress, &address.sin_addr);
  if (bind(listener, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0 || listen(listener, 2048) != 0) {
    std::perror("peers: the media server cannot listen");
    _exit(1);
  }
  return listener;
}

/// One session: its place in its stream, and when its next datagram is due.
struct Session {
  sockaddr_in to{};
  bool plays = false;
  std::uint64_t picture = 0;
  std::size_t packet = 0;
  std::uint16_t sequence = 0;
  std::uint32_t source = 0;
  Clock::time_point begin{};
  Clock::time_point due{};
};

class Server {
 public:
  Server(const Options& options, int ready)
      : options_(options),
        stream_(options),
        random_(options.seed),
        media_(socket(AF_INET, SOCK_DGRAM | SOCK_CLOEXEC, 0)),
        epoll_(epoll_create1(EPOLL_CLOEXEC)) {
    prctl(PR_SET_TIMERSLACK, 1UL);
    const int room = 1 << 22;
    setsockopt(media_, SOL_SOCKET, SO_SNDBUF, &room, sizeof room);
    for (const int port : {kRtspPort, kHttpPort}) {
      const int listener = listen_at(port);
      listeners_[listener] = port;
      watch(listener);
    }
    if (write(ready, "r", 1) != 1) _exit(1);
  }

  [[noreturn]] void run() {
    for (;;) {
      send_due();
      nanoseconds pause(std::chrono::milliseconds(100));
      if (!due_.empty()) pause = std::max(due_.top().first - Clock::now(), nanoseconds(0));
      epoll_event events[64];
      const auto seconds = std::chrono::floor<std::chrono::seconds>(pause);
      const timespec span{static_cast<std::time_t>(seconds.count()), static_cast<long>((pause - seconds).count())};
      const int count = epoll_pwait2(epoll_, events, 64, &span, nullptr);
      for (int i = 0; i < count; ++i) serve_descriptor(events[i].data.fd);
    }
  }

 private:
  using Due = std::pair<Clock::time_point, Session*>;

  void watch(int descriptor) const {
    epoll_event event{};
    event.events = EPOLLIN;
    event.data.fd = descriptor;
    epoll_ctl(epoll_, EPOLL_CTL_ADD, descriptor, &event);
  }

  void serve_descriptor(int descriptor) {
    if (const auto listener = listeners_.find(descriptor); listener != listeners_.end()) {
      const int connection = accept4(descriptor, nullptr, nullptr, SOCK_CLOEXEC);
      if (connection < 0) return;
      sessions_[connection] = listener->second == kRtspPort ? std::make_unique<Session>() : nullptr;
      return watch(connection);
    }
    char text[4096];
    const ssize_t length = recv(descriptor, text, sizeof text - 1, 0);
    Session* session = sessions_[descriptor].get();
    if (length > 0 && session != nullptr)
      return answer_rtsp(descriptor, *session, {text, static_cast<std::size_t>(length)});
    if (length > 0) answer_http(descriptor, {text, static_cast<std::size_t>(length)});
    // What was sent last may still be due: the session itself stays.
    if (session != nullptr) {
      session->plays = false;
      ended_.push_back(std::move(sessions_[descriptor]));
    }
    sessions_.erase(descriptor);
    close(descriptor);
  }

  static void answer(int connection, const std::string& text) {
    (void)!send(connection, text.data(), text.size(), MSG_NOSIGNAL);
  }

  static void answer_http(int connection, const std::string& request) {
    if (request.find("inquiry") == std::string::npos) return answer(connection, "HTTP/1.0 204 No Content\r\n\r\n");
    answer(connection, "HTTP/1.0 200 OK\r\nContent-Type: text/plain\r\n\r\nEsRTSPRec1Timeout=60");
  }

  static std::string value_of(const std::string& request, const std::string& key) {
    const auto at = request.find(key);
    if (at == std::string::npos) return {};
    const auto begin = at + key.size();
    return request.substr(begin, request.find_first_of("\r\n;-", begin) - begin);
  }

  void answer_rtsp(int connection, Session& session, const std::string& request) {
    const std::string head = "RTSP/1.0 200 OK\r\nCSeq: " + value_of(request, "CSeq: ") + "\r\n";
    const std::string number = "Session: " + std::to_string(connection) + "\r\n";
    if (request.starts_with("DESCRIBE")) {
      const std::string body = stream_.description();
      const std::string url = request.substr(9, request.find(' ', 9) - 9);
      return answer(connection, head + "Content-Base: " + url +
                                    "/\r\nContent-Type: application/sdp\r\nContent-Length: " +
                                    std::to_string(body.size()) + "\r\n\r\n" + body);
    }
    if (request.starts_with("SETUP")) {
      const std::string port = value_of(request, "client_port=");
      socklen_t size = sizeof session.to;
      getpeername(connection, reinterpret_cast<sockaddr*>(&session.to), &size);
      session.to.sin_port = htons(static_cast<std::uint16_t>(std::stoi("0" + port)));
      return answer(connection, head + number + "Transport: RTP/AVP;unicast;client_port=" + port + "-" +
                                    std::to_string(std::stoi("0" + port) + 1) + ";server_port=7000-7001\r\n\r\n");
    }
    if (request.starts_with("OPTIONS")) {
      return answer(connection, head + "Public: OPTIONS, DESCRIBE, SETUP, PLAY, GET_PARAMETER, TEARDOWN\r\n\r\n");
    }
    if (request.starts_with("TEARDOWN")) session.plays = false;
    answer(connection, head + number + "\r\n");
    if (request.starts_with("PLAY")) play(session);
  }

  // The sessions' pictures are spread over the frame interval.
  void play(Session& session) {
    session.plays = true;
    session.source = ++played_;
    waiting_.push_back(&session);
    if (waiting_.size() < options_.streams) return;
    const auto now = Clock::now();
    for (std::size_t i = 0; i < waiting_.size(); ++i) {
      Session& next = *waiting_[i];
      next.begin = now + interval() * static_cast<int>(i) / static_cast<int>(waiting_.size());
      next.due = next.begin;
      due_.emplace(next.due, &next);
    }
    waiting_.clear();
  }

  nanoseconds interval() const { return nanoseconds(static_cast<std::int64_t>(1e9 / options_.frames_per_second)); }

  void send_due() {
    while (!due_.empty() && due_.top().first <= Clock::now()) {
      Session& session = *due_.top().second;
      due_.pop();
      if (!session.plays || session.picture == options_.pictures()) continue;
      if (options_.link_megabits > 0)
        send_packet(session);
      else
        send_picture(session);
      due_.emplace(session.due, &session);
    }
  }

  void send_packet(Session& session) {
    const std::size_t length = lay_out(session, datagram_);
    if (!is_lost()) sendto(media_, datagram_, length, 0, reinterpret_cast<sockaddr*>(&session.to), sizeof session.to);
    constexpr double kOverhead = 66;  // bytes of UDP, IP and Ethernet, the gap between two frames among them
    const double bits = (static_cast<double>(length) + kOverhead) * 8;
    session.due += nanoseconds(static_cast<std::int64_t>(bits * 1000 / options_.link_megabits));
    step(session);
  }

  void send_picture(Session& session) {
    const std::uint64_t number = session.picture;
    while (session.picture == number) {
      // As many of one length as there are, and a shorter one: what one call with GSO takes.
      static unsigned char bytes[kMostSegments * sizeof datagram_];
      std::size_t filled = 0;
      std::size_t segment = 0;
      for (std::size_t count = 0; session.picture == number && count < (options_.gso ? kMostSegments : 1); ++count) {
        const std::size_t next = kHeader + stream_.picture(number).payloads[session.packet].size();
        if (segment != 0 && next > segment) break;
        const std::size_t length = lay_out(session, bytes + filled);
        if (segment == 0) segment = length;
        if (!is_lost()) filled += length;
        step(session);
        if (length < segment) break;
      }
      if (filled != 0) send_segments(session, bytes, filled, segment);
    }
  }

  void send_segments(const Session& session, unsigned char* bytes, std::size_t length, std::size_t segment) const {
    iovec piece{bytes, length};
    msghdr message{};
    sockaddr_in to = session.to;
    message.msg_name = &to;
    message.msg_namelen = sizeof to;
    message.msg_iov = &piece;
    message.msg_iovlen = 1;
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(std::uint16_t))] = {};
    if (length > segment) {
      message.msg_control = control;
      message.msg_controllen = sizeof control;
      cmsghdr* option = CMSG_FIRSTHDR(&message);
      option->cmsg_level = SOL_UDP;
      option->cmsg_type = UDP_SEGMENT;
      option->cmsg_len = CMSG_LEN(sizeof(std::uint16_t));
      const auto size = static_cast<std::uint16_t>(segment);
      std::memcpy(CMSG_DATA(option), &size, sizeof size);
    }
    if (sendmsg(media_, &message, 0) >= 0) return;
    // Without GSO each goes by itself.
    for (std::size_t at = 0; at < length; at += segment) {
      sendto(media_, bytes + at, std::min(segment, length - at), 0, reinterpret_cast<const sockaddr*>(&to), sizeof to);
    }
  }

  // The session's next datagram: its length.
  std::size_t lay_out(Session& session, unsigned char* place) {
    const std::vector<Payload>& payloads = stream_.picture(session.picture).payloads;
    const Payload& payload = payloads[session.packet];
    const bool last = session.packet + 1 == payloads.size();
    const auto time =
        static_cast<std::uint32_t>(static_cast<double>(session.picture) * 90000 / options_.frames_per_second);
    const auto put = [place](std::size_t at, std::uint32_t value, int bytes) {
      for (int i = 0; i < bytes; ++i)
        place[at + static_cast<std::size_t>(i)] = static_cast<unsigned char>(value >> 8 * (bytes - 1 - i));
    };
    place[0] = 0x80;
    place[1] = static_cast<unsigned char>(stream_.payload_type() | (last ? 0x80 : 0));
    put(2, session.sequence++, 2);
    put(4, time, 4);
    put(8, session.source, 4);
    std::memcpy(place + kHeader, payload.data(), payload.size());
    const std::size_t length = kHeader + payload.size();
    if (last) write_stamp(place + length - kStampLength, Clock::now().time_since_epoch().count());
    return length;
  }

  void step(Session& session) {
    if (++session.packet < stream_.picture(session.picture).payloads.size()) return;
    session.packet = 0;
    ++session.picture;
    session.due = std::max(session.due, session.begin + interval() * static_cast<std::int64_t>(session.picture));
  }

  bool is_lost() { return options_.loss > 0 && static_cast<double>(random_()) < options_.loss * 4294967296.0; }

  const Options options_;
  const MadeStream stream_;
  std::mt19937 random_;
  const int media_;
  const int epoll_;
  std::map<int, int> listeners_;  // port by descriptor
  std::map<int, std::unique_ptr<Session>> sessions_;
  std::vector<std::unique_ptr<Session>> ended_;
  std::vector<Session*> waiting_;
  std::uint32_t played_ = 0;
  std::priority_queue<Due, std::vector<Due>, std::greater<>> due_;
  unsigned char datagram_[2048];
};

}  // namespace

void serve(const Options& options, int ready) {
  static Server server(options, ready);
  server.run();
}

}  // namespace vexa_peers
