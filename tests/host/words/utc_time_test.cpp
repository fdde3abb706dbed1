// SPDX-License-Identifier: Apache-2.0
#include "host/words/utc_time.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

using std::chrono::milliseconds;
using std::chrono::seconds;

TEST(UtcTime, IsWrittenToTheSecondOrMillisecond) {
  EXPECT_EQ(utc_text(seconds(0)), "1970-01-01T00:00:00Z");
  EXPECT_EQ(utc_text(seconds(1706745599)), "2024-01-31T23:59:59Z");
  using Moment = std::chrono::system_clock::time_point;
  EXPECT_EQ(utc_text(Moment(milliseconds(1706745599999))), "2024-01-31T23:59:59.999Z");
  EXPECT_EQ(utc_text(Moment(milliseconds(1706745600005))), "2024-02-01T00:00:00.005Z");
}

TEST(UtcTime, IsReadWithOrWithoutItsZone) {
  EXPECT_EQ(utc_moment("2024-01-31T23:59:59Z"), seconds(1706745599));
  EXPECT_EQ(utc_moment("2024-01-31T23:59:59"), seconds(1706745599));
  EXPECT_EQ(utc_moment("2024-02-29T00:00:00Z"), seconds(1709164800));
}

TEST(UtcTime, OfAnyOtherFormOrOfNoDayIsNone) {
  for (const char* text :
       {"", "2024", "2024-1-31T23:59:59", "2024-02-30T00:00:00", "2023-02-29T00:00:00", "2024-01-31 23:59:59",
        "2024-01-31T23:59:59+01:00", "2024-01-31T23:59:59ZZ", "2024-01-31T24:00:00", " 2024-01-31T23:59:59"}) {
    EXPECT_EQ(utc_moment(text), std::nullopt) << text;
  }
}

}  // namespace
}  // namespace vexa::host
