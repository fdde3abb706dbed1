// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/media_stream.h"

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <fstream>
#include <iterator>
#include <optional>
#include <string>
#include <utility>

#include "virtual_camera/server/camera_state.h"

namespace vexa::camera {
namespace {

// A stream that its peer has held up this long goes on from here instead of sending the backlog.
constexpr std::chrono::seconds kHeldUp{1};
// How long a picture is held before it is asked for again.
constexpr std::chrono::milliseconds kHold{1};
constexpr std::size_t kSoundPieces = 50;  // a second

std::string contents_of(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

HttpStreamOptions stream_options(const CameraOptions& options) {
  HttpStreamOptions stream;
  stream.loop = options.loop;
  stream.units = options.pictures;
  stream.piece = options.stream_piece;
  stream.faults = options.stream_faults;
  stream.speed = options.speed;
  return stream;
}

}  // namespace

MediaStream::MediaStream(HttpStream stream, std::function<bool()> holds_pictures)
    : stream_(std::move(stream)), holds_pictures_(std::move(holds_pictures)) {}

void MediaStream::go_on(Line& line) {
  if (!std::exchange(begun_, true)) began_ = Clock::now();
  const std::optional<std::chrono::nanoseconds> due = stream_.next_due();
  if (!due) {
    if (stream_.waits()) return stream_.wait(line.waker());
    if (stream_.closes()) line.finish();
    return;
  }
  const Clock::duration late = Clock::now() - (began_ + *due);
  if (late > kHeldUp) began_ += late;
  line.send_at(began_ + *due, [this, due = *due] { return holds(due) ? std::string() : stream_.take(); });
}

// Whether the picture that is due stays. One that leaves late takes the schedule with it.
bool MediaStream::holds(std::chrono::nanoseconds due) {
  if (!holds_pictures_ || !stream_.begins_unit()) return false;
  const bool held = holds_pictures_();
  began_ = std::max(began_, Clock::now() + (held ? kHold : Clock::duration::zero()) - due);
  return held;
}

std::unique_ptr<HttpBody> open_image_stream(const std::shared_ptr<CameraState>& state, int number) {
  std::unique_ptr<PictureSource> source = state->sources.open_images(number);
  if (!source) return nullptr;
  HttpStreamOptions options = stream_options(state->options);
  options.user_data = [state] { return state->sources.present_user_data(); };
  return std::make_unique<MediaStream>(HttpStream(std::move(source), std::move(options)), state->options.hold_pictures);
}

std::unique_ptr<HttpBody> open_sound_stream(const std::shared_ptr<CameraState>& state) {
  const CameraOptions& given = state->options;
  if (given.sound_path.empty()) return nullptr;
  const std::string codec = state->settings.get("camera", "AudInCodec").value_or("g711_64");
  const std::size_t unit = sound_rate(codec) / kSoundPieces;
  std::string sound = contents_of(given.sound_path + "." + codec);
  if (unit == 0 || sound.size() < unit) return nullptr;
  HttpStreamOptions options = stream_options(given);
  options.units_per_second = static_cast<double>(kSoundPieces) * given.speed;
  return std::make_unique<MediaStream>(HttpStream(std::move(sound), unit, std::move(options)),
                                       state->options.hold_pictures);
}

}  // namespace vexa::camera
