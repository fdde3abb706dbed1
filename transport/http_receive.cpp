#include "transport/http_receive.h"

#include <sys/socket.h>

#include <cstdint>
#include <vector>

#include "transport/failure.h"
#include "transport/wire/http_answer.h"

namespace vexa {
namespace {

constexpr int kHeaderPause = 10;  // milliseconds between two looks at a header that is not complete
constexpr std::size_t kPieceRoom = 4096;
constexpr std::size_t kEndlessAnswer = std::size_t{32} << 20;

}  // namespace

Result<int> receive_header(int socket, std::span<char> room, WaitLimit limit) {
  const int ready = WaitBudget(limit).wait_readable(socket);
  if (ready == 0) return 0;
  if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
  bool closed = false;
  for (int looks_left = limit.milliseconds / kHeaderPause;; --looks_left) {
    const ssize_t peeked = recv(socket, room.data(), room.size(), MSG_PEEK);
    if (peeked < 0) return system_failure();
    const std::size_t header = header_length({room.data(), static_cast<std::size_t>(peeked)});
    if (header != 0) {
      if (recv(socket, room.data(), header, 0) < 0) return system_failure();
      return static_cast<int>(header);
    }
    if (looks_left <= 0 || closed || limit.cancels.raised()) return 0;
    closed = WaitBudget(limit.of(kHeaderPause)).wait_closed(socket) == 1;
  }
}

Result<int> receive_some(int socket, std::span<char> room, WaitLimit limit) {
  const int ready = WaitBudget(limit).wait_readable(socket);
  if (ready == 0) return 0;
  if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
  const ssize_t received = recv(socket, room.data(), room.size(), 0);
  if (received < 0) return system_failure();
  return static_cast<int>(received);
}

Result<int> receive_all(int socket, std::span<char> room, WaitLimit limit) {
  const WaitBudget budget(limit);
  std::size_t filled = 0;
  while (filled < room.size()) {
    const int ready = budget.wait_readable(socket);
    if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
    const ssize_t received = recv(socket, room.data() + filled, room.size() - filled, 0);
    if (received < 0) return system_failure();
    if (received == 0) break;
    filled += static_cast<std::size_t>(received);
  }
  return static_cast<int>(filled);
}

Result<int> receive_text(int socket, std::string& text, int length, WaitLimit limit) {
  const WaitBudget budget(limit);
  const bool until_closed = length <= 0;
  std::vector<char> piece(until_closed ? kPieceRoom : static_cast<std::size_t>(length));
  for (std::int64_t missing = length;;) {
    const int ready = budget.wait_readable(socket);
    if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
    const ssize_t received = recv(socket, piece.data(), piece.size(), 0);
    if (received < 0) return system_failure();
    text.append(piece.data(), static_cast<std::size_t>(received));
    // Kept: only a read of exactly what is missing ends a bounded read. Each read asks for the whole length, since an
    // answer comes in one piece and the camera closes after it.
    if (received == 0 || (!until_closed && received == missing)) return static_cast<int>(text.size());
    missing -= received;
    // Safe: a camera that never stops sending does not fill the memory.
    if (text.size() > kEndlessAnswer) return kReceiveTimedOut;
  }
}

}  // namespace vexa
