#include "transport/http_stream.h"

#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <thread>

#include "transport/failure.h"
#include "transport/http_receive.h"
#include "transport/wait_budget.h"
#include "transport/wire/http_answer.h"

namespace vexa {
namespace {

using TryClock = std::chrono::steady_clock;

constexpr int kPartHeaderWait = 1000;  // milliseconds, whatever the caller's time-out
constexpr int kMetadataLength = 64;
constexpr int kMillisecondsPerTry = 10;
constexpr std::chrono::microseconds kFirstPause{1};
constexpr std::chrono::milliseconds kPause{kMillisecondsPerTry};

/// Milliseconds that only waiting uses up: the pauses between the waits do not count.
class WaitingTime {
 public:
  explicit WaitingTime(WaitLimit limit) : limit_(limit), left_(std::chrono::milliseconds(limit.milliseconds)) {}

  int wait_readable(StoppableSocket source) {
    const auto begin = TryClock::now();
    const auto milliseconds = std::chrono::ceil<std::chrono::milliseconds>(left_).count();
    const int ready =
        WaitBudget(limit_.of(static_cast<int>(milliseconds))).wait_readable_unless(source.socket, source.stop);
    left_ -= std::min(TryClock::now() - begin, left_);
    return ready;
  }

 private:
  const WaitLimit limit_;
  TryClock::duration left_;
};

// Kept: a camera that has closed its stream is not an error here; the tries run out.
Result<> receive_into(StreamWindow& window, int socket) {
  const std::span<unsigned char> free = window.free_room();
  const ssize_t received = recv(socket, free.data(), free.size(), 0);
  if (received < 0 && errno != EAGAIN && errno != EWOULDBLOCK) return system_failure();
  window.received(static_cast<std::size_t>(std::max<ssize_t>(received, 0)));
  return {};
}

}  // namespace

Result<PicturePart> receive_picture_part(int socket, std::span<char> room, WaitLimit limit) {
  char header[kPartHeaderRoom];
  const auto header_length = receive_header(socket, header, limit.of(kPartHeaderWait));
  if (!header_length) return header_length.failure();
  if (*header_length == 0) return PicturePart{PicturePart::Kind::kSilence};
  const auto length = announced_length({header, static_cast<std::size_t>(*header_length)});
  if (!length) return kDataLenNotFound;
  const auto wanted = static_cast<std::size_t>(*length);
  if (wanted > room.size()) return PicturePart{PicturePart::Kind::kTooLarge};
  const auto received = receive_all(socket, room.first(wanted), limit);
  if (!received) return received.failure();
  if (*received != *length) return kNoReason;
  return PicturePart{PicturePart::Kind::kPicture, *length};
}

Result<int> receive_metadata_part(int socket, std::span<char> room, WaitLimit limit) {
  if (room.size() <= kMetadataLength) return kNoReason;
  char header[kPartHeaderRoom];
  const auto header_length = receive_header(socket, header, limit.of(kPartHeaderWait));
  if (!header_length || *header_length == 0) return header_length;
  const auto received = receive_all(socket, room.first(kMetadataLength), limit);
  if (!received) return received;
  if (*received != kMetadataLength) return kNoReason;
  room[kMetadataLength] = '\0';
  return kMetadataLength;
}

Result<int> receive_unit(StoppableSocket source, StreamWindow& window, StartCode code, std::span<unsigned char> room,
                         WaitLimit limit) {
  WaitingTime waiting(limit);
  TryClock::duration pause = kFirstPause;
  for (int tries = limit.milliseconds / kMillisecondsPerTry; tries > 0; --tries) {
    std::size_t length = 0;
    const StreamWindow::Cut cut = window.cut_frame(code, room, length);
    if (cut == StreamWindow::Cut::kFrame) return static_cast<int>(length);
    // Kept: a frame that is too long stays, and every call fails, until the stream is started anew.
    if (cut == StreamWindow::Cut::kTooLong) return kNoReason;
    window.make_room(code);
    const int ready = waiting.wait_readable(source);
    if (ready == 0) return 0;
    if (ready != 1) return wait_failure(ready, kReceiveTimedOut);
    std::this_thread::sleep_for(pause);
    pause = kPause;
    const auto received = receive_into(window, source.socket);
    if (!received) return received.failure();
  }
  // Kept: what came with the last try is searched by the next call.
  return 0;
}

}  // namespace vexa
