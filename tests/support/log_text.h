// What log files hold, with the digits of their times made equal.
#pragma once

#include <cstddef>
#include <string>

namespace vexa_test {

inline std::string banner_rule() { return std::string(103, '-'); }

inline std::string opening_banner() { return "\n" + banner_rule() + "\n00-00-0000 00:00:00.000 LogFile Opened. "; }

inline std::string closing_banner() { return "\n00-00-0000 00:00:00.000\tLogFile Closed\n" + banner_rule() + "\n"; }

/// `text` with a 0 for each digit of each "00-00-0000" and "00:00:00.000".
inline std::string without_times(std::string text) {
  const std::string forms[] = {"00-00-0000", "00:00:00.000"};
  for (std::size_t at = 0; at < text.size(); ++at) {
    for (const std::string& form : forms) {
      std::string piece = text.substr(at, form.size());
      for (char& c : piece) c = c >= '0' && c <= '9' ? '0' : c;
      if (piece == form) text.replace(at, form.size(), form);
    }
  }
  return text;
}

}  // namespace vexa_test
