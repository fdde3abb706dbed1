// SPDX-License-Identifier: Apache-2.0
#include "host/words/utc_time.h"

#include <fmt/format.h>
#include <time.h>

namespace vexa::host {
namespace {

constexpr char kForm[] = "%Y-%m-%dT%H:%M:%S";

// Without the "Z".
std::string date_and_time(std::chrono::seconds since_1970) {
  const auto moment = static_cast<std::time_t>(since_1970.count());
  std::tm fields{};
  gmtime_r(&moment, &fields);
  return fmt::format("{:04}-{:02}-{:02}T{:02}:{:02}:{:02}", fields.tm_year + 1900, fields.tm_mon + 1, fields.tm_mday,
                     fields.tm_hour, fields.tm_min, fields.tm_sec);
}

}  // namespace

std::string utc_text(std::chrono::seconds since_1970) { return date_and_time(since_1970) + "Z"; }

std::string utc_text(std::chrono::system_clock::time_point moment) {
  const auto seconds = std::chrono::floor<std::chrono::seconds>(moment);
  const auto fraction = std::chrono::duration_cast<std::chrono::milliseconds>(moment - seconds);
  return fmt::format("{}.{:03}Z", date_and_time(seconds.time_since_epoch()), fraction.count());
}

std::optional<std::chrono::seconds> utc_moment(const std::string& text) {
  std::tm fields{};
  if (strptime(text.c_str(), kForm, &fields) == nullptr) return std::nullopt;
  const std::chrono::seconds moment(timegm(&fields));
  // Days such as 30 February become others, and short forms such as 2024-1-31 longer ones.
  const std::string whole = date_and_time(moment);
  if (text != whole && text != whole + "Z") return std::nullopt;
  return moment;
}

}  // namespace vexa::host
