// SPDX-License-Identifier: Apache-2.0
// Pictures made from life: painted and encoded at the stream's pace, on a thread of their own, for all who watch.
#ifndef VIRTUAL_CAMERA_SOURCE_LIVE_VIDEO_H_
#define VIRTUAL_CAMERA_SOURCE_LIVE_VIDEO_H_

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <variant>
#include <vector>

#include "virtual_camera/codec/i420_picture.h"
#include "virtual_camera/codec/live_encoder.h"
#include "virtual_camera/source/picture_source.h"

namespace vexa::camera {

// Shared by the sources that watch it. Its thread runs from the first picture asked for until the last source is gone;
// only its sources keep it.
class LiveVideo : public std::enable_shared_from_this<LiveVideo> {
 public:
  // Fills the picture with what is to be seen at this moment. Called on the thread.
  using Paint = std::function<void(std::chrono::steady_clock::time_point, I420Picture&)>;

  // Nothing but the text of what is wrong when the encoder cannot be had. `speed`: pictures come so many times faster.
  [[nodiscard]] static std::variant<std::shared_ptr<LiveVideo>, std::string> open(const LiveEncoding& encoding,
                                                                                  double speed, Paint paint);
  ~LiveVideo();
  LiveVideo(const LiveVideo&) = delete;
  LiveVideo& operator=(const LiveVideo&) = delete;

  [[nodiscard]] const LiveEncoding& encoding() const { return encoding_; }
  // One more who watches: from when the source is first asked for a picture, beginning with a key picture, which is
  // made at once. One that is not asked for two seconds loses what it did not take, and goes on with a key picture. Its
  // wait() calls `ready` on the thread, with a lock held: that may post work to another thread, and no more.
  [[nodiscard]] std::unique_ptr<PictureSource> watch();

 private:
  class Watcher;

  LiveVideo(const LiveEncoding& encoding, double speed, Paint paint, LiveEncoder encoder);
  void join(Watcher& watcher);  // with the lock held
  void run();
  void make_picture(std::uint64_t index, std::chrono::steady_clock::time_point now);
  void hand_out(const SourcePicture& picture);
  [[nodiscard]] std::chrono::nanoseconds time_of(std::uint64_t index) const;

  const LiveEncoding encoding_;
  const double speed_;
  const Paint paint_;
  LiveEncoder encoder_;  // the thread's
  I420Picture painted_;  // the thread's
  std::mutex mutex_;     // of all below
  std::condition_variable changed_;
  std::vector<Watcher*> watchers_;
  bool key_wanted_ = false;
  bool stopped_ = false;
  std::thread thread_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SOURCE_LIVE_VIDEO_H_
