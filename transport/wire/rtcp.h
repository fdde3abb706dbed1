// RTCP packets (RFC 3550, 6.4 and 6.5): sender reports read, receiver reports written.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>
#include <vector>

#include "runtime/base/bytes.h"

namespace vexa {

struct SenderReport {
  std::uint32_t ssrc = 0;
  std::uint64_t ntp =
      0;  ///< seconds since 1900 in the high half, their fraction in the low one; 0: the sender has no clock
  std::uint32_t rtp_time = 0;  ///< the same moment on the RTP clock
};

/// The first sender report of a compound packet. None when there is none, or when the packet does not keep to the
/// form up to there: version 2, a report first, each length within the packet.
std::optional<SenderReport> find_sender_report(Bytes compound);

/// What a receiver reports of one source.
struct ReceptionReport {
  std::uint32_t reporter = 0;  ///< SSRC of this side
  std::uint32_t source = 0;
  std::uint8_t fraction_lost = 0;  ///< of the packets expected since the report before, in 256ths
  std::int32_t lost = 0;           ///< written within 24 bits
  std::uint32_t highest_sequence = 0;
  std::uint32_t jitter = 0;             ///< ticks of the RTP clock
  std::uint32_t last_report = 0;        ///< middle 32 bits of the latest sender report's NTP time; 0: none came
  std::uint32_t since_last_report = 0;  ///< in 65536ths of a second
};

/// A compound packet of a receiver report and a source description with `cname` (at most 255 bytes of it).
std::vector<unsigned char> receiver_report(const ReceptionReport& report, std::string_view cname);

/// Nanoseconds since 1970 of an NTP time. Seconds below 2^31 are of the era that begins in 2036.
std::int64_t unix_nanoseconds(std::uint64_t ntp);

}  // namespace vexa
