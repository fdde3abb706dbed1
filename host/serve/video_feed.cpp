// SPDX-License-Identifier: Apache-2.0
#include "host/serve/video_feed.h"

#include <algorithm>
#include <utility>

#include "host/serve/h264_units.h"
#include "host/serve/mp4_boxes.h"

namespace vexa::host {
namespace {

constexpr std::int64_t kShortest = 1000;    // microseconds that a picture is shown
constexpr std::int64_t kLongest = 1000000;  // also after an outage: the time line does not jump
constexpr std::size_t kLongestSet = 65535;

std::int64_t time_of(const SessionFrame& frame) { return std::int64_t{frame.seconds} * 1000000 + frame.microseconds; }

}  // namespace

bool VideoFeed::set_up(const std::string& sps, const std::string& pps) {
  if (setup_ && setup_->sps == sps && setup_->pps == pps) return true;
  const auto size = size_of(sps);
  if (!size || pps.empty() || sps.size() > kLongestSet || pps.size() > kLongestSet) return false;
  auto made = std::make_shared<Setup>();
  made->number = setup_ ? setup_->number + 1 : 1;
  made->sps = sps;
  made->pps = pps;
  made->codec = codec_string(sps);
  made->segment = std::make_shared<const std::string>(init_segment(sps, pps, *size));
  setup_ = std::move(made);
  return true;
}

void VideoFeed::take(const SessionFrame& frame) {
  if (frame.data == nullptr) return;
  H264Picture picture = take_apart({reinterpret_cast<const char*>(frame.data), frame.length});
  if (!picture.sps.empty()) sps_ = std::move(picture.sps);
  if (!picture.pps.empty()) pps_ = std::move(picture.pps);
  if (frame.isFirst) needs_key_ = true;
  finish(frame);
  const bool is_key = picture.is_idr || frame.isKey;
  if (picture.samples.empty() || (needs_key_ && !is_key)) return;
  // Parameter sets change where a key picture begins, and only there.
  if (is_key && !set_up(sps_, pps_)) {
    needs_key_ = true;
    return;
  }
  needs_key_ = false;
  const bool has_time = frame.seconds != 0 || frame.microseconds != 0;
  waiting_ = Waiting{std::move(picture.samples), setup_, time_of(frame), frame.arrival, has_time, is_key};
}

void VideoFeed::interrupt() {
  needs_key_ = true;
  waiting_.reset();
}

void VideoFeed::clear() {
  interrupt();
  first_ += kept_.size();
  kept_.clear();
  kept_bytes_ = 0;
}

void VideoFeed::finish(const SessionFrame& next) {
  if (!waiting_) return;
  const Waiting picture = *std::exchange(waiting_, std::nullopt);
  const std::int64_t by_camera = time_of(next) - picture.time;
  const bool counts = picture.has_time && !next.isFirst && by_camera > 0 && by_camera <= kLongest;
  const std::int64_t shown =
      std::clamp(counts ? by_camera : (next.arrival - picture.arrival) * 1000, kShortest, kLongest);
  const auto duration = static_cast<std::uint32_t>(shown * kVideoClock / 1000000);
  const auto number = static_cast<std::uint32_t>(first_ + kept_.size());
  const Mp4Sample sample{number, time_, duration, picture.is_key};
  auto bytes = std::make_shared<const std::string>(media_fragment(sample, picture.samples));
  time_ += duration;
  keep({std::move(bytes), picture.setup, picture.arrival, picture.is_key});
}

void VideoFeed::keep(Fragment fragment) {
  kept_bytes_ += fragment.bytes->size();
  kept_.push_back(std::move(fragment));
  while (kept_bytes_ > kMostKept && kept_.size() > 1) {
    kept_bytes_ -= kept_.front().bytes->size();
    kept_.pop_front();
    ++first_;
  }
}

// 0: none is kept.
std::uint64_t VideoFeed::latest_key() const {
  const auto found = std::find_if(kept_.rbegin(), kept_.rend(), [](const Fragment& one) { return one.is_key; });
  return found == kept_.rend() ? 0 : first_ + static_cast<std::uint64_t>(kept_.rend() - found) - 1;
}

std::optional<VideoFeed::Piece> VideoFeed::next(Place& place) const {
  const std::uint64_t end = first_ + kept_.size();
  std::size_t behind = 0;
  for (std::uint64_t at = std::max(place.next, first_); at < end; ++at) behind += kept_[at - first_].bytes->size();
  if (place.next < first_ || behind > kMostBehind) {
    const std::uint64_t key = latest_key();
    if (key > place.next) {
      if (place.next > 0) place.missed += key - place.next;
      place.next = key;
    }
  }
  if (place.next < first_ || place.next >= end) return std::nullopt;
  const Fragment& fragment = kept_[place.next - first_];
  if (place.setup != fragment.setup->number) {
    place.setup = fragment.setup->number;
    return Piece{fragment.setup->segment, fragment.setup->codec, fragment.arrival};
  }
  ++place.next;
  return Piece{fragment.bytes, {}, fragment.arrival};
}

}  // namespace vexa::host
