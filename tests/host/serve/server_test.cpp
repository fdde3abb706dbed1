// SPDX-License-Identifier: Apache-2.0
// The server of vexactl serve, asked over real connections.
#include "host/serve/server.h"

#include <arpa/inet.h>
#include <fmt/format.h>
#include <gtest/gtest.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <atomic>
#include <future>
#include <nlohmann/json.hpp>
#include <thread>

#include "host/base/unique_fd.h"
#include "host/serve/pages.h"
#include "tests/support/own_address.h"

namespace vexa::host {
namespace {

const std::string kToken = "0123456789abcdef";
constexpr int kPatience = 30000;  // milliseconds for what must come

// One connection to the server: blocking, with a limit on every wait.
class Visitor {
 public:
  explicit Visitor(const std::string& address, std::uint16_t port)
      : socket_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in place{};
    place.sin_family = AF_INET;
    place.sin_port = htons(port);
    inet_pton(AF_INET, address.c_str(), &place.sin_addr);
    EXPECT_EQ(connect(socket_.get(), reinterpret_cast<const sockaddr*>(&place), sizeof place), 0);
  }

  void send(const std::string& bytes) {
    EXPECT_EQ(::send(socket_.get(), bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }
  // So many bytes, or fewer when the server ends the connection.
  std::string read(std::size_t count) {
    while (received_.size() < count && receive()) continue;
    const std::size_t taken = std::min(count, received_.size());
    std::string bytes = received_.substr(0, taken);
    received_.erase(0, taken);
    return bytes;
  }
  std::string read_until(const std::string& end) {
    while (received_.find(end) == std::string::npos && receive()) continue;
    const std::size_t at = received_.find(end);
    return read(at == std::string::npos ? received_.size() : at + end.size());
  }
  std::string read_to_end() {
    while (receive()) continue;
    return std::exchange(received_, {});
  }

 private:
  bool receive() {
    pollfd waiting{socket_.get(), POLLIN, 0};
    if (poll(&waiting, 1, kPatience) != 1) return false;
    char piece[65536];
    const ssize_t count = recv(socket_.get(), piece, sizeof piece, 0);
    if (count > 0) received_.append(piece, static_cast<std::size_t>(count));
    return count > 0;
  }

  UniqueFd socket_;
  std::string received_;
};

// A message of the server's: its kind (1 text, 2 binary) and its bytes. Other frames are passed over.
struct Message {
  int kind = 0;
  std::string bytes;
};

class ServerAtWork : public testing::Test {
 protected:
  void SetUp() override {
    gate_ = &wall_.add("gate");
    yard_ = &wall_.add("the yard");
  }
  void TearDown() override {
    if (thread_.joinable()) {
      ended_ = true;
      thread_.join();
    }
  }

  void start(ServerOptions options = {}) {
    options.address = vexa_test::own_loopback(3);
    options.token = kToken;
    options.names = {"wall.example"};
    options.version = "1.2.3";
    server_ = std::make_unique<Server>(std::move(options), wall_);
    const Result<std::uint16_t> port = server_->open();
    ASSERT_TRUE(port) << port.error().text;
    port_ = *port;
    int ends[2];
    ASSERT_EQ(pipe(ends), 0);
    read_end_ = UniqueFd(ends[0]);
    write_end_ = UniqueFd(ends[1]);
    server_->watch(read_end_.get(), [this] {
      char mark = 0;
      if (read(read_end_.get(), &mark, 1) == 1) task_();
      done_.set_value();
    });
    thread_ = std::thread([this] { server_->run([this] { return ended_.load(); }); });
  }

  // Does something to the wall on the server's thread.
  void on_the_loop(std::function<void()> task) {
    task_ = std::move(task);
    done_ = {};
    std::future<void> done = done_.get_future();
    ASSERT_EQ(write(write_end_.get(), "!", 1), 1);
    done.wait();
  }
  void show(WallCamera& camera, const std::string& picture) {
    on_the_loop([&] {
      timespec now{};
      clock_gettime(CLOCK_MONOTONIC, &now);
      SessionFrame frame;
      frame.data = reinterpret_cast<const unsigned char*>(picture.data());
      frame.length = picture.size();
      frame.arrival = std::int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
      camera.take_frame(frame, true, 1);
    });
  }

  [[nodiscard]] Visitor visit() const { return Visitor(vexa_test::own_loopback(3), port_); }
  static std::string fields() { return "Host: wall.example\r\nAuthorization: Bearer " + kToken + "\r\n"; }
  std::string ask(const std::string& line, const std::string& with) {
    Visitor visitor = visit();
    visitor.send(line + " HTTP/1.1\r\n" + with + "Connection: close\r\n\r\n");
    return visitor.read_to_end();
  }
  std::string get(const std::string& path, const std::string& more = "") { return ask("GET " + path, fields() + more); }
  static std::string status_of(const std::string& answer) { return answer.size() < 12 ? answer : answer.substr(9, 3); }
  static std::string body_of(const std::string& answer) {
    const std::size_t end = answer.find("\r\n\r\n");
    return end == std::string::npos ? "" : answer.substr(end + 4);
  }

  static std::string upgrade(const std::string& with) {
    return "GET /ws HTTP/1.1\r\n" + with +
           "Upgrade: websocket\r\nConnection: Upgrade\r\nSec-WebSocket-Version: 13\r\n"
           "Sec-WebSocket-Key: dGhlIHNhbXBsZSBub25jZQ==\r\n\r\n";
  }
  // A page that has been let in.
  Visitor open_page() {
    Visitor page = visit();
    page.send(upgrade(fields()));
    EXPECT_EQ(page.read_until("\r\n\r\n").substr(0, 12), "HTTP/1.1 101");
    return page;
  }
  // Masked by zeros, as the bytes then stay as they are.
  static void say(Visitor& page, const std::string& text) {
    page.send(std::string("\x81") + static_cast<char>(0x80 | text.size()) + std::string(4, '\0') + text);
  }
  static Message next_message(Visitor& page) {
    for (;;) {
      const std::string head = page.read(2);
      if (head.size() < 2) return {};
      std::size_t length = static_cast<unsigned char>(head[1]) & 0x7FU;
      const std::size_t more = length == 126 ? 2 : length == 127 ? 8 : 0;
      if (more > 0) length = 0;
      for (const char byte : page.read(more)) length = length << 8U | static_cast<unsigned char>(byte);
      Message message{static_cast<unsigned char>(head[0]) & 0x0F, page.read(length)};
      if (message.kind == 1 || message.kind == 2) return message;
    }
  }
  static Message next_picture(Visitor& page) {
    Message message = next_message(page);
    while (message.kind == 1) message = next_message(page);
    return message;
  }

  Wall wall_;
  WallCamera* gate_ = nullptr;
  WallCamera* yard_ = nullptr;
  std::unique_ptr<Server> server_;
  std::uint16_t port_ = 0;
  UniqueFd read_end_;
  UniqueFd write_end_;
  std::function<void()> task_;
  std::promise<void> done_;
  std::atomic<bool> ended_{false};
  std::thread thread_;
};

TEST_F(ServerAtWork, RefusesWithoutTheTokenOnEveryPath) {
  start();
  for (const char* path : {"/metrics", "/wall.js", "/wall.css", "/api/cameras", "/healthz", "/readyz", "/openapi.json",
                           "/cameras/gate/picture.jpg", "/nothing"}) {
    EXPECT_EQ(status_of(ask(std::string("GET ") + path, "Host: wall.example\r\n")), "401") << path;
  }
  Visitor page = visit();
  page.send(upgrade("Host: wall.example\r\n"));
  EXPECT_EQ(status_of(page.read_until("\r\n\r\n")), "401");
}

TEST_F(ServerAtWork, RefusesOtherHostsAndOriginsOnPathsAndOnTheWebSocket) {
  start();
  const std::string token = "Authorization: Bearer " + kToken + "\r\n";
  const struct {
    std::string with;
    const char* status;
  } cases[] = {{token, "400"},
               {token + "Host: wall.example\r\nHost: wall.example\r\n", "400"},
               {token + "Host: evil.example\r\n", "421"},
               {fields() + "Origin: http://evil.example\r\n", "403"},
               {fields() + "Sec-Fetch-Site: cross-site\r\n", "403"}};
  for (const auto& c : cases) {
    for (const char* path : {"/", "/metrics", "/wall.js"}) {
      EXPECT_EQ(status_of(ask(std::string("GET ") + path, c.with)), c.status) << path << " " << c.with;
    }
    Visitor page = visit();
    page.send(upgrade(c.with));
    EXPECT_EQ(status_of(page.read_until("\r\n\r\n")), c.status) << c.with;
  }
}

TEST_F(ServerAtWork, GivesABrowserACookieForTheToken) {
  start();
  const std::string stranger = ask("GET /", "Host: wall.example\r\n");
  EXPECT_EQ(status_of(stranger), "401");
  EXPECT_EQ(body_of(stranger), sign_in_page().text);
  EXPECT_EQ(status_of(ask("GET /sign-in.js", "Host: wall.example\r\n")), "200");
  const std::string json = "Host: wall.example\r\nContent-Type: application/json\r\nX-Vexa-Token: ";
  EXPECT_EQ(status_of(ask("POST /session", json + "wrong\r\n")), "401");
  const std::string traded = ask("POST /session", json + kToken + "\r\n");
  EXPECT_EQ(status_of(traded), "204");
  const std::size_t at = traded.find("Set-Cookie: ") + 12;
  const std::string cookie = traded.substr(at, traded.find(';', at) - at);
  EXPECT_EQ(body_of(ask("GET /", "Host: wall.example\r\nCookie: " + cookie + "\r\n")), find_page_file("/")->text);
}

TEST_F(ServerAtWork, EveryAnswerKeepsPagesOfOthersOut) {
  start();
  for (const char* path : {"/", "/wall.js", "/metrics", "/api/cameras", "/nothing"}) {
    const std::string answer = get(path);
    for (const char* line : {"\r\nCross-Origin-Resource-Policy: same-origin\r\n",
                             "\r\nX-Content-Type-Options: nosniff\r\n", "\r\nReferrer-Policy: no-referrer\r\n",
                             "frame-ancestors 'none'\r\n", "\r\nContent-Security-Policy: default-src 'self'; "}) {
      EXPECT_NE(answer.find(line), std::string::npos) << path << line;
    }
    EXPECT_EQ(answer.find("Access-Control-Allow-Origin"), std::string::npos);
  }
}

TEST_F(ServerAtWork, AnswersWhatItCannotServePlainly) {
  start();
  EXPECT_EQ(status_of(get("/nothing")), "404");
  EXPECT_EQ(status_of(get("/../etc/passwd")), "404");
  EXPECT_EQ(status_of(get("/api/cameras/nobody")), "404");
  EXPECT_EQ(status_of(get("/cameras/gate/secret")), "404");
  EXPECT_EQ(status_of(get("/ws")), "426");
  EXPECT_EQ(status_of(ask("DELETE /api/cameras", fields())), "405");
  EXPECT_EQ(status_of(get("/" + std::string(9000, 'x'))), "431");
  Visitor body = visit();
  body.send("POST /session HTTP/1.1\r\n" + fields() + "Content-Length: 100000\r\n\r\n");
  EXPECT_EQ(status_of(body.read_until("\r\n\r\n")), "413");
  Visitor noise = visit();
  noise.send("\x16\x03\x01 no HTTP at all\r\n\r\n");
  const std::string answer = noise.read_to_end();
  EXPECT_TRUE(answer.empty() || status_of(answer) == "400") << answer;
}

TEST_F(ServerAtWork, AnswersSeveralRequestsOfOneConnection) {
  start();
  Visitor visitor = visit();
  for (int i = 0; i < 3; ++i) {
    visitor.send("HEAD /healthz HTTP/1.1\r\n" + fields() + "\r\n");
    EXPECT_EQ(status_of(visitor.read_until("\r\n\r\n")), "200");
  }
}

TEST_F(ServerAtWork, ReportsItsCamerasAsJsonThatItsDescriptionHas) {
  start();
  const auto described = nlohmann::json::parse(body_of(get("/openapi.json")));
  const auto& schema = described["components"]["schemas"]["Camera"];
  const auto cameras = nlohmann::json::parse(body_of(get("/api/cameras")))["cameras"];
  ASSERT_EQ(cameras.size(), 2U);
  for (const auto& [name, value] : cameras[0].items()) EXPECT_TRUE(schema["properties"].contains(name)) << name;
  for (const auto& name : schema["required"]) EXPECT_TRUE(cameras[0].contains(name.get<std::string>())) << name;
  EXPECT_EQ(nlohmann::json::parse(body_of(get("/api/cameras/the%20yard")))["name"], "the yard");
  for (const auto& [path, methods] : described["paths"].items()) {
    std::string asked = path;
    if (const std::size_t at = asked.find("{name}"); at != std::string::npos) asked.replace(at, 6, "gate");
    if (asked.ends_with(".mjpg")) continue;
    const std::string status = status_of(get(asked));
    EXPECT_TRUE(methods["get"]["responses"].contains(status)) << path << " " << status;
  }
}

TEST_F(ServerAtWork, ReportsMetricsInTheFormatThatIsAskedFor) {
  start();
  const std::string plain = get("/metrics");
  EXPECT_NE(plain.find("Content-Type: text/plain; version=0.0.4; charset=utf-8\r\n"), std::string::npos);
  EXPECT_NE(plain.find("vexa_build_info{version=\"1.2.3\"} 1\n"), std::string::npos);
  const std::string open = get("/metrics", "Accept: application/openmetrics-text; version=1.0.0\r\n");
  EXPECT_NE(open.find("Content-Type: application/openmetrics-text; version=1.0.0"), std::string::npos);
  EXPECT_EQ(open.substr(open.size() - 6), "# EOF\n");
}

TEST_F(ServerAtWork, IsReadyOnceEachCameraHasBeenTried) {
  start();
  EXPECT_EQ(status_of(get("/readyz")), "503");
  on_the_loop([&] {
    SessionStatus status;
    status.state = SessionState::kWaiting;
    gate_->take_status(status);
    yard_->take_status(status);
  });
  EXPECT_EQ(status_of(get("/readyz")), "200");
}

TEST_F(ServerAtWork, GivesTheLatestPictureAndNoneThatIsOld) {
  start();
  EXPECT_EQ(status_of(get("/cameras/gate/picture.jpg")), "503");
  const auto show_at = [&](std::int64_t arrival) {
    on_the_loop([&, arrival] {
      SessionFrame frame;
      frame.data = reinterpret_cast<const unsigned char*>("jpeg");
      frame.length = 4;
      frame.arrival = arrival;
      gate_->take_frame(frame, true, 1);
    });
  };
  constexpr std::int64_t kNeverOld = std::int64_t{1} << 50;
  show_at(-100000);
  EXPECT_EQ(status_of(get("/cameras/gate/picture.jpg")), "503");
  show_at(kNeverOld);
  const std::string answer = get("/cameras/gate/picture.jpg");
  EXPECT_NE(answer.find("Content-Type: image/jpeg\r\n"), std::string::npos);
  EXPECT_EQ(body_of(answer), "jpeg");
}

TEST_F(ServerAtWork, StreamsPicturesAsMultipart) {
  start();
  Visitor stream = visit();
  stream.send("GET /cameras/the%20yard/stream.mjpg HTTP/1.1\r\n" + fields() + "\r\n");
  const std::string head = stream.read_until("--vexa-picture\r\n");
  EXPECT_NE(head.find("multipart/x-mixed-replace; boundary=vexa-picture"), std::string::npos) << head;
  for (const std::string picture : {"first", "second"}) {
    show(*yard_, picture);
    EXPECT_EQ(stream.read_until("--vexa-picture\r\n"),
              fmt::format("Content-Type: image/jpeg\r\nContent-Length: {}\r\n\r\n{}"
                          "\r\n--vexa-picture\r\n",
                          picture.size(), picture));
  }
}

TEST_F(ServerAtWork, SendsAPageStatesAndThePicturesOfTheCamerasInItsView) {
  start();
  Visitor page = open_page();
  const Message states = next_message(page);
  EXPECT_EQ(states.kind, 1);
  EXPECT_EQ(nlohmann::json::parse(states.bytes)["cameras"][1]["name"], "the yard");
  show(*gate_, "of the gate");
  say(page, R"({"watch": [1, 7, -1, "x"]})");
  show(*yard_, "of the yard");
  const Message picture = next_picture(page);
  EXPECT_EQ(picture.kind, 2);
  EXPECT_EQ(picture.bytes.substr(0, 4), std::string("\0\0\0\1", 4));
  EXPECT_EQ(picture.bytes.substr(8), "of the yard");
  say(page, R"({"watch": [0]})");
  EXPECT_EQ(next_picture(page).bytes.substr(8), "of the gate");
}

TEST_F(ServerAtWork, PassesOverWhatAPageCannotMean) {
  start();
  Visitor page = open_page();
  for (const char* text : {"", "{", "[]", "{}", R"({"watch": 5})", "null"}) say(page, text);
  say(page, R"({"watch": [0]})");
  show(*gate_, "still here");
  EXPECT_EQ(next_picture(page).bytes.substr(8), "still here");
}

TEST_F(ServerAtWork, APageThatReadsNothingHoldsUpNoOther) {
  start();
  Visitor slow = open_page();
  Visitor fast = open_page();
  say(slow, R"({"watch": [0]})");
  say(fast, R"({"watch": [0]})");
  const std::string large(8U << 20U, 'x');  // more than the sockets between them hold
  for (int i = 0; i < 3; ++i) {
    show(*gate_, large + std::to_string(i));
    EXPECT_EQ(next_picture(fast).bytes.back(), '0' + i);
  }
}

TEST_F(ServerAtWork, MoreViewersThanItServesAreRefused) {
  ServerOptions options;
  options.most_viewers = 1;
  start(options);
  Visitor page = open_page();
  Visitor second = visit();
  second.send(upgrade(fields()));
  EXPECT_EQ(status_of(second.read_until("\r\n\r\n")), "503");
  EXPECT_EQ(status_of(get("/cameras/gate/stream.mjpg")), "503");
  EXPECT_EQ(status_of(get("/healthz")), "200");
}

TEST_F(ServerAtWork, MoreConnectionsThanItServesAreClosedAndTheOthersGoOn) {
  ServerOptions options;
  options.most_connections = 1;
  start(options);
  Visitor first = visit();
  first.send("GET /healthz HTTP/1.1\r\n" + fields() + "\r\n");
  EXPECT_EQ(status_of(first.read_until("\r\n\r\n")), "200");
  EXPECT_EQ(visit().read_to_end(), "");
  first.read_until("OK\n");
  first.send("GET /healthz HTTP/1.1\r\n" + fields() + "\r\n");
  EXPECT_EQ(status_of(first.read_until("\r\n\r\n")), "200");
}

TEST(ServerStart, APortThatIsTakenIsReported) {
  Wall wall;
  ServerOptions options;
  options.address = vexa_test::own_loopback(3);
  options.token = kToken;
  Server first(options, wall);
  const Result<std::uint16_t> port = first.open();
  ASSERT_TRUE(port);
  options.port = *port;
  Server second(options, wall);
  const Result<std::uint16_t> taken = second.open();
  ASSERT_FALSE(taken);
  EXPECT_EQ(taken.error().text, fmt::format("cannot listen on {}:{}: Address already in use", options.address, *port));
}

TEST(Pages, TakeLessThan150Kilobytes) {
  std::size_t bytes = 0;
  for (const char* path : {"/", "/wall.css", "/wall.js", "/sign-in.js"}) {
    ASSERT_NE(find_page_file(path), nullptr);
    bytes += find_page_file(path)->text.size();
  }
  EXPECT_LT(bytes, 150U * 1024);
}

TEST(Pages, HoldNoScriptAndNoStyleInTheirText) {
  for (const std::string_view text : {find_page_file("/")->text, sign_in_page().text}) {
    EXPECT_EQ(text.find("<style"), std::string_view::npos);
    EXPECT_EQ(text.find(" style="), std::string_view::npos);
    EXPECT_EQ(text.find("onclick"), std::string_view::npos);
    EXPECT_EQ(text.find("<script>"), std::string_view::npos);
  }
}

}  // namespace
}  // namespace vexa::host
