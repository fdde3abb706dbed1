// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/source/live_video.h"

#include <algorithm>
#include <cmath>
#include <optional>
#include <utility>

namespace vexa::camera {
namespace {

using Clock = std::chrono::steady_clock;

Codec kind_of_live(Codec codec) {
  switch (codec) {
    case Codec::kJpeg:
      return Codec::kJpeg;
    case Codec::kMpeg4:
      return Codec::kMpeg4;
    case Codec::kH264:
      break;
  }
  return Codec::kH264;
}

}  // namespace

// What waits for one who watches.
class LiveVideo::Watcher : public PictureSource {
 public:
  explicit Watcher(std::shared_ptr<LiveVideo> video) : video_(std::move(video)) {
    format_.codec = kind_of_live(video_->encoding().codec);
    format_.frames_per_second = video_->encoding().frame_rate;
  }
  ~Watcher() override {
    const std::lock_guard<std::mutex> lock(video_->mutex_);
    std::erase(video_->watchers_, this);
  }

  [[nodiscard]] const SourceFormat& format() const override { return format_; }
  [[nodiscard]] bool ended() const override { return false; }
  [[nodiscard]] std::optional<SourcePicture> next() override {
    const std::lock_guard<std::mutex> lock(video_->mutex_);
    if (!std::exchange(joined_, true)) video_->join(*this);
    if (waiting_.empty()) return std::nullopt;
    SourcePicture picture = std::move(waiting_.front());
    waiting_.pop_front();
    return picture;
  }
  void wait(const std::function<void()>& ready) override {
    {
      const std::lock_guard<std::mutex> lock(video_->mutex_);
      if (waiting_.empty()) {
        ready_ = ready;
        return;
      }
    }
    ready();
  }

  // With the video's lock held. Whether a key picture is needed.
  [[nodiscard]] bool take(SourcePicture picture) {
    const auto most = 2 * static_cast<std::size_t>(video_->encoding().frame_rate);
    if (waiting_.size() > most) {
      waiting_.clear();
      needs_key_ = true;
    }
    if (needs_key_ && !picture.key) return true;
    needs_key_ = false;
    if (!begin_) begin_ = picture.due;
    picture.due -= *begin_;
    picture.stamp = picture.due;
    picture.place = place_++;
    waiting_.push_back(std::move(picture));
    if (const std::function<void()> ready = std::exchange(ready_, nullptr)) ready();
    return false;
  }

 private:
  const std::shared_ptr<LiveVideo> video_;
  SourceFormat format_;
  std::deque<SourcePicture> waiting_;
  std::function<void()> ready_;
  std::optional<std::chrono::nanoseconds> begin_;
  std::size_t place_ = 0;
  bool joined_ = false;
  bool needs_key_ = true;
};

std::variant<std::shared_ptr<LiveVideo>, std::string> LiveVideo::open(const LiveEncoding& encoding, double speed,
                                                                      Paint paint) {
  std::variant<LiveEncoder, std::string> encoder = LiveEncoder::open(encoding);
  if (std::string* trouble = std::get_if<std::string>(&encoder)) return std::move(*trouble);
  return std::shared_ptr<LiveVideo>(
      new LiveVideo(encoding, speed, std::move(paint), std::get<LiveEncoder>(std::move(encoder))));
}

LiveVideo::LiveVideo(const LiveEncoding& encoding, double speed, Paint paint, LiveEncoder encoder)
    : encoding_(encoding),
      speed_(speed),
      paint_(std::move(paint)),
      encoder_(std::move(encoder)),
      painted_(encoding.width, encoding.height) {}

LiveVideo::~LiveVideo() {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    stopped_ = true;
  }
  changed_.notify_all();
  if (thread_.joinable()) thread_.join();
}

std::unique_ptr<PictureSource> LiveVideo::watch() { return std::make_unique<Watcher>(shared_from_this()); }

void LiveVideo::join(Watcher& watcher) {
  watchers_.push_back(&watcher);
  key_wanted_ = true;
  if (!thread_.joinable()) thread_ = std::thread([this] { run(); });
}

std::chrono::nanoseconds LiveVideo::time_of(std::uint64_t index) const {
  return steady_time(index, encoding_.frame_rate * speed_);
}

// A machine too slow for the rate leaves pictures out; those that it makes keep their times.
void LiveVideo::run() {
  const Clock::time_point began = Clock::now();
  std::unique_lock<std::mutex> lock(mutex_);
  for (std::uint64_t index = 0; !stopped_;) {
    lock.unlock();
    make_picture(index, Clock::now());
    const auto late = std::chrono::duration<double>(Clock::now() - began).count();
    index = std::max(index + 1, static_cast<std::uint64_t>(late * encoding_.frame_rate * speed_));
    lock.lock();
    changed_.wait_until(lock, began + time_of(index), [this] { return stopped_; });
  }
}

void LiveVideo::make_picture(std::uint64_t index, Clock::time_point now) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (std::exchange(key_wanted_, false)) encoder_.ask_for_key();
  }
  paint_(now, painted_);
  std::variant<EncodedPicture, std::string> encoded = encoder_.encode(painted_);
  const EncodedPicture* made = std::get_if<EncodedPicture>(&encoded);
  if (made == nullptr) return;  // the next one may do
  SourcePicture picture;
  picture.codec = kind_of_live(encoding_.codec);
  picture.key = made->key;
  picture.bytes = std::make_shared<const std::string>(made->bytes.begin(), made->bytes.end());
  picture.due = steady_time(index, encoding_.frame_rate);
  hand_out(picture);
}

void LiveVideo::hand_out(const SourcePicture& picture) {
  const std::lock_guard<std::mutex> lock(mutex_);
  for (Watcher* watcher : watchers_) {
    if (watcher->take(picture)) key_wanted_ = true;
  }
}

}  // namespace vexa::camera
