// What the model variants do in their own way, on the wire.
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "tests/device/settings_exchange.h"
#include "vexa/vexa_variants.h"

namespace vexa_test {
namespace {

constexpr char kToNetwork[] = "/command/system.cgi?VideoOutMode=ip";
constexpr char kAskSystem[] = "/command/inquiry.cgi?inq=system";
constexpr char kAskNetwork[] = "/command/inquiry.cgi?inq=network";

template <typename Variant>
ELibDReturnCode set_bright_mode(Settings<Variant>& driver, std::string mode) {
  return driver.SetBrightMode(mode);
}

TEST(HeronAndSimpleHd, OfferNoExposureModes) {
  for (const char* mode : {"", "Full auto", "Shutter Priority", "Iris Priority", "Manual"}) {
    Settings<CVexaHeronCommon> heron;
    heron.expect_no_exchange();
    EXPECT_EQ(set_bright_mode(heron, mode), LIBD_NOT_SUPPORTED) << mode;
    EXPECT_TRUE(heron.had_no_exchange());
    Settings<CVexaSimpleHDCommon> simple;
    simple.expect_no_exchange();
    EXPECT_EQ(set_bright_mode(simple, mode), LIBD_NOT_SUPPORTED) << mode;
    EXPECT_TRUE(simple.had_no_exchange());
  }
}

TEST(SimplePtz, InheritsItsExposureModes) {
  Played<CVexaSimplePTZCommon> play({command("/command/camera.cgi?ExpMode=iris")});
  EXPECT_EQ(set_bright_mode(play.driver, "Iris Priority"), LIBD_OK);
}

TEST(Marlin, PairsFullAutoWithTheManualIrisLens) {
  const std::string path = "/command/camera.cgi?ExpMode=manualirislens&AutoShutter=on&AutoSlowShutter=on";
  Played<CVexaMarlinCommon> play({command(path), refusal(path)});
  EXPECT_EQ(set_bright_mode(play.driver, "Full auto"), LIBD_OK);
  EXPECT_EQ(set_bright_mode(play.driver, "Full auto"), LIBD_UNAUTHORIZED);
}

TEST(Marlin, PairsShutterPriorityWithTheAutoIrisLens) {
  const std::string path = "/command/camera.cgi?ExpMode=autoirislens&AutoShutter=off&AutoSlowShutter=off";
  Played<CVexaMarlinCommon> play({command(path), refusal(path)});
  EXPECT_EQ(set_bright_mode(play.driver, "Shutter Priority"), LIBD_OK);
  EXPECT_EQ(set_bright_mode(play.driver, "Shutter Priority"), LIBD_UNAUTHORIZED);
}

TEST(Marlin, SendsNothingForAnyOtherMode) {
  Settings<CVexaMarlinCommon> driver;
  driver.expect_no_exchange();
  EXPECT_EQ(set_bright_mode(driver, ""), LIBD_INVALID_ARGUMENT);
  for (const char* mode : {"Iris Priority", "full auto", "Full auto ", "manualirislens", "x"}) {
    EXPECT_EQ(set_bright_mode(driver, mode), LIBD_FAILED) << mode;
  }
  EXPECT_TRUE(driver.had_no_exchange());
}

TEST(Marlin, ReadsTheSystemWithoutMindingTheOutput) {
  Played<CVexaMarlinCommon> play({inquiry("system", "VideoOutMode=pal"), inquiry("network", "")});
  SLibDSystemInfo info;
  EXPECT_EQ(play.driver.GetCurrentSystemInfo(info), LIBD_OK);
}

struct OutputRow {
  const char* system;
  bool brought;  // the driver sends the picture to the network
};

constexpr OutputRow kOutputs[] = {{"ModelName=M&VideoOutMode=pal&Serial=5", true},
                                  {"ModelName=M&VideoOutMode=ntsc", true},
                                  {"ModelName=M&VideoOutMode=", true},
                                  {"ModelName=M&VideoOutMode=IP", true},
                                  {"ModelName=M&VideoOutMode=pal&VideoOutMode=ip", true},
                                  {"ModelName=M&VideoOutMode=pal&x=ip", true},
                                  {"ModelName=M&VideoOutMode=ip", false},
                                  {"ModelName=M&VideoOutMode=xipx", false},
                                  {"ModelName=M&VideoOutMode=ip&VideoOutMode=pal", false},
                                  {"ModelName=M", false}};

class VideoOutput : public testing::TestWithParam<OutputRow> {};

template <typename Variant>
void expect_system_info(Script script, const char* model) {
  Played<Variant> play(std::move(script));
  play.driver.m_FixedSystemInfo.modelName = model;
  SLibDSystemInfo info;
  CLibraryDevice& device = play.driver;
  EXPECT_EQ(device.GetCurrentSystemInfo(info), LIBD_OK);
  EXPECT_EQ(info.modelName, "M");
  EXPECT_EQ(info.macAddress, "00:11");
}

/// The exchanges when the output is looked at between the inquiries, or not at all.
Script script_of(const OutputRow& row, bool probed) {
  Script script{inquiry("system", row.system)};
  if (row.brought && probed) script.push_back(command(kToNetwork));
  script.push_back(inquiry("network", "MacAddress=00:11"));
  return script;
}

TEST_P(VideoOutput, IsPutBackByHeronBehindBothInquiries) {
  for (const char* model : {"Unknown", "LMX-A100", "LMX-C100"}) {
    Script script{inquiry("system", GetParam().system), inquiry("network", "MacAddress=00:11")};
    if (GetParam().brought) script.push_back(command(kToNetwork));
    expect_system_info<CVexaHeronCommon>(script, model);
  }
}

TEST_P(VideoOutput, IsPutBackBySimpleHdBetweenTheInquiries) {
  for (const char* model : {"Unknown", "LMX-C100", "LMX-A202", "LMX-A10", "LMX-A1000", "lmx-a100", ""}) {
    expect_system_info<CVexaSimpleHDCommon>(script_of(GetParam(), true), model);
  }
}

TEST_P(VideoOutput, IsLeftAloneBySimpleHdOnItsModels) {
  for (const char* model : {"LMX-A100", "LMX-A200", "LMX-A201"}) {
    expect_system_info<CVexaSimpleHDCommon>(script_of(GetParam(), false), model);
  }
}

TEST_P(VideoOutput, IsPutBackBySimplePtzBetweenTheInquiries) {
  for (const char* model : {"Unknown", "LMX-A100", "LMX-C101", "LMX-C300", ""}) {
    expect_system_info<CVexaSimplePTZCommon>(script_of(GetParam(), true), model);
  }
}

TEST_P(VideoOutput, IsLeftAloneBySimplePtzOnItsModels) {
  for (const char* model : {"LMX-C100", "LMX-C200"}) {
    expect_system_info<CVexaSimplePTZCommon>(script_of(GetParam(), false), model);
  }
}

INSTANTIATE_TEST_SUITE_P(Rows, VideoOutput, testing::ValuesIn(kOutputs));

/// What GetCurrentSystemInfo says and has filled when an exchange of the script is refused.
template <typename Variant>
SLibDSystemInfo info_of_refused(Script script) {
  Played<Variant> play(std::move(script));
  SLibDSystemInfo info;
  EXPECT_EQ(play.driver.GetCurrentSystemInfo(info), LIBD_UNAUTHORIZED);
  return info;
}

template <typename Variant>
class ProbingVariant : public testing::Test {};
using ProbingVariants = testing::Types<CVexaHeronCommon, CVexaSimpleHDCommon, CVexaSimplePTZCommon>;
TYPED_TEST_SUITE(ProbingVariant, ProbingVariants);

TYPED_TEST(ProbingVariant, EndsWithTheLatestErrorWhenTheSystemInquiryFails) {
  const SLibDSystemInfo info = info_of_refused<TypeParam>({refusal(kAskSystem)});
  EXPECT_EQ(info.maker, "");
}

TYPED_TEST(ProbingVariant, KeepsWhatItReadWhenTheNetworkInquiryFails) {
  const SLibDSystemInfo info =
      info_of_refused<TypeParam>({inquiry("system", "ModelName=M&VideoOutMode=ip"), refusal(kAskNetwork)});
  EXPECT_EQ(info.modelName, "M");
}

TEST(Heron, EndsWithTheLatestErrorWhenTheOutputIsRefused) {
  const SLibDSystemInfo info = info_of_refused<CVexaHeronCommon>(
      {inquiry("system", "ModelName=M&VideoOutMode=pal"), inquiry("network", "MacAddress=00:11"), refusal(kToNetwork)});
  EXPECT_EQ(info.modelName, "M");
  EXPECT_EQ(info.macAddress, "00:11");
}

TEST(SimpleHdAndSimplePtz, EndWithTheLatestErrorWhenTheOutputIsRefused) {
  const Script script{inquiry("system", "ModelName=M&VideoOutMode=pal"), refusal(kToNetwork)};
  EXPECT_EQ(info_of_refused<CVexaSimpleHDCommon>(script).macAddress, "");
  EXPECT_EQ(info_of_refused<CVexaSimplePTZCommon>(script).macAddress, "");
}

constexpr auto kUntouchedMode = static_cast<ELibVideoOutMode>(77);

struct Asked {
  int result;
  int mode;
  bool operator==(const Asked&) const = default;
};

template <typename Variant>
Asked asked(Settings<Variant>& driver) {
  ELibVideoOutMode mode = kUntouchedMode;
  const ELibDReturnCode result = driver.GetVideoOutMode(mode);
  return {result, mode};
}

template <typename Variant>
void expect_network_without_asking(const std::vector<const char*>& models) {
  for (const char* model : models) {
    Settings<Variant> driver;
    driver.expect_no_exchange();
    driver.m_FixedSystemInfo.modelName = model;
    EXPECT_EQ(asked(driver), (Asked{LIBD_OK, LIB_VIDEO_OUT_IP})) << model;
    EXPECT_TRUE(driver.had_no_exchange());
  }
}

TEST(GetVideoOutMode, IsTheNetworkWithoutAskingOnOtherModels) {
  expect_network_without_asking<CVexaSimpleHDCommon>({"LMX-A201", "Unknown", "", "LMX-C100", "LMX-A10"});
  expect_network_without_asking<CVexaSimplePTZCommon>({"LMX-A100", "Unknown", "", "LMX-C201", "LMX-C1000"});
}

struct WordRow {
  const char* system;
  Asked said;
};

constexpr WordRow kWords[] = {{"A=1&VideoOutMode=ip&B=2", {1, 0}},
                              {"VideoOutMode=pal", {1, 1}},
                              {"VideoOutMode=ntsc", {1, 2}},
                              {"VideoOutMode=pal&VideoOutMode=ip", {1, 1}},
                              {"VideoOutMode=", {0, 77}},
                              {"VideoOutMode=PAL", {0, 77}},
                              {"VideoOutMode=secam", {0, 77}},
                              {"VideoOutMode=ip ", {0, 77}},
                              {"A=1", {0, 77}},
                              {"", {0, 77}}};

template <typename Variant>
Asked asked_on_the_wire(ScriptStep step, const char* model) {
  Played<Variant> play({std::move(step)});
  play.driver.m_FixedSystemInfo.modelName = model;
  const Asked said = asked(play.driver);
  return said;
}

TEST(GetVideoOutMode, ReadsTheCamerasWordOnItsModels) {
  for (const WordRow& row : kWords) {
    for (const char* model : {"LMX-A100", "LMX-A200"}) {
      EXPECT_EQ(asked_on_the_wire<CVexaSimpleHDCommon>(inquiry("system", row.system), model), row.said) << row.system;
    }
    for (const char* model : {"LMX-C100", "LMX-C200"}) {
      EXPECT_EQ(asked_on_the_wire<CVexaSimplePTZCommon>(inquiry("system", row.system), model), row.said) << row.system;
    }
  }
}

TEST(GetVideoOutMode, TellsTheLatestErrorWhenTheInquiryFails) {
  const Asked refused{LIBD_UNAUTHORIZED, 77};
  EXPECT_EQ(asked_on_the_wire<CVexaSimpleHDCommon>(refusal(kAskSystem), "LMX-A100"), refused);
  EXPECT_EQ(asked_on_the_wire<CVexaSimplePTZCommon>(refusal(kAskSystem), "LMX-C200"), refused);
}

TEST(GetVideoOutMode, IsNotOfferedByTheOtherDrivers) {
  Settings<CVexaCommon> common;
  Settings<CVexaHeronCommon> heron;
  Settings<CVexaMarlinCommon> marlin;
  EXPECT_EQ(asked(common), (Asked{LIBD_NOT_SUPPORTED, 77}));
  EXPECT_EQ(asked(heron), (Asked{LIBD_NOT_SUPPORTED, 77}));
  EXPECT_EQ(asked(marlin), (Asked{LIBD_NOT_SUPPORTED, 77}));
}

}  // namespace
}  // namespace vexa_test
