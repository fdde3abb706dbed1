// The resolution filter: tables of the families, and what each criterion leaves.
#include "vexa/resolution_filter.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

namespace {

using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::IsEmpty;
using Criteria = std::vector<std::pair<const char*, std::string>>;

constexpr char kMaxSize[] = "ImageMaxSizeFilter";
constexpr char kCapSize[] = "VideoCapSizeFilter";
constexpr char kSolidPtz[] = "SolidPTZFilter";

std::vector<SLibDVideoCodecInfo> offered(const std::string& model, const Criteria& criteria) {
  CResolutionFilterFacade filter;
  filter.Initialize(model);
  for (const auto& [item, value] : criteria) filter.SetFilterItemCriteria(item, value);
  std::vector<SLibDVideoCodecInfo> codecs;
  filter.GetFilteredResolutionList(codecs);
  return codecs;
}

std::vector<std::string> names(const std::vector<SLibDVideoCodecInfo>& codecs) {
  std::vector<std::string> all;
  for (const auto& codec : codecs) all.push_back(codec.name);
  return all;
}

std::vector<std::string> sizes(const SLibDVideoCodecInfo& codec) {
  std::vector<std::string> all;
  for (const auto& size : codec.resolutions) all.push_back(size.text);
  return all;
}

/// Sizes of the codec of that name; nothing when it is not offered.
std::vector<std::string> sizes(const std::vector<SLibDVideoCodecInfo>& codecs, const std::string& name) {
  for (const auto& codec : codecs) {
    if (codec.name == name) return sizes(codec);
  }
  return {};
}

const std::vector<std::string> kGeneralSizes = {"1920x1080", "1280x1024", "1280x960", "1280x800", "1280x720",
                                                "1024x768",  "800x600",   "768x576",  "720x576",  "704x576",
                                                "720x480",   "704x480",   "640x480",  "640x368",  "384x288",
                                                "352x288",   "352x240",   "320x240",  "320x192",  "160x120"};

TEST(FilterTables, OfTheGeneralFamily) {
  const auto codecs = offered("Unknown", {});
  EXPECT_THAT(names(codecs), ElementsAre("JPEG", "MPEG4", "H.264"));
  for (const auto& codec : codecs) EXPECT_THAT(sizes(codec), ElementsAreArray(kGeneralSizes)) << codec.name;
}

TEST(FilterTables, AreTheGeneralOnesForAnUnknownModel) {
  for (const char* model : {"", "Unknown", "LMX", "LMX-", "LMX-B100", "LMX-Z", "lmx-a100", " LMX-A100", "XLMX-A100"}) {
    EXPECT_THAT(sizes(offered(model, {}), "JPEG"), ElementsAreArray(kGeneralSizes)) << model;
  }
}

TEST(FilterTables, AreTheGeneralOnesBeforeAModelIsNamed) {
  CResolutionFilterFacade filter;
  std::vector<SLibDVideoCodecInfo> codecs;
  filter.GetFilteredResolutionList(codecs);
  EXPECT_THAT(sizes(codecs, "JPEG"), ElementsAreArray(kGeneralSizes));
}

const std::vector<std::string> kSmallMpeg4 = {"640x480", "640x368", "320x240", "320x192", "160x120"};

TEST(FilterTables, OfHeron) {
  const auto codecs = offered("LMX-H100", {});
  EXPECT_THAT(names(codecs), ElementsAre("JPEG", "MPEG4", "H.264"));
  const std::vector<std::string> all = {"1920x1080", "1280x960", "1280x720", "1024x768", "800x600",
                                        "640x480",   "640x368",  "320x240",  "320x192",  "160x120"};
  EXPECT_THAT(sizes(codecs[0]), ElementsAreArray(all));
  EXPECT_THAT(sizes(codecs[1]), ElementsAreArray(kSmallMpeg4));
  EXPECT_THAT(sizes(codecs[2]), ElementsAreArray(all));
}

TEST(FilterTables, OfMarlin) {
  const auto codecs = offered("LMX-M5", {});
  EXPECT_THAT(names(codecs), ElementsAre("JPEG", "MPEG4", "H.264"));
  const std::vector<std::string> all = {"1280x1024", "1280x960", "1280x720", "1024x768", "800x600",
                                        "640x480",   "640x368",  "320x240",  "320x192",  "160x120"};
  EXPECT_THAT(sizes(codecs[0]), ElementsAreArray(all));
  EXPECT_THAT(sizes(codecs[1]), ElementsAreArray(kSmallMpeg4));
  EXPECT_THAT(sizes(codecs[2]), ElementsAreArray(all));
}

TEST(FilterTables, OfPtz) {
  const auto codecs = offered("LMX-P", {});
  EXPECT_THAT(names(codecs), ElementsAre("JPEG", "H.264"));
  for (const auto& codec : codecs) {
    EXPECT_THAT(sizes(codec), ElementsAre("1920x1080", "1280x960", "1280x720", "1024x768", "800x600", "640x480",
                                          "640x368", "320x240", "320x192"));
  }
}

TEST(FilterTables, OfSimpleHd) {
  for (const char* model : {"LMX-A100", "LMX-A200", "LMX-A201"}) {
    const auto codecs = offered(model, {});
    EXPECT_THAT(names(codecs), ElementsAre("JPEG", "MPEG4", "H.264"));
    const std::vector<std::string> all = {"1280x1024", "1280x960", "1280x720", "1024x768", "800x600",
                                          "720x576",   "720x480",  "640x480",  "640x368",  "384x288",
                                          "320x240",   "320x192",  "160x120"};
    EXPECT_THAT(sizes(codecs[0]), ElementsAreArray(all));
    EXPECT_THAT(sizes(codecs[1]),
                ElementsAre("720x576", "720x480", "640x480", "640x368", "384x288", "320x240", "320x192", "160x120"));
    EXPECT_THAT(sizes(codecs[2]), ElementsAreArray(all));
  }
}

TEST(FilterTables, OfSimplePtz) {
  for (const char* model : {"LMX-C100", "LMX-C200"}) {
    const auto codecs = offered(model, {});
    EXPECT_THAT(names(codecs), ElementsAre("JPEG", "MPEG4", "H.264"));
    for (const auto& codec : codecs) {
      EXPECT_THAT(sizes(codec), ElementsAre("768x576", "720x576", "704x576", "720x480", "704x480", "640x480", "384x288",
                                            "352x288", "352x240", "320x240", "160x120"));
    }
  }
}

class EveryFamily : public testing::TestWithParam<const char*> {};

TEST_P(EveryFamily, StandsFromTheLargestSizeToTheSmallest) {
  for (const auto& codec : offered(GetParam(), {})) {
    const auto larger = [](const SLibDResolutionInfo& a, const SLibDResolutionInfo& b) {
      return a.width * a.height > b.width * b.height;
    };
    EXPECT_TRUE(std::is_sorted(codec.resolutions.begin(), codec.resolutions.end(), larger)) << codec.name;
  }
}

TEST_P(EveryFamily, NamesItsSizesByTheirSides) {
  for (const auto& codec : offered(GetParam(), {})) {
    for (const auto& size : codec.resolutions) {
      EXPECT_EQ(size.text, std::to_string(size.width) + "x" + std::to_string(size.height));
    }
  }
}

TEST_P(EveryFamily, OffersQualitiesForJpegAndBitRatesForTheOthers) {
  for (const auto& codec : offered(GetParam(), {})) {
    EXPECT_EQ(codec.qualities.empty(), codec.name != "JPEG") << codec.name;
    EXPECT_EQ(codec.bitRates.empty(), codec.name == "JPEG") << codec.name;
    ASSERT_FALSE(codec.frameRates.empty());
    EXPECT_EQ(codec.frameRates.front().label, "1fps");
    EXPECT_EQ(codec.frameRates.back().value, 30);
  }
}

TEST_P(EveryFamily, KeepsASizeUnderSolidPtz) {
  EXPECT_EQ(names(offered(GetParam(), {{kSolidPtz, "on"}})), names(offered(GetParam(), {})));
}

INSTANTIATE_TEST_SUITE_P(Families, EveryFamily,
                         testing::Values("Unknown", "LMX-H1", "LMX-M1", "LMX-P1", "LMX-A1", "LMX-C1"));

TEST(FilterTables, LabelTheirSteps) {
  const auto codecs = offered("Unknown", {});
  EXPECT_EQ(codecs[0].qualities.front().label, "Level 1");
  EXPECT_EQ(codecs[0].qualities.front().value, 1);
  EXPECT_EQ(codecs[0].qualities.back().label, "Level 10");
  EXPECT_EQ(codecs[2].bitRates.front().label, "64kbit/s");
  EXPECT_EQ(codecs[2].bitRates.back().label, "8192kbit/s");
  EXPECT_EQ(codecs[2].bitRates.back().value, 8192);
}

struct CriteriaRow {
  const char* model;
  Criteria criteria;
  std::vector<std::string> jpeg;  // what remains of JPEG
};

class FilterCriteria : public testing::TestWithParam<CriteriaRow> {};

TEST_P(FilterCriteria, LeaveTheSizesThatAllOfThemAdmit) {
  const CriteriaRow& row = GetParam();
  EXPECT_THAT(sizes(offered(row.model, row.criteria), "JPEG"), ElementsAreArray(row.jpeg));
}

const std::vector<std::string> kPtzSizes = {"1920x1080", "1280x960", "1280x720", "1024x768", "800x600",
                                            "640x480",   "640x368",  "320x240",  "320x192"};

const std::vector<std::string> kPtzMoving = {"1280x720", "800x600", "640x480", "640x368", "320x240", "320x192"};

std::vector<std::string> ptz_from(std::size_t first) {
  return {kPtzSizes.begin() + static_cast<long>(first), kPtzSizes.end()};
}

INSTANTIATE_TEST_SUITE_P(MaxSize, FilterCriteria,
                         testing::Values(CriteriaRow{"LMX-P1", {{kMaxSize, "1920,1080"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "1919,1080"}}, ptz_from(1)},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "1920,1079"}}, ptz_from(1)},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "1280,959"}}, ptz_from(2)},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640,480"}}, ptz_from(5)},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640,479"}}, ptz_from(6)},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "320,192"}}, ptz_from(8)},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "320,191"}}, {}},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "1,1"}}, {}}));

INSTANTIATE_TEST_SUITE_P(
    CaptureSize, FilterCriteria,
    testing::Values(CriteriaRow{"LMX-P1", {{kCapSize, "1920,1080"}}, {"1920x1080", "1280x720", "640x368", "320x192"}},
                    CriteriaRow{
                        "LMX-P1", {{kCapSize, "1280,960"}}, {"1280x960", "1024x768", "800x600", "640x480", "320x240"}},
                    CriteriaRow{"LMX-P1", {{kCapSize, "1280,800"}}, {"1280x720", "640x368", "320x192"}},
                    CriteriaRow{"LMX-P1", {{kCapSize, "1280,801"}}, {"1024x768", "800x600", "640x480", "320x240"}},
                    CriteriaRow{"LMX-M1",
                                {{kCapSize, "1280,1024"}},
                                {"1280x1024", "1280x960", "1024x768", "800x600", "640x480", "320x240", "160x120"}},
                    CriteriaRow{"LMX-P1", {{kCapSize, "319,191"}}, {}}));

INSTANTIATE_TEST_SUITE_P(
    SolidPtz, FilterCriteria,
    testing::Values(
        CriteriaRow{"LMX-P1", {{kSolidPtz, "on"}}, kPtzMoving}, CriteriaRow{"LMX-P1", {{kSolidPtz, "off"}}, kPtzSizes},
        CriteriaRow{"LMX-P1", {{kSolidPtz, "on"}, {kSolidPtz, "off"}}, kPtzSizes},
        CriteriaRow{"LMX-C1", {{kSolidPtz, "on"}}, {"384x288", "352x288", "352x240", "320x240", "160x120"}},
        CriteriaRow{"LMX-H1", {{kSolidPtz, "on"}}, {"800x600", "640x480", "640x368", "320x240", "320x192", "160x120"}},
        CriteriaRow{"LMX-M1", {{kSolidPtz, "on"}}, {"640x480", "640x368", "320x240", "320x192", "160x120"}}));

INSTANTIATE_TEST_SUITE_P(
    Together, FilterCriteria,
    testing::Values(
        CriteriaRow{"LMX-P1", {{kCapSize, "1280,960"}, {kMaxSize, "800,600"}}, {"800x600", "640x480", "320x240"}},
        CriteriaRow{"LMX-P1", {{kMaxSize, "800,600"}, {kCapSize, "1280,960"}}, {"800x600", "640x480", "320x240"}},
        CriteriaRow{"LMX-P1", {{kCapSize, "1920,1080"}, {kSolidPtz, "on"}}, {"1280x720", "640x368", "320x192"}},
        CriteriaRow{"LMX-P1", {{kCapSize, "640,480"}, {kMaxSize, "640,368"}, {kSolidPtz, "on"}}, {"320x240"}},
        CriteriaRow{"LMX-P1", {{kMaxSize, "640,480"}, {kMaxSize, "320,240"}}, {"320x240", "320x192"}}));

INSTANTIATE_TEST_SUITE_P(Ignored, FilterCriteria,
                         testing::Values(CriteriaRow{"LMX-P1", {{kMaxSize, ""}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640x480"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "a,b"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "0000000640,480"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, std::string("64\0,480", 7)}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kCapSize, ",1"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kSolidPtz, "On"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kSolidPtz, ""}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kSolidPtz, "on"}, {kSolidPtz, "x"}}, kPtzMoving},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640,480"}, {kMaxSize, "x"}}, ptz_from(5)},
                                         CriteriaRow{"LMX-P1", {{"imagemaxsizefilter", "1,1"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{"", "1,1"}}, kPtzSizes}));

INSTANTIATE_TEST_SUITE_P(NoSizeGiven, FilterCriteria,
                         testing::Values(CriteriaRow{"LMX-P1", {{kMaxSize, "-1,-1"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "0,0"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640,0"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "-1,480"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kCapSize, "-1,-1"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kCapSize, "640,480"}, {kCapSize, "-1,-1"}}, kPtzSizes},
                                         CriteriaRow{"LMX-P1", {{kMaxSize, "640,480x"}}, ptz_from(5)}));

TEST(Filter, OffersNoCodecThatKeepsNoSize) {
  EXPECT_THAT(names(offered("LMX-H1", {{kCapSize, "1920,1080"}})), ElementsAre("JPEG", "MPEG4", "H.264"));
  EXPECT_THAT(names(offered("LMX-H1", {{kMaxSize, "1,1"}})), IsEmpty());
}

TEST(Filter, ForgetsItsCriteriaWhenInitialized) {
  CResolutionFilterFacade filter;
  filter.Initialize("LMX-P1");
  filter.SetFilterItemCriteria(kMaxSize, "320,192");
  filter.SetFilterItemCriteria(kCapSize, "320,192");
  filter.SetFilterItemCriteria(kSolidPtz, "on");
  filter.Initialize("LMX-P1");
  std::vector<SLibDVideoCodecInfo> codecs;
  filter.GetFilteredResolutionList(codecs);
  EXPECT_THAT(sizes(codecs, "JPEG"), ElementsAreArray(kPtzSizes));
}

TEST(Filter, ReplacesWhatTheListHeld) {
  CResolutionFilterFacade filter;
  std::vector<SLibDVideoCodecInfo> codecs(7);
  filter.GetFilteredResolutionList(codecs);
  EXPECT_EQ(codecs.size(), 3u);
  filter.GetFilteredResolutionList(codecs);
  EXPECT_EQ(codecs.size(), 3u);
}

TEST(Filter, KeepsCriteriaOfEachObjectApart) {
  CResolutionFilterFacade narrow;
  CResolutionFilterFacade wide;
  narrow.SetFilterItemCriteria(kMaxSize, "160,120");
  std::vector<SLibDVideoCodecInfo> codecs;
  wide.GetFilteredResolutionList(codecs);
  EXPECT_THAT(sizes(codecs, "JPEG"), ElementsAreArray(kGeneralSizes));
}

}  // namespace
