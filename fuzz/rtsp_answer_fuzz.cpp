// SPDX-License-Identifier: Apache-2.0
// Everything read from RTSP answers: header end after any peek, status line, clock rate, session, range clock.
#include <cstddef>
#include <cstdint>
#include <cstdlib>

#include "transport/wire/http_answer.h"
#include "transport/wire/rtsp_answer.h"

namespace {

/// The wall clock of a description's range.
void read_clock(std::string_view text) {
  const vexa::RangeClock clock = vexa::parse_range_clock(text);
  if (!clock.understood && clock.micros != 0) std::abort();
  if (clock.seconds && text.find('.') == std::string_view::npos) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view answer(reinterpret_cast<const char*>(data), size);
  const bool has_end = answer.find("\r\n\r\n") != std::string_view::npos;
  for (const std::size_t latest : {std::size_t{0}, size / 2, size}) {
    if (vexa::rtsp_header_complete(answer, latest) && !has_end) std::abort();
  }
  if (vexa::rtsp_header_complete(answer, 0) != has_end) std::abort();
  const auto line = vexa::parse_status_line(answer, "RTSP/");
  if (line && line->reason.empty()) std::abort();
  static_cast<void>(vexa::rtp_clock(answer));
  static_cast<void>(vexa::session_number(answer));
  if (const auto clock = vexa::range_clock_text(answer)) read_clock(*clock);
  read_clock(answer);
  return 0;
}
