// SPDX-License-Identifier: Apache-2.0
// One camera's H.264, remuxed once for all who watch it.
#ifndef HOST_SERVE_VIDEO_FEED_H_
#define HOST_SERVE_VIDEO_FEED_H_

#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include "vexa/session.h"

namespace vexa::host {

using SharedBytes = std::shared_ptr<const std::string>;

// Turns pictures into fragments of MP4 on a time line of its own, which never steps back or jumps, and keeps the latest
// of them. A fragment is complete once the next picture has come, for that one ends it. On the thread of the event
// loop.
class VideoFeed {
 public:
  // Where one viewer is.
  struct Place {
    std::uint64_t next = 0;   // number of the fragment; 0: not begun
    std::uint64_t setup = 0;  // number of the initialisation segment that it has
    std::uint64_t missed = 0;
  };
  // What a viewer gets next: an initialisation segment with its codec, or a fragment.
  struct Piece {
    SharedBytes bytes;
    std::string codec;  // empty: a fragment
    std::int64_t arrival = 0;
  };

  // A picture of H.264 as the session delivers it. Before the first key picture with parameter sets nothing is kept.
  void take(const SessionFrame& frame);
  // The stream has ended: what comes next begins with a key picture.
  void interrupt();
  // The same, and nothing that was kept is shown to those who come.
  void clear();

  // Moves the place on. A viewer that is more than kMostBehind bytes back goes on at the latest key picture.
  [[nodiscard]] std::optional<Piece> next(Place& place) const;

  static constexpr std::size_t kMostKept = std::size_t{8} << 20U;
  static constexpr std::size_t kMostBehind = std::size_t{1} << 20U;

 private:
  struct Setup {
    std::uint64_t number = 0;
    std::string sps;
    std::string pps;
    std::string codec;
    SharedBytes segment;
  };
  struct Fragment {
    SharedBytes bytes;
    std::shared_ptr<const Setup> setup;
    std::int64_t arrival = 0;
    bool is_key = false;
  };
  // The picture whose duration is not known yet.
  struct Waiting {
    std::string samples;
    std::shared_ptr<const Setup> setup;
    std::int64_t time = 0;  // microseconds, of the camera
    std::int64_t arrival = 0;
    bool has_time = false;
    bool is_key = false;
  };

  bool set_up(const std::string& sps, const std::string& pps);
  void finish(const SessionFrame& next);
  void keep(Fragment fragment);
  [[nodiscard]] std::uint64_t latest_key() const;

  std::shared_ptr<const Setup> setup_;
  std::optional<Waiting> waiting_;
  bool needs_key_ = true;
  std::deque<Fragment> kept_;
  std::uint64_t first_ = 1;  // number of kept_.front()
  std::size_t kept_bytes_ = 0;
  std::uint64_t time_ = 0;  // of the fragment to come, in units of kVideoClock
  std::string sps_;
  std::string pps_;
};

}  // namespace vexa::host

#endif  // HOST_SERVE_VIDEO_FEED_H_
