#include "runtime/pages.h"

#include <gtest/gtest.h>

#include <cstring>
#include <memory>

#include "tests/support/resident_pages.h"

namespace vexa {
namespace {

using vexa_test::page_size;
using vexa_test::resident_pages;

class Mapping {
 public:
  Mapping(std::size_t size, int kind)
      : size_(size), address_(mmap(nullptr, size, PROT_READ | PROT_WRITE, kind | MAP_ANONYMOUS, -1, 0)) {
    std::memset(address_, 0x5a, size);
  }
  Mapping(const Mapping&) = delete;
  Mapping& operator=(const Mapping&) = delete;
  ~Mapping() { munmap(address_, size_); }
  std::span<unsigned char> bytes() const { return {static_cast<unsigned char*>(address_), size_}; }

 private:
  std::size_t size_;
  void* address_;
};

bool are_all(std::span<const unsigned char> bytes, unsigned char value) {
  return std::all_of(bytes.begin(), bytes.end(), [value](unsigned char byte) { return byte == value; });
}

TEST(Pages, GivenBackAreTheWholeOnesInsideTheBlockAndNoOthers) {
  const Mapping mapping(8 * page_size(), MAP_PRIVATE);
  ASSERT_TRUE(give_pages_back(mapping.bytes().subspan(1, 4 * page_size())));
  EXPECT_EQ(resident_pages(mapping.bytes().data(), mapping.bytes().size()), 5u);
  EXPECT_TRUE(are_all(mapping.bytes().first(page_size()), 0x5a));
  EXPECT_TRUE(are_all(mapping.bytes().subspan(4 * page_size()), 0x5a));
}

TEST(Pages, OfABlockWithoutAWholeOneStay) {
  const Mapping mapping(2 * page_size(), MAP_PRIVATE);
  EXPECT_TRUE(give_pages_back(mapping.bytes().subspan(1, 2 * page_size() - 2)));
  EXPECT_TRUE(give_pages_back({}));
  EXPECT_TRUE(are_all(mapping.bytes(), 0x5a));
}

TEST(Pages, ABlockIsClearedWithoutBeingBroughtIntoMemory) {
  const Mapping mapping(64 * page_size(), MAP_PRIVATE);
  const auto block = mapping.bytes().subspan(10, 62 * page_size());
  clear_untouched(block);
  EXPECT_LE(resident_pages(block.data(), block.size()), 1u);
  EXPECT_TRUE(are_all(block, 0));
  EXPECT_TRUE(are_all(mapping.bytes().first(10), 0x5a));
  EXPECT_TRUE(are_all(mapping.bytes().subspan(10 + block.size()), 0x5a));
}

TEST(Pages, ASmallBlockIsClearedToo) {
  for (const std::size_t size : {std::size_t{0}, std::size_t{1}, page_size(), page_size() + 7}) {
    const Mapping mapping(4 * page_size(), MAP_PRIVATE);
    const auto block = mapping.bytes().subspan(100, size);
    clear_untouched(block);
    EXPECT_TRUE(are_all(block, 0)) << size;
    EXPECT_TRUE(are_all(mapping.bytes().subspan(100 + size), 0x5a)) << size;
  }
}

TEST(Pages, SharedMemoryThatKeepsItsBytesIsClearedByteByByte) {
  const Mapping mapping(8 * page_size(), MAP_SHARED);
  clear_untouched(mapping.bytes());
  EXPECT_TRUE(are_all(mapping.bytes(), 0));
}

}  // namespace
}  // namespace vexa
