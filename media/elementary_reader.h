// Frames from an elementary stream over HTTP, unit by unit.
#pragma once

#include <functional>
#include <span>

#include "media/assembly/codec.h"
#include "runtime/base/result.h"
#include "transport/socket.h"
#include "transport/wire/stream_window.h"

namespace vexa {

/// A frame that grows by units, in its owner's fields.
struct GrowingFrame {
  std::span<unsigned char> room;
  unsigned int& length;      ///< bytes of frame so far
  std::int32_t& frame_type;  ///< an ELibDVideoFrameType value
};

struct UnitRead {
  enum class Kind {
    kPart,     ///< a unit that does not end the picture, or one of user data
    kPicture,  ///< the unit that ends the picture; the frame is whole
    kSilence   ///< no whole unit came in time, or the stream is to end
  };
  Kind kind;
  int length;  ///< bytes of the unit
};

/// Reads the next unit, waiting `timeout` milliseconds for it, and appends it to the frame. User data is no part of the
/// frame: its text goes to `user_data`.
Result<UnitRead> read_unit(StoppableSocket source, StreamWindow& window, const Codec& codec, GrowingFrame frame,
                           int timeout, const std::function<void(Bytes)>& user_data);

}  // namespace vexa
