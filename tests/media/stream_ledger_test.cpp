// SPDX-License-Identifier: Apache-2.0
#include "media/stream_ledger.h"

#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <thread>

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

TEST(StreamLedger, PartsOfAStreamWithoutPacketsHaveOneFateEach) {
  using Fate = vexa::StreamLedger::PartFate;
  const std::chrono::steady_clock::time_point moment{std::chrono::seconds(7)};
  vexa::StreamLedger ledger;
  ledger.part(Fate::kAssembled, 100, moment);
  ledger.part(Fate::kAssembled, 100, moment);
  ledger.part(Fate::kIncomplete, 10, moment);
  ledger.part(Fate::kTooLarge, 0, moment);
  ledger.publish();
  const vexa::StreamRecord record = ledger.read();
  EXPECT_EQ(record.collection.pictures_begun, 4u);
  EXPECT_EQ(record.collection.pictures_assembled, 2u);
  EXPECT_EQ(record.collection.pictures_incomplete, 1u);
  EXPECT_EQ(record.collection.pictures_too_large, 1u);
  EXPECT_EQ(record.collection.pictures_held, 0u);
  EXPECT_EQ(record.bytes_received, 210u);
  EXPECT_EQ(record.last_packet, 7'000'000'000u);
}

// Each datagram changes both halves of the bytes' sum, so that a record put together of two shows on 32 bits as well.
TEST(StreamLedger, ARecordReadBesideItsWriterIsOfOneMoment) {
  constexpr std::size_t kBytes = 0xffffffff;
  constexpr std::uint64_t kPackets = 50000;
  vexa::StreamLedger ledger;
  std::thread writer([&ledger] {
    for (std::uint64_t i = 1; i <= kPackets; ++i) {
      ledger.datagram(kBytes, std::chrono::steady_clock::time_point(std::chrono::nanoseconds(i * kBytes)));
      ledger.refuse(vexa::StreamLedger::Refusal::kNotRtp);
      ledger.publish();
    }
  });
  std::uint64_t last = 0;
  while (last != kPackets && !HasFailure()) {
    const vexa::StreamRecord record = ledger.read();
    EXPECT_GE(record.packets_received, last);
    last = record.packets_received;
    EXPECT_EQ(record.bytes_received, last * kBytes);
    EXPECT_EQ(record.not_rtp, last) << "received is used, discarded and held";
    EXPECT_EQ(record.last_packet, last * kBytes);
  }
  writer.join();
}

}  // namespace
}  // namespace vexa_test
