// SPDX-License-Identifier: Apache-2.0
#include "vexa/real_time.h"

#include <array>
#include <limits>
#include <optional>
#include <string_view>

#include "runtime/base/calendar.h"
#include "runtime/base/scanned_number.h"
#include "runtime/file_time.h"
#include "runtime/real_time_format.h"

namespace vexa {
namespace {

std::optional<std::uint64_t> ticks_of_fields(const _SYSTEMTIME& fields) {
  _FILETIME time{};
  if (!SystemTimeToFileTime(&fields, &time)) return std::nullopt;
  return ticks_of(time);
}

std::optional<std::uint64_t> local_to_utc(std::uint64_t local_ticks) {
  const _FILETIME local = file_time_of(local_ticks);
  _FILETIME utc{};
  if (!LocalFileTimeToFileTime(&local, &utc)) return std::nullopt;
  return ticks_of(utc);
}

std::optional<std::uint64_t> utc_to_local(std::uint64_t ticks) {
  const _FILETIME utc = file_time_of(ticks);
  _FILETIME local{};
  if (!FileTimeToLocalFileTime(&utc, &local)) return std::nullopt;
  return ticks_of(local);
}

/// The UTC ticks of a reading of the clock, UTC or local, with `more` added; 0, unset, when they cannot be counted.
std::uint64_t ticks_of_reading(std::optional<std::uint64_t> reading, bool utc, std::int64_t more = 0) {
  if (reading && !utc) reading = local_to_utc(*reading);
  if (!reading) return 0;
  const std::uint64_t sum = *reading + static_cast<std::uint64_t>(more);
  // Safe: a count that leaves its 64 bits would come back at the other end.
  const bool wrapped = more < 0 ? sum > *reading : sum < *reading;
  return wrapped ? 0 : sum;
}

/// The fields of a tick count; all 0 when it has none.
_SYSTEMTIME fields_of_ticks(std::uint64_t ticks) {
  const _FILETIME time = file_time_of(ticks);
  _SYSTEMTIME fields{};
  FileTimeToSystemTime(&time, &fields);
  return fields;
}

std::tm broken_down(const _SYSTEMTIME& fields) {
  std::tm time{};
  time.tm_year = fields.wYear - 1900;
  time.tm_mon = fields.wMonth - 1;
  time.tm_mday = fields.wDay;
  time.tm_hour = fields.wHour;
  time.tm_min = fields.wMinute;
  time.tm_sec = fields.wSecond;
  time.tm_isdst = -1;
  return time;
}

std::optional<YearWeek> week_of(const _SYSTEMTIME& local) {
  const auto day_number = day_of_year(local.wYear, local.wMonth, local.wDay);
  if (!day_number) return std::nullopt;
  const WeekDay day{local.wYear, *day_number - 1, local.wDayOfWeek};
  switch (CRealTime::m_WeekAlgo) {
    case 0:
      return week_by_days(day);
    case 1:
      return week_of_january_first(day, CRealTime::m_FirstDayOfWeek);
    case 2:
      return week_by_iso(day);
    default:
      return std::nullopt;
  }
}

constexpr std::size_t kTextNumbers = 7;  // day, month, year, hour, minute, second, milliseconds
constexpr std::size_t kLeastTextNumbers = 5;

/// Reads the numbers of "day-month-year hour:minute:second.milliseconds"; those that are missing at the end stay 0.
std::optional<std::array<std::uint16_t, kTextNumbers>> read_text(std::string_view text) {
  constexpr std::string_view kSeparators = "-- ::.";
  static_assert(kSeparators.size() == kTextNumbers - 1);
  std::array<std::uint16_t, kTextNumbers> numbers{};
  for (std::size_t i = 0; i < numbers.size(); ++i) {
    const auto number = scan_number(text, text.size());
    if (!number) return i < kLeastTextNumbers ? std::nullopt : std::make_optional(numbers);
    // Safe: a number that no field holds makes the text unreadable instead of naming another day.
    if (number->value > std::numeric_limits<std::uint16_t>::max()) return std::nullopt;
    numbers[i] = static_cast<std::uint16_t>(number->value);
    text.remove_prefix(number->length);
    if (i == kSeparators.size() || kSeparators[i] == ' ') continue;
    if (text.empty() || text.front() != kSeparators[i]) text = {};
    text.remove_prefix(text.empty() ? 0 : 1);
  }
  return numbers;
}

}  // namespace
}  // namespace vexa

int CRealTime::m_FirstDayOfWeek = 1;
int CRealTime::m_WeekAlgo = 2;
CRealTime CRealTime::m_SnapShotTime;

CRealTime::CRealTime(const _FILETIME& utc) : ticks_(vexa::ticks_of(utc)) {}

CRealTime::CRealTime(const _SYSTEMTIME& local) : ticks_(vexa::ticks_of_reading(vexa::ticks_of_fields(local), false)) {}

// Kept: what follows the point is a count of milliseconds and no fraction, as the logger writes three digits always.
CRealTime::CRealTime(const char* text, bool utc) : CRealTime() {
  const auto numbers = vexa::read_text(text == nullptr ? "" : text);
  if (!numbers) return;
  const auto [day, month, year, hour, minute, second, millisecond] = *numbers;
  const auto full_year = static_cast<std::uint16_t>(year < 100 ? year + 2000 : year);
  *this = CRealTime(full_year, month, day, hour, minute, second, millisecond, 0, utc);
}

CRealTime::CRealTime(std::uint16_t year, std::uint16_t month, std::uint16_t day, std::uint16_t hour,
                     std::uint16_t minute, std::uint16_t second, std::uint16_t millisecond, std::uint16_t microsecond,
                     bool utc)
    : ticks_(vexa::ticks_of_reading(vexa::ticks_of_fields({year, month, 0, day, hour, minute, second, millisecond}),
                                    utc, static_cast<std::int64_t>(microsecond * vexa::kTicksPerMicrosecond))) {}

CRealTime::CRealTime(std::time_t seconds, bool utc) : CRealTime(seconds, 0, utc) {}

CRealTime::CRealTime(std::time_t seconds, std::int64_t ticks, bool utc)
    : ticks_(vexa::ticks_of_reading(vexa::ticks_of_unix(seconds, 0), utc, ticks)) {}

CRealTime CRealTime::GetTheCurrentTime() {
  _SYSTEMTIME now{};
  GetSystemTime(&now);
  return CRealTime(vexa::file_time_of(vexa::ticks_of_fields(now).value_or(0)));
}

_FILETIME CRealTime::GetUtcFileTime() const { return vexa::file_time_of(ticks_); }

void CRealTime::GetUtcFileTime(_FILETIME& time) const { time = GetUtcFileTime(); }

_SYSTEMTIME CRealTime::GetUtcSystemTime() const { return vexa::fields_of_ticks(ticks_); }

void CRealTime::GetUtcSystemTime(_SYSTEMTIME& fields) const { fields = GetUtcSystemTime(); }

_SYSTEMTIME CRealTime::GetLocalSystemTime() const {
  const auto local = vexa::utc_to_local(ticks_);
  return local ? vexa::fields_of_ticks(*local) : _SYSTEMTIME{};
}

void CRealTime::GetLocalSystemTime(_SYSTEMTIME& fields) const { fields = GetLocalSystemTime(); }

std::time_t CRealTime::GetLocalTimeTime(bool timeOfDayOnly) const {
  if (ticks_ == 0) return 0;
  std::tm local = vexa::broken_down(GetLocalSystemTime());
  if (timeOfDayOnly) {
    local.tm_year = 100;
    local.tm_mon = 0;
    local.tm_mday = 1;
  }
  return std::mktime(&local);
}

std::string CRealTime::Format(const char* format, bool utc) const {
  const _SYSTEMTIME local = GetLocalSystemTime();
  const vexa::TimeParts parts{
      utc ? GetUtcSystemTime() : local,
      // Kept: week and day of the year are those of local time in a text in UTC too.
      vexa::week_of(local).value_or(vexa::YearWeek{0, -1}),
      vexa::day_of_year(local.wYear, local.wMonth, local.wDay).value_or(-1),
  };
  return vexa::format_time(format, parts);
}

int CRealTime::GetWeek(int* weekYear) const {
  const auto week = vexa::week_of(GetLocalSystemTime());
  if (!week) return -1;
  if (weekYear != nullptr) *weekYear = week->year;
  return week->week;
}

int CRealTime::GetDayOfYear() const {
  const _SYSTEMTIME local = GetLocalSystemTime();
  return vexa::day_of_year(local.wYear, local.wMonth, local.wDay).value_or(-1);
}

CRealTime CRealTime::GetFirstDayOfWeek() const {
  const auto local = vexa::utc_to_local(ticks_);
  if (!local) return CRealTime();
  const int days = vexa::days_into_week(vexa::fields_of_ticks(*local).wDayOfWeek, m_FirstDayOfWeek);
  const auto back = *local % vexa::kTicksPerDay + static_cast<std::uint64_t>(days) * vexa::kTicksPerDay;
  if (back > *local) return CRealTime();
  return CRealTime(vexa::file_time_of(vexa::local_to_utc(*local - back).value_or(0)));
}

int CRealTime::GetDaysInMonth(int year, int month) { return vexa::days_in_month(year, month); }

bool CRealTime::IsLeapYear(int year) { return vexa::is_leap_year(year); }
