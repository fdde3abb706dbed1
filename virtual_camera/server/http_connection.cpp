#include "virtual_camera/server/http_connection.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <fstream>
#include <iterator>
#include <system_error>
#include <utility>

#include "virtual_camera/card/card_cgi.h"
#include "virtual_camera/source/stream_plan.h"
#include "virtual_camera/wire/credentials.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {
namespace {

using StreamClock = std::chrono::steady_clock;

// A stream that its peer has held up this long goes on from here instead of sending the backlog.
constexpr std::chrono::seconds kHeldUp{1};
constexpr std::size_t kSoundPieces = 50;  // a second
constexpr std::string_view kImageStem = "/image";

// The number in "/imageN"; nothing for another path.
std::optional<int> image_number(std::string_view path) {
  if (!path.starts_with(kImageStem)) return std::nullopt;
  path.remove_prefix(kImageStem.size());
  int number = 0;
  const auto [end, error] = std::from_chars(path.data(), path.data() + path.size(), number);
  const bool whole = error == std::errc() && end == path.data() + path.size() && path.front() != '-';
  return whole ? std::optional(number) : std::nullopt;
}

std::string contents_of(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

// "interval=SECONDS"; a second where it is not named.
std::chrono::duration<double> interval_of(std::string_view query) {
  constexpr std::string_view kKey = "interval=";
  constexpr int kLongest = 3600;
  int seconds = 1;
  if (query.starts_with(kKey)) {
    query.remove_prefix(kKey.size());
    std::from_chars(query.data(), query.data() + query.size(), seconds);
  }
  return std::chrono::seconds(std::clamp(seconds, 1, kLongest));
}

}  // namespace

HttpConnection::HttpConnection(asio::ip::tcp::socket socket, std::shared_ptr<CameraState> state)
    : Connection(std::move(socket), std::move(state)), next_part_(this->state().context) {}

std::size_t HttpConnection::request_size(std::string_view received) const { return head_size(received); }

Answer HttpConnection::answer(const std::string& request) {
  const std::optional<RequestHead> head = parse_head(request);
  if (!head) return http_answer("400 Bad Request", "");
  const CameraOptions& options = state().options;
  if (!credentials_match(head->field("Authorization"), options.user, options.password)) {
    return http_answer("401 Unauthorized", "");
  }
  stream_ = open_stream(head->path);
  if (stream_) return {200, stream_->head()};
  if (std::optional<Answer> feed = open_feed(*head)) return *feed;
  return command(*head);
}

Answer HttpConnection::command(const RequestHead& head) {
  if (head.query == "inq=sensor") state().report_contacts();
  if (head.query == "inq=a-slot") state().report_card();
  if (state().settings.answer("a-slot")) {
    if (std::optional<Answer> answer = answer_card(head, state().card)) return *std::move(answer);
  }
  if (head.query == "inq=presetposition" && state().ptz) state().report_presets();
  if (const std::optional<bool> moved = state().ptz ? move(head) : std::nullopt) {
    return *moved ? no_content() : http_answer("400 Bad Request", "");
  }
  Answer answer = answer_command(head, state().settings);
  if (answer.status != 204) return answer;
  if (state().settings_changed) state().settings_changed();
  state().switch_detectors();
  if (head.path == "/command/system.cgi" && head.query == "TamperingStatusClear=on") state().alarms.clear_tampering();
  return answer;
}

// Whether the head obeys; nothing for a request that is not for it.
std::optional<bool> HttpConnection::move(const RequestHead& head) {
  const bool moves = head.path == "/command/ptzf.cgi";
  if (head.method != "GET" || (!moves && head.path != "/command/presetposition.cgi")) return std::nullopt;
  PtzHead& ptz = *state().ptz;
  const PtzHead::Pairs commands = query_pairs(head.query);
  if (moves) return ptz.move(commands, state().ptz_picture(), StreamClock::now());
  return ptz.command_presets(commands, StreamClock::now());
}

// Nothing for a path that names no feed, or one that the model lacks.
std::optional<Answer> HttpConnection::open_feed(const RequestHead& head) {
  if (head.path == "/command/alarmdata.cgi") feed_ = Feed::kAlarms;
  if (head.path == "/mddata.cgi") feed_ = Feed::kMetadata;
  if (feed_ == Feed::kNone) return std::nullopt;
  interval_ = std::chrono::duration_cast<StreamClock::duration>(interval_of(head.query) / state().options.speed);
  state().switch_detectors();
  return Answer{200, "HTTP/1.0 200 OK\r\nContent-Type: multipart/x-mixed-replace;boundary=alarm\r\n\r\n"};
}

void HttpConnection::take_alarm(const std::string& part) {
  if (feed_ != Feed::kAlarms) return;
  parts_.push_back(part);
  next_part_.cancel();
}

void HttpConnection::stream_feed() {
  if (!parts_.empty()) {
    std::string part = std::move(parts_.front());
    parts_.pop_front();
    return send_part(std::move(part));
  }
  if (std::exchange(part_due_, false)) {
    return send_part(feed_ == Feed::kAlarms ? state().alarm_part : state().alarms.metadata_part());
  }
  next_part_.expires_after(interval_);
  next_part_.async_wait([self = shared_from_this(), this](asio::error_code stopped) {
    if (feed_ == Feed::kNone) return;
    part_due_ = !stopped;
    stream_feed();
  });
}

void HttpConnection::send_part(std::string part) {
  send_at(StreamClock::now(), [part = std::move(part)] { return part; });
}

void HttpConnection::ended() {
  feed_ = Feed::kNone;
  next_part_.cancel();
  stream_.reset();
}

// Nothing for a path that names no stream, or one that the camera has nothing for.
std::optional<HttpStream> HttpConnection::open_stream(const std::string& path) const {
  if (const std::optional<int> number = image_number(path)) return open_images(*number);
  return path == "/audio" ? open_sound() : std::nullopt;
}

HttpStreamOptions HttpConnection::stream_options() const {
  const CameraOptions& options = state().options;
  HttpStreamOptions stream;
  stream.loop = options.loop;
  stream.units = options.pictures;
  stream.piece = options.stream_piece;
  stream.faults = options.stream_faults;
  stream.speed = options.speed;
  return stream;
}

std::optional<HttpStream> HttpConnection::open_images(int number) const {
  std::unique_ptr<PictureSource> source = plan_images(state(), number);
  if (!source) return std::nullopt;
  HttpStreamOptions stream = stream_options();
  stream.user_data = [camera = shared_state()] { return present_user_data(*camera); };
  return HttpStream(std::move(source), std::move(stream));
}

std::optional<HttpStream> HttpConnection::open_sound() const {
  const CameraOptions& options = state().options;
  if (options.sound_path.empty()) return std::nullopt;
  const std::string codec = state().settings.get("camera", "AudInCodec").value_or("g711_64");
  const std::size_t unit = sound_rate(codec) / kSoundPieces;
  std::string sound = contents_of(options.sound_path + "." + codec);
  if (unit == 0 || sound.size() < unit) return std::nullopt;
  HttpStreamOptions stream = stream_options();
  stream.units_per_second = static_cast<double>(kSoundPieces) * options.speed;
  return HttpStream(std::move(sound), unit, std::move(stream));
}

Connection::Next HttpConnection::answered() {
  if (feed_ != Feed::kNone) return Next::kStream;
  if (!stream_) return Next::kCloseConnection;
  stream_began_ = StreamClock::now();
  return Next::kStream;
}

void HttpConnection::stream() {
  if (feed_ != Feed::kNone) return stream_feed();
  const std::optional<std::chrono::nanoseconds> due = stream_->next_due();
  if (!due) {
    if (stream_->waits()) return wait_for_picture();
    if (stream_->closes()) finish_stream();
    return;
  }
  const StreamClock::duration late = StreamClock::now() - (stream_began_ + *due);
  if (late > kHeldUp) stream_began_ += late;
  send_at(stream_began_ + *due, [this] { return stream_->take(); });
}

void HttpConnection::wait_for_picture() {
  stream_->wait([weak = weak_from_this(), &context = state().context, this] {
    asio::post(context, [weak, this] {
      const std::shared_ptr<Connection> self = weak.lock();
      if (self && stream_) stream();
    });
  });
}

Answer HttpConnection::refuse(const std::string&, std::string_view status) const { return http_answer(status, ""); }

}  // namespace vexa::camera
