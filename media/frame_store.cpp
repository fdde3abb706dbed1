#include "media/frame_store.h"

#include <algorithm>
#include <iterator>

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
  if (found == spares_.rend()) return new unsigned char[capacity];
  unsigned char* buffer = found->second.release();
  spares_.erase(std::next(found).base());
  return buffer;
}

void FrameStore::give_back(unsigned char* buffer, std::size_t capacity) {
  std::unique_ptr<unsigned char[]> owned(buffer);
  if (buffer == nullptr) return;
  // Frames have outgrown the others.
  std::erase_if(spares_, [capacity](const Spare& spare) { return spare.first < capacity; });
  if (spares_.size() >= kMostSpares) return;
  spares_.emplace_back(capacity, std::move(owned));
}

}  // namespace vexa
