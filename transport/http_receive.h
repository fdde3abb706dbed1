// Reading what a camera sends over an HTTP connection.
#pragma once

#include <span>
#include <string>

#include "runtime/base/result.h"
#include "transport/wait_budget.h"

namespace vexa {

// A limit of 0 milliseconds or less looks once. The sockets stay the caller's.

/// Takes a header off the socket and nothing else, so that the body stays for its reader: the header's length; 0 when
/// none came in time, the camera has closed, or it does not fit into `room`.
Result<int> receive_header(int socket, std::span<char> room, WaitLimit limit);

/// One read: the bytes received; 0 when none came in time or the camera has closed.
Result<int> receive_some(int socket, std::span<char> room, WaitLimit limit);

/// Fills `room`; fewer bytes only when the camera closes. All its waits share the limit.
Result<int> receive_all(int socket, std::span<char> room, WaitLimit limit);

/// Appends `length` bytes to `text`, all until the camera closes when `length` is 0 or less: the size of the text.
Result<int> receive_text(int socket, std::string& text, int length, WaitLimit limit);

}  // namespace vexa
