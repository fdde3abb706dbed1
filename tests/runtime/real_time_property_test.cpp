// SPDX-License-Identifier: Apache-2.0
// What holds for times and formats of every kind; RapidCheck chooses them, and shrinks what does not hold.
#include <gtest/gtest.h>
#include <rapidcheck.h>
#include <rapidcheck/gtest.h>

#include <algorithm>
#include <cstdio>
#include <string>
#include <vector>

#include "runtime/file_time.h"
#include "runtime/real_time_format.h"
#include "tests/runtime/in_zone.h"
#include "vexa/real_time.h"

namespace vexa {
namespace {

using test::InZone;

constexpr std::int64_t kYear1900 = -2208988800;
constexpr std::int64_t kLastDays = 253402128000;  // 9999-12-30
constexpr std::int64_t kDayInSeconds = 86400;
constexpr char kZoneNames[][17] = {"UTC", "Europe/Amsterdam", "Australia/Sydney", "Asia/Kolkata"};

std::uint64_t count_of(const CRealTime& time) { return ticks_of(time.GetUtcFileTime()); }

/// A time of whole milliseconds of the years 1900 to 9999, but none near the second before 1970, which no fields name.
CRealTime any_time() {
  const auto seconds = *rc::gen::suchThat(rc::gen::inRange(kYear1900, kLastDays), [](std::int64_t second) {
    return second < -kDayInSeconds || second > kDayInSeconds;
  });
  const auto milliseconds = *rc::gen::inRange<std::uint64_t>(0, 1000);
  return CRealTime(file_time_of(ticks_of_unix(seconds, milliseconds * kTicksPerMillisecond).value()));
}

/// From one time to another, in ticks.
std::int64_t distance_of(const CRealTime& to, const CRealTime& from) {
  return static_cast<std::int64_t>(count_of(to) - count_of(from));
}

/// The zone's offset at a time, in ticks.
std::int64_t offset_of(const CRealTime& time) {
  const _FILETIME utc = time.GetUtcFileTime();
  _FILETIME local{};
  FileTimeToLocalFileTime(&utc, &local);
  return distance_of(CRealTime(local), time);
}

/// Text of these characters; "%" is made frequent by standing there several times.
std::string text_of(const std::string& characters) {
  return *rc::gen::container<std::string>(rc::gen::elementOf(characters));
}

/// Directives that name all seven fields, in any order, with a character that no number holds after each.
std::string any_whole_format() {
  const std::vector<std::string> directives = {"%Y",
                                               *rc::gen::element<std::string>("%D", "%d"),
                                               *rc::gen::element<std::string>("%O", "%o"),
                                               *rc::gen::element<std::string>("%H", "%h"),
                                               *rc::gen::element<std::string>("%M", "%m"),
                                               *rc::gen::element<std::string>("%S", "%s"),
                                               *rc::gen::element<std::string>("%L", "%03L")};
  const std::vector<int> keys = *rc::gen::container<std::vector<int>>(directives.size(), rc::gen::arbitrary<int>());
  std::vector<std::size_t> order = {0, 1, 2, 3, 4, 5, 6};
  std::stable_sort(order.begin(), order.end(), [&keys](std::size_t a, std::size_t b) { return keys[a] < keys[b]; });
  std::string format;
  for (const std::size_t place : order) format += directives[place] + *rc::gen::elementOf(std::string("-/:., _"));
  return format;
}

RC_GTEST_PROP(RealTimeProperty, ScanReadsBackWhatFormatWrites, ()) {
  const CRealTime time = any_time();
  const std::string format = any_whole_format();
  const std::string text = time.Format(format.c_str(), true);
  CRealTime back;
  RC_ASSERT(back.Scan(text.c_str(), format.c_str(), true) == 7);
  RC_ASSERT(count_of(back) == count_of(time));
}

RC_GTEST_PROP(RealTimeProperty, ALocalTextComesBackExceptNearAChangeOfOffset, ()) {
  const InZone zone(kZoneNames[*rc::gen::inRange(0, 4)]);
  const CRealTime time = any_time();
  const char* format = "%Y-%O-%D %H:%M:%S.%03L";
  CRealTime back;
  RC_ASSERT(back.Scan(time.Format(format, false).c_str(), format, false) == 7);
  const CRealTime later(file_time_of(count_of(time) + kTicksPerDay));
  const CRealTime earlier(file_time_of(count_of(time) - kTicksPerDay));
  const bool near_change = offset_of(earlier) != offset_of(later);
  RC_CLASSIFY(near_change, "near a change of offset");
  const std::int64_t distance = distance_of(back, time);
  constexpr std::int64_t kLargestChange = 7200 * static_cast<std::int64_t>(kTicksPerSecond);
  RC_ASSERT((near_change ? distance >= -kLargestChange && distance <= kLargestChange : distance == 0));
}

RC_GTEST_PROP(RealTimeProperty, TheTextConstructorAgreesWithScan, ()) {
  const std::string text = any_time().Format("%D-%O-%Y %H:%M:%S.%03L", true);
  CRealTime scanned;
  RC_ASSERT(scanned.Scan(text.c_str(), "%D-%O-%Y %H:%M:%S.%L", true) == 7);
  RC_ASSERT(count_of(CRealTime(text.c_str(), true)) == count_of(scanned));
}

RC_GTEST_PROP(RealTimeProperty, AnyFormatIsBoundedAndWithoutDirectivesCopied, ()) {
  const CRealTime time = any_time();
  const std::string format = text_of("%%%%#-.0123456789AaBbNnYyOoDdHhMmSsLlWwGgXxqz \n");
  const std::string written = time.Format(format.c_str(), true);
  RC_ASSERT(written.size() <= 255U);
  if (format.find('%') == std::string::npos) RC_ASSERT(written == format.substr(0, 241));
}

RC_GTEST_PROP(RealTimeProperty, FlagsThatPrintfKnowsPadAsPrintfDoes, ()) {
  std::string flags = text_of("-0");
  if (const int width = *rc::gen::inRange(0, 40); width > 0) flags += std::to_string(width);
  if (*rc::gen::arbitrary<bool>()) flags += "." + std::to_string(*rc::gen::inRange(0, 40));
  const CRealTime time = any_time();
  const _SYSTEMTIME fields = time.GetUtcSystemTime();
  char expected[64] = {};
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral"
  std::snprintf(expected, sizeof expected, ("%" + flags + "d").c_str(), fields.wMilliseconds);
#pragma GCC diagnostic pop
  RC_ASSERT(time.Format(("%" + flags + "L").c_str(), true) == std::string(expected));
}

RC_GTEST_PROP(RealTimeProperty, ScanOfAnyTextCountsOrRefusesAndThenChangesNothing, ()) {
  const std::string text = text_of("0123456789-+:. /xY%\t");
  const std::string format = text_of("%%%%%%#-.059DdOoHhMmSsLlYyAq:-. /");
  const CRealTime before(2001, 2, 3, 4, 5, 6, 7, 0, true);
  CRealTime time = before;
  const int count = time.Scan(text.c_str(), format.c_str(), true);
  RC_ASSERT((count >= -1 && count <= static_cast<int>(format.size() / 2)));
  if (count <= 0) RC_ASSERT(count_of(time) == count_of(before));
}

RC_GTEST_PROP(RealTimeProperty, PartsOfASpanAddUpToItsTotal, ()) {
  const auto ticks = *rc::gen::arbitrary<std::int64_t>();
  long long days = 0, hours = 0, minutes = 0, seconds = 0, milliseconds = 0;
  const std::string text = format_span("%d %h %m %s %l", ticks);
  RC_ASSERT(std::sscanf(text.c_str(), "%20lld %3lld %3lld %3lld %4lld", &days, &hours, &minutes, &seconds,
                        &milliseconds) == 5);
  RC_ASSERT((((days * 24 + hours) * 60 + minutes) * 60 + seconds) * 1000 + milliseconds == ticks / 10000);
}

}  // namespace
}  // namespace vexa
