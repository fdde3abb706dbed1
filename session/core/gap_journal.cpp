// SPDX-License-Identifier: Apache-2.0
#include "session/core/gap_journal.h"

#include <algorithm>
#include <cstdio>
#include <sstream>

namespace vexa {
namespace {

constexpr std::size_t kMostOver = 1000;  // gaps that are over and still remembered
constexpr char kHex[] = "0123456789ABCDEF";

// A camera's text as one word of a line.
std::string word_of(const std::string& text) {
  std::string word;
  for (const char letter : text) {
    const auto byte = static_cast<unsigned char>(letter);
    if (byte > ' ' && byte < 0x7f && letter != '%') {
      word += letter;
    } else {
      word += '%';
      word += kHex[byte >> 4U];
      word += kHex[byte & 15U];
    }
  }
  return word.empty() ? "%" : word;
}

int digit_of(char letter) {
  const std::string digits = kHex;
  const std::size_t at = digits.find(letter);
  return at == std::string::npos ? -1 : static_cast<int>(at);
}

std::string text_of(const std::string& word) {
  std::string text;
  for (std::size_t i = 0; i < word.size(); ++i) {
    const bool escaped =
        word[i] == '%' && i + 2 < word.size() && digit_of(word[i + 1]) >= 0 && digit_of(word[i + 2]) >= 0;
    if (escaped) {
      text += static_cast<char>(digit_of(word[i + 1]) * 16 + digit_of(word[i + 2]));
      i += 2;
    } else if (word[i] != '%') {
      text += word[i];
    }
  }
  return text;
}

bool is_over(const Gap& gap) { return gap.state != GapState::kOpen && gap.state != GapState::kDue; }

// A line ends with a full stop, so that one that was cut is known.
template <typename... Words>
std::string line_of(const char* kind, const Words&... words) {
  std::ostringstream line;
  line << kind;
  ((line << ' ' << words), ...);
  line << " .\n";
  return line.str();
}

std::string gap_line(const Gap& gap) {
  return line_of("gap", gap.number, gap.begin, gap.end, gap.cameraBegin, gap.cameraEnd);
}

template <typename... Words>
bool whole(std::istringstream& line, Words&... words) {
  std::string stop;
  (line >> ... >> words) >> stop;
  return !line.fail() && stop == ".";
}

}  // namespace

std::string GapJournal::live_line(std::int64_t time, std::int64_t camera_time) {
  char line[64];
  const int length = std::snprintf(line, sizeof line, "live %020lld %020lld .\n", static_cast<long long>(time),
                                   static_cast<long long>(camera_time));
  return {line, static_cast<std::size_t>(length)};
}

GapJournal GapJournal::read(const std::string& text) {
  GapJournal journal;
  std::istringstream lines(text);
  std::string line;
  while (std::getline(lines, line)) journal.take(line);
  if (journal.live_ > 0 && journal.open_ == 0) (void)journal.open_gap(journal.live_, journal.camera_live_);
  return journal;
}

void GapJournal::take(const std::string& text) {
  std::istringstream line(text);
  std::string kind;
  std::string word;
  std::uint64_t number = 0;
  line >> kind;
  if (kind == "live") {
    std::int64_t time = 0;
    std::int64_t camera_time = 0;
    if (!whole(line, time, camera_time)) return;
    live_ = time;
    camera_live_ = camera_time;
  } else if (kind == "card") {
    std::int64_t time = 0;
    if (whole(line, time)) listed_at_ = time;
  } else if (kind == "seen") {
    if (whole(line, word)) seen_.insert(text_of(word));
  } else if (kind == "gap") {
    Gap gap;
    if (!whole(line, gap.number, gap.begin, gap.end, gap.cameraBegin, gap.cameraEnd) || gap.number == 0) return;
    gap.state = gap.end == 0 ? GapState::kOpen : GapState::kDue;
    gap.pictures = gaps_[gap.number].pictures;
    gaps_[gap.number] = gap;
    latest_ = std::max(latest_, gap.number);
    if (gap.end == 0) open_ = gap.number;
    if (gap.end != 0 && open_ == gap.number) open_ = 0;
  } else if (kind == "over") {
    if (!whole(line, number)) return;
    gaps_.erase(number);
    fetched_.erase(number);
    latest_ = std::max(latest_, number);
    if (open_ == number) open_ = 0;
  } else if (kind == "since") {
    std::int64_t time = 0;
    if (!whole(line, number, time) || gaps_.count(number) == 0) return;
    fetched_[number].listed_before = time;
  } else if (kind == "new") {
    if (!whole(line, number, word) || gaps_.count(number) == 0) return;
    fetched_[number].fresh.insert(text_of(word));
  } else if (kind == "run") {
    GapStretch run;
    std::uint64_t pictures = 0;
    if (!whole(line, number, run.begin, run.end, pictures) || gaps_.count(number) == 0) return;
    fetched_[number].runs.push_back(run);
    gaps_[number].pictures += pictures;
  } else if (kind == "far") {
    std::int64_t camera_time = 0;
    if (!whole(line, number, word, camera_time) || gaps_.count(number) == 0) return;
    fetched_[number].progress[text_of(word)] = camera_time;
  } else if (kind == "have") {
    std::int64_t camera_time = 0;
    std::int64_t time = 0;
    if (!whole(line, number, word, camera_time, time) || gaps_.count(number) == 0) return;
    note(number, text_of(word), camera_time, time);
  }
}

std::string GapJournal::text() const {
  std::string text;
  if (listed_at_ != 0) text += line_of("card", listed_at_);
  for (const std::string& name : seen_) text += line_of("seen", word_of(name));
  // Its number is never given again.
  if (latest_ != 0) text += line_of("over", latest_);
  for (const auto& [number, gap] : gaps_) {
    if (is_over(gap)) continue;
    text += gap_line(gap);
    const auto fetched = fetched_.find(number);
    if (fetched == fetched_.end()) continue;
    std::uint64_t pictures = gap.pictures;
    for (const GapStretch& run : fetched->second.runs) {
      text += line_of("run", number, run.begin, run.end, pictures);
      pictures = 0;  // with the first
    }
    for (const auto& [name, far] : fetched->second.progress) text += line_of("far", number, word_of(name), far);
    if (fetched->second.listed_before != 0) text += line_of("since", number, fetched->second.listed_before);
    for (const std::string& name : fetched->second.fresh) text += line_of("new", number, word_of(name));
  }
  return text;
}

std::string GapJournal::open_gap(std::int64_t begin, std::int64_t camera_begin) {
  if (open_ != 0) return "";
  Gap gap;
  gap.number = open_ = ++latest_;
  gap.begin = begin;
  gap.cameraBegin = camera_begin;
  gaps_[gap.number] = gap;
  return gap_line(gap);
}

std::string GapJournal::close_gap(std::int64_t end, std::int64_t camera_end) {
  if (open_ == 0) return "";
  Gap& gap = gaps_[open_];
  open_ = 0;
  gap.end = std::max(end, gap.begin + 1);
  gap.cameraEnd = camera_end;
  gap.state = GapState::kDue;
  return gap_line(gap);
}

std::string GapJournal::know_end(std::uint64_t gap, std::int64_t camera_end) {
  const auto found = gaps_.find(gap);
  if (found == gaps_.end() || found->second.state != GapState::kDue) return "";
  found->second.cameraEnd = camera_end;
  return gap_line(found->second);
}

std::string GapJournal::deliver(std::uint64_t gap, const std::string& recording, std::int64_t camera_time,
                                std::int64_t time) {
  note(gap, recording, camera_time, time);
  return line_of("have", gap, word_of(recording), camera_time, time);
}

void GapJournal::note(std::uint64_t gap, const std::string& recording, std::int64_t camera_time, std::int64_t time) {
  Fetched& fetched = fetched_[gap];
  const auto far = fetched.progress.emplace(recording, camera_time).first;
  far->second = std::max(far->second, camera_time);
  ++gaps_[gap].pictures;
  std::vector<GapStretch>& runs = fetched.runs;
  if (!runs.empty() && time >= runs.back().begin && time - runs.back().end <= kGapPause) {
    runs.back().end = std::max(runs.back().end, time);
  } else {
    runs.push_back({time, time});
  }
}

std::string GapJournal::finish(std::uint64_t gap, GapState state, const std::vector<GapStretch>& missing,
                               const std::string& reason) {
  Gap& ended = gaps_[gap];
  ended.state = state;
  ended.missing = missing;
  ended.text = reason;
  fetched_.erase(gap);
  forget_old();
  return line_of("over", gap);
}

void GapJournal::forget_old() {
  std::size_t over = 0;
  for (const auto& [number, gap] : gaps_) over += is_over(gap) ? 1U : 0U;
  for (auto gap = gaps_.begin(); gap != gaps_.end() && over > kMostOver;) {
    if (is_over(gap->second)) {
      gap = gaps_.erase(gap);
      --over;
    } else {
      ++gap;
    }
  }
}

std::string GapJournal::see(const std::vector<std::string>& recordings, std::uint64_t gap, std::int64_t time) {
  const bool of_gap = listed_at_ != 0 && gaps_.count(gap) != 0;
  std::string lines;
  if (of_gap && fetched_[gap].listed_before == 0) {
    fetched_[gap].listed_before = listed_at_;
    lines += line_of("since", gap, listed_at_);
  }
  listed_at_ = time;
  lines += line_of("card", time);
  std::set<std::string> now;
  for (const std::string& name : recordings) {
    now.insert(name);
    if (seen_.count(name) != 0) continue;
    lines += line_of("seen", word_of(name));
    if (of_gap && fetched_[gap].fresh.insert(name).second) lines += line_of("new", gap, word_of(name));
  }
  seen_ = std::move(now);
  return lines;
}

std::uint64_t GapJournal::due() const {
  for (const auto& [number, gap] : gaps_) {
    if (gap.state == GapState::kDue) return number;
  }
  return 0;
}

std::map<std::string, std::int64_t> GapJournal::progress(std::uint64_t gap) const {
  const auto found = fetched_.find(gap);
  return found == fetched_.end() ? std::map<std::string, std::int64_t>() : found->second.progress;
}

std::vector<GapStretch> GapJournal::runs(std::uint64_t gap) const {
  const auto found = fetched_.find(gap);
  return found == fetched_.end() ? std::vector<GapStretch>() : found->second.runs;
}

std::set<std::string> GapJournal::fresh(std::uint64_t gap) const {
  const auto found = fetched_.find(gap);
  return found == fetched_.end() ? std::set<std::string>() : found->second.fresh;
}

std::int64_t GapJournal::listed_before(std::uint64_t gap) const {
  const auto found = fetched_.find(gap);
  return found == fetched_.end() ? 0 : found->second.listed_before;
}

std::vector<GapStretch> missing_of(const Gap& gap, const std::vector<GapStretch>& runs) {
  std::vector<GapStretch> sorted = runs;
  std::sort(sorted.begin(), sorted.end(), [](const GapStretch& a, const GapStretch& b) { return a.begin < b.begin; });
  std::vector<GapStretch> missing;
  std::int64_t covered = gap.begin;
  for (const GapStretch& run : sorted) {
    if (run.begin - covered > kGapPause) missing.push_back({covered, run.begin});
    covered = std::max(covered, run.end);
  }
  if (gap.end - covered > kGapPause) missing.push_back({covered, gap.end});
  return missing;
}

}  // namespace vexa
