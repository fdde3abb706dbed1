#include "transport/wire/rtsp_answer.h"

#include "runtime/base/text.h"

namespace vexa {
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
  auto rate_text = text_after(*rtpmap, "/");
  if (!rate_text) return {Found::kNoSlash, 0};
  const auto rate = take_int(*rate_text);
  return rate ? RtpClock{Found::kRate, *rate} : RtpClock{Found::kNoNumber, 0};
}

std::optional<std::string_view> range_clock_text(std::string_view answer) {
  return text_after(before_nul(answer), "clock=");
}

std::optional<int> session_number(std::string_view answer) {
  auto session = text_after(before_nul(answer), "Session:");
  return session ? take_int(*session) : std::nullopt;
}

}  // namespace vexa
