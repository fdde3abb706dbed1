// SPDX-License-Identifier: Apache-2.0
// A host's own library in the place of libVexaCommonFilter.so.1.
#include <gtest/gtest.h>

#include <array>
#include <cstdio>
#include <string>
#include <vector>

namespace {

/// What the host, given a camera's answers, prints when `folder` is searched for libraries first.
std::string printed_with(const std::string& folder, const std::vector<std::string>& answers = {}) {
  std::string line = "LD_LIBRARY_PATH='" + folder + "' '" VEXA_BINARY_DIR "/bin/filter_host'";
  for (const std::string& answer : answers) line += " '" + answer + "'";
  line += " 2>&1";
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

/// What GetCameraInfo passes to the filter from one answer, by a driver that has read none before.
std::string told_of(const std::string& answer) { return printed_with(VEXA_BINARY_DIR "/replacement", {answer}); }

TEST(FilterWords, AreTheCamerasOwnTextsOfEachProperty) {
  const struct {
    const char* answer;
    const char* told;
  } cases[] = {{"VideoStd=ntsc&VidCapSize=1280,1024x&SolidPTZ=On&ImageMaxSize=640",
                "model=LMX-C100 VideoCapSizeFilter=1280,1024x SolidPTZFilter=On \n"},
               {"ImageMaxSize=640,480&SolidPTZ=on&VidCapSize=1280,720&VideoStd=ntsc",
                "model=LMX-C100 VideoCapSizeFilter=1280,720 SolidPTZFilter=on ImageMaxSizeFilter=640,480 \n"},
               {"VideoStd=ntsc&SolidPTZ=off", "model=LMX-C100 SolidPTZFilter=off \n"},
               {"VideoStd=ntsc&SolidPTZ=on ", "model=LMX-C100 SolidPTZFilter=on  \n"},
               {"VideoStd=ntsc&SolidPTZ=", "model=LMX-C100 SolidPTZFilter= \n"},
               {"VideoStd=ntsc&SolidPTZ=no&SolidPTZ=on", "model=LMX-C100 SolidPTZFilter=no \n"},
               {"VideoStd=ntsc&VidCapSize= +1280, 1024", "model=LMX-C100 VideoCapSizeFilter= +1280, 1024 \n"},
               {"VideoStd=ntsc&ImageMaxSize=1,2,3", "model=LMX-C100 ImageMaxSizeFilter=1,2,3 \n"},
               {"VideoStd=ntsc&VidCapSize=1280x720&ImageMaxSize=,480", "model=LMX-C100 \n"},
               {"VideoStd=ntsc&VidCapSize=&ImageMaxSize=", "model=LMX-C100 \n"},
               {"VideoStd=ntsc&VidCapSize=x&VidCapSize=1,2", "model=LMX-C100 \n"},
               {"VideoStd=ntsc", "model=LMX-C100 \n"}};
  for (const auto& c : cases) EXPECT_EQ(told_of(c.answer), c.told) << c.answer;
}

TEST(FilterWords, AreAskedForAnOfferOnlyWhenAPropertyChanged) {
  EXPECT_EQ(told_of("VideoStd=pal&VidCapSize=0,0&SolidPTZ=off&ImageMaxSize=0,0"), "\n");
  EXPECT_EQ(told_of("SolidPTZ=Off&RTSPPort=8554"), "\n");
}

TEST(FilterWords, StartAfreshWithEveryAnswer) {
  EXPECT_EQ(
      printed_with(VEXA_BINARY_DIR "/replacement", {"VidCapSize=1,2", "SolidPTZ=on", "SolidPTZ=on&VidCapSize=1,2"}),
      "model=LMX-C100 VideoCapSizeFilter=1,2 \n"
      "model=LMX-C100 SolidPTZFilter=on \n"
      "model=LMX-C100 SolidPTZFilter=on \n");
}

}  // namespace
