// Reading what a camera sends over an HTTP connection.
#pragma once

#include <span>
#include <string>

#include "runtime/base/result.h"

namespace vexa {

// Time-outs are in milliseconds; 0 or less does not wait. The sockets stay the caller's.

/// Takes a header off the socket and no byte more, so that the body stays for its reader: the header's length; 0 when
/// none came in time or it does not fit into `room`. Waits twice: for the first byte and for the rest.
Result<int> receive_header(int socket, std::span<char> room, int timeout);

/// One read: the bytes received; 0 when none came in time or the camera has closed.
Result<int> receive_some(int socket, std::span<char> room, int timeout);

/// Fills `room`; fewer bytes only when the camera closes. All its waits share the time-out.
Result<int> receive_all(int socket, std::span<char> room, int timeout);

/// Appends `length` bytes to `text`, all until the camera closes when `length` is 0 or less: the size of the text.
Result<int> receive_text(int socket, std::string& text, int length, int timeout);

}  // namespace vexa
