// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/card_recorder.h"

#include <asio/io_context.hpp>
#include <asio/post.hpp>
#include <cmath>
#include <string_view>
#include <utility>

#include "virtual_camera/model/settings_store.h"
#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kSection = "edgestorage";
constexpr std::string_view kImage = "image";

int number_at(std::string_view text) { return leading_number(text).value_or(0); }

template <typename Duration>
std::chrono::steady_clock::duration paced(Duration time, double speed) {
  return std::chrono::duration_cast<std::chrono::steady_clock::duration>(
      std::chrono::duration<double>(std::chrono::duration<double>(time) / speed));
}

RecordingHead head_of(const CameraState& state, int image, const SourceFormat& format) {
  RecordingHead head;
  head.codec = format.codec;
  head.frame_rate = static_cast<int>(std::lround(format.frames_per_second));
  if (const auto stream = stream_settings(state.settings, image)) {
    head.size = std::to_string(stream->width) + "," + std::to_string(stream->height);
    head.bit_rate = stream->bit_rate;
    head.quality = stream->quality;
  }
  head.start = in_tenths_of_milliseconds(state.wall_clock().time_since_epoch());
  return head;
}

}  // namespace

RecorderSettings recorder_settings(const SettingsStore& settings) {
  const auto value = [&](std::string_view key) { return settings.get(kSection, key).value_or(""); };
  RecorderSettings recorder;
  const std::string image = value("EsRec1");
  if (value("Edgestorage") != "on" || value("EsAlmRec1WatchAddress").empty() || !image.starts_with(kImage)) {
    return recorder;
  }
  recorder.image = number_at(std::string_view(image).substr(kImage.size()));
  const std::string times = value("EsAlmRec1Time");
  const std::size_t comma = times.find(',');
  if (comma != std::string::npos)
    recorder.after = std::chrono::seconds(number_at(std::string_view(times).substr(comma + 1)));
  return recorder;
}

CardRecorder::CardRecorder(std::shared_ptr<CameraState> state)
    : state_(std::move(state)), pace_(state_->context), after_(state_->context) {}

void CardRecorder::set_reachable(bool reachable) {
  reachable_ = reachable;
  update();
}

void CardRecorder::update() {
  const RecorderSettings settings = recorder_settings(state_->settings);
  if (settings.image == 0) return stop();
  if (!reachable_) {
    after_.cancel();
    if (!source_) begin(settings.image);
    return;
  }
  if (!source_) return;
  after_.expires_after(paced(settings.after, state_->options.speed));
  after_.async_wait([self = shared_from_this()](asio::error_code stopped) {
    if (!stopped) self->stop();
  });
}

void CardRecorder::stop() {
  pace_.cancel();
  after_.cancel();
  if (std::exchange(source_, nullptr)) state_->card.finish();
}

void CardRecorder::begin(int image) {
  std::optional<StreamPlan> plan = state_->sources.plan(image);
  if (!plan || !plan->source) return;
  if (state_->card.begin(head_of(*state_, image, plan->source->format())).empty()) return;
  source_ = std::move(plan->source);
  ++made_;
  began_ = std::chrono::steady_clock::now();
  first_due_.reset();
  take_next();
}

void CardRecorder::take_next() {
  if (!source_) return;
  std::optional<SourcePicture> picture = source_->next();
  if (!picture && source_->ended()) return stop();
  if (!picture) {
    return source_->wait([weak = weak_from_this(), made = made_, &context = state_->context] {
      asio::post(context, [weak, made] {
        const auto self = weak.lock();
        if (self && self->made_ == made) self->take_next();
      });
    });
  }
  if (!first_due_) first_due_ = picture->due;
  pace_.expires_at(began_ + paced(picture->due - *first_due_, state_->options.speed));
  pace_.async_wait([self = shared_from_this(), stored = *std::move(picture)](asio::error_code stopped) {
    if (!stopped && self->source_) self->store(stored);
  });
}

void CardRecorder::store(const SourcePicture& picture) {
  const bool stored =
      state_->card.add({picture.bytes, picture.key, in_tenths_of_milliseconds(picture.due - *first_due_)});
  stored ? take_next() : stop();
}

}  // namespace vexa::camera
