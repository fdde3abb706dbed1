#include "runtime/level_event.h"

#include <gtest/gtest.h>

#include <cerrno>

#include "tests/support/descriptors.h"

namespace vexa {
namespace {

TEST(LevelEvent, IsReadableFromItsRaisingToItsLowering) {
  LevelEvent event;
  ASSERT_GE(event.open(false), 0);
  EXPECT_FALSE(vexa_test::is_readable(event.descriptor()));
  event.raise();
  event.raise();
  EXPECT_TRUE(vexa_test::is_readable(event.descriptor()));
  event.lower();
  EXPECT_FALSE(vexa_test::is_readable(event.descriptor()));
  event.lower();
  event.raise();
  EXPECT_TRUE(vexa_test::is_readable(event.descriptor()));
}

TEST(LevelEvent, MayBeginRaisedAndIsOpenedOnce) {
  LevelEvent event;
  const int descriptor = event.open(true);
  EXPECT_TRUE(vexa_test::is_readable(descriptor));
  EXPECT_EQ(event.open(false), descriptor);
  EXPECT_TRUE(vexa_test::is_readable(descriptor));
}

TEST(LevelEvent, DoesNothingWhileItIsClosed) {
  LevelEvent event;
  event.raise();
  event.lower();
  EXPECT_EQ(event.descriptor(), -1);
  const int descriptor = event.open(false);
  event.close();
  EXPECT_EQ(vexa_test::poll_events(descriptor), POLLNVAL);
  EXPECT_EQ(event.descriptor(), -1);
}

TEST(LevelEvent, ReportsThatNoDescriptorIsLeft) {
  LevelEvent event;
  const vexa_test::NoDescriptorsLeft none;
  EXPECT_EQ(event.open(false), -1);
  EXPECT_EQ(errno, EMFILE);
}

}  // namespace
}  // namespace vexa
