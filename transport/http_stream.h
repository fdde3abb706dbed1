// Endless HTTP streams, one unit a call: pictures, text parts, elementary video.
#pragma once

#include <span>

#include "runtime/base/result.h"
#include "transport/socket.h"
#include "transport/wait_budget.h"
#include "transport/wire/stream_window.h"

namespace vexa {

/// The most bytes of a part's header, and of a part that is a header alone.
inline constexpr int kPartHeaderRoom = 1023;

/// One part with a picture, as its header announces it.
struct PicturePart {
  enum class Kind { kPicture, kSilence, kTooLarge };
  Kind kind;
  int length = 0;  ///< bytes, with kPicture
};

/// Reads the next part's picture into `room`. The header is waited for a second, the picture for the limit. A picture
/// that is too large for the room stays on the socket.
Result<PicturePart> receive_picture_part(int socket, std::span<char> room, WaitLimit limit);

/// Reads the 64 bytes of the next metadata part and a NUL into `room`, which has 65 bytes or more: 64, or 0 when no
/// part came within a second.
Result<int> receive_metadata_part(int socket, std::span<char> room, WaitLimit limit);

/// Cuts the next unit of an elementary stream into `room`, receiving as long as it is not whole: its length, 0 when it
/// did not come within the limit or the stream is to end.
Result<int> receive_unit(StoppableSocket source, StreamWindow& window, StartCode code, std::span<unsigned char> room,
                         WaitLimit limit);

}  // namespace vexa
