// Endless HTTP streams, one unit a call: JPEG pictures, alarm parts, motion metadata, elementary video.
#include <sys/socket.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <string_view>
#include <thread>

#include "device/driver_state.h"
#include "runtime/base/sync.h"
#include "transport/failure.h"
#include "transport/wait_budget.h"
#include "transport/wire/input_part.h"
#include "transport/wire/part_header.h"
#include "transport/wire/stream_window.h"
#include "vexa/runtime.h"
#include "vexa/vexa_common.h"

namespace {

using StreamClock = std::chrono::steady_clock;

constexpr int kPartHeaderRoom = 1023;
constexpr int kPartHeaderWait = 1000;  // milliseconds, whatever the caller's time-out
constexpr int kMetadataLength = 64;
constexpr int kMillisecondsPerTry = 10;
constexpr std::chrono::microseconds kFirstPause{1};
constexpr std::chrono::milliseconds kPause{kMillisecondsPerTry};

/// Milliseconds that only waiting uses up: the pauses between the waits do not count.
class WaitingTime {
 public:
  explicit WaitingTime(int milliseconds) : left_(std::chrono::milliseconds(milliseconds)) {}

  int wait_readable_unless(int socket, int stop) {
    const auto begin = StreamClock::now();
    const auto milliseconds = std::chrono::ceil<std::chrono::milliseconds>(left_).count();
    const int ready = vexa::WaitBudget(static_cast<int>(milliseconds)).wait_readable_unless(socket, stop);
    left_ -= std::min(StreamClock::now() - begin, left_);
    return ready;
  }

 private:
  StreamClock::duration left_;
};

}  // namespace

int CVexaCommon::http_multipart_jpeg_recv(int socket, char* buffer, int capacity, int timeout) {
  ClearLatestError();
  char header[kPartHeaderRoom + 1];
  const int header_length = http_header_recv(socket, header, kPartHeaderRoom, kPartHeaderWait);
  if (header_length < 1) return header_length;
  const auto length = vexa::announced_length({header, static_cast<std::size_t>(header_length)});
  if (!length) return Fail(vexa::kDataLenNotFound);
  if (*length > capacity) return Fail(vexa::kBufferTooSmall);
  if (http_recvn(socket, buffer, *length, timeout) != *length) return -1;
  TakeCameraPosition(reinterpret_cast<unsigned char*>(buffer), static_cast<unsigned int>(*length));
  return *length;
}

int CVexaCommon::http_multipart_input_recv(int socket, unsigned int& mask, unsigned int& state) {
  ClearLatestError();
  char part[kPartHeaderRoom + 1];
  const int length = http_header_recv(socket, part, kPartHeaderRoom, ConnectionTimeout());
  if (length < 1) return length;
  const vexa::MotionReport motion{StoredVmdType() != LIBD_VMD_WINDOW, m_UseMotionDetection};
  const vexa::InputBits bits = vexa::parse_input_part({part, static_cast<std::size_t>(length)}, motion);
  mask = bits.present;
  state = bits.state;
  return 1;
}

int CVexaCommon::http_multipart_mddata_recv(int socket, char* buffer, int capacity, int timeout) {
  ClearLatestError();
  if (capacity <= kMetadataLength) return -1;
  char header[kPartHeaderRoom + 1];
  const int header_length = http_header_recv(socket, header, kPartHeaderRoom, kPartHeaderWait);
  if (header_length < 1) return header_length;
  if (http_recvn(socket, buffer, kMetadataLength, timeout) != kMetadataLength) return -1;
  buffer[kMetadataLength] = '\0';
  return kMetadataLength;
}

int CVexaCommon::http_stream_recv(int socket, char* buffer, int capacity, StartCodeFinder finder, int codeLength,
                                  int timeout) {
  ClearLatestError();
  const vexa::StartCode code{finder, static_cast<std::size_t>(codeLength)};
  const std::span<unsigned char> room(reinterpret_cast<unsigned char*>(buffer),
                                      static_cast<std::size_t>(std::max(capacity, 0)));
  vexa::StreamWindow window({m_StreamBuffer, m_StreamBufferSize},
                            {m_StreamFrameStart, m_StreamSearchPos, m_StreamWriteEnd});
  WaitingTime waiting(timeout);
  StreamClock::duration pause = kFirstPause;
  for (int tries = timeout / kMillisecondsPerTry; tries > 0; --tries) {
    std::size_t length = 0;
    const vexa::StreamWindow::Cut cut = window.cut_frame(code, room, length);
    if (cut == vexa::StreamWindow::Cut::kFrame) return static_cast<int>(length);
    // Kept: a frame that is too long stays, and every call fails, until the stream is started anew.
    if (cut == vexa::StreamWindow::Cut::kTooLong) return -1;
    window.make_room(code);
    int stop = -1;
    eventFd(m_StopVideoEvent, stop);
    const int ready = waiting.wait_readable_unless(socket, stop);
    if (ready == 0) return 0;
    if (ready != 1) return FailWait(ready, vexa::kReceiveTimedOut);
    std::this_thread::sleep_for(pause);
    pause = kPause;
    if (!ReceiveStream(socket, window)) return -1;
  }
  // Kept: what came with the last try is searched by the next call.
  return 0;
}

// Kept: a camera that has closed is none that fails; the tries run out.
bool CVexaCommon::ReceiveStream(int socket, vexa::StreamWindow& window) {
  const std::span<unsigned char> free = window.free_room();
  const ssize_t received = recv(socket, free.data(), free.size(), 0);
  if (received < 0 && errno != EAGAIN && errno != EWOULDBLOCK) {
    FailSystem();
    return false;
  }
  window.received(static_cast<std::size_t>(std::max<ssize_t>(received, 0)));
  return true;
}
