// SPDX-License-Identifier: Apache-2.0
#include "session/core/gap_cut.h"

#include <algorithm>
#include <cstdlib>
#include <utility>

namespace vexa {
namespace {

constexpr std::size_t kAlike = 3;
// A picture comes that much later than it was taken, at most, once the clocks are known by their pictures.
constexpr std::int64_t kDelay = 1000000;

}  // namespace

std::uint64_t hash_of(const unsigned char* data, std::size_t length) {
  std::uint64_t hash = 14695981039346656037ULL;
  for (std::size_t i = 0; i < length; ++i) hash = (hash ^ data[i]) * 1099511628211ULL;
  return hash;
}

GapCut::GapCut(const CutPlan& plan, std::vector<SeenPicture> before, std::vector<SeenPicture> after)
    : plan_(plan), before_(std::move(before)), after_(std::move(after)) {}

GapCut::Verdict GapCut::add(std::uint64_t hash, bool key, std::int64_t camera_time) {
  held_.push_back({next_++, hash, key, camera_time});
  if (const SeenPicture* const live = has_taken_ ? nullptr : match(before_); live != nullptr) {
    wanted_from_ = next_;
    know_clock(*live);
    begins_by_content_ = true;
  }
  if (const SeenPicture* const live = match(after_); live != nullptr) {
    know_clock(*live);
    // The two before it are the same as live ones too.
    held_.erase(held_.end() - static_cast<std::ptrdiff_t>(kAlike), held_.end());
    return finish();
  }
  if (is_after(held_.back())) {
    held_.pop_back();
    return finish();
  }
  if (is_in_head()) return hold();
  // The latest two may be the beginning of a match.
  return decide(after_.empty() ? 0 : kAlike - 1);
}

GapCut::Verdict GapCut::end() { return finish(); }

// What was held back for a match that does not come is delivered.
GapCut::Verdict GapCut::finish() {
  Verdict verdict = decide(0);
  held_.clear();
  verdict.forget = next_;
  verdict.over = true;
  return verdict;
}

void GapCut::know_clock(const SeenPicture& live) {
  plan_.offset = held_.back().camera_time - live.time;
  plan_.uncertainty = std::min(plan_.uncertainty, kDelay);
}

// So long as a picture may be one that came live before the gap, or was delivered before.
bool GapCut::is_in_head() const {
  if (decided_) return false;
  const std::int64_t time = held_.back().camera_time;
  return host_time(time) <= plan_.begin + plan_.uncertainty || time <= plan_.resume_after;
}

// A key picture that is not wanted itself makes those before it needless.
GapCut::Verdict GapCut::hold() {
  const Held& latest = held_.back();
  const bool needless = host_time(latest.camera_time) <= plan_.begin - plan_.uncertainty - kDelay ||
                        latest.camera_time <= plan_.resume_after;
  if (latest.key && needless) {
    while (held_.size() > kAlike) held_.pop_front();
  }
  if (held_.size() > kMostHeld) held_.pop_front();
  Verdict verdict;
  verdict.forget = held_.front().number;
  return verdict;
}

bool GapCut::is_wanted(const Held& picture) const {
  return picture.number >= wanted_from_ && picture.camera_time > plan_.resume_after;
}

// Where content has shown the beginning it shows the end too, and time alone does not end it at once.
bool GapCut::is_after(const Held& picture) const {
  const std::int64_t grace = begins_by_content_ && !after_.empty() ? plan_.uncertainty : 0;
  return host_time(picture.camera_time) >= plan_.end + grace;
}

const SeenPicture* GapCut::match(const std::vector<SeenPicture>& live) const {
  if (held_.size() < kAlike || live.size() < kAlike) return nullptr;
  const auto latest = held_.end() - static_cast<std::ptrdiff_t>(kAlike);
  const auto is_alike = [latest](const Held& held) { return held.hash == latest->hash; };
  if (std::all_of(latest, held_.end(), is_alike)) return nullptr;
  const SeenPicture* best = nullptr;
  std::int64_t least = plan_.uncertainty + kDelay;
  for (std::size_t i = kAlike - 1; i < live.size(); ++i) {
    const std::int64_t apart = std::llabs(live[i].time - host_time(held_.back().camera_time));
    if (apart > least) continue;
    const bool same = std::equal(latest, held_.end(), live.begin() + static_cast<std::ptrdiff_t>(i + 1 - kAlike),
                                 [](const Held& a, const SeenPicture& b) { return a.hash == b.hash; });
    if (!same) continue;
    least = apart;
    best = &live[i];
  }
  return best;
}

// Delivers all but the latest few.
GapCut::Verdict GapCut::decide(std::size_t kept) {
  Verdict verdict;
  if (!decided_ && !begins_by_content_) {
    const auto first = std::find_if(held_.begin(), held_.end(),
                                    [this](const Held& held) { return host_time(held.camera_time) > plan_.begin; });
    wanted_from_ = first == held_.end() ? next_ : first->number;
  }
  decided_ = true;
  const auto first = std::find_if(held_.begin(), held_.end(), [this](const Held& held) { return is_wanted(held); });
  const std::size_t wanted = first == held_.end() ? next_ : first->number;
  std::size_t lead = wanted;
  for (const Held& held : held_) {
    if (held.key && held.number <= wanted) lead = held.number;
  }
  while (held_.size() > kept) {
    const Held& oldest = held_.front();
    if (is_wanted(oldest)) {
      verdict.take.push_back(oldest.number);
      has_taken_ = true;
    } else if (!has_taken_ && wanted != next_ && oldest.number >= lead) {
      verdict.lead.push_back(oldest.number);
    } else if (!has_taken_ && wanted == next_) {
      break;
    }
    held_.pop_front();
  }
  verdict.forget = held_.empty() ? next_ : held_.front().number;
  return verdict;
}

}  // namespace vexa
