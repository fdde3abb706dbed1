// Writes a stream's sender reports (RFC 3550, 6.4.1).
#ifndef VIRTUAL_CAMERA_RTP_SENDER_REPORT_H_
#define VIRTUAL_CAMERA_RTP_SENDER_REPORT_H_

#include <array>
#include <chrono>
#include <cstdint>

#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/values/sender_reports.h"

namespace vexa::camera {

using SenderReportBytes = std::array<std::uint8_t, 28>;

// One stream's. A report names the time of a picture, so that it does not depend on when it leaves.
class SenderReportWriter {
 public:
  // `began`: the time of the stream's first picture, since 1970.
  SenderReportWriter(const SenderReports& reports, std::chrono::nanoseconds began) : reports_(reports), began_(began) {}

  // Whether a report leaves with picture `index`.
  [[nodiscard]] bool due(std::uint64_t index) const { return reports_.every != 0 && index % reports_.every == 0; }
  // With the picture whose first packet is `first`, shown `time` after the stream began.
  [[nodiscard]] SenderReportBytes write(const Outgoing& first, std::chrono::nanoseconds time) const;

 private:
  [[nodiscard]] std::uint64_t ntp(std::uint64_t index, std::chrono::nanoseconds time) const;

  SenderReports reports_;
  std::chrono::nanoseconds began_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_RTP_SENDER_REPORT_H_
