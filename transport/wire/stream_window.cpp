#include "transport/wire/stream_window.h"

#include <algorithm>
#include <cstring>

namespace vexa {
namespace {

constexpr std::size_t kLittleRoom = 65536;

}  // namespace

StreamWindow::Cut StreamWindow::cut_frame(StartCode code, std::span<unsigned char> room, std::size_t& length) {
  const std::ptrdiff_t unsearched = places_.write_end - places_.search;
  if (unsearched <= static_cast<std::ptrdiff_t>(code.length)) return Cut::kNoneYet;
  const unsigned char* found = code.find(places_.search, static_cast<unsigned int>(unsearched));
  if (found == nullptr) {
    // A start code that the end of the data cuts is found once the rest is there.
    places_.search = places_.write_end - code.length + 1;
    return Cut::kNoneYet;
  }
  const Bytes frame(places_.frame_start, static_cast<std::size_t>(found - places_.frame_start));
  if (frame.size() > room.size()) return Cut::kTooLong;
  std::copy(frame.begin(), frame.end(), room.begin());
  length = frame.size();
  places_.frame_start += length;
  places_.search = places_.frame_start + code.length;
  return Cut::kFrame;
}

void StreamWindow::make_room(StartCode code) {
  if (buffer_.empty() || free_room().size() >= kLittleRoom) return;
  const std::size_t length = static_cast<std::size_t>(places_.write_end - places_.frame_start);
  std::memmove(buffer_.data(), places_.frame_start, length);
  places_.frame_start = buffer_.data();
  // Kept: the unfinished frame is searched again from its front.
  places_.search = buffer_.data() + code.length;
  places_.write_end = buffer_.data() + length;
  if (part_ == nullptr) return;
  while (*part_ < buffer_.size() && free_room().size() < kLittleRoom) *part_ = std::min(2 * *part_, buffer_.size());
}

std::span<unsigned char> StreamWindow::free_room() const {
  const auto filled = static_cast<std::size_t>(places_.write_end - buffer_.data());
  const std::size_t part = part_ == nullptr ? buffer_.size() : std::min(*part_, buffer_.size());
  return buffer_.subspan(filled, part - std::min(part, filled));
}

}  // namespace vexa
