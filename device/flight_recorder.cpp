// SPDX-License-Identifier: Apache-2.0
#include "device/flight_recorder.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <thread>

#include "device/camera_link.h"
#include "device/driver_state.h"
#include "device/error_record.h"
#include "runtime/base/moment.h"
#include "runtime/base/result.h"
#include "runtime/base/text.h"
#include "transport/wire/http_request.h"
#include "vexa/flight_record.h"

namespace vexa {
namespace {

static_assert(FlightRing::kLines == kFlightRecordLines);

constexpr std::size_t kFileLineRoom = 4000;
constexpr std::int64_t kNanosecondsAMicrosecond = 1000;

std::atomic<unsigned> drivers{0};

/// A place for the ring of one driver. Places are taken again and never freed, so that a signal handler may walk them.
struct RingPlace {
  std::atomic<const FlightRing*> ring{nullptr};
  RingPlace* next = nullptr;
};

std::atomic<RingPlace*> places{nullptr};
std::atomic<int> readers{0};  // of rings, that hold no recorder's lock

/// False when memory is short.
bool show(const FlightRing& ring) {
  for (RingPlace* place = places; place != nullptr; place = place->next) {
    const FlightRing* none = nullptr;
    if (place->ring.compare_exchange_strong(none, &ring)) return true;
  }
  auto* place = new (std::nothrow) RingPlace;
  if (place == nullptr) return false;
  place->ring = &ring;
  place->next = places;
  while (!places.compare_exchange_weak(place->next, place)) {
  }
  return true;
}

/// Afterwards no reader is at the ring.
void hide(const FlightRing& ring) {
  for (RingPlace* place = places; place != nullptr; place = place->next) {
    const FlightRing* shown = &ring;
    if (place->ring.compare_exchange_strong(shown, nullptr)) break;
  }
  while (readers != 0) std::this_thread::sleep_for(std::chrono::milliseconds(1));
}

// A pipe that nobody reads is refused rather than waited for.
int open_trace_file() {
  const char* path = secure_getenv("VEXA_TRACE");
  if (path == nullptr || *path == '\0') return -1;
  const int file = open(path, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC | O_NOCTTY | O_NONBLOCK, S_IRUSR | S_IWUSR);
  if (file < 0) {
    char room[256];
    std::fprintf(stderr, "VEXA_TRACE: cannot open %s: %s\n", path, strerror_r(errno, room, sizeof room));
  }
  return file;
}

bool write_all(int descriptor, const char* bytes, std::size_t length) {
  while (length > 0) {
    const ssize_t written = write(descriptor, bytes, length);
    if (written < 0 && errno == EINTR) continue;
    if (written <= 0) return false;
    bytes += written;
    length -= static_cast<std::size_t>(written);
  }
  return true;
}

std::string utc_now() {
  const std::int64_t now = nanoseconds_since_1970();
  const auto seconds = static_cast<std::time_t>(now / kNanosecondsASecond);
  std::tm utc{};
  gmtime_r(&seconds, &utc);
  char room[40];
  const std::size_t length = std::strftime(room, sizeof room, "%Y-%m-%dT%H:%M:%S", &utc);
  const auto micros = static_cast<long>(now % kNanosecondsASecond / kNanosecondsAMicrosecond);
  return std::string(room, length) + format_within(sizeof room, ".%06ldZ", micros).text;
}

void append_printable(std::string& line, std::string_view text) {
  while (!text.empty() && (text.back() == '\n' || text.back() == '\r')) text.remove_suffix(1);
  for (const char c : text) {
    if (c == '\r') continue;
    if (c == '\n') {
      line += " | ";
    } else {
      line += c >= ' ' && c <= '~' ? c : '?';
    }
  }
}

std::string without_secrets(std::string_view text, const SLibDConnectionInfo& info) {
  std::string out = without_credentials(std::string(text), info.userName, info.password);
  return masked(std::move(out), percent_encoded(info.password, ""));
}

}  // namespace

void FlightRing::add(std::string_view text) {
  Line line{};
  line.length = std::min(text.size(), kLineRoom);
  std::memcpy(line.text, text.data(), static_cast<std::size_t>(line.length));
  const std::uint32_t end = end_.load(std::memory_order_relaxed);
  lines_[end % kLines].publish(line);
  end_.store(end + 1 == 2 * kLines ? kLines : end + 1, std::memory_order_release);
}

FlightRecorder::FlightRecorder(Connection& connection)
    : connection_(connection), number_(++drivers), file_(open_trace_file()), on_(file_.valid()) {}

FlightRecorder::~FlightRecorder() { end_record(); }

std::string FlightRecorder::line_of(const char* kind, std::string_view event) {
  char camera[kCameraNameRoom];
  connection_.write_name(camera);
  std::string line = utc_now() + ' ' + std::to_string(number_) + ' ';
  append_printable(line, camera);
  line.append(1, ' ').append(kind).append(1, ' ');
  append_printable(line, without_secrets(event, connection_.copy()));
  return line;
}

void FlightRecorder::note(const char* kind, std::string_view event) {
  if (!is_on()) return;
  (void)within_memory([&] {
    std::string line = line_of(kind, event);
    {
      const Guard guard(lock_);
      if (ring_ != nullptr) ring_->add(line);
    }
    if (!file_.valid()) return;
    line.resize(std::min(line.size(), kFileLineRoom));
    line += '\n';
    // In one piece, so that lines of threads and processes do not mix.
    while (write(file_.get(), line.data(), line.size()) < 0 && errno == EINTR) {
    }
  });
}

bool FlightRecorder::begin_record() {
  auto ring = std::unique_ptr<FlightRing>(new (std::nothrow) FlightRing);
  const Guard guard(lock_);
  if (ring_ != nullptr) return true;
  if (ring == nullptr || !show(*ring)) return false;
  ring_ = std::move(ring);
  on_ = true;
  return true;
}

void FlightRecorder::end_record() {
  const Guard guard(lock_);
  if (ring_ == nullptr) return;
  on_ = file_.valid();
  hide(*ring_);
  ring_.reset();
}

std::vector<std::string> FlightRecorder::record() {
  std::vector<std::string> lines;
  const Guard guard(lock_);
  if (ring_ != nullptr) ring_->visit([&](std::string_view line) { lines.emplace_back(line); });
  return lines;
}

bool BeginFlightRecord(CVexaCommon& driver) noexcept { return DriverState::of(driver).recorder.begin_record(); }

void EndFlightRecord(CVexaCommon& driver) noexcept { DriverState::of(driver).recorder.end_record(); }

bool ReadFlightRecord(CVexaCommon& driver, std::vector<std::string>& lines) noexcept {
  return within_memory([&] { lines = DriverState::of(driver).recorder.record(); });
}

void WriteFlightRecords(int descriptor) noexcept {
  const int kept_error = errno;
  ++readers;
  bool goes = true;
  for (const RingPlace* place = places; place != nullptr && goes; place = place->next) {
    const FlightRing* ring = place->ring;
    if (ring == nullptr) continue;
    ring->visit([&](std::string_view line) {
      char text[FlightRing::kLineRoom + 1];
      std::memcpy(text, line.data(), line.size());
      text[line.size()] = '\n';
      goes = goes && write_all(descriptor, text, line.size() + 1);
    });
  }
  --readers;
  errno = kept_error;
}

}  // namespace vexa
