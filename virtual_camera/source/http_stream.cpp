// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/http_stream.h"

#include <fmt/format.h>

#include <cmath>
#include <utility>

#include "virtual_camera/source/clip_source.h"

namespace vexa::camera {
namespace {

using Action = HttpStreamFault::Action;

}  // namespace

HttpStream::HttpStream(std::unique_ptr<PictureSource> source, HttpStreamOptions options)
    : source_(std::move(source)), options_(std::move(options)) {}

HttpStream::HttpStream(std::shared_ptr<const ImageClip> clip, HttpStreamOptions options)
    : source_(std::make_unique<ClipSource>(std::move(clip), options.units_per_second,
                                           options.loop ? ClipSource::AtEnd::kStartOver : ClipSource::AtEnd::kStop)),
      options_(std::move(options)) {}

HttpStream::HttpStream(std::string sound, std::size_t unit, HttpStreamOptions options)
    : sound_(std::move(sound)), sound_unit_(unit), options_(std::move(options)) {}

bool HttpStream::is_jpeg() const { return source_ && source_->format().codec == Codec::kJpeg; }

std::string HttpStream::head() const {
  const char* type = is_jpeg() ? "multipart/x-mixed-replace;boundary=picture" : "application/octet-stream";
  return fmt::format("HTTP/1.0 200 OK\r\nContent-Type: {}\r\n\r\n", type);
}

const HttpStreamFault* HttpStream::fault(Action action) const {
  for (const HttpStreamFault& fault : options_.faults) {
    if (fault.index == index_ && fault.action == action) return &fault;
  }
  return nullptr;
}

std::chrono::nanoseconds HttpStream::paced(std::chrono::nanoseconds time) const {
  return std::chrono::nanoseconds(std::llround(static_cast<double>(time.count()) / options_.speed));
}

void HttpStream::change_clip(const std::string& path) {
  const double rate = source_ ? source_->format().frames_per_second : options_.units_per_second;
  source_began_ = index_ == 0 ? planned_ : planned_ + paced(steady_time(1, rate));
  std::shared_ptr<const ImageClip> clip = ImageClip::load(path);
  source_.reset();
  if (!clip) return;
  source_ = std::make_unique<ClipSource>(std::move(clip), rate,
                                         options_.loop ? ClipSource::AtEnd::kStartOver : ClipSource::AtEnd::kStop);
}

// Takes up the unit's picture or sound, and plans it.
bool HttpStream::load_content() {
  if (source_) {
    picture_ = source_->next();
    if (picture_) planned_ = source_began_ + paced(picture_->due);
    return picture_.has_value();
  }
  const std::size_t count = sound_unit_ == 0 ? 0 : sound_.size() / sound_unit_;
  if (count == 0 || (index_ >= count && !options_.loop)) return false;
  planned_ = steady_time(index_, options_.units_per_second);
  return true;
}

std::string HttpStream::content() const {
  if (!picture_) {
    const auto turn = static_cast<std::size_t>(index_ % (sound_.size() / sound_unit_));
    return sound_.substr(turn * sound_unit_, sound_unit_);
  }
  const bool takes_text = options_.user_data && source_->format().takes_user_data;
  return with_user_data(picture_->codec, *picture_->bytes, takes_text ? options_.user_data() : "");
}

std::string HttpStream::unit_bytes(const std::string& content) const {
  const HttpStreamFault* before = fault(Action::kBefore);
  const std::string front = before != nullptr ? before->text : "";
  if (!is_jpeg()) return front + content;
  const HttpStreamFault* lie = fault(Action::kDataLength);
  const std::string length = lie != nullptr ? lie->text : std::to_string(content.size());
  const std::string line = fault(Action::kNoDataLength) != nullptr ? "" : fmt::format("DataLen: {}\r\n", length);
  return fmt::format("{}--picture\r\nContent-Type: image/jpeg\r\n{}\r\n{}\r\n", front, line, content);
}

// The faults that change the piece that is ready, or end the stream with it.
void HttpStream::apply_faults() {
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
  if (loaded_) return true;
  if (ended_ || (options_.units != 0 && index_ >= options_.units)) return false;
  if (const HttpStreamFault* other = fault(Action::kOtherClip)) change_clip(other->text);
  if (!load_content()) return false;
  if (const HttpStreamFault* pause = fault(Action::kPause)) late_ += pause->time;
  made_ = false;
  loaded_ = true;
  return true;
}

std::optional<std::chrono::nanoseconds> HttpStream::next_due() {
  if (!load_unit()) return std::nullopt;
  return planned_ + late_;
}

std::string HttpStream::take() {
  if (!load_unit()) return {};
  if (!std::exchange(made_, true)) {
    unit_ = unit_bytes(content());
    apply_faults();
  }
  std::string piece = unit_.substr(0, options_.piece == 0 ? unit_.size() : options_.piece);
  unit_.erase(0, piece.size());
  if (unit_.empty()) {
    loaded_ = false;
    ++index_;
  }
  return piece;
}

std::optional<HttpStream::Piece> HttpStream::next() {
  while (const auto due = next_due()) {
    std::string piece = take();
    if (!piece.empty()) return Piece{*due, std::move(piece)};
  }
  return std::nullopt;
}

bool HttpStream::waits() const {
  const bool over = ended_ || (options_.units != 0 && index_ >= options_.units);
  return !over && !loaded_ && source_ && !source_->ended();
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
