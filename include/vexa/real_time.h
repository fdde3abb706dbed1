// SPDX-License-Identifier: Apache-2.0
// Points and lengths of time: the Win32-style conversions, CRealTime and CRealTimeSpan.
#pragma once

#include <cstdint>
#include <ctime>
#include <string>

#include "vexa/export.h"

/// A count of 100 ns ticks since 1601-01-01 00:00:00 UTC, in two halves. 1970-01-01 is tick 116444736000000000.
struct _FILETIME {
  std::uint32_t dwLowDateTime;
  std::uint32_t dwHighDateTime;
};

/// A date and a time of day.
struct _SYSTEMTIME {
  std::uint16_t wYear;          ///< the full year
  std::uint16_t wMonth;         ///< 1 (January) to 12
  std::uint16_t wDayOfWeek;     ///< 0 (Sunday) to 6; never read when fields become a time
  std::uint16_t wDay;           ///< 1 to 31
  std::uint16_t wHour;          ///< 0 to 23
  std::uint16_t wMinute;        ///< 0 to 59
  std::uint16_t wSecond;        ///< 0 to 59
  std::uint16_t wMilliseconds;  ///< 0 to 999
};

/// A time zone; no zone but the process's own is known, so there is nothing to put in one.
struct _TIME_ZONE_INFORMATION;

// The conversions return true on success. On failure, which a null pointer is too, they return false and leave what
// they should have filled as it was. Any thread may call them; the zone is the one the C library has (see tzset).
//
// They reach as far as the platform's time_t: to the last tick where it has 64 bits. Where it has 32 bits, a tick count
// outside 1901-12-13 to 2038-01-19 is read modulo 2^32 seconds.
extern "C" {

/// Fills `now` with the present UTC time, to the millisecond.
VEXA_API bool GetSystemTime(_SYSTEMTIME* now);

/// Turns UTC fields into ticks. Fields beyond their ranges are carried (32 January is 1 February). Fails for a time
/// before 1601 or beyond what time_t or 64 bits can count, and for 1969-12-31 23:59:59, whose count is -1.
VEXA_API bool SystemTimeToFileTime(const _SYSTEMTIME* fields, _FILETIME* time);

/// Turns ticks into UTC fields; what is below a millisecond is dropped.
VEXA_API bool FileTimeToSystemTime(const _FILETIME* time, _SYSTEMTIME* fields);

/// Moves a UTC time to local time by the zone's offset at that moment. The result is whole microseconds: the last
/// decimal digit of the tick count is dropped.
VEXA_API bool FileTimeToLocalFileTime(const _FILETIME* utc, _FILETIME* local);

/// Moves a local time to UTC. The offset is the one the zone has at the moment `local` would name if it were UTC, so a
/// time closer to a change of offset than the offset is long may come out by the size of the change too early or late.
/// The result is whole microseconds.
VEXA_API bool LocalFileTimeToFileTime(const _FILETIME* local, _FILETIME* utc);

/// Turns UTC fields into fields of the process's local time. `zone` must be null, anything else fails.
VEXA_API bool SystemTimeToTzSpecificLocalTime(const _TIME_ZONE_INFORMATION* zone, const _SYSTEMTIME* utc,
                                              _SYSTEMTIME* local);
}

/// A point in time: a count of 100 ns ticks since 1601-01-01 00:00:00 UTC. Zero means unset.
///
/// A plain value: copied freely, owned by nobody. Threads may share one that none of them changes. Nothing throws on
/// bad input; what cannot be computed is reported by the result. "Local" is the process's own zone.
class VEXA_API CRealTime {
 public:
  /// An unset time.
  constexpr CRealTime() noexcept : ticks_(0) {}
  CRealTime(const _FILETIME& utc);
  /// From local fields; unset when they name no time that can be counted. Local fields become UTC as
  /// LocalFileTimeToFileTime does it.
  CRealTime(const _SYSTEMTIME& local);
  /// From a text "day-month-year hour:minute:second.milliseconds" of plain numbers, as the logger writes it. The second
  /// and the milliseconds may be missing (".5" is 5 ms). A year below 100 is one of 2000 to 2099. Unset when `text` is
  /// null, when fewer than five numbers can be read, or when one of them is above 65535.
  CRealTime(const char* text, bool utc);
  /// From fields in UTC, or in local time when `utc` is false; unset when they name no time that can be counted.
  CRealTime(std::uint16_t year, std::uint16_t month, std::uint16_t day, std::uint16_t hour, std::uint16_t minute,
            std::uint16_t second, std::uint16_t millisecond, std::uint16_t microsecond, bool utc);
  /// From seconds since 1970-01-01 00:00:00 in UTC, or in local time when `utc` is false.
  CRealTime(std::time_t seconds, bool utc);
  /// The same with `ticks` of 100 ns added; unset when the seconds or the sum lie before 1601.
  CRealTime(std::time_t seconds, std::int64_t ticks, bool utc);

  /// The present time, to the millisecond.
  static CRealTime GetTheCurrentTime();

  _FILETIME GetUtcFileTime() const;
  void GetUtcFileTime(_FILETIME& time) const;
  /// UTC fields; all 0 when the time has none.
  _SYSTEMTIME GetUtcSystemTime() const;
  void GetUtcSystemTime(_SYSTEMTIME& fields) const;
  /// Local fields; all 0 when the time has none.
  _SYSTEMTIME GetLocalSystemTime() const;
  void GetLocalSystemTime(_SYSTEMTIME& fields) const;
  /// The local fields as seconds since 1970-01-01 UTC, whole seconds; 0 for an unset time, -1 where time_t does not
  /// reach. With `timeOfDayOnly` the date counts as 2000-01-01, so that times of day can be compared.
  std::time_t GetLocalTimeTime(bool timeOfDayOnly) const;

  /// Writes local time, or UTC when `utc` is true, by `format`. A directive is "%", any flags out of "#-.0123456789",
  /// and a letter; all else is copied.
  ///
  ///   %%             "%"
  ///   %A %a          day of the week: "Sunday" / "Sun"
  ///   %B %b          month in English: "March" / "Mar"
  ///   %N %n          month in Dutch: "maart" / "maa"
  ///   %Y %y          year, four digits / year of the century, two digits
  ///   %O %o          month, two digits / number
  ///   %D %d          day of the month, two digits / number
  ///   %H %h          hour, 0 to 23, two digits / number
  ///   %M %m          minute, two digits / number
  ///   %S %s          second, two digits / number
  ///   %L             milliseconds, number ("%03L" writes three digits)
  ///   %l             hundredths of a second, rounded, at most 99, two digits
  ///   %W %w          week number (GetWeek), two digits / number
  ///   %G %g          the year that week belongs to, four digits / of the century, two digits
  ///   %X             day of the year, 1 to 366, number
  ///   %x             days in the month, number
  ///
  /// Flags work as in printf ("%5d", "%-5d", "%05d", "%.3A") for names and for what is called a number here, and are
  /// dropped elsewhere. A letter that is not listed, or flags in an order that printf does not know, are copied as they
  /// stand; so is a "%" that ends the format. Week and day of the year are those of local time whatever `utc` says. A
  /// null `format` gives an empty text.
  ///
  /// Copying stops once 241 characters are written; a piece that would pass 255 characters is cut there.
  std::string Format(const char* format, bool utc) const;

  /// Reads a time from `text` by `format`, in UTC or (`utc` false) local time.
  ///
  /// A character of the format is searched forward in the text, and reading goes on after it; after the text's end
  /// when it is not there. A directive reads a number where reading stands (spaces before it are skipped; only the
  /// next 256 characters are looked at) but does not move on, so two directives need a character between them. Flags
  /// between "%" and the letter are skipped.
  ///
  ///   %D %d          day, 1 to 31
  ///   %O %o          month, 1 to 12
  ///   %H %h          hour, 0 to 23
  ///   %M %m          minute, 0 to 59
  ///   %S %s          second, 0 to 59
  ///   %L             milliseconds, 0 to 999
  ///   %l             hundredths of a second, 0 to 99, two characters at most
  ///   %Y             year, 0 to 9999, four characters at most
  ///   %y             year of this century, 0 to 99, two characters at most
  ///
  /// Upper-case D, O, H, M and S read two characters at most, lower-case letters and L any number. "%%" and other
  /// letters read nothing.
  ///
  /// Returns how many numbers were read; reading ends at the first that is missing. What was not read counts as 0, and
  /// the time becomes unset when the fields then name no time. Returns 0 and changes nothing when no number was read or
  /// a pointer is null; returns -1 and changes nothing when a number is out of its range.
  int Scan(const char* text, const char* format, bool utc);

  /// The number of the local week by m_WeekAlgo, and through `weekYear`, unless null, the year it belongs to. Returns
  /// -1 and leaves `*weekYear` as it was when the time has no local fields or m_WeekAlgo is not 0, 1 or 2.
  int GetWeek(int* weekYear) const;
  /// The local day of the year, 1 to 366; -1 when the time has no local fields.
  int GetDayOfYear() const;
  /// The local midnight that begins the week (by m_FirstDayOfWeek) this time lies in; unset when there is none.
  CRealTime GetFirstDayOfWeek() const;
  /// 28 to 31; -1 for a month outside 1 to 12.
  static int GetDaysInMonth(int year, int month);
  /// By the Gregorian rule.
  static bool IsLeapYear(int year);

  // These hold for the whole process and are not guarded: set them before other threads use this class.

  /// The day weeks begin on, 0 (Sunday) to 6; 1 (Monday) at start. Other values count modulo 7. Rules 0 and 2 of
  /// m_WeekAlgo do not look at it.
  static int m_FirstDayOfWeek;
  /// How GetWeek counts; 2 at start.
  ///   0: week 1 is the first seven days of the year, and so on
  ///   1: week 1 holds January 1; days of December in the same week as the next January 1 are in week 1 of that year
  ///   2: ISO 8601: weeks begin on Monday, week 1 holds the year's first Thursday
  static int m_WeekAlgo;
  /// A time for the host's own use; unset at start, and the library neither reads nor changes it.
  static CRealTime m_SnapShotTime;

 private:
  std::uint64_t ticks_;
};

/// A length of time: a signed count of 100 ns ticks, 10000000 to the second. A plain value, as CRealTime.
class VEXA_API CRealTimeSpan {
 public:
  /// From seconds. The tick count is kept modulo 2^64, so it wraps beyond some 29000 years.
  CRealTimeSpan(long seconds);

  /// The product of the two tick counts (not of the lengths in seconds), modulo 2^64.
  CRealTimeSpan operator*(const CRealTimeSpan& other) const;

  /// The hours, minutes and seconds of the span (whole days dropped) as the local time of day on 2000-01-01, in seconds
  /// since 1970-01-01 UTC.
  std::time_t GetTimeTime() const;

  /// Writes the span by `format`, whose directives are built as those of CRealTime::Format. Upper-case letters give the
  /// whole span, lower-case letters a part of it:
  ///
  ///   %%             "%"
  ///   %D             whole days in the span
  ///   %H             whole hours in the span
  ///   %M             whole minutes in the span
  ///   %S             whole seconds in the span
  ///   %L             whole milliseconds in the span
  ///   %d             days, as %D: there is no larger unit
  ///   %h             hours beyond whole days, 0 to 23
  ///   %m             minutes beyond whole hours, 0 to 59
  ///   %s             seconds beyond whole minutes, 0 to 59
  ///   %l             milliseconds beyond whole seconds, 0 to 999
  ///   %T             days and a clock: "1 day 2:03:04", "0 days 0:00:05"
  ///   %C             days to seconds in words, without those that are 0: "1 day 3 minutes"; "0 seconds" if all are 0
  ///   %F             days to milliseconds in words, all five:
  ///                  "1 day 0 hours 3 minutes 0 seconds 20 milliseconds"
  ///   %c             the largest unit that is not 0, milliseconds among them, in words: "3 minutes"; else "0 seconds"
  ///   %i             milliseconds beyond whole seconds in words: "20 milliseconds"
  ///
  /// Flags work as in printf for the single numbers ("%02h") and are dropped for the other letters. In a negative span
  /// each single number is negative, and %T and the words have one "-" before them. Letters that are not listed are
  /// copied with their "%" and flags. The length limits of CRealTime::Format hold; a null `format` gives an empty text.
  std::string Format(const char* format) const;

 private:
  std::int64_t ticks_;
};
