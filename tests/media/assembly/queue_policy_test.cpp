// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/queue_policy.h"

#include <gtest/gtest.h>

namespace vexa::test {
namespace {

struct PolicyCase {
  const char* what;
  std::int32_t type;
  std::size_t waiting;
  bool wait_key;
  std::size_t dropped;
  bool append;
  bool wait_key_after;
};

TEST(QueuePolicy, DecidesForEveryTypeAndBothEdgesOfTheBacklog) {
  const PolicyCase cases[] = {
      {"JPEG joins 9", 0, 9, false, 0, true, false},
      {"JPEG pushes one of 10 out", 0, 10, false, 1, true, false},
      {"JPEG pushes three of 12 out", 0, 12, false, 3, true, false},
      {"delta joins 30", 22, 30, false, 0, true, false},
      {"delta empties 31 and goes", 22, 31, false, 31, false, true},
      {"key empties 31 and joins", 20, 31, false, 31, true, false},
      {"MPEG-4 delta joins 30", 11, 30, false, 0, true, false},
      {"MPEG-4 delta empties 31 and goes", 11, 31, false, 31, false, true},
      {"MPEG-4 key empties 31 and joins", 10, 31, false, 31, true, false},
      {"no picture is never queued and asks for a key", -1, 0, false, 0, false, true},
      {"no picture empties a backlog as well", -1, 31, false, 31, false, true},
      {"delta goes while a key is waited for", 22, 0, true, 0, false, true},
      {"MPEG-4 delta goes while a key is waited for", 11, 3, true, 0, false, true},
      {"JPEG goes while a key is waited for", 0, 0, true, 0, false, true},
      {"H.264 key ends the wait", 20, 0, true, 0, true, false},
      {"MPEG-4 key ends the wait", 10, 0, true, 0, true, false},
  };
  for (const PolicyCase& c : cases) {
    bool wait_key = c.wait_key;
    const QueueDecision decision = decide_queue(c.type, c.waiting, wait_key);
    EXPECT_EQ(decision.oldest_to_drop, c.dropped) << c.what;
    EXPECT_EQ(decision.append, c.append) << c.what;
    EXPECT_EQ(wait_key, c.wait_key_after) << c.what;
  }
}

}  // namespace
}  // namespace vexa::test
