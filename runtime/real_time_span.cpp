// SPDX-License-Identifier: Apache-2.0
#include <array>
#include <ctime>
#include <optional>
#include <string>
#include <string_view>

#include "runtime/base/directive.h"
#include "runtime/file_time.h"
#include "runtime/real_time_format.h"
#include "vexa/real_time.h"

namespace vexa {
namespace {

enum Unit { kDays, kHours, kMinutes, kSeconds, kMilliseconds, kUnits };

/// A length without its sign, cut into units.
struct SpanParts {
  bool negative;
  std::array<std::int64_t, kUnits> total;  ///< whole units in the span
  std::array<std::int64_t, kUnits> rest;   ///< whole units beyond the next larger unit
};

constexpr std::array<std::string_view, kUnits> kUnitNames = {"day", "hour", "minute", "second", "millisecond"};

SpanParts parts_of(std::int64_t ticks) {
  const bool negative = ticks < 0;
  const auto bits = static_cast<std::uint64_t>(ticks);
  const std::uint64_t length = negative ? 0 - bits : bits;
  const auto count = [](std::uint64_t amount, std::uint64_t unit) { return static_cast<std::int64_t>(amount / unit); };
  return {negative,
          {count(length, kTicksPerDay), count(length, kTicksPerHour), count(length, kTicksPerMinute),
           count(length, kTicksPerSecond), count(length, kTicksPerMillisecond)},
          {count(length, kTicksPerDay), count(length % kTicksPerDay, kTicksPerHour),
           count(length % kTicksPerHour, kTicksPerMinute), count(length % kTicksPerMinute, kTicksPerSecond),
           count(length % kTicksPerSecond, kTicksPerMillisecond)}};
}

/// "1 day", "2 hours"
std::string in_words(const SpanParts& span, int unit) {
  const auto index = static_cast<std::size_t>(unit);
  const std::int64_t count = span.rest[index];
  return std::to_string(count).append(" ").append(kUnitNames[index]).append(count == 1 ? "" : "s");
}

/// The units from days to `last` in words, those that are not 0; the seconds when all are.
std::string used_units_in_words(const SpanParts& span, int last) {
  std::string words;
  for (int unit = kDays; unit <= last; ++unit) {
    if (span.rest[static_cast<std::size_t>(unit)] == 0) continue;
    words += (words.empty() ? "" : " ") + in_words(span, unit);
  }
  return words.empty() ? in_words(span, kSeconds) : words;
}

std::string all_units_in_words(const SpanParts& span) {
  std::string words = in_words(span, kDays);
  for (int unit = kHours; unit < kUnits; ++unit) words += " " + in_words(span, unit);
  return words;
}

std::string largest_unit_in_words(const SpanParts& span) {
  for (int unit = kDays; unit < kUnits; ++unit) {
    if (span.rest[static_cast<std::size_t>(unit)] != 0) return in_words(span, unit);
  }
  return in_words(span, kSeconds);
}

/// "2 days 3:04:05"
std::string days_and_clock(const SpanParts& span) {
  return in_words(span, kDays) + " " + std::to_string(span.rest[kHours]) + ":" + two_digits(span.rest[kMinutes]) + ":" +
         two_digits(span.rest[kSeconds]);
}

std::optional<std::string> words_of(char letter, const SpanParts& span) {
  switch (letter) {
    case 'T':
      return days_and_clock(span);
    case 'C':
      return used_units_in_words(span, kSeconds);
    case 'F':
      return all_units_in_words(span);
    case 'c':
      return largest_unit_in_words(span);
    case 'i':
      return in_words(span, kMilliseconds);
    default:
      return std::nullopt;
  }
}

std::optional<std::int64_t> number_of(char letter, const SpanParts& span) {
  constexpr std::string_view kTotals = "DHMSL";
  constexpr std::string_view kRests = "dhmsl";
  static_assert(kTotals.size() == kUnits && kRests.size() == kUnits);
  const std::int64_t sign = span.negative ? -1 : 1;
  if (const auto unit = kTotals.find(letter); unit != std::string_view::npos) return sign * span.total[unit];
  if (const auto unit = kRests.find(letter); unit != std::string_view::npos) return sign * span.rest[unit];
  return std::nullopt;
}

}  // namespace

std::string format_span(const char* format, std::int64_t ticks) {
  const SpanParts span = parts_of(ticks);
  return expand_directives(format, [&span](char letter, const FieldFlags& flags) -> std::optional<std::string> {
    if (const auto number = number_of(letter, span)) return number_field(*number, flags);
    const auto words = words_of(letter, span);
    return words && span.negative ? "-" + *words : words;
  });
}

}  // namespace vexa

// Safe: products beyond 64 bits wrap, as unsigned numbers do, in both operations below.
CRealTimeSpan::CRealTimeSpan(long seconds)
    : ticks_(static_cast<std::int64_t>(static_cast<std::uint64_t>(seconds) * vexa::kTicksPerSecond)) {}

// Kept: the tick counts are multiplied, so a second times a second is ten million seconds.
CRealTimeSpan CRealTimeSpan::operator*(const CRealTimeSpan& other) const {
  CRealTimeSpan product(0);
  product.ticks_ =
      static_cast<std::int64_t>(static_cast<std::uint64_t>(ticks_) * static_cast<std::uint64_t>(other.ticks_));
  return product;
}

std::time_t CRealTimeSpan::GetTimeTime() const {
  const std::int64_t seconds_of_day = ticks_ / static_cast<std::int64_t>(vexa::kTicksPerSecond) % 86400;
  std::tm time{};
  time.tm_year = 100;
  time.tm_mday = 1;
  time.tm_hour = static_cast<int>(seconds_of_day / 3600);
  time.tm_min = static_cast<int>(seconds_of_day % 3600 / 60);
  time.tm_sec = static_cast<int>(seconds_of_day % 60);
  time.tm_isdst = -1;
  return std::mktime(&time);
}

std::string CRealTimeSpan::Format(const char* format) const { return vexa::format_span(format, ticks_); }
