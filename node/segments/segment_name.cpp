// SPDX-License-Identifier: Apache-2.0
#include "node/segments/segment_name.h"

#include <array>
#include <charconv>
#include <cstdio>
#include <utility>
#include <vector>

namespace vexa::node {
namespace {

using State = SegmentName::State;

constexpr std::pair<State, std::string_view> kEnds[] = {
    {State::kWriting, ".part"}, {State::kRecovered, ".recovered.mp4"}, {State::kWhole, ".mp4"}};

constexpr std::size_t kTimeLength = 19;  // "20260131T235959250Z"

bool is_plain(char c) { return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '-'; }

// All of the text as a number; no sign, no zero before it.
template <typename Number>
bool read_number(std::string_view text, Number& number) {
  const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
  return error == std::errc() && end == text.data() + text.size();
}

std::optional<std::string> unescaped(std::string_view text) {
  std::string camera;
  for (std::size_t i = 0; i < text.size(); ++i) {
    if (is_plain(text[i])) {
      camera += text[i];
      continue;
    }
    unsigned byte = 0;
    const std::string_view digits = text.substr(i + 1, 2);
    const auto [end, error] = std::from_chars(digits.data(), digits.data() + digits.size(), byte, 16);
    if (text[i] != '%' || digits.size() != 2 || error != std::errc() || end != digits.data() + 2) return std::nullopt;
    camera += static_cast<char>(byte);
    i += 2;
  }
  return camera;
}

std::string time_text(std::chrono::milliseconds since_1970) {
  const std::chrono::sys_time<std::chrono::milliseconds> moment(since_1970);
  const auto day = std::chrono::floor<std::chrono::days>(moment);
  const std::chrono::year_month_day date(day);
  const std::chrono::hh_mm_ss time(moment - day);
  std::array<char, 48> text{};
  std::snprintf(text.data(), text.size(), "%04d%02u%02uT%02d%02d%02d%03dZ", static_cast<int>(date.year()),
                static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()),
                static_cast<int>(time.hours().count()), static_cast<int>(time.minutes().count()),
                static_cast<int>(time.seconds().count()), static_cast<int>(time.subseconds().count()));
  return text.data();
}

std::optional<std::chrono::milliseconds> time_of(std::string_view text) {
  constexpr std::pair<std::size_t, std::size_t> kFields[] = {{0, 4}, {4, 2}, {6, 2}, {9, 2}, {11, 2}, {13, 2}, {15, 3}};
  std::array<unsigned, 7> values{};
  if (text.size() != kTimeLength) return std::nullopt;
  for (std::size_t i = 0; i < values.size(); ++i) {
    if (!read_number(text.substr(kFields[i].first, kFields[i].second), values[i])) return std::nullopt;
  }
  const std::chrono::year_month_day date(std::chrono::year(static_cast<int>(values[0])), std::chrono::month(values[1]),
                                         std::chrono::day(values[2]));
  if (!date.ok()) return std::nullopt;
  const auto time = std::chrono::sys_days(date).time_since_epoch() + std::chrono::hours(values[3]) +
                    std::chrono::minutes(values[4]) + std::chrono::seconds(values[5]) +
                    std::chrono::milliseconds(values[6]);
  if (time_text(time) != text) return std::nullopt;
  return time;
}

}  // namespace

std::string escaped_camera(std::string_view camera) {
  std::string text;
  for (const char c : camera) {
    std::array<char, 8> escaped{};
    std::snprintf(escaped.data(), escaped.size(), "%%%02x", static_cast<unsigned>(static_cast<unsigned char>(c)));
    if (is_plain(c)) {
      text += c;
    } else {
      text += escaped.data();
    }
  }
  return text;
}

std::string file_name_of(const SegmentName& name) {
  std::string text = time_text(name.start) + "_" + escaped_camera(name.camera) + "_" + std::to_string(name.token) +
                     "_" + std::to_string(name.counter);
  for (const auto& [state, end] : kEnds) {
    if (state == name.state) text += end;
  }
  return text;
}

std::optional<SegmentName> segment_of(std::string_view file_name) {
  SegmentName name;
  std::string_view rest = file_name;
  for (const auto& [state, end] : kEnds) {
    if (!rest.ends_with(end)) continue;
    rest.remove_suffix(end.size());
    name.state = state;
    break;
  }
  if (rest.size() == file_name.size()) return std::nullopt;
  std::vector<std::string_view> fields;
  for (std::size_t at = 0; at <= rest.size() && fields.size() < 5;) {
    const std::size_t end = std::min(rest.find('_', at), rest.size());
    fields.push_back(rest.substr(at, end - at));
    at = end + 1;
  }
  if (fields.size() != 4) return std::nullopt;
  const auto start = time_of(fields[0]);
  const auto camera = unescaped(fields[1]);
  if (!start || !camera || !read_number(fields[2], name.token) || !read_number(fields[3], name.counter)) {
    return std::nullopt;
  }
  name.start = *start;
  name.camera = *camera;
  if (file_name_of(name) != file_name) return std::nullopt;
  return name;
}

}  // namespace vexa::node
