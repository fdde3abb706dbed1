// SPDX-License-Identifier: Apache-2.0
#include "media/stream_ledger.h"

#include <gtest/gtest.h>

#include <chrono>

namespace vexa_test {
namespace {

using std::chrono::milliseconds;

TEST(StreamLedger, MeasuresJitterAnewAfterARestartWithLowerTimestamps) {
  constexpr int kClockRate = 90000;
  const std::chrono::steady_clock::time_point begin{std::chrono::hours(1)};
  vexa::StreamLedger ledger;
  ledger.begin_stream(vexa::StreamTransport::kUdp);
  ledger.media(3'000'000'000, kClockRate, begin);
  ledger.restarted(7);
  ledger.media(9000, kClockRate, begin + milliseconds(100));
  EXPECT_EQ(ledger.jitter(), 0u) << "the time from one run to the next is none";
  ledger.media(18000, kClockRate, begin + milliseconds(216));
  EXPECT_EQ(ledger.jitter(), 1'000'000u) << "a sixteenth of the 16 ms that the picture came late";
}

}  // namespace
}  // namespace vexa_test
