// SPDX-License-Identifier: Apache-2.0
#include "node/segments/segment_name.h"

#include <gtest/gtest.h>

namespace vexa::node {
namespace {

using namespace std::chrono_literals;
using State = SegmentName::State;

TEST(SegmentNames, ReadBackAsTheyWereMade) {
  const struct {
    SegmentName name;
    const char* text;
  } cases[] = {
      {{0ms, "gate", 0, 1, State::kWhole}, "19700101T000000000Z_gate_0_1.mp4"},
      {{1769903999250ms, "gate-2", 18446744073709551615U, 17, State::kWriting},
       "20260131T235959250Z_gate-2_18446744073709551615_17.part"},
      {{951782400000ms, "A b_c", 3, 0, State::kRecovered}, "20000229T000000000Z_A%20b%5fc_3_0.recovered.mp4"},
  };
  for (const auto& row : cases) {
    EXPECT_EQ(file_name_of(row.name), row.text);
    EXPECT_EQ(segment_of(row.text), row.name) << row.text;
  }
}

TEST(SegmentNames, OtherNamesAreNoSegments) {
  for (const char* text :
       {"", ".mp4", "film.mp4", "20260131T235959250Z_gate_0_1", "20260131T235959250Z_gate_0_1.mkv",
        "20260231T235959250Z_gate_0_1.mp4", "20260131T240000000Z_gate_0_1.mp4", "20260131T235959250Z_gate_01_1.mp4",
        "20260131T235959250Z_gate_-1_1.mp4", "20260131T235959250Z_gate_1.mp4", "20260131T235959250Z_a_b_0_1.mp4",
        "20260131T235959250Z_%2_0_1.mp4", "20260131T235959250Z_%7A_0_1.mp4", "20260131T235959250Z_../x_0_1.mp4",
        "20260131T235959250Z_gate_0_18446744073709551616.mp4"}) {
    EXPECT_EQ(segment_of(text), std::nullopt) << text;
  }
}

TEST(SegmentNames, ACamerasNameNeverLeavesItsFolder) {
  EXPECT_EQ(escaped_camera("../etc"), "%2e%2e%2fetc");
  EXPECT_EQ(escaped_camera(std::string_view("\0\xff", 2)), "%00%ff");
}

}  // namespace
}  // namespace vexa::node
