#include "virtual_camera/rtp/sender_report.h"

#include <cmath>
#include <cstddef>

namespace vexa::camera {
namespace {

constexpr std::uint64_t kSecondsTo1970 = 2208988800;
constexpr std::uint64_t kNanosecondsASecond = 1000000000;
constexpr std::uint8_t kOtherSource = 0xff;

void put(SenderReportBytes& bytes, std::size_t place, std::uint32_t value) {
  for (std::size_t i = 0; i < 4; ++i) bytes.at(place + i) = static_cast<std::uint8_t>(value >> (24 - 8 * i));
}

}  // namespace

std::uint64_t SenderReportWriter::ntp(std::uint64_t index, std::chrono::nanoseconds time) const {
  if (reports_.clock == ReportedClock::kZero) return 0;
  std::chrono::nanoseconds shown = began_ + reports_.ahead;
  if (reports_.clock == ReportedClock::kRunning) {
    shown += time;
    shown += std::chrono::nanoseconds(std::llround(static_cast<double>(time.count()) * reports_.drift * 1e-6));
    if (reports_.step_at != 0 && index >= reports_.step_at) shown += reports_.step;
  }
  const auto count = static_cast<std::uint64_t>(shown.count());
  const std::uint64_t fraction = ((count % kNanosecondsASecond) << 32U) / kNanosecondsASecond;
  return (count / kNanosecondsASecond + kSecondsTo1970) << 32U | fraction;
}

SenderReportBytes SenderReportWriter::write(const Outgoing& first, std::chrono::nanoseconds time) const {
  SenderReportBytes bytes{0x80, 200, 0, 6};  // version 2, no block, a sender report of 7 words
  for (std::size_t i = 0; i < 4; ++i) {
    bytes.at(4 + i) = first.header.at(8 + i);   // SSRC
    bytes.at(16 + i) = first.header.at(4 + i);  // RTP time
  }
  if (reports_.other_ssrc) bytes[7] ^= kOtherSource;
  const std::uint64_t time_sent = ntp(first.record.picture, time);
  put(bytes, 8, static_cast<std::uint32_t>(time_sent >> 32U));
  put(bytes, 12, static_cast<std::uint32_t>(time_sent));
  return bytes;
}

}  // namespace vexa::camera
