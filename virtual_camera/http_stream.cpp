#include "virtual_camera/http_stream.h"

#include <fmt/format.h>

#include <cmath>
#include <utility>

namespace vexa::camera {
namespace {

using Action = HttpStreamFault::Action;

}  // namespace

HttpStream::HttpStream(std::shared_ptr<const ImageClip> clip, HttpStreamOptions options)
    : clip_(std::move(clip)), options_(std::move(options)) {}

HttpStream::HttpStream(std::string sound, std::size_t unit, HttpStreamOptions options)
    : sound_(std::move(sound)), sound_unit_(unit), options_(std::move(options)) {}

std::string HttpStream::head() const {
  const bool parts = clip_ && clip_->kind() == ImageKind::kJpeg;
  const char* type = parts ? "multipart/x-mixed-replace;boundary=picture" : "application/octet-stream";
  return fmt::format("HTTP/1.0 200 OK\r\nContent-Type: {}\r\n\r\n", type);
}

const HttpStreamFault* HttpStream::fault(Action action) const {
  for (const HttpStreamFault& fault : options_.faults) {
    if (fault.index == index_ && fault.action == action) return &fault;
  }
  return nullptr;
}

// The unit as the clip has it; nothing behind its end.
std::optional<std::string> HttpStream::content() const {
  if (!clip_ && sound_unit_ == 0) return std::nullopt;  // another clip was to follow, and is not there
  const std::uint64_t place = index_ - clip_began_;
  const std::size_t count = clip_ ? clip_->pictures().size() : sound_.size() / sound_unit_;
  if (count == 0 || (place >= count && !options_.loop)) return std::nullopt;
  const auto turn = static_cast<std::size_t>(place % count);
  if (!clip_) return sound_.substr(turn * sound_unit_, sound_unit_);
  return with_user_data(clip_->kind(), clip_->pictures()[turn], options_.user_data);
}

std::string HttpStream::unit_bytes(const std::string& content) const {
  const HttpStreamFault* before = fault(Action::kBefore);
  const std::string front = before != nullptr ? before->text : "";
  if (!clip_ || clip_->kind() != ImageKind::kJpeg) return front + content;
  const HttpStreamFault* lie = fault(Action::kDataLength);
  const std::string length = lie != nullptr ? lie->text : std::to_string(content.size());
  const std::string line = fault(Action::kNoDataLength) != nullptr ? "" : fmt::format("DataLen: {}\r\n", length);
  return fmt::format("{}--picture\r\nContent-Type: image/jpeg\r\n{}\r\n{}\r\n", front, line, content);
}

// The faults that change what stands ready, or end the stream with it.
void HttpStream::strike() {
  if (const HttpStreamFault* cut = fault(Action::kCut)) unit_ = unit_.substr(0, cut->bytes);
  for (const Action action : {Action::kClose, Action::kSilence}) {
    const HttpStreamFault* end = fault(action);
    if (end == nullptr) continue;
    unit_ = unit_.substr(0, end->bytes);
    ended_ = true;
    closes_ = action == Action::kClose;
  }
}

bool HttpStream::load_unit() {
  if (begun_) ++index_;
  begun_ = true;
  if (ended_ || (options_.units != 0 && index_ >= options_.units)) return false;
  if (const HttpStreamFault* other = fault(Action::kOtherClip)) {
    clip_ = ImageClip::load(other->text);
    clip_began_ = index_;
  }
  const std::optional<std::string> next = content();
  if (!next) return false;
  if (const HttpStreamFault* pause = fault(Action::kPause)) late_ += pause->time;
  const double seconds = static_cast<double>(index_) / options_.units_per_second;
  due_ = late_ + std::chrono::nanoseconds(std::llround(seconds * 1e9));
  unit_ = unit_bytes(*next);
  strike();
  return true;
}

std::optional<HttpStream::Piece> HttpStream::next() {
  while (unit_.empty()) {
    if (!load_unit()) return std::nullopt;
  }
  const std::size_t count = options_.piece == 0 ? unit_.size() : options_.piece;
  Piece piece{due_, unit_.substr(0, count)};
  unit_.erase(0, count);
  return piece;
}

std::size_t sound_rate(std::string_view codec) {
  constexpr struct {
    std::string_view codec;
    std::size_t rate;
  } kRates[] = {{"g711_64", 8000}, {"g726_40", 5000}, {"g726_32", 4000}, {"g726_24", 3000}, {"g726_16", 2000}};
  for (const auto& row : kRates) {
    if (row.codec == codec) return row.rate;
  }
  return 0;
}

}  // namespace vexa::camera
