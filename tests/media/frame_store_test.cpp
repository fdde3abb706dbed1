#include "media/frame_store.h"

#include <gtest/gtest.h>

#include <memory>
#include <vector>

namespace vexa {
namespace {

using Buffer = std::unique_ptr<unsigned char[]>;

TEST(FrameStore, GivesTheBufferOfThatSizeThatCameBackLast) {
  FrameStore store;
  unsigned char* first = store.take(8);
  unsigned char* second = store.take(8);
  store.give_back(first, 8);
  store.give_back(second, 8);
  EXPECT_EQ(Buffer(store.take(8)).get(), second);
  EXPECT_EQ(Buffer(store.take(8)).get(), first);
}

TEST(FrameStore, PassesOverNull) {
  FrameStore store;
  unsigned char* spare = store.take(8);
  store.give_back(spare, 8);
  store.give_back(nullptr, 8);
  store.give_back(nullptr, 16);
  EXPECT_EQ(Buffer(store.take(8)).get(), spare) << "a null of a larger size does not make the others outgrown";
  EXPECT_NE(Buffer(store.take(16)).get(), nullptr);
}

TEST(FrameStore, KeepsFourSparesAndNoMore) {
  FrameStore store;
  std::vector<unsigned char*> buffers;
  for (int i = 0; i < 5; ++i) buffers.push_back(store.take(8));
  for (unsigned char* buffer : buffers) store.give_back(buffer, 8);
  std::vector<Buffer> taken;
  for (std::size_t i = 4; i-- > 0;) {
    taken.emplace_back(store.take(8));
    EXPECT_EQ(taken.back().get(), buffers[i]);
  }
}

TEST(FrameStore, DropsSmallerSparesWhenALargerOneComesBack) {
  FrameStore store;
  Buffer large(store.take(1 << 20));
  for (int i = 0; i < 4; ++i) store.give_back(new unsigned char[8], 8);
  unsigned char* kept = large.get();
  store.give_back(large.release(), 1 << 20);
  EXPECT_EQ(Buffer(store.take(1 << 20)).get(), kept) << "there is room for it among four others";
}

TEST(FrameStore, NeverGivesABufferOfAnotherSize) {
  FrameStore store;
  store.give_back(new unsigned char[16], 16);
  Buffer small(store.take(8));
  Buffer large(store.take(32));
  small[7] = large[31] = 1;  // address checkers see a buffer that is too short
  Buffer spare(store.take(16));
  spare[15] = 1;
}

TEST(FrameStore, ClearedItKeepsNothing) {
  FrameStore store;
  store.give_back(store.take(8), 8);
  store.clear();
  store.give_back(store.take(16), 16);
  EXPECT_NE(Buffer(store.take(16)).get(), nullptr);
}

}  // namespace
}  // namespace vexa
