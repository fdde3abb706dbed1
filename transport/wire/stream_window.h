// The bytes of an elementary stream between the socket and the frame cut out of them.
#pragma once

#include <cstddef>
#include <span>

#include "runtime/base/bytes.h"

namespace vexa {

/// Where the next start code begins in `length` bytes; null when there is none.
using StartCodeFinder = const unsigned char* (*)(const unsigned char* data, unsigned int length);

struct StartCode {
  StartCodeFinder find;
  std::size_t length;  ///< bytes of one start code
};

/// Cuts frames out of a buffer; a frame is everything from one start code to the next. Holds no bytes: the buffer and
/// the places in it are the caller's, and outlive the window.
class StreamWindow {
 public:
  /// Places in the buffer. frame_start <= write_end always; search may be anywhere after frame_start.
  struct Places {
    unsigned char*& frame_start;  ///< first byte of the frame that is not handed out yet
    unsigned char*& search;       ///< where the search for the next start code goes on
    unsigned char*& write_end;    ///< end of the bytes received
  };

  /// `part`, when given, is how many bytes at the buffer's start are in use; it grows when a frame needs more. So small
  /// frames do not wander through a large buffer.
  StreamWindow(std::span<unsigned char> buffer, Places places, std::size_t* part = nullptr)
      : buffer_(buffer), places_(places), part_(part) {}

  enum class Cut { kFrame, kNoneYet, kTooLong };

  /// Copies the next whole frame to `room` and moves on to the one after it; `length` is the frame's then. A frame that
  /// is longer than the room stays, and blocks all that follow.
  Cut cut_frame(StartCode code, std::span<unsigned char> room, std::size_t& length);

  /// Moves the unfinished frame to the buffer's start when little room is left after it.
  void make_room(StartCode code);

  /// Where received bytes go; `received` is then called with their count.
  std::span<unsigned char> free_room() const;
  void received(std::size_t count) { places_.write_end += count; }

 private:
  std::span<unsigned char> buffer_;
  Places places_;
  std::size_t* part_;
};

}  // namespace vexa
