// SPDX-License-Identifier: Apache-2.0
#include "runtime/file_time.h"

#include <sys/time.h>

#include <ctime>
#include <limits>

namespace vexa {
namespace {

// Kept: seconds are as wide as the platform's time_t; times outside 32 bits wrap into them where it has no more.
std::time_t unix_seconds(std::uint64_t ticks) {
  return static_cast<std::time_t>(static_cast<std::int64_t>(ticks / kTicksPerSecond) - kUnixEpochSeconds);
}

_SYSTEMTIME fields_of(const std::tm& time, std::uint64_t milliseconds) {
  _SYSTEMTIME fields{};
  fields.wYear = static_cast<std::uint16_t>(time.tm_year + 1900);
  fields.wMonth = static_cast<std::uint16_t>(time.tm_mon + 1);
  fields.wDayOfWeek = static_cast<std::uint16_t>(time.tm_wday);
  fields.wDay = static_cast<std::uint16_t>(time.tm_mday);
  fields.wHour = static_cast<std::uint16_t>(time.tm_hour);
  fields.wMinute = static_cast<std::uint16_t>(time.tm_min);
  fields.wSecond = static_cast<std::uint16_t>(time.tm_sec);
  fields.wMilliseconds = static_cast<std::uint16_t>(milliseconds);
  return fields;
}

enum class Shift { kToLocal = 1, kToUtc = -1 };

bool shift_by_zone(const _FILETIME* from, Shift direction, _FILETIME* to) {
  if (from == nullptr || to == nullptr) return false;
  const std::uint64_t ticks = ticks_of(*from);
  const std::time_t seconds = unix_seconds(ticks);
  std::tm local{};
  if (localtime_r(&seconds, &local) == nullptr) return false;
  // Kept: whole microseconds; the last digit of the ticks is dropped on the way.
  const std::uint64_t below_second = ticks % kTicksPerSecond / kTicksPerMicrosecond * kTicksPerMicrosecond;
  const std::int64_t offset = std::int64_t{local.tm_gmtoff} * static_cast<int>(direction);
  // Safe: near the ends of the count the offset would wrap the time to the other end.
  const auto shifted = ticks_of_unix(seconds + offset, below_second);
  if (!shifted) return false;
  *to = file_time_of(*shifted);
  return true;
}

}  // namespace

std::uint64_t ticks_of(const _FILETIME& time) {
  return (std::uint64_t{time.dwHighDateTime} << 32) | time.dwLowDateTime;
}

_FILETIME file_time_of(std::uint64_t ticks) {
  return {static_cast<std::uint32_t>(ticks), static_cast<std::uint32_t>(ticks >> 32)};
}

std::optional<std::uint64_t> ticks_of_unix(std::int64_t seconds, std::uint64_t more) {
  constexpr auto kLimit = std::numeric_limits<std::uint64_t>::max();
  constexpr auto kLastSecond = static_cast<std::int64_t>(kLimit / kTicksPerSecond) - kUnixEpochSeconds;
  if (seconds < -kUnixEpochSeconds || seconds > kLastSecond) return std::nullopt;
  const std::uint64_t ticks = static_cast<std::uint64_t>(seconds + kUnixEpochSeconds) * kTicksPerSecond;
  if (more > kLimit - ticks) return std::nullopt;
  return ticks + more;
}

}  // namespace vexa

bool GetSystemTime(_SYSTEMTIME* now) {
  if (now == nullptr) return false;
  timeval time{};
  gettimeofday(&time, nullptr);
  std::tm utc{};
  if (gmtime_r(&time.tv_sec, &utc) == nullptr) return false;
  *now = vexa::fields_of(utc, static_cast<std::uint64_t>(time.tv_usec / 1000));
  return true;
}

bool SystemTimeToFileTime(const _SYSTEMTIME* fields, _FILETIME* time) {
  if (fields == nullptr || time == nullptr) return false;
  std::tm utc{};
  utc.tm_year = fields->wYear - 1900;
  utc.tm_mon = fields->wMonth - 1;
  utc.tm_mday = fields->wDay;
  utc.tm_hour = fields->wHour;
  utc.tm_min = fields->wMinute;
  utc.tm_sec = fields->wSecond;
  const std::time_t seconds = timegm(&utc);
  // Kept: -1 always means failure, so the second before 1970 cannot be converted.
  if (seconds == -1) return false;
  const auto ticks = vexa::ticks_of_unix(seconds, fields->wMilliseconds * vexa::kTicksPerMillisecond);
  if (!ticks) return false;
  *time = vexa::file_time_of(*ticks);
  return true;
}

bool FileTimeToSystemTime(const _FILETIME* time, _SYSTEMTIME* fields) {
  if (time == nullptr || fields == nullptr) return false;
  const std::uint64_t ticks = vexa::ticks_of(*time);
  const std::time_t seconds = vexa::unix_seconds(ticks);
  std::tm utc{};
  if (gmtime_r(&seconds, &utc) == nullptr) return false;
  *fields = vexa::fields_of(utc, ticks % vexa::kTicksPerSecond / vexa::kTicksPerMillisecond);
  return true;
}

bool FileTimeToLocalFileTime(const _FILETIME* utc, _FILETIME* local) {
  return vexa::shift_by_zone(utc, vexa::Shift::kToLocal, local);
}

// Kept: the offset is looked up as if local time were UTC, so a time near a change may be off by that change.
bool LocalFileTimeToFileTime(const _FILETIME* local, _FILETIME* utc) {
  return vexa::shift_by_zone(local, vexa::Shift::kToUtc, utc);
}

bool SystemTimeToTzSpecificLocalTime(const _TIME_ZONE_INFORMATION* zone, const _SYSTEMTIME* utc, _SYSTEMTIME* local) {
  if (zone != nullptr) return false;
  _FILETIME utc_time{};
  _FILETIME local_time{};
  return SystemTimeToFileTime(utc, &utc_time) && FileTimeToLocalFileTime(&utc_time, &local_time) &&
         FileTimeToSystemTime(&local_time, local);
}
