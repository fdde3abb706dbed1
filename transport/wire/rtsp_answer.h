// SPDX-License-Identifier: Apache-2.0
// The values that the driver reads from a camera's RTSP answers and their SDP.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string_view>

namespace vexa {

/// Whether an answer's header end has come. `looked_at` is what the peeks so far have put after one another, each from
/// the answer's beginning; the latest peek begins at `latest`.
bool rtsp_header_complete(std::string_view looked_at, std::size_t latest);

/// The description's rate of the RTP clock.
struct RtpClock {
  enum class Found { kRate, kNoRtpmap, kNoSlash, kNoNumber };
  Found found;
  int rate;  ///< ticks a second, with kRate
};

/// Reads the first rtpmap line of a DESCRIBE answer.
RtpClock rtp_clock(std::string_view answer);

/// What follows the first "clock=" of a DESCRIBE answer.
std::optional<std::string_view> range_clock_text(std::string_view answer);

/// The session number of a SETUP answer; nullopt when it is missing or no decimal number.
std::optional<int> session_number(std::string_view answer);

struct RangeClock {
  bool understood = false;              ///< the clock was read to its end
  std::optional<std::int64_t> seconds;  ///< since 1970-01-01 UTC, once a "." was reached, also when not understood
  int micros = 0;                       ///< with `understood`
};

/// Reads date "T" time "." fraction, up to a "Z" or the end of the line; the text ends at a NUL.
RangeClock parse_range_clock(std::string_view text);

}  // namespace vexa
