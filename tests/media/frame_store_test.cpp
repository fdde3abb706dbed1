#include "media/frame_store.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <new>
#include <vector>

#include "tests/support/failing_new.h"
#include "tests/support/resident_pages.h"

namespace vexa {
namespace {

using Buffer = std::unique_ptr<unsigned char[]>;

/// Whether no spare buffer of this size is left: taking one allocates.
bool has_none(FrameStore& store, std::size_t capacity) {
  const vexa_test::AllocationFailure failure(0);
  try {
    const Buffer taken(store.take(capacity));
  } catch (const std::bad_alloc&) {
    return failure.happened();
  }
  return false;
}

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
  EXPECT_TRUE(has_none(store, 16));
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
  EXPECT_TRUE(has_none(store, 8));
}

TEST(FrameStore, DropsSmallerSparesWhenALargerOneComesBack) {
  FrameStore store;
  Buffer large(store.take(1 << 20));
  for (int i = 0; i < 4; ++i) store.give_back(new unsigned char[8], 8);
  unsigned char* kept = large.get();
  store.give_back(large.release(), 1 << 20);
  EXPECT_EQ(Buffer(store.take(1 << 20)).get(), kept) << "there is room for it among four others";
  EXPECT_TRUE(has_none(store, 8));
}

TEST(FrameStore, NeverGivesABufferOfAnotherSize) {
  FrameStore store;
  Buffer first(store.take(16));
  unsigned char* spare = first.get();
  store.give_back(first.release(), 16);
  for (const std::size_t other : {8U, 15U, 17U, 32U}) EXPECT_TRUE(has_none(store, other)) << other;
  EXPECT_EQ(Buffer(store.take(16)).get(), spare);
}

TEST(FrameStore, ClearedItKeepsNothing) {
  FrameStore store;
  store.give_back(store.take(8), 8);
  store.clear();
  EXPECT_TRUE(has_none(store, 8));
  Buffer later(store.take(16));
  unsigned char* kept = later.get();
  store.give_back(later.release(), 16);
  EXPECT_EQ(Buffer(store.take(16)).get(), kept) << "it goes on afterwards";
}

TEST(FrameStore, GivesTheRearOfItsBuffersBackWhenTheStreamShrinks) {
  constexpr std::size_t kCapacity = 1200000;
  FrameStore store;
  const auto stream = [&store](std::size_t length) {
    for (unsigned i = 0; i < RecentNeed::kPeriod; ++i) {
      unsigned char* buffer = store.take(kCapacity);
      std::memset(buffer, 1, length);
      store.give_back(buffer, kCapacity, length);
    }
  };
  unsigned char* out = store.take(kCapacity);
  std::memset(out, 1, 1000000);
  stream(1000000);
  stream(20000);
  const std::size_t needed = 20000 / vexa_test::page_size() + 1;
  unsigned char* spare = store.take(kCapacity);
  EXPECT_LE(vexa_test::resident_pages(spare, kCapacity), needed);
  EXPECT_EQ(std::count(spare, spare + 20000, 1), 20000);
  store.give_back(out, kCapacity, 10);
  EXPECT_LE(vexa_test::resident_pages(out, kCapacity), needed) << "one that was with the host meanwhile";
  store.give_back(spare, kCapacity, 10);
}

TEST(FrameStore, DropsSparesThatAreNotTakenForSomeTime) {
  FrameStore store;
  std::vector<unsigned char*> buffers;
  for (int i = 0; i < 4; ++i) buffers.push_back(store.take(8));
  for (unsigned char* buffer : buffers) store.give_back(buffer, 8, 8);
  for (unsigned i = 0; i < 2 * FrameStore::kIdlePeriod; ++i) store.give_back(store.take(8), 8, 8);
  const Buffer last(store.take(8));
  EXPECT_EQ(last.get(), buffers.back());
  EXPECT_TRUE(has_none(store, 8));
}

}  // namespace
}  // namespace vexa
