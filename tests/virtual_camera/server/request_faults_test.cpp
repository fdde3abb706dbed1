// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/request_faults.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

TEST(RequestFaults, OnlyRequestsThatHoldTheMatchAreStruck) {
  RequestFaultList list;
  list.add(RequestFault::reset("inq=system"));
  EXPECT_FALSE(list.take("GET /command/inquiry.cgi?inq=network HTTP/1.0"));
  EXPECT_TRUE(list.take("GET /command/inquiry.cgi?inq=system HTTP/1.0"));
  EXPECT_TRUE(list.take("GET /command/inquiry.cgi?inq=system HTTP/1.0"));
  list.clear();
  EXPECT_FALSE(list.take("GET /command/inquiry.cgi?inq=system HTTP/1.0"));
}

TEST(RequestFaults, AnOccurrenceAppliesToThatMatchAlone) {
  RequestFaultList list;
  list.add(RequestFault::reset("A").nth(2));
  EXPECT_FALSE(list.take("A"));
  EXPECT_FALSE(list.take("B"));
  EXPECT_TRUE(list.take("A"));
  EXPECT_FALSE(list.take("A"));
}

TEST(RequestFaults, TheFirstRuleInForceWinsAndLaterOnesStillCount) {
  RequestFaultList list;
  list.add(RequestFault::no_answer("A").nth(1));
  list.add(RequestFault::reset("").nth(2));
  EXPECT_EQ(list.take("A")->action, FaultAction::kNoAnswer);
  EXPECT_EQ(list.take("A")->action, FaultAction::kReset);
  EXPECT_FALSE(list.take("A"));
}

TEST(RequestFaults, DeliveryFollowsTheAction) {
  const struct {
    RequestFault fault;
    std::string bytes;
    milliseconds delay, interval;
    DeliveryEnd end;
    bool replaces;
  } cases[] = {
      {RequestFault::no_answer(""), "", milliseconds(0), milliseconds(0), DeliveryEnd::kHold, true},
      {RequestFault::slow("", milliseconds(70)), "answer", milliseconds(70), milliseconds(0), DeliveryEnd::kAsUsual,
       false},
      {RequestFault::byte_at_a_time("", milliseconds(3)), "answer", milliseconds(0), milliseconds(3),
       DeliveryEnd::kAsUsual, false},
      {RequestFault::byte_at_a_time("", milliseconds(0)), "answer", milliseconds(0), milliseconds(1),
       DeliveryEnd::kAsUsual, false},
      {RequestFault::cut_after("", 3), "ans", milliseconds(0), milliseconds(0), DeliveryEnd::kClose, false},
      {RequestFault::cut_after("", 99), "answer", milliseconds(0), milliseconds(0), DeliveryEnd::kClose, false},
      {RequestFault::stall_after("", 0), "", milliseconds(0), milliseconds(0), DeliveryEnd::kHold, false},
      {RequestFault::reset(""), "", milliseconds(0), milliseconds(0), DeliveryEnd::kReset, true},
      {RequestFault::status("", "503 Busy"), "answer", milliseconds(0), milliseconds(0), DeliveryEnd::kAsUsual, true},
      {RequestFault::raw("", "x"), "answer", milliseconds(0), milliseconds(0), DeliveryEnd::kAsUsual, true},
      {RequestFault::wrong_credentials(""), "answer", milliseconds(0), milliseconds(0), DeliveryEnd::kAsUsual, true},
      {RequestFault::reboot("", milliseconds(5)), "", milliseconds(0), milliseconds(0), DeliveryEnd::kReset, true},
  };
  for (const auto& c : cases) {
    const Delivery delivery = plan_delivery(c.fault, "answer");
    const int action = static_cast<int>(c.fault.action);
    EXPECT_EQ(delivery.bytes, c.bytes) << action;
    EXPECT_EQ(delivery.delay, c.delay) << action;
    EXPECT_EQ(delivery.interval, c.interval) << action;
    EXPECT_EQ(delivery.end, c.end) << action;
    EXPECT_EQ(replaces_request(c.fault.action), c.replaces) << action;
  }
}

TEST(RequestFaults, WithoutAFaultTheAnswerGoesOutWhole) {
  const Delivery delivery = plan_delivery(std::nullopt, "answer");
  EXPECT_EQ(delivery.bytes, "answer");
  EXPECT_EQ(delivery.delay.count(), 0);
  EXPECT_EQ(delivery.interval.count(), 0);
  EXPECT_EQ(delivery.end, DeliveryEnd::kAsUsual);
}

}  // namespace
}  // namespace vexa::camera
