#include "media/frame_store.h"

#include <algorithm>
#include <iterator>
#include <span>

#include "runtime/pages.h"

namespace vexa {
namespace {

/// One frame that is being filled, one with the host, and a few between: more only costs memory.
constexpr std::size_t kMostSpares = 4;

}  // namespace

FrameStore::FrameStore() { spares_.reserve(kMostSpares); }

unsigned char* FrameStore::take(std::size_t capacity) {
  // The one given back last, whose memory is still in the cache.
  const auto found =
      std::find_if(spares_.rbegin(), spares_.rend(), [&](const Spare& spare) { return spare.first == capacity; });
  if (found == spares_.rend()) {
    least_spares_ = 0;
    return new unsigned char[capacity];
  }
  unsigned char* buffer = found->second.release();
  spares_.erase(std::next(found).base());
  least_spares_ = std::min(least_spares_, spares_.size());
  return buffer;
}

void FrameStore::give_back(unsigned char* buffer, std::size_t capacity, std::size_t used) {
  std::unique_ptr<unsigned char[]> owned(buffer);
  if (buffer == nullptr) return;
  if (used != 0) note_use(used);
  if (trims_left_ != 0) {
    --trims_left_;
    give_pages_back(std::span(buffer, capacity).subspan(std::min(std::max(kept_bytes_, used), capacity)));
  }
  // Frames have outgrown the others.
  std::erase_if(spares_, [capacity](const Spare& spare) { return spare.first < capacity; });
  if (spares_.size() >= kMostSpares) return;
  spares_.emplace_back(capacity, std::move(owned));
}

// The allocator may keep what is deleted for itself: its pages go first.
void FrameStore::clear() {
  for (const auto& [capacity, buffer] : spares_) give_pages_back({buffer.get(), capacity});
  spares_.clear();
}

void FrameStore::note_use(std::size_t used) {
  if (++frames_ == kIdlePeriod) drop_idle_spares();
  const auto needed = need_.used(used);
  if (!needed) return;
  kept_bytes_ = *needed;
  trims_left_ = RecentNeed::kPeriod;
  for (const auto& [capacity, buffer] : spares_) {
    give_pages_back(std::span(buffer.get(), capacity).subspan(std::min(kept_bytes_, capacity)));
  }
}

// The oldest of them: those that came back last are taken first.
void FrameStore::drop_idle_spares() {
  const auto idle = spares_.begin() + static_cast<std::ptrdiff_t>(std::min(least_spares_, spares_.size()));
  for (auto spare = spares_.begin(); spare != idle; ++spare) give_pages_back({spare->second.get(), spare->first});
  spares_.erase(spares_.begin(), idle);
  frames_ = 0;
  least_spares_ = spares_.size();
}

}  // namespace vexa
