// SPDX-License-Identifier: Apache-2.0
// The one file that sees Boost: its templates take longer to compile than the rest of the program.
#include "host/serve/server.h"

#include <fmt/format.h>
#include <time.h>

#include <algorithm>
#include <array>
#include <boost/asio/io_context.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <boost/asio/posix/stream_descriptor.hpp>
#include <boost/asio/post.hpp>
#include <boost/asio/steady_timer.hpp>
#include <boost/asio/write.hpp>
#include <boost/beast/core/flat_buffer.hpp>
#include <boost/beast/core/tcp_stream.hpp>
#include <boost/beast/http.hpp>
#include <boost/beast/websocket.hpp>
#include <chrono>
#include <map>
#include <nlohmann/json.hpp>
#include <utility>

#include "host/serve/gate.h"
#include "host/serve/pages.h"

namespace vexa::host {
namespace {

namespace asio = boost::asio;
namespace beast = boost::beast;
namespace http = boost::beast::http;
namespace websocket = boost::beast::websocket;
using tcp = asio::ip::tcp;
using boost::system::error_code;
using Asked = http::request<http::string_body>;
using Answer = http::response<http::string_body>;

constexpr std::uint32_t kLongestHead = 8192;
constexpr std::uint64_t kLongestBody = 4096;
constexpr std::size_t kLongestMessage = 65536;    // of a page
constexpr std::chrono::milliseconds kTick{200};   // at most five pictures a second
constexpr int kTicksOfStates = 5;                 // states once a second
constexpr std::chrono::seconds kRequestTime{10};  // for a request, an answer, or the next picture to leave
constexpr std::size_t kMostWatched = 1000;        // of one page
constexpr std::uint32_t kOfVideo = 0x80000000U;   // a message of H.264, not of a picture in JPEG
constexpr std::string_view kBoundary = "vexa-picture";

std::int64_t monotonic_now() {
  timespec now{};
  clock_gettime(CLOCK_MONOTONIC, &now);
  return std::int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
}

std::string_view view_of(beast::string_view text) { return {text.data(), text.size()}; }
std::string_view field(const Asked& asked, beast::string_view name) { return view_of(asked[name]); }

std::string_view path_of(const Asked& asked) {
  const std::string_view target = view_of(asked.target());
  return target.substr(0, target.find('?'));
}

Visitor visitor_of(const Asked& asked) {
  // Of two hosts neither counts.
  const std::string_view host = asked.count("Host") == 1 ? field(asked, "Host") : std::string_view();
  return {view_of(asked.method_string()),
          path_of(asked),
          host,
          field(asked, "Origin"),
          field(asked, "Sec-Fetch-Site"),
          field(asked, "Cookie"),
          field(asked, "Authorization"),
          field(asked, "X-Vexa-Token"),
          field(asked, "Content-Type")};
}

template <typename Body>
void add_defences(http::response<Body>& answer) {
  answer.set("Cache-Control", "no-store");
  answer.set("X-Content-Type-Options", "nosniff");
  answer.set("Referrer-Policy", "no-referrer");
  answer.set("Cross-Origin-Resource-Policy", "same-origin");
  answer.set("Content-Security-Policy",
             "default-src 'self'; media-src 'self' blob:; img-src 'self' blob: data:; frame-ancestors 'none'");
}

Answer make_answer(const Asked& asked, http::status status, std::string_view type, std::string_view body) {
  Answer answer{status, asked.version()};
  add_defences(answer);
  if (!type.empty()) answer.set(http::field::content_type, beast::string_view(type.data(), type.size()));
  answer.keep_alive(asked.keep_alive());
  answer.body().assign(body);
  answer.content_length(body.size());
  if (asked.method() == http::verb::head) answer.body().clear();
  return answer;
}

Answer make_plain(const Asked& asked, http::status status) {
  const std::string text = fmt::format("{}\n", view_of(http::obsolete_reason(status)));
  return make_answer(asked, status, "text/plain; charset=utf-8", text);
}

http::status status_of(Admission admission) {
  switch (admission) {
    case Admission::kBadRequest:
      return http::status::bad_request;
    case Admission::kMisdirected:
      return http::status::misdirected_request;
    case Admission::kForbidden:
      return http::status::forbidden;
    case Admission::kUnauthorized:
    case Admission::kSignIn:
      return http::status::unauthorized;
    case Admission::kEnter:
    case Admission::kTrade:
      break;
  }
  return http::status::ok;
}

// "/cameras/NAME/picture.jpg": the name, percent-decoded, and what follows it.
struct CameraPath {
  std::string name;
  std::string_view rest;
};

int hex_digit(char c) {
  if (c >= '0' && c <= '9') return c - '0';
  const char small = static_cast<char>(c | 0x20);
  return small >= 'a' && small <= 'f' ? small - 'a' + 10 : -1;
}

std::string decoded(std::string_view text) {
  std::string bytes;
  for (std::size_t i = 0; i < text.size(); ++i) {
    const int high = text[i] == '%' && i + 2 < text.size() ? hex_digit(text[i + 1]) : -1;
    const int low = high >= 0 ? hex_digit(text[i + 2]) : -1;
    bytes += low < 0 ? text[i] : static_cast<char>(high * 16 + low);
    if (low >= 0) i += 2;
  }
  return bytes;
}

CameraPath camera_path(std::string_view path, std::string_view folder) {
  if (!path.starts_with(folder)) return {};
  path.remove_prefix(folder.size());
  const std::size_t slash = std::min(path.find('/'), path.size());
  return {decoded(path.substr(0, slash)), path.substr(slash)};
}

// What all connections share. On the loop's thread.
struct Shared {
  Shared(const ServerOptions& given, const Wall& cameras) : options(given), wall(cameras) {}

  const ServerOptions& options;
  const Wall& wall;
  std::unique_ptr<Gate> gate;  // once the port is known
  ServeCounts counts;
  std::size_t connections = 0;
  std::function<void(std::size_t, bool)> want_video;
  std::map<std::size_t, std::size_t> video_viewers;
};

// A viewer of a camera's H.264, as long as it lives.
class VideoClaim {
 public:
  VideoClaim(Shared& shared, std::size_t camera) : shared_(shared), camera_(camera) {
    if (++shared_.video_viewers[camera_] == 1 && shared_.want_video) shared_.want_video(camera_, true);
  }
  ~VideoClaim() {
    shared_.counts.fragments_missed += place_.missed;
    if (--shared_.video_viewers[camera_] == 0 && shared_.want_video) shared_.want_video(camera_, false);
  }
  VideoClaim(const VideoClaim&) = delete;
  VideoClaim& operator=(const VideoClaim&) = delete;

  [[nodiscard]] std::size_t camera() const { return camera_; }
  std::optional<VideoFeed::Piece> next() {
    auto piece = shared_.wall.camera(camera_).video().next(place_);
    if (piece) ++shared_.counts.fragments_sent;
    shared_.counts.fragments_missed += std::exchange(place_.missed, 0);
    return piece;
  }

 private:
  Shared& shared_;
  const std::size_t camera_;
  VideoFeed::Place place_;
};

// Something that a tick may move on: a page's socket, or a stream of pictures.
class Viewer {
 public:
  explicit Viewer(Shared& shared) : shared_(shared) { ++shared_.counts.viewers; }
  virtual ~Viewer() { --shared_.counts.viewers; }
  Viewer(const Viewer&) = delete;
  Viewer& operator=(const Viewer&) = delete;
  virtual void tick() = 0;   // five times a second
  virtual void advance() {}  // cameras may have sent something

 protected:
  Shared& shared_;
};

using Viewers = std::vector<std::weak_ptr<Viewer>>;

// Counts a connection as long as it lives, whichever of the classes below has its socket.
class Seat {
 public:
  explicit Seat(Shared& shared) : shared_(&shared) {
    ++shared.connections;
    ++shared.counts.connections;
  }
  Seat(Seat&& other) noexcept : shared_(std::exchange(other.shared_, nullptr)) {}
  Seat& operator=(Seat&&) = delete;
  ~Seat() {
    if (shared_ != nullptr) --shared_->connections;
  }

 private:
  Shared* shared_;
};

// One page: states once a second, and pictures of the cameras in its view, one on its way at a time.
class PageSocket final : public Viewer, public std::enable_shared_from_this<PageSocket> {
 public:
  PageSocket(beast::tcp_stream stream, Seat seat, Shared& shared)
      : Viewer(shared), seat_(std::move(seat)), socket_(std::move(stream)) {}

  void accept(const Asked& asked) {
    auto patience = websocket::stream_base::timeout::suggested(beast::role_type::server);
    patience.idle_timeout = std::chrono::seconds(30);
    patience.keep_alive_pings = true;
    beast::get_lowest_layer(socket_).expires_never();
    socket_.set_option(patience);
    socket_.read_message_max(kLongestMessage);
    socket_.auto_fragment(false);  // a picture is one frame
    socket_.async_accept(asked, [self = shared_from_this()](error_code error) {
      if (error) return;
      self->open_ = true;
      self->read();
      self->tick();
    });
  }

  void tick() override {
    if (!open_ || writing_) return;
    if (--ticks_to_states_ <= 0) {
      ticks_to_states_ = kTicksOfStates;
      message_ = shared_.wall.states(monotonic_now());
      socket_.text(true);
      return write();
    }
    send_something();
  }

  void advance() override {
    if (open_ && !writing_) send_video();
  }

 private:
  void send_something() {
    send_video();
    if (!writing_) send_picture();
  }

  void read() {
    socket_.async_read(received_, [self = shared_from_this()](error_code error, std::size_t) {
      if (error) return;
      self->take_message();
      self->received_.consume(self->received_.size());
      self->read();
    });
  }

  // {"watch": [0, 3]} and {"video": 3}, or null for none; anything else is passed over.
  void take_message() {
    const auto data = received_.cdata();
    const std::string_view text(static_cast<const char*>(data.data()), data.size());
    const auto message = nlohmann::json::parse(text, nullptr, false);
    if (!message.is_object()) return;
    if (const auto watched = message.find("watch"); watched != message.end()) take_watched(*watched);
    if (const auto video = message.find("video"); video != message.end()) take_video(*video);
  }

  [[nodiscard]] bool is_camera(const nlohmann::json& index) const {
    return index.is_number_unsigned() && index.get<std::uint64_t>() < shared_.wall.size();
  }

  void take_watched(const nlohmann::json& watched) {
    if (!watched.is_array()) return;
    std::map<std::size_t, std::uint64_t> wanted;
    for (const auto& index : watched) {
      if (!is_camera(index) || wanted.size() >= kMostWatched) continue;
      const auto camera = index.get<std::size_t>();
      const auto had = sent_.find(camera);
      wanted[camera] = had == sent_.end() ? 0 : had->second;
    }
    sent_ = std::move(wanted);
  }

  // The same camera again begins it anew.
  void take_video(const nlohmann::json& index) {
    video_.reset();
    rest_.reset();
    if (is_camera(index)) video_ = std::make_unique<VideoClaim>(shared_, index.get<std::size_t>());
    advance();
  }

  // An initialisation segment follows a text that names its codec.
  void send_video() {
    if (!video_) return;
    auto piece = rest_ ? std::exchange(rest_, std::nullopt) : video_->next();
    if (!piece) return;
    if (!piece->codec.empty()) {
      message_ = nlohmann::json{{"video", {{"camera", video_->camera()}, {"codec", piece->codec}}}}.dump();
      piece->codec.clear();
      rest_ = std::move(piece);
      socket_.text(true);
      return write();
    }
    write_bytes(kOfVideo | static_cast<std::uint32_t>(video_->camera()), monotonic_now() - piece->arrival,
                *piece->bytes);
  }

  // The next camera, in turn, whose picture the page does not have.
  void send_picture() {
    if (sent_.empty()) return;
    auto at = sent_.upper_bound(latest_sent_);
    for (std::size_t tried = 0; tried < sent_.size(); ++tried, ++at) {
      if (at == sent_.end()) at = sent_.begin();
      const WallCamera& camera = shared_.wall.camera(at->first);
      if (!camera.picture() || at->second == camera.picture_number()) continue;
      at->second = camera.picture_number();
      latest_sent_ = at->first;
      return write_picture(at->first, camera);
    }
  }

  void write_picture(std::size_t index, const WallCamera& camera) {
    ++shared_.counts.pictures_sent;
    ++burst_;
    write_bytes(static_cast<std::uint32_t>(index), camera.age(monotonic_now()).value_or(0), *camera.picture());
  }

  void write_bytes(std::uint32_t what, std::int64_t age, const std::string& bytes) {
    message_.clear();
    for (const std::uint32_t number : {what, static_cast<std::uint32_t>(std::clamp<std::int64_t>(age, 0, 1 << 30))}) {
      for (const unsigned shift : {24U, 16U, 8U, 0U}) message_ += static_cast<char>((number >> shift) & 0xFFU);
    }
    message_ += bytes;
    socket_.binary(true);
    write();
  }

  void write() {
    writing_ = true;
    socket_.async_write(asio::buffer(message_), [self = shared_from_this()](error_code error, std::size_t) {
      self->writing_ = false;
      if (error) return beast::get_lowest_layer(self->socket_).close();
      self->send_video();
      // All cameras of the page have their turn within one tick where the viewer takes them fast enough.
      if (!self->writing_ && self->burst_ < self->sent_.size()) self->send_picture();
      if (!self->writing_) self->burst_ = 0;
    });
  }

  Seat seat_;
  websocket::stream<beast::tcp_stream> socket_;
  beast::flat_buffer received_{kLongestMessage};
  std::map<std::size_t, std::uint64_t> sent_;  // camera in view: the picture that the page has of it
  std::size_t latest_sent_ = 0;
  std::size_t burst_ = 0;  // pictures since the latest tick
  std::string message_;
  std::unique_ptr<VideoClaim> video_;
  std::optional<VideoFeed::Piece> rest_;  // follows the text that is on its way
  int ticks_to_states_ = 0;
  bool open_ = false;
  bool writing_ = false;
};

// An answer without an end: for programs and embedding.
class OpenAnswer : public Viewer, public std::enable_shared_from_this<OpenAnswer> {
 public:
  OpenAnswer(beast::tcp_stream stream, Seat seat, Shared& shared)
      : Viewer(shared), seat_(std::move(seat)), stream_(std::move(stream)) {}

  void begin(const std::string& type, std::string_view first) {
    http::response<http::empty_body> head{http::status::ok, 10};
    add_defences(head);
    head.set(http::field::content_type, type);
    std::string text = "HTTP/1.0 200 OK\r\n";
    for (const auto& each : head.base()) {
      text += fmt::format("{}: {}\r\n", view_of(each.name_string()), view_of(each.value()));
    }
    write(fmt::format("{}\r\n{}", text, first));
  }

 protected:
  [[nodiscard]] bool writing() const { return writing_; }

  void write(std::string message) {
    message_ = std::move(message);
    writing_ = true;
    stream_.expires_after(kRequestTime);
    asio::async_write(stream_, asio::buffer(message_), [self = shared_from_this()](error_code error, std::size_t) {
      self->writing_ = false;
      if (error) return self->stream_.close();
      self->wait_for_peer();
      self->advance();
    });
  }

 private:
  // Nothing is expected of the peer but its end, which also lets go of this.
  void wait_for_peer() {
    if (std::exchange(waiting_, true)) return;
    stream_.expires_never();
    stream_.async_read_some(asio::buffer(unread_),
                            [self = shared_from_this()](error_code, std::size_t) { self->stream_.close(); });
  }

  Seat seat_;
  beast::tcp_stream stream_;
  std::string message_;
  std::array<char, 1> unread_{};
  bool writing_ = false;
  bool waiting_ = false;
};

// Multipart JPEG.
class PictureStream final : public OpenAnswer {
 public:
  PictureStream(beast::tcp_stream stream, Seat seat, Shared& shared, std::size_t camera)
      : OpenAnswer(std::move(stream), std::move(seat), shared), camera_(shared.wall.camera(camera)) {}

  void begin() {
    OpenAnswer::begin(fmt::format("multipart/x-mixed-replace; boundary={}", kBoundary),
                      fmt::format("--{}\r\n", kBoundary));
  }

  void tick() override {
    if (writing() || !camera_.picture() || sent_ == camera_.picture_number()) return;
    sent_ = camera_.picture_number();
    const std::string& picture = *camera_.picture();
    ++shared_.counts.pictures_sent;
    write(fmt::format("Content-Type: image/jpeg\r\nContent-Length: {}\r\n\r\n{}\r\n--{}\r\n", picture.size(), picture,
                      kBoundary));
  }

 private:
  const WallCamera& camera_;
  std::uint64_t sent_ = 0;
};

// Fragmented MP4, until the parameter sets change.
class VideoStream final : public OpenAnswer {
 public:
  VideoStream(beast::tcp_stream stream, Seat seat, Shared& shared, std::size_t camera)
      : OpenAnswer(std::move(stream), std::move(seat), shared), video_(shared, camera) {}

  void begin() { OpenAnswer::begin("video/mp4", {}); }
  void tick() override { advance(); }
  void advance() override {
    if (writing()) return;
    if (const auto piece = video_.next()) write(*piece->bytes);
  }

 private:
  VideoClaim video_;
};

// One connection, request after request, until it becomes a viewer's.
class Visit : public std::enable_shared_from_this<Visit> {
 public:
  Visit(tcp::socket socket, Shared& shared, Viewers& viewers)
      : seat_(shared), stream_(std::move(socket)), shared_(shared), viewers_(viewers) {}

  void read() {
    parser_.emplace();
    parser_->header_limit(kLongestHead);
    parser_->body_limit(kLongestBody);
    stream_.expires_after(kRequestTime);
    http::async_read(stream_, buffer_, *parser_, [self = shared_from_this()](error_code error, std::size_t) {
      if (!error) return self->take(self->parser_->release());
      if (error == http::error::end_of_stream || error == beast::error::timeout) return self->stream_.close();
      self->refuse(error);
    });
  }

 private:
  // Of a request that cannot be read: too long, or no HTTP.
  void refuse(error_code error) {
    const bool head = error == http::error::header_limit;
    const bool body = error == http::error::body_limit;
    if (!head && !body && error.category() != http::make_error_code(http::error::bad_version).category()) {
      return stream_.close();
    }
    ++shared_.counts.refused;
    Asked asked;
    asked.version(11);
    asked.keep_alive(false);
    answer(make_plain(asked, head   ? http::status::request_header_fields_too_large
                             : body ? http::status::payload_too_large
                                    : http::status::bad_request));
  }

  void take(Asked asked) {
    const Admission admission = shared_.gate->admit(visitor_of(asked));
    if (admission == Admission::kEnter) return route(asked);
    if (admission == Admission::kTrade) {
      Answer traded = make_answer(asked, http::status::no_content, {}, {});
      traded.set(http::field::set_cookie, shared_.gate->cookie_field());
      return answer(std::move(traded));
    }
    if (admission == Admission::kSignIn) {
      const bool page = path_of(asked) == "/";
      const PageFile& file = page ? sign_in_page() : *find_page_file("/sign-in.js");
      const http::status status = page ? http::status::unauthorized : http::status::ok;
      return answer(make_answer(asked, status, fmt::format("{}; charset=utf-8", file.type), file.text));
    }
    ++shared_.counts.refused;
    answer(make_plain(asked, status_of(admission)));
  }

  void route(const Asked& asked) {
    const std::string_view path = path_of(asked);
    if (asked.method() != http::verb::get && asked.method() != http::verb::head) {
      Answer refused = make_plain(asked, http::status::method_not_allowed);
      refused.set(http::field::allow, "GET, HEAD");
      return answer(std::move(refused));
    }
    const std::int64_t now = monotonic_now();
    const Wall& wall = shared_.wall;
    if (path == "/ws") return open_page_socket(asked);
    if (const PageFile* file = find_page_file(path)) {
      return answer(make_answer(asked, http::status::ok, fmt::format("{}; charset=utf-8", file->type), file->text));
    }
    if (path == "/healthz") return answer(make_plain(asked, http::status::ok));
    if (path == "/readyz") {
      return answer(make_plain(asked, wall.ready() ? http::status::ok : http::status::service_unavailable));
    }
    if (path == "/metrics") {
      const auto format = metrics_format(field(asked, "Accept"));
      return answer(make_answer(asked, http::status::ok, metrics_type(format),
                                wall.metrics(format, shared_.counts, shared_.options.version)));
    }
    if (path == "/api/cameras")
      return answer(make_answer(asked, http::status::ok, "application/json", wall.states(now)));
    route_to_camera(asked, path, now);
  }

  void route_to_camera(const Asked& asked, std::string_view path, std::int64_t now) {
    const CameraPath state = camera_path(path, "/api/cameras/");
    const CameraPath pictures = camera_path(path, "/cameras/");
    const auto found = shared_.wall.find(state.name.empty() ? pictures.name : state.name);
    if (!found) return answer(make_plain(asked, http::status::not_found));
    const WallCamera* const camera = &shared_.wall.camera(*found);
    if (!state.name.empty() && state.rest.empty()) {
      return answer(make_answer(asked, http::status::ok, "application/json", Wall::state_of(*camera, now)));
    }
    if (pictures.rest == "/picture.jpg") {
      // A picture that is old is not shown as the present one.
      const bool live = camera->picture() && !camera->stale(now);
      if (!live) return answer(make_plain(asked, http::status::service_unavailable));
      return answer(make_answer(asked, http::status::ok, "image/jpeg", *camera->picture()));
    }
    if (pictures.rest == "/stream.mjpg") return open_stream<PictureStream>(asked, *found);
    if (pictures.rest == "/video.mp4") return open_stream<VideoStream>(asked, *found);
    answer(make_plain(asked, http::status::not_found));
  }

  [[nodiscard]] bool full() const { return shared_.counts.viewers >= shared_.options.most_viewers; }

  void open_page_socket(const Asked& asked) {
    if (!websocket::is_upgrade(asked)) return answer(make_plain(asked, http::status::upgrade_required));
    if (full()) return answer(make_plain(asked, http::status::service_unavailable));
    const auto page = std::make_shared<PageSocket>(std::move(stream_), std::move(seat_), shared_);
    viewers_.push_back(page);
    page->accept(asked);
  }

  template <typename Stream>
  void open_stream(const Asked& asked, std::size_t camera) {
    if (full()) return answer(make_plain(asked, http::status::service_unavailable));
    const auto stream = std::make_shared<Stream>(std::move(stream_), std::move(seat_), shared_, camera);
    viewers_.push_back(stream);
    stream->begin();
  }

  void answer(Answer made) {
    answer_.emplace(std::move(made));
    stream_.expires_after(kRequestTime);
    http::async_write(stream_, *answer_, [self = shared_from_this()](error_code error, std::size_t) {
      if (error || self->answer_->need_eof() || !self->answer_->keep_alive()) return self->close();
      self->read();
    });
  }

  void close() {
    error_code ignored;
    stream_.socket().shutdown(tcp::socket::shutdown_send, ignored);
  }

  Seat seat_;
  beast::tcp_stream stream_;
  Shared& shared_;
  Viewers& viewers_;
  beast::flat_buffer buffer_{kLongestHead + kLongestBody};
  std::optional<http::request_parser<http::string_body>> parser_;
  std::optional<Answer> answer_;
};

}  // namespace

class Server::Impl {
 public:
  Impl(ServerOptions options, const Wall& wall)
      : options_(std::move(options)), shared_(options_, wall), acceptor_(context_), timer_(context_), pause_(context_) {
    shared_.want_video = options_.want_video;
  }
  // What the callback reaches may be gone before the viewers are.
  ~Impl() { shared_.want_video = nullptr; }
  Impl(const Impl&) = delete;
  Impl& operator=(const Impl&) = delete;

  Result<std::uint16_t> open() {
    error_code error;
    const auto address = asio::ip::make_address(options_.address, error);
    const tcp::endpoint place(address, options_.port);
    if (!error) acceptor_.open(place.protocol(), error);
    if (!error) acceptor_.set_option(asio::socket_base::reuse_address(true), error);
    if (!error) acceptor_.bind(place, error);
    if (!error) acceptor_.listen(asio::socket_base::max_listen_connections, error);
    const std::uint16_t port = error ? options_.port : acceptor_.local_endpoint(error).port();
    if (error) {
      return fail(Problem{ExitCode::kCannotWrite,
                          fmt::format("cannot listen on {}:{}: {}", options_.address, port, error.message()),
                          "Give another --address or --port; 0 takes any free one."});
    }
    const std::string cookie = random_token();
    if (cookie.empty()) {
      return fail(Problem{ExitCode::kCannotWrite, "the system gives no random numbers", "Try again."});
    }
    std::vector<std::string> names = options_.names;
    names.push_back(fmt::format("{}:{}", options_.address, port));
    shared_.gate = std::make_unique<Gate>(port, std::move(names), options_.token, cookie);
    accept();
    return port;
  }

  void watch(int descriptor, std::function<void()> ready) {
    watched_.push_back(std::make_unique<Watched>(context_, descriptor, std::move(ready)));
    await(*watched_.back());
  }

  void run(const std::function<bool()>& ended) {
    ended_ = ended;
    tick();
    context_.run();
  }

  void stop() {
    asio::post(context_, [this] { context_.stop(); });
  }

 private:
  // A descriptor of another's, which stays open.
  struct Watched {
    Watched(asio::io_context& context, int number, std::function<void()> call)
        : descriptor(context, number), ready(std::move(call)) {}
    ~Watched() { descriptor.release(); }
    Watched(const Watched&) = delete;
    Watched& operator=(const Watched&) = delete;
    asio::posix::stream_descriptor descriptor;
    std::function<void()> ready;
  };

  void await(Watched& watched) {
    watched.descriptor.async_wait(asio::posix::stream_descriptor::wait_read, [this, &watched](error_code error) {
      if (error) return;
      watched.ready();
      for_each_viewer(&Viewer::advance);
      await(watched);
    });
  }

  void accept() {
    acceptor_.async_accept([this](error_code error, tcp::socket socket) {
      if (!acceptor_.is_open()) return;
      if (!error && shared_.connections < options_.most_connections) {
        std::make_shared<Visit>(std::move(socket), shared_, viewers_)->read();
      }
      if (!error) return accept();
      // Out of descriptors: those who wait keep their place.
      pause_.expires_after(kTick);
      pause_.async_wait([this](error_code stopped) {
        if (!stopped) accept();
      });
    });
  }

  void for_each_viewer(void (Viewer::*step)()) {
    for (const auto& weak : Viewers(viewers_)) {
      if (const auto viewer = weak.lock()) (viewer.get()->*step)();
    }
  }

  void tick() {
    if (ended_ && ended_()) return context_.stop();
    std::erase_if(viewers_, [](const std::weak_ptr<Viewer>& viewer) { return viewer.expired(); });
    for_each_viewer(&Viewer::tick);
    timer_.expires_after(kTick);
    timer_.async_wait([this](error_code error) {
      if (!error) tick();
    });
  }

  const ServerOptions options_;
  // The context's handlers hold the connections, and these what they share: it goes last.
  Shared shared_;
  Viewers viewers_;
  std::function<bool()> ended_;
  asio::io_context context_{1};
  tcp::acceptor acceptor_;
  asio::steady_timer timer_;
  asio::steady_timer pause_;
  std::vector<std::unique_ptr<Watched>> watched_;
};

Server::Server(ServerOptions options, const Wall& wall) : impl_(std::make_unique<Impl>(std::move(options), wall)) {}
Server::~Server() = default;
Result<std::uint16_t> Server::open() { return impl_->open(); }
void Server::watch(int descriptor, std::function<void()> ready) { impl_->watch(descriptor, std::move(ready)); }
void Server::run(const std::function<bool()>& ended) { impl_->run(ended); }
void Server::stop() { impl_->stop(); }

}  // namespace vexa::host
