// SPDX-License-Identifier: Apache-2.0
#include "node/program/camera_segments.h"

#include <utility>

#include "host/base/codec.h"
#include "host/recording/media_container.h"

namespace vexa::node {
namespace {

constexpr std::chrono::seconds kRetry{5};

}  // namespace

// Begun with its first picture.
class CameraSegments::Segment final : public host::PictureTarget {
 public:
  explicit Segment(CameraSegments& owner) : owner_(owner), path_(owner.folder_.path()) {}

  [[nodiscard]] std::optional<host::Problem> check() const override { return std::nullopt; }
  [[nodiscard]] const std::string& path() const override { return path_; }

  [[nodiscard]] std::optional<host::Problem> write(const host::RecordedPicture& picture) override {
    if (!segment_) {
      if (auto failed = begin(picture.time)) return failed;
    }
    if (auto failed = video_->write(picture)) return failed;
    if (picture.time - flushed_ < owner_.times_.flush) return std::nullopt;
    flushed_ = picture.time;
    return owner_.folder_.flush(*segment_);
  }

  [[nodiscard]] std::optional<host::Problem> close() override {
    if (!segment_) return std::nullopt;
    if (auto failed = video_->close()) return failed;
    ++owner_.counts_.segments;
    return owner_.folder_.finish(std::move(*segment_));
  }

 private:
  [[nodiscard]] std::optional<host::Problem> begin(std::chrono::microseconds time) {
    SegmentName name;
    name.start = std::chrono::floor<std::chrono::milliseconds>(time);
    name.camera = owner_.camera_;
    name.counter = ++owner_.counter_;
    auto begun = owner_.folder_.begin(std::move(name));
    if (!begun) return begun.error();
    segment_ = std::move(*begun);
    flushed_ = time;
    video_ = std::make_unique<host::MediaContainer>(path_ + "/" + file_name_of(segment_->name),
                                                    host::ContainerFormat::kMp4, segment_->file.get());
    return std::nullopt;
  }

  CameraSegments& owner_;
  std::string path_;
  std::optional<OpenSegment> segment_;
  std::unique_ptr<host::MediaContainer> video_;  // writes to the segment, and goes first
  std::chrono::microseconds flushed_{0};
};

CameraSegments::CameraSegments(std::string camera, SegmentFolder folder, SegmentTimes times, Report report)
    : camera_(std::move(camera)), folder_(std::move(folder)), times_(times), report_(std::move(report)) {
  if (const auto segments = folder_.list()) {
    for (const ListedSegment& segment : *segments) counter_ = std::max(counter_, segment.name.counter);
  }
  files_ = make_files();
}

CameraSegments::~CameraSegments() = default;

std::unique_ptr<host::RecordingFiles> CameraSegments::make_files() {
  return std::make_unique<host::RecordingFiles>(folder_.path() + "/segment", times_.length, [this](const std::string&) {
    return std::make_unique<Segment>(*this);
  });
}

void CameraSegments::take_state(const SessionStatus& status) {
  const bool changed = status.cause == SessionCause::kStreamChanged && status.state == SessionState::kLive;
  if (changed && files_) files_->begin_anew();
}

void CameraSegments::take_picture(const SessionFrame& frame) {
  const std::optional<host::Codec> codec = host::codec_of_frame(frame.frameType);
  if (!codec) return;
  if (!files_) {
    if (Clock::now() < retry_at_) return;
    files_ = make_files();
  }
  if (frame.isFirst) files_->miss();
  const auto time = std::chrono::floor<std::chrono::microseconds>(std::chrono::system_clock::now().time_since_epoch());
  bool kept = false;
  if (auto failed = files_->write({frame.data, frame.length, *codec, frame.isKey, time}, kept)) {
    give_up(*failed);
    return;
  }
  counts_.pictures += kept ? 1U : 0U;
}

void CameraSegments::give_up(const host::Problem& problem) {
  ++counts_.failures;
  report_(problem);
  files_.reset();
  if (const auto repaired = folder_.recover(); !repaired) report_(repaired.error());
  retry_at_ = Clock::now() + kRetry;
}

void CameraSegments::close() {
  if (!files_) return;
  if (auto failed = files_->close()) give_up(*failed);
}

}  // namespace vexa::node
