#include "media/assembly/packet_collector.h"

#include <algorithm>
#include <utility>

#include "transport/wire/packet_order.h"

namespace vexa {
namespace {

/// How long a complete key picture waits for what is missing before it.
constexpr std::chrono::milliseconds kKeyPicturePatience{200};

/// Consecutive packets behind the last one used that prove a restarted sequence.
constexpr std::size_t kRestartProof = 3;

/// 1.2 s in ticks.
constexpr std::int64_t most_age(int clock_rate) { return static_cast<std::int64_t>(clock_rate) * 12 / 10; }

/// Faster than the clock of any camera. A rate beyond it, which a description may name, would take a restart for a
/// latecomer: 1.2 s of it are half of all timestamps and more.
constexpr int kFastestClock = 1'000'000;

}  // namespace

bool PacketCollector::add(const SPacketInfo& packet, int clock_rate, Instant now, SequenceLedger::Arrival arrival) {
  remove_too_old(packet, clock_rate);
  const bool ahead = last_used_ && sequence_is_ahead(packet.sequence, *last_used_);
  if (is_listed(packet) || (!ahead && recent_.holds(packet.timestamp, packet.sequence))) {
    ++counts_.duplicated;
    return false;
  }
  if (last_used_ && !ahead) {
    if (is_latecomer(packet, clock_rate)) {
      ++(arrival == SequenceLedger::Arrival::kDuplicate ? counts_.duplicated : counts_.late);
      return false;
    }
    take_stray(packet, now);
    return true;
  }
  drop_strays();
  insert(packet, now);
  return true;
}

// They were no restart.
void PacketCollector::drop_strays() {
  counts_.late += strays_.size();
  counts_.held -= strays_.size();
  strays_.clear();
}

// A rate that is no rate sets no age.
void PacketCollector::remove_too_old(const SPacketInfo& newest, int clock_rate) {
  if (packets_.empty() || clock_rate <= 0) return;
  const std::int64_t limit = order_timestamp(newest.timestamp) - most_age(clock_rate);
  const auto within = [limit](const SPacketInfo& packet) { return order_timestamp(packet.timestamp) <= limit; };
  if (!within(packets_.front())) return;
  const auto end = std::partition_point(packets_.begin(), packets_.end(), within);
  // Where the order of timestamps turns (at 2^32 and at the lift), newer packets stand first: they are not old.
  const auto old = std::remove_if(packets_.begin(), end, [&](const SPacketInfo& packet) {
    return timestamp_is_after(newest.timestamp, packet.timestamp);
  });
  if (old == end) return;
  const std::size_t listed = packets_.size();
  packets_.erase(old, end);
  count_given_up(listed);
  forget_sequence();
}

bool PacketCollector::is_listed(const SPacketInfo& packet) const {
  const auto place = place_of(packets_, packet);
  if (place == packets_.begin()) return false;
  const SPacketInfo& before = *(place - 1);
  return before.timestamp == packet.timestamp && before.sequence == packet.sequence;
}

bool PacketCollector::follows_last_used(std::uint16_t sequence) const {
  return last_used_ && sequence == static_cast<std::uint16_t>(*last_used_ + 1);
}

// A packet of a picture that was given up: a camera that restarts is not that close to its former timestamps.
bool PacketCollector::is_latecomer(const SPacketInfo& packet, int clock_rate) const {
  const std::uint32_t age = last_used_timestamp_ - packet.timestamp;
  return age != 0 && age <= most_age(std::min(clock_rate, kFastestClock));
}

// Packets that go on behind the last one used are a camera that began its sequence again.
void PacketCollector::take_stray(const SPacketInfo& packet, Instant now) {
  const bool goes_on = !strays_.empty() && packet.sequence == static_cast<std::uint16_t>(strays_.back().sequence + 1);
  if (!goes_on) drop_strays();
  strays_.push_back(packet);
  ++counts_.held;
  if (strays_.size() < kRestartProof) return;
  // So that no insertion below can fail, and leave some of them listed twice.
  packets_.reserve(kRestartProof);
  standing_keys_.reserve(kRestartProof);
  const std::vector<SPacketInfo> restarted = std::exchange(strays_, {});
  counts_.held -= restarted.size();
  const std::size_t listed = packets_.size();
  packets_.clear();
  count_given_up(listed);
  forget_sequence();
  recent_ = RecentPictures{};
  ++counts_.restarts;
  for (const SPacketInfo& stray : restarted) insert(stray, now);
}

void PacketCollector::insert(const SPacketInfo& packet, Instant now) {
  preamble_seen_ = preamble_seen_ || rules_.is_preamble(packet);
  const auto place = place_of(packets_, packet);
  const bool at_end = place == packets_.end();
  const auto inserted = packets_.insert(place, packet);
  count_inserted(static_cast<std::size_t>(inserted - packets_.begin()));
  // In order and without the marker, a packet completes nothing.
  if (at_end && !packet.marker) return;
  changed_ = true;
  const auto index = static_cast<std::size_t>(inserted - packets_.begin());
  note_key_picture(index, now);
  note_proven_follower(index, now);
}

// A picture is a run of one timestamp. Where the order of timestamps turns, a packet may part a run in two.
void PacketCollector::count_inserted(std::size_t index) {
  ++counts_.held;
  const std::uint32_t timestamp = packets_[index].timestamp;
  const bool has_next = index + 1 < packets_.size();
  const bool joins_previous = index > 0 && packets_[index - 1].timestamp == timestamp;
  if (joins_previous && !has_next) return;
  const bool joins_next = has_next && packets_[index + 1].timestamp == timestamp;
  if (joins_previous || joins_next) return;
  const bool parts = index > 0 && has_next && packets_[index - 1].timestamp == packets_[index + 1].timestamp;
  const std::uint64_t begun = parts ? 2 : 1;
  counts_.pictures_begun += begun;
  counts_.pictures_held += begun;
}

std::uint64_t PacketCollector::pictures_listed() const {
  std::uint64_t pictures = packets_.empty() ? 0 : 1;
  for (std::size_t i = 1; i < packets_.size(); ++i) {
    if (packets_[i].timestamp != packets_[i - 1].timestamp) ++pictures;
  }
  return pictures;
}

// Packets have left the list, and no picture was made of them.
void PacketCollector::count_given_up(std::size_t listed_before) {
  const std::size_t packets = listed_before - packets_.size();
  counts_.given_up += packets;
  counts_.held -= packets;
  const std::uint64_t pictures = pictures_listed();
  counts_.pictures_incomplete += counts_.pictures_held - pictures;
  counts_.pictures_held = pictures;
}

void PacketCollector::discard_all() {
  counts_.stopped += counts_.held;
  counts_.held = 0;
  counts_.pictures_stopped += counts_.pictures_held;
  counts_.pictures_held = 0;
  packets_.clear();
  strays_.clear();
  standing_keys_.clear();
  forget_sequence();
}

// A late packet may be the one right before a picture that stands complete already.
void PacketCollector::note_proven_follower(std::size_t index, Instant now) {
  const std::size_t next = index + 1;
  if (next == packets_.size() || packets_[next].timestamp == packets_[index].timestamp) return;
  if (packets_[next].sequence != static_cast<std::uint16_t>(packets_[index].sequence + 1)) return;
  note_key_picture(next, now);
}

void PacketCollector::note_key_picture(std::size_t index, Instant now) {
  const Run run = run_around(index);
  if (!is_complete(run) || !rules_.is_key(packets(run))) return;
  const SPacketInfo& first = packets_[run.first];
  const bool proven = front_is_proven(run);
  if (proven) key_opening_ = rules_.opening(first);
  if (!is_trusted_key(run)) return;
  const auto same = [&first](const KeyPicture& key) { return key.timestamp == first.timestamp; };
  auto key = std::find_if(standing_keys_.begin(), standing_keys_.end(), same);
  if (key == standing_keys_.end()) key = standing_keys_.insert(key, {first.timestamp, now, std::nullopt});
  if (proven) key->proven_first = first.sequence;
}

PacketCollector::Run PacketCollector::run_around(std::size_t index) const {
  const std::uint32_t timestamp = packets_[index].timestamp;
  std::size_t first = index;
  while (first > 0 && packets_[first - 1].timestamp == timestamp) --first;
  std::size_t end = index + 1;
  while (end < packets_.size() && packets_[end].timestamp == timestamp) ++end;
  return {first, end - first};
}

bool PacketCollector::is_complete(Run run) const {
  const SPacketInfo& first = packets_[run.first];
  const SPacketInfo& last = packets_[run.first + run.count - 1];
  return last.marker && static_cast<std::uint16_t>(last.sequence - first.sequence) == run.count - 1;
}

// The packet before the run's first is known, and belongs to another picture.
bool PacketCollector::front_is_proven(Run run) const {
  const std::uint16_t first = packets_[run.first].sequence;
  if (follows_last_used(first)) return true;
  return run.first > 0 && static_cast<std::uint16_t>(packets_[run.first - 1].sequence + 1) == first;
}

// Behind a gap nothing says that the picture's first packet is there, but the packet itself.
bool PacketCollector::is_trusted_key(Run run) const {
  const PacketRun packets = this->packets(run);
  if (!rules_.is_key(packets)) return false;
  if (front_is_proven(run)) return true;
  if (key_opening_ != 0) return rules_.opening(packets.front()) == key_opening_;
  return rules_.opens_whole(packets, preamble_seen_);
}

// A part of it may have been overwritten since; what proved its front may be gone without harm.
bool PacketCollector::still_stands(const KeyPicture& key, Run run) const {
  if (!is_complete(run) || !rules_.is_key(packets(run))) return false;
  return key.proven_first == packets_[run.first].sequence || is_trusted_key(run);
}

// The picture whose turn it is: the one that follows the last packet used, or, when none is tracked, the oldest.
std::optional<PacketCollector::Run> PacketCollector::expected_run() const {
  if (packets_.empty()) return std::nullopt;
  if (!last_used_ || follows_last_used(packets_.front().sequence)) return run_around(0);
  // Where the order of timestamps turns, the next picture need not stand first.
  const auto next = std::find_if(packets_.begin(), packets_.end(),
                                 [this](const SPacketInfo& packet) { return follows_last_used(packet.sequence); });
  if (next == packets_.end()) return std::nullopt;
  const Run run = run_around(static_cast<std::size_t>(next - packets_.begin()));
  if (!follows_last_used(packets_[run.first].sequence)) return std::nullopt;
  return run;
}

std::optional<PacketCollector::Run> PacketCollector::next_picture(Instant now) {
  while (changed_) {
    const std::optional<Run> run = expected_run();
    if (!run || !is_complete(*run)) break;
    const bool key = rules_.is_key(packets(*run));
    if (last_used_ && (key || !waiting_for_key_)) return run;
    if (key && is_trusted_key(*run)) return run;
    if (key) break;
    ++counts_.pictures_without_key;
    mark_used(*run);
  }
  changed_ = false;
  return first_standing_key(now);
}

// The wait for what is missing before a key picture ends: the earliest that stands complete begins afresh.
std::optional<PacketCollector::Run> PacketCollector::first_standing_key(Instant now) {
  const std::optional<Instant> end_of_wait = deadline();
  if (!end_of_wait || now < *end_of_wait) return std::nullopt;
  last_used_.reset();
  waiting_for_key_ = true;
  while (!standing_keys_.empty()) {
    const auto earliest = std::min_element(
        standing_keys_.begin(), standing_keys_.end(),
        [](const KeyPicture& a, const KeyPicture& b) { return timestamp_is_after(b.timestamp, a.timestamp); });
    const std::uint32_t timestamp = earliest->timestamp;
    const std::size_t listed = packets_.size();
    std::erase_if(packets_,
                  [timestamp](const SPacketInfo& packet) { return timestamp_is_after(timestamp, packet.timestamp); });
    if (packets_.size() != listed) count_given_up(listed);
    const std::optional<Run> run = run_of(timestamp);
    if (run && still_stands(*earliest, *run)) return run;
    standing_keys_.erase(earliest);
  }
  changed_ = true;
  return std::nullopt;
}

std::optional<PacketCollector::Run> PacketCollector::run_of(std::uint32_t timestamp) const {
  const auto found = std::find_if(packets_.begin(), packets_.end(),
                                  [timestamp](const SPacketInfo& packet) { return packet.timestamp == timestamp; });
  if (found == packets_.end()) return std::nullopt;
  return run_around(static_cast<std::size_t>(found - packets_.begin()));
}

void PacketCollector::use(Run run) {
  if (rules_.is_key(packets(run))) waiting_for_key_ = false;
  ++counts_.pictures_assembled;
  mark_used(run);
}

void PacketCollector::abandon(Run run, PictureLoss loss) {
  ++(loss == PictureLoss::kTooLarge ? counts_.pictures_too_large : counts_.pictures_damaged);
  mark_used(run);
  waiting_for_key_ = true;
}

void PacketCollector::mark_used(Run run) {
  const auto first = packets_.begin() + static_cast<std::ptrdiff_t>(run.first);
  const auto end = first + static_cast<std::ptrdiff_t>(run.count);
  const std::uint32_t timestamp = first->timestamp;
  last_used_ = (end - 1)->sequence;
  last_used_timestamp_ = timestamp;
  recent_.add(timestamp, first->sequence, *last_used_);
  const auto next = packets_.erase(first, end);
  counts_.used += run.count;
  counts_.held -= run.count;
  --counts_.pictures_held;
  if (next != packets_.begin() && next != packets_.end() && (next - 1)->timestamp == next->timestamp) {
    // It stood in the middle of another, which is one again.
    --counts_.pictures_held;
    ++counts_.pictures_incomplete;
  }
  std::erase_if(standing_keys_, [timestamp](const KeyPicture& key) { return key.timestamp == timestamp; });
  changed_ = true;
  remove_passed_by();
}

// What is listed but no longer ahead will never be used. In order, both ends of the list tell that there is nothing.
void PacketCollector::remove_passed_by() {
  if (packets_.empty()) return;
  const auto passed = [this](const SPacketInfo& packet) { return !sequence_is_ahead(packet.sequence, *last_used_); };
  if (!passed(packets_.front()) && !passed(packets_.back())) return;
  const std::size_t listed = packets_.size();
  std::erase_if(packets_, passed);
  count_given_up(listed);
}

void PacketCollector::drop_overwritten(const std::vector<PacketRing::Slot>& slots) {
  std::uint64_t lost = 0;
  for (const PacketRing::Slot& slot : slots) {
    SPacketInfo key;
    key.timestamp = slot.timestamp;
    key.sequence = slot.sequence;
    const std::size_t strays =
        std::erase_if(strays_, [&key](const SPacketInfo& stray) { return stray.sequence == key.sequence; });
    counts_.overwritten += strays;
    counts_.held -= strays;
    if (!is_listed(key)) continue;
    packets_.erase(place_of(packets_, key) - 1);
    ++lost;
  }
  if (lost == 0) return;
  count_given_up(packets_.size() + lost);
  counts_.given_up -= lost;
  counts_.overwritten += lost;
  forget_sequence();
}

std::optional<PacketCollector::Instant> PacketCollector::deadline() const {
  if (standing_keys_.empty()) return std::nullopt;
  const auto earlier = [](const KeyPicture& a, const KeyPicture& b) { return a.complete_since < b.complete_since; };
  return std::min_element(standing_keys_.begin(), standing_keys_.end(), earlier)->complete_since + kKeyPicturePatience;
}

// The next key picture starts afresh. Without a sequence there is nothing to forget.
void PacketCollector::forget_sequence() {
  std::erase_if(standing_keys_, [this](const KeyPicture& key) { return !run_of(key.timestamp); });
  changed_ = true;
  if (!last_used_) return;
  last_used_.reset();
  waiting_for_key_ = true;
}

}  // namespace vexa
