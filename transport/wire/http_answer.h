// How a camera's answer begins: the end of its header, its status line.
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

namespace vexa {

/// Bytes up to and including the end of the header; 0 when it has not come. Looks no further than the first NUL.
std::size_t header_length(std::string_view received);

struct StatusLine {
  int status;
  std::string reason;  ///< never empty
};

/// Reads the status line that `text` begins with, `protocol` being "HTTP/" or "RTSP/".
std::optional<StatusLine> parse_status_line(std::string_view text, std::string_view protocol);

}  // namespace vexa
