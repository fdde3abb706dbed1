// SPDX-License-Identifier: Apache-2.0
// What a camera's HTTP answers are made of: header end, status line, the small header before each picture of a
// multipart stream, the key=value pairs of an inquiry.
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

/// The bytes that follow, as "DataLen:" announces them; nullopt when it does not, or announces a negative number.
std::optional<int> announced_length(std::string_view part_header);

/// The value of the first `key` (which carries its "="), up to the next "&" or the end; not decoded, perhaps empty.
std::optional<std::string_view> cgi_value(std::string_view answer, std::string_view key);

}  // namespace vexa
