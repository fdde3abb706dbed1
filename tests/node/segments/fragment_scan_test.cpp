// SPDX-License-Identifier: Apache-2.0
#include "node/segments/fragment_scan.h"

#include <gtest/gtest.h>

#include <cstring>
#include <vector>

#include "tests/node/segments/boxes.h"

namespace vexa::node {
namespace {

using vexa_test::box;
using vexa_test::fragment;
using vexa_test::header;

FragmentScan scan(const std::string& file) {
  const auto read = [&file](std::uint64_t at, unsigned char* bytes, std::size_t length) {
    if (at > file.size() || length > file.size() - at) return false;
    std::memcpy(bytes, file.data() + at, length);
    return true;
  };
  return scan_fragments(read, file.size());
}

TEST(FragmentScan, AFileCutAnywhereIsWholeUpToItsLastWholeFragment) {
  const std::string file = header() + fragment(100) + fragment(0) + fragment(7);
  const std::size_t ends[] = {header().size(), header().size() + fragment(100).size(),
                              header().size() + fragment(100).size() + fragment(0).size(), file.size()};
  for (std::size_t length = 0; length <= file.size(); ++length) {
    const FragmentScan found = scan(file.substr(0, length));
    std::uint64_t whole = 0, fragments = 0;
    for (std::size_t i = 0; i < 4; ++i) {
      if (ends[i] > length) break;
      whole = ends[i];
      fragments = i;
    }
    ASSERT_EQ(found.whole, whole) << length;
    ASSERT_EQ(found.fragments, fragments) << length;
  }
}

TEST(FragmentScan, BoxesAfterTheFragmentsAreWholeToo) {
  const std::string file = header() + fragment(9) + box("mfra", 40);
  EXPECT_EQ(scan(file).whole, file.size());
  EXPECT_EQ(scan(file).fragments, 1U);
}

TEST(FragmentScan, NothingIsWholeWithoutAHeader) {
  EXPECT_EQ(scan(box("ftyp", 20) + fragment(9)).whole, 0U);
  EXPECT_EQ(scan(box("ftyp", 20) + fragment(9)).fragments, 0U);
}

TEST(FragmentScan, AMoofWithoutItsDataIsNotWhole) {
  EXPECT_EQ(scan(header() + box("moof", 30) + box("free", 5) + box("mdat", 5)).fragments, 0U);
  EXPECT_EQ(scan(header() + box("moof", 30)).whole, header().size());
}

TEST(FragmentScan, SizesThatNoBoxHasEndTheScan) {
  using namespace std::string_literals;
  for (const std::string& bad : {"\0\0\0\0mdat"s, "\0\0\0\7mdat"s, "\xff\xff\xff\xffmdat"s, "\0\0\0\1mdat"s,
                                 "\0\0\0\1mdat\0\0\0\0\0\0\0\17"s, "\0\0\0\1mdat\xff\xff\xff\xff\xff\xff\xff\xff"s}) {
    EXPECT_EQ(scan(header() + fragment(3) + bad).whole, (header() + fragment(3)).size());
  }
}

TEST(FragmentScan, ASizeOf64BitsIsRead) {
  using namespace std::string_literals;
  const std::string file = header() + box("moof", 3) + "\0\0\0\1mdat\0\0\0\0\0\0\0\22xx"s;
  EXPECT_EQ(scan(file).whole, file.size());
  EXPECT_EQ(scan(file).fragments, 1U);
}

}  // namespace
}  // namespace vexa::node
