#include "runtime/base/published.h"

#include <gtest/gtest.h>

#include <array>
#include <thread>

namespace vexa {
namespace {

struct Wide {
  std::array<std::uint64_t, 32> numbers{};
};

/// Both halves of each number are `value`, so that a number put together of two writes shows too.
Wide filled_with(std::uint32_t value) {
  Wide wide;
  wide.numbers.fill(std::uint64_t{value} << 32 | value);
  return wide;
}

TEST(Published, IsADefaultRecordUntilItIsPublished) {
  const Published<Wide> published;
  EXPECT_EQ(published.read().numbers, Wide{}.numbers);
  EXPECT_EQ(published.version(), 0u);
}

TEST(Published, ReadsWhatWasPublishedLast) {
  Published<Wide> published;
  published.publish(filled_with(1));
  published.publish(filled_with(0xffffffff));
  EXPECT_EQ(published.read().numbers, filled_with(0xffffffff).numbers);
  EXPECT_EQ(published.version(), 2u);
}

TEST(Published, ARecordReadBesideItsWriterIsOfOneWriteAndNeverOlderThanTheOneBefore) {
  constexpr std::uint32_t kWrites = 50000;
  Published<Wide> published;
  std::thread writer([&published] {
    for (std::uint32_t i = 1; i <= kWrites; ++i) published.publish(filled_with(i));
  });
  std::uint64_t last = 0;
  while (last != filled_with(kWrites).numbers[0]) {
    const Wide read = published.read();
    for (const std::uint64_t number : read.numbers) {
      if (number != read.numbers[0]) ADD_FAILURE() << "torn: " << number << " beside " << read.numbers[0];
    }
    if (read.numbers[0] < last) ADD_FAILURE() << read.numbers[0] << " after " << last;
    last = read.numbers[0];
    if (HasFailure()) break;
  }
  writer.join();
}

}  // namespace
}  // namespace vexa
