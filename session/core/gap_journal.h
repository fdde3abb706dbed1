// SPDX-License-Identifier: Apache-2.0
// The gaps of a camera, and how far each has been fetched, as lines of text.
#pragma once

#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "vexa/backfill.h"

namespace vexa {

/// Pictures that are no further apart belong to one run: microseconds.
constexpr std::int64_t kGapPause = 1000000;

/// Holds no file: each change returns the line that is to be appended to it. A damaged or cut line is as if it had
/// never been written.
class GapJournal {
 public:
  /// From the whole text of a file. A journal that ends while pictures came has an open gap from the last one on.
  static GapJournal read(const std::string& text);
  /// The same state in as few lines as it takes; gaps that are over are left out.
  [[nodiscard]] std::string text() const;
  /// The first line, always as long: pictures come, the latest at this time by both clocks. 0: none come.
  [[nodiscard]] static std::string live_line(std::int64_t time, std::int64_t camera_time);

  /// Camera times are 0 where they are not known.
  [[nodiscard]] std::string open_gap(std::int64_t begin, std::int64_t camera_begin);
  /// The open gap, if there is one, ends with a picture.
  [[nodiscard]] std::string close_gap(std::int64_t end, std::int64_t camera_end);
  /// The camera's time of a gap's end has become known.
  [[nodiscard]] std::string know_end(std::uint64_t gap, std::int64_t camera_end);
  [[nodiscard]] std::string deliver(std::uint64_t gap, const std::string& recording, std::int64_t camera_time,
                                    std::int64_t time);
  [[nodiscard]] std::string finish(std::uint64_t gap, GapState state, const std::vector<GapStretch>& missing,
                                   const std::string& reason);
  /// The card holds these and no others, at this time by the host's clock. Those that are new belong to the gap, unless
  /// it is 0 or nothing was known of the card before.
  [[nodiscard]] std::string see(const std::vector<std::string>& recordings, std::uint64_t gap, std::int64_t time);

  [[nodiscard]] const std::map<std::uint64_t, Gap>& gaps() const { return gaps_; }
  /// Its number; 0: none is open.
  [[nodiscard]] std::uint64_t open() const { return open_; }
  /// The oldest gap that is to be fetched; 0: none.
  [[nodiscard]] std::uint64_t due() const;
  /// How far each recording was delivered for a gap: its latest picture's time by the camera's clock.
  [[nodiscard]] std::map<std::string, std::int64_t> progress(std::uint64_t gap) const;
  /// Host times of the first and last pictures of each uninterrupted run that was delivered, in their order.
  [[nodiscard]] std::vector<GapStretch> runs(std::uint64_t gap) const;
  /// Recordings that were new when the gap was fetched.
  [[nodiscard]] std::set<std::string> fresh(std::uint64_t gap) const;
  /// When the card was last listed before the gap was fetched; 0: never.
  [[nodiscard]] std::int64_t listed_before(std::uint64_t gap) const;

 private:
  struct Fetched {
    std::map<std::string, std::int64_t> progress;
    std::vector<GapStretch> runs;
    std::set<std::string> fresh;
    std::int64_t listed_before = 0;
  };

  void take(const std::string& line);
  void note(std::uint64_t gap, const std::string& recording, std::int64_t camera_time, std::int64_t time);
  void forget_old();

  std::map<std::uint64_t, Gap> gaps_;
  std::map<std::uint64_t, Fetched> fetched_;
  std::set<std::string> seen_;
  std::uint64_t open_ = 0;
  std::uint64_t latest_ = 0;
  std::int64_t live_ = 0;
  std::int64_t camera_live_ = 0;
  std::int64_t listed_at_ = 0;
};

/// The parts of a gap that no run covers; a pause of up to kGapPause is none.
std::vector<GapStretch> missing_of(const Gap& gap, const std::vector<GapStretch>& runs);

}  // namespace vexa
