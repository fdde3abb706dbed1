// SPDX-License-Identifier: Apache-2.0
// What log files hold, with the digits of their times made equal.
#pragma once

#include <cstddef>
#include <string>

#include "tests/support/temporary_folder.h"

namespace vexa_test {

inline std::string banner_rule() { return std::string(103, '-'); }

inline std::string opening_banner() { return "\n" + banner_rule() + "\n00-00-0000 00:00:00.000 LogFile Opened. "; }

inline std::string closing_banner() { return "\n00-00-0000 00:00:00.000\tLogFile Closed\n" + banner_rule() + "\n"; }

/// `text` with a 0 for each digit of each "00-00-0000" and "00:00:00.000".
inline std::string without_times(std::string text) {
  const std::string forms[] = {"00-00-0000", "00:00:00.000"};
  for (std::size_t at = 0; at < text.size(); ++at) {
    if (text[at] < '0' || text[at] > '9') continue;
    for (const std::string& form : forms) {
      std::string piece = text.substr(at, form.size());
      for (char& c : piece) c = c >= '0' && c <= '9' ? '0' : c;
      if (piece == form) text.replace(at, form.size(), form);
    }
  }
  return text;
}

/// What the log file at `path` holds, without its times.
inline std::string log_text(const std::string& path) { return without_times(contents_of(path)); }

/// Text that makes a new file `size` bytes large, together with the opening banner before it.
inline std::string text_up_to(std::size_t size) { return std::string(size - opening_banner().size(), 'x'); }

}  // namespace vexa_test
