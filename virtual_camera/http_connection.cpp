#include "virtual_camera/http_connection.h"

#include <algorithm>
#include <cmath>
#include <fstream>
#include <iterator>
#include <utility>

#include "virtual_camera/credentials.h"
#include "virtual_camera/message.h"

namespace vexa::camera {
namespace {

using StreamClock = std::chrono::steady_clock;

// A stream that its peer has held up this long goes on from here instead of sending the backlog.
constexpr std::chrono::seconds kHeldUp{1};
constexpr std::size_t kSoundPieces = 50;  // a second
constexpr std::string_view kImageStem = "/image";

bool names_image(std::string_view path) {
  if (!path.starts_with(kImageStem) || path == kImageStem) return false;
  path.remove_prefix(kImageStem.size());
  return std::all_of(path.begin(), path.end(), [](char c) { return c >= '0' && c <= '9'; });
}

std::string contents_of(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

}  // namespace

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
  return answer_command(*head, state().settings);
}

// Nothing for a path that names no stream, or one that the camera has nothing for.
std::optional<HttpStream> HttpConnection::open_stream(const std::string& path) const {
  const CameraOptions& options = state().options;
  HttpStreamOptions stream{options.frames_per_second * options.speed,
                           options.loop,
                           options.pictures,
                           options.stream_piece,
                           options.user_data,
                           options.stream_faults};
  if (names_image(path) && options.images) return HttpStream(options.images, std::move(stream));
  if (path != "/audio" || options.sound_path.empty()) return std::nullopt;
  const std::string codec = state().settings.get("camera", "AudInCodec").value_or("g711_64");
  const std::size_t unit = sound_rate(codec) / kSoundPieces;
  std::string sound = contents_of(options.sound_path + "." + codec);
  if (unit == 0 || sound.size() < unit) return std::nullopt;
  stream.units_per_second = static_cast<double>(kSoundPieces) * options.speed;
  return HttpStream(std::move(sound), unit, std::move(stream));
}

Connection::Next HttpConnection::answered() {
  if (!stream_) return Next::kCloseConnection;
  stream_began_ = StreamClock::now();
  return Next::kStream;
}

void HttpConnection::stream() {
  std::optional<HttpStream::Piece> piece = stream_->next();
  if (!piece) {
    if (stream_->closes()) finish_stream();
    return;
  }
  const StreamClock::duration late = StreamClock::now() - (stream_began_ + piece->due);
  if (late > kHeldUp) stream_began_ += late;
  send_at(stream_began_ + piece->due, std::move(piece->bytes));
}

Answer HttpConnection::refuse(const std::string&, std::string_view status) const { return http_answer(status, ""); }

}  // namespace vexa::camera
