// SPDX-License-Identifier: Apache-2.0
// Which pictures of a recording belong to a gap.
#pragma once

#include <cstddef>
#include <cstdint>
#include <deque>
#include <vector>

namespace vexa {

/// A picture by its content and time, microseconds since 1970.
struct SeenPicture {
  std::uint64_t hash = 0;
  std::int64_t time = 0;
};

/// FNV-1a over its bytes.
std::uint64_t hash_of(const unsigned char* data, std::size_t length);

/// The latest pictures that came live, and the first after a gap.
class SeenPictures {
 public:
  static constexpr std::size_t kMost = 1024;
  void add(const SeenPicture& picture) {
    pictures_.push_back(picture);
    if (pictures_.size() > kMost) pictures_.pop_front();
  }
  [[nodiscard]] const std::deque<SeenPicture>& all() const { return pictures_; }

 private:
  std::deque<SeenPicture> pictures_;
};

/// The edges of a gap, by the host's clock, and what is known of the camera's. Microseconds.
struct CutPlan {
  std::int64_t begin = 0;
  std::int64_t end = 0;
  std::int64_t offset = 0;                ///< camera's clock less the host's
  std::int64_t uncertainty = 0;           ///< of the offset
  std::int64_t resume_after = INT64_MIN;  ///< by the camera's clock: what was delivered before
};

/// Cuts one recording at both edges of a gap: where its pictures are those that came live, else by time. Three pictures
/// after each other have to be the same, at about their time; three that are alike among themselves prove nothing.
/// Pictures are given in their order, and are kept by whoever gives them, by their number from 0.
class GapCut {
 public:
  /// `before` and `after`: pictures that came live, in their order, for an offset that is uncertain.
  GapCut(const CutPlan& plan, std::vector<SeenPicture> before, std::vector<SeenPicture> after);

  struct Verdict {
    std::vector<std::size_t> lead;  ///< numbers to deliver, as they lead in
    std::vector<std::size_t> take;  ///< numbers to deliver
    std::size_t forget = 0;         ///< pictures below this number are not asked for again
    bool over = false;              ///< what follows is after the gap
  };
  Verdict add(std::uint64_t hash, bool key, std::int64_t camera_time);
  /// No more come.
  Verdict end();

  [[nodiscard]] std::int64_t host_time(std::int64_t camera_time) const { return camera_time - plan_.offset; }

 private:
  struct Held {
    std::size_t number;
    std::uint64_t hash;
    bool key;
    std::int64_t camera_time;
  };
  static constexpr std::size_t kMostHeld = 4096;

  [[nodiscard]] bool is_in_head() const;
  [[nodiscard]] bool is_wanted(const Held& picture) const;
  [[nodiscard]] bool is_after(const Held& picture) const;
  [[nodiscard]] const SeenPicture* match(const std::vector<SeenPicture>& live) const;
  void know_clock(const SeenPicture& live);
  Verdict hold();
  Verdict decide(std::size_t kept);
  Verdict finish();

  CutPlan plan_;
  const std::vector<SeenPicture> before_;
  const std::vector<SeenPicture> after_;
  std::deque<Held> held_;  ///< of the head, and the latest three
  std::size_t next_ = 0;
  std::size_t wanted_from_ = 0;  ///< number of the first picture after the latest that came live
  bool begins_by_content_ = false;
  bool decided_ = false;  ///< the head is over
  bool has_taken_ = false;
};

}  // namespace vexa
