// A host's own library in the place of libVexaCommonFilter.so.1.
#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <string>

namespace {

/// What the host prints when `folder` is searched for libraries first.
std::string printed_with(const std::string& folder) {
  const std::string line = "LD_LIBRARY_PATH='" + folder + "' '" VEXA_BINARY_DIR "/bin/filter_host' 2>&1";
  FILE* const output = popen(line.c_str(), "r");
  if (output == nullptr) return "not run";
  std::string text;
  std::array<char, 4096> piece{};
  for (std::size_t got; (got = fread(piece.data(), 1, piece.size(), output)) > 0;) text.append(piece.data(), got);
  return pclose(output) == 0 ? text : "failed: " + text;
}

TEST(FilterLibrary, OffersTheSizesOfItsOwnTables) {
  EXPECT_EQ(printed_with("/nonexistent"),
            "JPEG=768x576 MPEG4=768x576 H.264=768x576 \n"
            "JPEG=384x288 MPEG4=384x288 H.264=384x288 \n"
            "JPEG=384x288 MPEG4=384x288 H.264=384x288 \n"
            "JPEG=768x576 MPEG4=768x576 H.264=768x576 \n"
            "JPEG=768x576 MPEG4=768x576 H.264=768x576 \n");
}

TEST(FilterLibrary, CanBeReplacedByTheHostsOwn) {
  EXPECT_EQ(printed_with(VEXA_BINARY_DIR "/replacement"),
            "model=LMX-C100 VideoCapSizeFilter=-2147483648,-214748 \n"
            "model=LMX-C100 VideoCapSizeFilter=384,288 \n"
            "model=LMX-C100 SolidPTZFilter=on \n"
            "model=LMX-C100 SolidPTZFilter=off \n"
            "model=LMX-C100 ImageMaxSizeFilter=-2147483648,-2147483648 \n");
}

}  // namespace
