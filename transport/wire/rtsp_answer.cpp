#include "transport/wire/rtsp_answer.h"

#include <cstdio>
#include <string>

#include "runtime/base/text.h"

namespace vexa {
namespace {

/// The number that a text begins with behind blanks, as scanf's "%d" reads it; numbers beyond int become its limits.
std::optional<int> scanned_int(std::string_view text) {
  long long value = 0;
  // NOLINTNEXTLINE(cert-err34-c): what is no number is told by the count.
  if (std::sscanf(std::string(text).c_str(), "%lld", &value) != 1) return std::nullopt;
  return clamp_to_int(value);
}

}  // namespace

bool rtsp_header_complete(std::string_view looked_at, std::size_t latest) {
  constexpr std::string_view kEnd = "\r\n\r\n";
  const std::size_t begin = latest < kEnd.size() ? latest : latest - kEnd.size();
  if (looked_at.find(kEnd, begin) != std::string_view::npos) return true;
  return looked_at.substr(0, looked_at.size() - latest).ends_with(kEnd);
}

RtpClock rtp_clock(std::string_view answer) {
  using Found = RtpClock::Found;
  // Kept: the first rtpmap line counts, whatever its track; cameras describe their video first.
  const auto rtpmap = text_after(before_nul(answer), "rtpmap:");
  if (!rtpmap) return {Found::kNoRtpmap, 0};
  const auto rate_text = text_after(*rtpmap, "/");
  if (!rate_text) return {Found::kNoSlash, 0};
  const auto rate = scanned_int(*rate_text);
  return rate ? RtpClock{Found::kRate, *rate} : RtpClock{Found::kNoNumber, 0};
}

std::optional<std::string_view> range_clock_text(std::string_view answer) {
  return text_after(before_nul(answer), "clock=");
}

std::optional<int> session_number(std::string_view answer) {
  const auto session = text_after(before_nul(answer), "Session:");
  return session ? scanned_int(*session) : std::nullopt;
}

}  // namespace vexa
