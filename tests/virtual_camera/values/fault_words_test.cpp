// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/values/fault_words.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

TEST(FaultWords, APacketFaultIsSetByItsWord) {
  PacketFaults faults;
  EXPECT_TRUE(set_packet_fault(faults, "loss", "0.25"));
  EXPECT_TRUE(set_packet_fault(faults, "burst-length", "3"));
  EXPECT_TRUE(set_packet_fault(faults, "delay-ms", "60"));
  EXPECT_EQ(faults.loss, 0.25);
  EXPECT_EQ(faults.burst_length, 3U);
  EXPECT_EQ(faults.delay_time.count(), 60);
}

TEST(FaultWords, EveryPacketFaultThatIsListedTakesItsListedValue) {
  PacketFaults faults;
  const auto values = packet_fault_values(faults);
  EXPECT_EQ(values.size(), 13U);
  for (const auto& [word, value] : values) {
    EXPECT_TRUE(set_packet_fault(faults, word, std::to_string(static_cast<int>(value)))) << word;
  }
}

TEST(FaultWords, AValueOutOfItsRangeChangesNothing) {
  const struct {
    const char* word;
    const char* value;
  } cases[] = {{"loss", "1.001"},   {"loss", "-0.1"},    {"loss", "nan"},         {"loss", ""},
               {"loss", "0.1x"},    {"delay-ms", "-1"},  {"delay-ms", "60001"},   {"burst-length", "100001"},
               {"corrupt", "many"}, {"nonsense", "0.1"}, {"burst-length", "0.5"}, {"", ""}};
  for (const auto& c : cases) {
    PacketFaults faults;
    EXPECT_FALSE(set_packet_fault(faults, c.word, c.value)) << c.word << "=" << c.value;
    EXPECT_EQ(packet_fault_values(faults), packet_fault_values(PacketFaults())) << c.word << "=" << c.value;
  }
}

TEST(FaultWords, ARequestFaultTakesItsMatchItsValueAndItsOccurrence) {
  const auto fault = request_fault("slow-answer", "PLAY#2", "70");
  ASSERT_TRUE(fault);
  EXPECT_EQ(fault->match, "PLAY");
  EXPECT_EQ(fault->occurrence, 2U);
  EXPECT_EQ(fault->action, FaultAction::kSlowAnswer);
  EXPECT_EQ(fault->time.count(), 70);
  EXPECT_EQ(request_fault("raw-answer", "PLAY", "a\\r\\nb\\\\")->text, "a\r\nb\\");
  EXPECT_EQ(request_fault("reset", "", "")->match, "");
}

TEST(FaultWords, ARequestFaultWithAWrongWordOrValueIsNone) {
  const struct {
    const char* word;
    const char* match;
    const char* value;
  } cases[] = {{"nonsense", "PLAY", ""},     {"slow-answer", "PLAY", "soon"}, {"slow-answer", "PLAY", ""},
               {"cut-answer", "PLAY", "-1"}, {"status", "PLAY", ""},          {"no-answer", "PLAY", "5"},
               {"no-answer", "PLAY#x", ""},  {"no-answer", "PLAY#", ""}};
  for (const auto& c : cases) EXPECT_FALSE(request_fault(c.word, c.match, c.value)) << c.word << " " << c.match;
}

}  // namespace
}  // namespace vexa::camera
