#include "transport/wire/sequence_ledger.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <random>
#include <set>
#include <vector>

namespace vexa {
namespace {

using Arrival = SequenceLedger::Arrival;

void expect_equation(const SequenceLedger& ledger) {
  ASSERT_EQ(ledger.expected(), ledger.received_once() + ledger.missing());
}

TEST(SequenceLedger, ExpectsNothingBeforeTheFirstPacket) {
  const SequenceLedger ledger;
  EXPECT_EQ(ledger.expected(), 0u);
  EXPECT_EQ(ledger.missing(), 0u);
  EXPECT_EQ(ledger.runs(), 0u);
}

TEST(SequenceLedger, PacketsInOrderAreExpectedAndNoneIsMissingAcrossTheWrap) {
  SequenceLedger ledger;
  for (unsigned i = 0; i < 70000; ++i) {
    EXPECT_EQ(ledger.arrived(static_cast<std::uint16_t>(65000 + i)), Arrival::kNew);
  }
  EXPECT_EQ(ledger.expected(), 70000u);
  EXPECT_EQ(ledger.missing(), 0u);
  EXPECT_EQ(ledger.highest(), 65000u + 69999u);
}

TEST(SequenceLedger, ALatePacketMovesFromMissingToLateOnce) {
  SequenceLedger ledger;
  ledger.arrived(10);
  ledger.arrived(13);
  EXPECT_EQ(ledger.missing(), 2u);
  EXPECT_EQ(ledger.arrived(11), Arrival::kLate);
  EXPECT_EQ(ledger.arrived(11), Arrival::kDuplicate);
  EXPECT_EQ(ledger.arrived(13), Arrival::kDuplicate);
  EXPECT_EQ(ledger.missing(), 1u);
  EXPECT_EQ(ledger.late(), 1u);
  EXPECT_EQ(ledger.expected(), 4u);
}

TEST(SequenceLedger, APacketSentBeforeTheFirstToComeLowersTheBase) {
  SequenceLedger ledger;
  ledger.arrived(100);
  EXPECT_EQ(ledger.arrived(97), Arrival::kLate);
  EXPECT_EQ(ledger.expected(), 4u);
  EXPECT_EQ(ledger.missing(), 2u);
  EXPECT_EQ(ledger.arrived(98), Arrival::kLate);
  EXPECT_EQ(ledger.missing(), 1u);
}

TEST(SequenceLedger, NoNumberIsExtendedBelowZero) {
  SequenceLedger ledger;
  ledger.arrived(2);
  EXPECT_EQ(ledger.arrived(65530), Arrival::kUnplaced);
  EXPECT_EQ(ledger.expected(), 1u);
}

TEST(SequenceLedger, AWindowAheadIsAGapAndOneMoreIsNot) {
  SequenceLedger gap;
  gap.arrived(5);
  EXPECT_EQ(gap.arrived(5 + SequenceLedger::kWindow), Arrival::kNew);
  EXPECT_EQ(gap.missing(), SequenceLedger::kWindow - 1u);
  SequenceLedger jump;
  jump.arrived(5);
  EXPECT_EQ(jump.arrived(5 + SequenceLedger::kWindow + 1), Arrival::kUnplaced);
  EXPECT_EQ(jump.missing(), 0u);
}

TEST(SequenceLedger, TwoConsecutivePacketsFarAwayBeginARunOfTheirOwn) {
  SequenceLedger ledger;
  for (const unsigned sequence : {1u, 2u, 3u}) ledger.arrived(static_cast<std::uint16_t>(sequence));
  EXPECT_EQ(ledger.arrived(40000), Arrival::kUnplaced);
  EXPECT_EQ(ledger.arrived(40001), Arrival::kNew);
  EXPECT_EQ(ledger.expected(), 5u);
  EXPECT_EQ(ledger.missing(), 0u);
  EXPECT_EQ(ledger.runs(), 2u);
  EXPECT_GT(ledger.extended(40001), 65535u) << "extended numbers ascend across runs";
}

TEST(SequenceLedger, SinglePacketsFarAwayDoNotEndARun) {
  SequenceLedger ledger;
  ledger.arrived(1);
  for (const unsigned stray : {40000u, 50000u}) {
    EXPECT_EQ(ledger.arrived(static_cast<std::uint16_t>(stray)), Arrival::kUnplaced);
  }
  EXPECT_EQ(ledger.arrived(40001), Arrival::kUnplaced) << "not right after 40000";
  EXPECT_EQ(ledger.arrived(2), Arrival::kNew);
  EXPECT_EQ(ledger.arrived(40002), Arrival::kUnplaced) << "the run went on in between";
  EXPECT_EQ(ledger.runs(), 1u);
  EXPECT_EQ(ledger.expected(), 2u);
}

TEST(SequenceLedger, WhatIsMissingWhenARunEndsStaysMissing) {
  SequenceLedger ledger;
  ledger.arrived(1);
  ledger.arrived(3);
  ledger.begin_run();
  EXPECT_EQ(ledger.arrived(2), Arrival::kNew) << "of another run";
  EXPECT_EQ(ledger.missing(), 1u);
  EXPECT_EQ(ledger.expected(), 4u);
}

TEST(SequenceLedger, CountsARandomChannelAsASetOfNumbersDoes) {
  std::mt19937 random(7);
  std::uniform_real_distribution<double> chance(0, 1);
  struct Sent {
    std::uint64_t number;
    double place;
  };
  std::vector<Sent> sent;
  constexpr std::uint64_t kFirst = 65000;
  for (std::uint64_t i = 0; i < 200000; ++i) {
    if (i != 0 && chance(random) < 0.05) continue;
    const double place = static_cast<double>(i);
    sent.push_back({kFirst + i, place + (chance(random) < 0.05 ? 1 + 19 * chance(random) : 0)});
    if (chance(random) < 0.01) sent.push_back({kFirst + i, place + 20 * chance(random)});
  }
  std::stable_sort(sent.begin(), sent.end(), [](const Sent& a, const Sent& b) { return a.place < b.place; });
  SequenceLedger ledger;
  std::set<std::uint64_t> seen;
  std::uint64_t late = 0;
  for (const Sent& packet : sent) {
    const bool is_late = !seen.empty() && packet.number < *seen.rbegin();
    const bool is_new = seen.insert(packet.number).second;
    if (is_new && is_late) ++late;
    const Arrival arrival = ledger.arrived(static_cast<std::uint16_t>(packet.number));
    ASSERT_EQ(arrival, !is_new ? Arrival::kDuplicate : is_late ? Arrival::kLate : Arrival::kNew);
    ASSERT_EQ(ledger.received_once(), seen.size());
    ASSERT_EQ(ledger.expected(), *seen.rbegin() - *seen.begin() + 1);
    ASSERT_EQ(ledger.late(), late);
    ASSERT_NO_FATAL_FAILURE(expect_equation(ledger));
    ASSERT_EQ(ledger.extended(static_cast<std::uint16_t>(packet.number)), packet.number);
  }
}

TEST(SequenceLedger, TheEquationHoldsForAnyNumbers) {
  std::mt19937 random(11);
  SequenceLedger ledger;
  std::uint64_t expected = 0;
  for (int i = 0; i < 200000; ++i) {
    const bool go_on = i % 7 != 0;
    const auto near = static_cast<std::uint16_t>(ledger.highest() + random() % 5 - 2);
    ledger.arrived(go_on ? near : static_cast<std::uint16_t>(random()));
    if (i % 1000 == 0) ledger.begin_run();
    ASSERT_NO_FATAL_FAILURE(expect_equation(ledger));
    ASSERT_GE(ledger.expected(), expected) << "a total never falls";
    expected = ledger.expected();
  }
}

}  // namespace
}  // namespace vexa
