// SPDX-License-Identifier: Apache-2.0
// The directive languages of CRealTime::Format and CRealTimeSpan::Format, as functions of plain values.
#pragma once

#include <cstdint>
#include <string>

#include "runtime/base/calendar.h"
#include "vexa/real_time.h"

namespace vexa {

/// All that a time's directives write.
struct TimeParts {
  _SYSTEMTIME fields;  ///< local or UTC
  YearWeek week;
  int day_of_year;
};

/// The text of `format` in CRealTime::Format.
std::string format_time(const char* format, const TimeParts& parts);

/// The text of `format` in CRealTimeSpan::Format.
std::string format_span(const char* format, std::int64_t ticks);

}  // namespace vexa
