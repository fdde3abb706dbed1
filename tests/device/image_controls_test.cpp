// Exposure and image controls on the wire.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <climits>
#include <future>
#include <string>
#include <vector>

#include "tests/device/settings_exchange.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

using Driver = Played<CVexaCommon>;

using Setter = ELibDReturnCode (*)(SettingsDriver&);

struct SetterRow {
  Setter set;
  const char* path;
};

template <typename Value>
constexpr Value made(int number) {
  return static_cast<Value>(number);
}

ELibDReturnCode set_bright_mode(SettingsDriver& driver, std::string mode) { return driver.SetBrightMode(mode); }

constexpr SetterRow kSetters[] = {
    {[](SettingsDriver& d) { return set_bright_mode(d, "Full auto"); }, "ExpMode=full"},
    {[](SettingsDriver& d) { return set_bright_mode(d, "Shutter Priority"); }, "ExpMode=shutter"},
    {[](SettingsDriver& d) { return set_bright_mode(d, "Iris Priority"); }, "ExpMode=iris"},
    {[](SettingsDriver& d) { return d.SetBackLightCompMode(true); }, "BLComp=on"},
    {[](SettingsDriver& d) { return d.SetBackLightCompMode(false); }, "BLComp=off"},
    {[](SettingsDriver& d) { return d.SetDayNightMode(made<ELibDDayNightType>(10)); }, "DayNightMode=auto"},
    {[](SettingsDriver& d) { return d.SetDayNightMode(made<ELibDDayNightType>(20)); },
     "DayNightMode=manual&DayNight=off"},
    {[](SettingsDriver& d) { return d.SetDayNightMode(made<ELibDDayNightType>(30)); },
     "DayNightMode=manual&DayNight=on"},
    {[](SettingsDriver& d) { return d.SetXdnrMode(made<ELibDXdnrType>(0)); }, "XDNR=high"},
    {[](SettingsDriver& d) { return d.SetXdnrMode(made<ELibDXdnrType>(1)); }, "XDNR=mid"},
    {[](SettingsDriver& d) { return d.SetXdnrMode(made<ELibDXdnrType>(2)); }, "XDNR=low"},
    {[](SettingsDriver& d) { return d.SetXdnrMode(made<ELibDXdnrType>(3)); }, "XDNR=off"},
    {[](SettingsDriver& d) { return d.SetViewDR(made<ELibDViewDRMode>(0)); }, "ViewDR=off"},
    {[](SettingsDriver& d) { return d.SetViewDR(made<ELibDViewDRMode>(1)); }, "ViewDR=on"},
    {[](SettingsDriver& d) { return d.SetVisibilityEnhancerMode(made<ELibDVisibilityEnhancerType>(0)); },
     "VisibilityEnhancer=high"},
    {[](SettingsDriver& d) { return d.SetVisibilityEnhancerMode(made<ELibDVisibilityEnhancerType>(1)); },
     "VisibilityEnhancer=mid"},
    {[](SettingsDriver& d) { return d.SetVisibilityEnhancerMode(made<ELibDVisibilityEnhancerType>(2)); },
     "VisibilityEnhancer=low"},
    {[](SettingsDriver& d) { return d.SetVisibilityEnhancerMode(made<ELibDVisibilityEnhancerType>(3)); },
     "VisibilityEnhancer=off"},
    {[](SettingsDriver& d) { return d.SetIRIlluminator(made<ELibIRIlluminatorMode>(1), 7); },
     "IRLed=daynight&IRLedMaxStrength=7"},
    {[](SettingsDriver& d) { return d.SetIRIlluminator(made<ELibIRIlluminatorMode>(0), 0); },
     "IRLed=off&IRLedMaxStrength=0"},
    {[](SettingsDriver& d) { return d.SetIRIlluminator(made<ELibIRIlluminatorMode>(1), INT_MIN); },
     "IRLed=daynight&IRLedMaxStrength=-2147483648"},
    {[](SettingsDriver& d) { return d.SetIRIlluminator(made<ELibIRIlluminatorMode>(1), INT_MAX); },
     "IRLed=daynight&IRLedMaxStrength=2147483647"}};

class ImageSetter : public testing::TestWithParam<SetterRow> {};

TEST_P(ImageSetter, SendsOneRequest) {
  Driver play({command(std::string("/command/camera.cgi?") + GetParam().path)});
  EXPECT_EQ(GetParam().set(play.driver), LIBD_OK);
}

TEST_P(ImageSetter, TellsTheLatestErrorWhenItsRequestIsRefused) {
  Driver play({refusal(std::string("/command/camera.cgi?") + GetParam().path)});
  EXPECT_EQ(GetParam().set(play.driver), LIBD_UNAUTHORIZED);
}

INSTANTIATE_TEST_SUITE_P(Rows, ImageSetter, testing::ValuesIn(kSetters));

TEST(SetIRIlluminator, SwitchesOffForAnyModeThatIsNotDayNight) {
  for (const int mode : {-1, 2, 3, INT_MAX, INT_MIN}) {
    Driver play({command("/command/camera.cgi?IRLed=off&IRLedMaxStrength=5")});
    EXPECT_EQ(play.driver.SetIRIlluminator(made<ELibIRIlluminatorMode>(mode), 5), LIBD_OK) << mode;
  }
}

/// A driver in reach of no camera; the test fails when it turns to one.
class Unsent : public testing::Test {
 protected:
  Unsent() { driver_.expect_no_exchange(); }
  ~Unsent() override { EXPECT_TRUE(driver_.had_no_exchange()); }

  SettingsDriver driver_;
};

using RefusedArgument = Unsent;

TEST_F(RefusedArgument, OfADayNightModeThatIsNone) {
  for (const int mode : {-1, 0, 1, 9, 11, 19, 21, 29, 31, 40, INT_MAX, INT_MIN}) {
    EXPECT_EQ(driver_.SetDayNightMode(made<ELibDDayNightType>(mode)), LIBD_INVALID_ARGUMENT) << mode;
  }
}

TEST_F(RefusedArgument, OfALevelThatIsNone) {
  for (const int mode : {-1, 4, 5, 256, INT_MAX, INT_MIN}) {
    EXPECT_EQ(driver_.SetXdnrMode(made<ELibDXdnrType>(mode)), LIBD_INVALID_ARGUMENT) << mode;
    EXPECT_EQ(driver_.SetVisibilityEnhancerMode(made<ELibDVisibilityEnhancerType>(mode)), LIBD_INVALID_ARGUMENT);
  }
}

TEST_F(RefusedArgument, OfADynamicRangeThatIsNone) {
  for (const int mode : {-1, 2, 3, INT_MAX, INT_MIN}) {
    EXPECT_EQ(driver_.SetViewDR(made<ELibDViewDRMode>(mode)), LIBD_INVALID_ARGUMENT) << mode;
  }
}

TEST_F(RefusedArgument, OfAnEmptyExposureMode) { EXPECT_EQ(set_bright_mode(driver_, ""), LIBD_INVALID_ARGUMENT); }

TEST_F(Unsent, IsAnExposureModeThatIsUnknown) {
  for (const char* mode : {"full", "Full Auto", "Full auto ", "Manual", "shutter"}) {
    EXPECT_EQ(set_bright_mode(driver_, mode), LIBD_FAILED) << mode;
  }
}

TEST(SetBrightMode, LeavesTheStoredModeAsItWas) {
  Driver play({command("/command/camera.cgi?ExpMode=iris")});
  play.driver.m_PTZControlInfo.brightMode = "Full auto";
  EXPECT_EQ(set_bright_mode(play.driver, "Iris Priority"), LIBD_OK);
  EXPECT_EQ(play.driver.m_PTZControlInfo.brightMode, "Full auto");
}

/// What a getter says: its result, and the numbers it hands out.
struct Said {
  int result;
  int value;
  int second = 0;
  bool operator==(const Said&) const = default;
};

void PrintTo(const Said& said, std::ostream* out) { *out << said.result << ": " << said.value << ", " << said.second; }

constexpr int kUntouched = 77;

using Getter = Said (*)(SettingsDriver&);

template <typename Value, ELibDReturnCode (CVexaCommon::*kGet)(Value&)>
Said said_by(SettingsDriver& driver) {
  Value value = made<Value>(kUntouched);
  const ELibDReturnCode result = (driver.*kGet)(value);
  return {result, value};
}

constexpr Getter kDayNight = said_by<ELibDDayNightType, &CVexaCommon::GetDayNightMode>;
constexpr Getter kXdnr = said_by<ELibDXdnrType, &CVexaCommon::GetXdnrMode>;
constexpr Getter kViewDr = said_by<ELibDViewDRMode, &CVexaCommon::GetViewDR>;
constexpr Getter kVisibility = said_by<ELibDVisibilityEnhancerType, &CVexaCommon::GetVisibilityEnhancerMode>;
constexpr Getter kIlluminator = [](SettingsDriver& driver) {
  auto mode = made<ELibIRIlluminatorMode>(kUntouched);
  int strength = kUntouched;
  const ELibDReturnCode result = driver.GetIRIlluminator(mode, strength);
  return Said{result, mode, strength};
};

struct GetterRow {
  Getter get;
  const char* answer;
  Said said;
};

class ImageGetter : public testing::TestWithParam<GetterRow> {};

TEST_P(ImageGetter, ReadsTheCachedAnswer) {
  SettingsDriver driver;
  driver.expect_no_exchange();
  driver.cache_inquiry(GetParam().answer);
  EXPECT_EQ(GetParam().get(driver), GetParam().said) << GetParam().answer;
  EXPECT_TRUE(driver.had_no_exchange());
}

TEST_P(ImageGetter, AsksTheCameraWhenNothingIsCachedAndCachesItsAnswer) {
  Driver play({inquiry("camera", GetParam().answer)});
  EXPECT_EQ(GetParam().get(play.driver), GetParam().said) << GetParam().answer;
  EXPECT_EQ(play.driver.cached_inquiry(), GetParam().answer);
}

constexpr GetterRow kDayNightRows[] = {{kDayNight, "A=1&DayNightMode=auto&DayNight=on", {1, 10}},
                                       {kDayNight, "A=1&DayNightMode=manual&DayNight=off", {1, 20}},
                                       {kDayNight, "A=1&DayNight=on&DayNightMode=manual", {1, 30}},
                                       {kDayNight, "A=1&DayNightMode=manual&DayNight=", {0, -1}},
                                       {kDayNight, "A=1&DayNightMode=manual&DayNight=dusk", {0, -1}},
                                       {kDayNight, "A=1&DayNightMode=manual", {0, -1}},
                                       {kDayNight, "A=1&DayNightMode=Auto", {0, -1}},
                                       {kDayNight, "A=1&DayNightMode=", {0, -1}},
                                       {kDayNight, "A=1&DayNight=on", {0, kUntouched}},
                                       {kDayNight, "DayNightMode=auto", {0, kUntouched}},
                                       {kDayNight, "A=1&DayNightMode=auto&DayNightMode=x", {1, 10}}};
INSTANTIATE_TEST_SUITE_P(DayNight, ImageGetter, testing::ValuesIn(kDayNightRows));

constexpr GetterRow kXdnrRows[] = {{kXdnr, "A=1&XDNR=high", {1, 0}},      {kXdnr, "A=1&XDNR=mid&B=2", {1, 1}},
                                   {kXdnr, "A=1&XDNR=low", {1, 2}},       {kXdnr, "A=1&XDNR=off", {1, 3}},
                                   {kXdnr, "A=1&XDNR=", {0, kUntouched}}, {kXdnr, "A=1&XDNR=High", {0, kUntouched}},
                                   {kXdnr, "XDNR=high", {0, kUntouched}}, {kXdnr, "A=1&XDNR=middle", {0, kUntouched}},
                                   {kXdnr, "A=1", {0, kUntouched}},       {kXdnr, "A=1&XDNR=low&XDNR=off", {1, 2}}};
INSTANTIATE_TEST_SUITE_P(Xdnr, ImageGetter, testing::ValuesIn(kXdnrRows));

constexpr GetterRow kViewDrRows[] = {
    {kViewDr, "A=1&ViewDR=off", {1, 0}},       {kViewDr, "A=1&ViewDR=on", {1, 1}},
    {kViewDr, "A=1&ViewDR=", {0, kUntouched}}, {kViewDr, "A=1&ViewDR=1", {0, kUntouched}},
    {kViewDr, "ViewDR=on", {0, kUntouched}},   {kViewDr, "A=1&ViewDR=on&ViewDR=off", {1, 1}},
    {kViewDr, "A=1", {0, kUntouched}}};
INSTANTIATE_TEST_SUITE_P(ViewDr, ImageGetter, testing::ValuesIn(kViewDrRows));

constexpr GetterRow kVisibilityRows[] = {{kVisibility, "A=1&VisibilityEnhancer=high", {1, 0}},
                                         {kVisibility, "A=1&VisibilityEnhancer=mid", {1, 1}},
                                         {kVisibility, "A=1&VisibilityEnhancer=low", {1, 2}},
                                         {kVisibility, "A=1&VisibilityEnhancer=off", {1, 3}},
                                         {kVisibility, "A=1&VisibilityEnhancer=", {0, kUntouched}},
                                         {kVisibility, "A=1&VisibilityEnhancer=on", {0, kUntouched}},
                                         {kVisibility, "VisibilityEnhancer=high", {0, kUntouched}},
                                         {kVisibility, "A=1&VisibilityEnhancer=off&VisibilityEnhancer=low", {1, 3}},
                                         {kVisibility, "A=1", {0, kUntouched}}};
INSTANTIATE_TEST_SUITE_P(Visibility, ImageGetter, testing::ValuesIn(kVisibilityRows));

constexpr GetterRow kIlluminatorRows[] = {
    {kIlluminator, "A=1&IRLed=off&IRLedMaxStrength=3", {1, 0, 3}},
    {kIlluminator, "A=1&IRLedMaxStrength=100&IRLed=daynight", {1, 1, 100}},
    {kIlluminator, "A=1&IRLed=daynight&IRLedMaxStrength=", {1, 1, 0}},
    {kIlluminator, "A=1&IRLed=daynight&IRLedMaxStrength=-9x", {1, 1, -9}},
    {kIlluminator, "A=1&IRLed=daynight&IRLedMaxStrength=1&IRLedMaxStrength=2", {1, 1, 1}},
    {kIlluminator, "A=1&IRLed=daynight", {0, 1, kUntouched}},
    {kIlluminator, "A=1&IRLed=off", {0, 0, kUntouched}},
    {kIlluminator, "A=1&IRLed=on&IRLedMaxStrength=3", {0, kUntouched, kUntouched}},
    {kIlluminator, "A=1&IRLed=&IRLedMaxStrength=3", {0, kUntouched, kUntouched}},
    {kIlluminator, "IRLed=off&IRLedMaxStrength=3", {0, kUntouched, kUntouched}},
    {kIlluminator, "A=1&IRLedMaxStrength=3", {0, kUntouched, kUntouched}}};
INSTANTIATE_TEST_SUITE_P(Illuminator, ImageGetter, testing::ValuesIn(kIlluminatorRows));

TEST(ImageGetters, TellTheLatestErrorWhenTheInquiryFails) {
  for (const Getter get : {kDayNight, kXdnr, kViewDr, kVisibility, kIlluminator}) {
    Driver play({refusal("/command/inquiry.cgi?inq=camera")});
    const Said said = get(play.driver);
    EXPECT_EQ(said.result, LIBD_UNAUTHORIZED);
    EXPECT_EQ(said.value, kUntouched);
    EXPECT_EQ(play.driver.cached_inquiry(), "");
  }
}

TEST(ImageGetters, DoNotFindTheKeyThatBeginsTheAnswer) {
  const struct {
    Getter get;
    const char* key;
  } rows[] = {{kDayNight, "DayNightMode=auto"},
              {kXdnr, "XDNR=low"},
              {kViewDr, "ViewDR=on"},
              {kVisibility, "VisibilityEnhancer=low"},
              {kIlluminator, "IRLed=off"}};
  for (const auto& row : rows) {
    SettingsDriver driver;
    driver.cache_inquiry(std::string(row.key) + "&IRLedMaxStrength=1");
    EXPECT_EQ(row.get(driver), (Said{LIBD_FAILED, kUntouched, row.get == kIlluminator ? kUntouched : 0})) << row.key;
    driver.cache_inquiry("A=1&" + std::string(row.key) + "&IRLedMaxStrength=1");
    EXPECT_EQ(row.get(driver).result, LIBD_OK) << row.key;
  }
}

TEST(ImageGetters, AskAgainAfterAnEmptyAnswer) {
  Driver play({inquiry("camera", ""), inquiry("camera", "A=1&XDNR=low")});
  EXPECT_EQ(kXdnr(play.driver), (Said{0, kUntouched}));
  EXPECT_EQ(kXdnr(play.driver), (Said{1, 2}));
}

TEST(ImageCache, TellsTheValueBeforeTheChangeUntilTheCameraIsAskedAnew) {
  Driver play({inquiry("camera", "A=1&ViewDR=off&XDNR=low&VisibilityEnhancer=low&IRLed=off&IRLedMaxStrength=3"),
               command("/command/camera.cgi?ViewDR=on"), command("/command/camera.cgi?XDNR=high"),
               command("/command/camera.cgi?VisibilityEnhancer=high"),
               command("/command/camera.cgi?IRLed=daynight&IRLedMaxStrength=9"),
               inquiry("camera", "A=1&ViewDR=on&XDNR=high&VisibilityEnhancer=high&IRLed=daynight&IRLedMaxStrength=9")});
  SettingsDriver& driver = play.driver;
  EXPECT_EQ(kViewDr(driver), (Said{1, 0}));
  EXPECT_EQ(driver.SetViewDR(LIBD_VIEWDR_ON), LIBD_OK);
  EXPECT_EQ(driver.SetXdnrMode(LIBD_XDNR_HIGH), LIBD_OK);
  EXPECT_EQ(driver.SetVisibilityEnhancerMode(LIBD_VISIBILITY_HIGH), LIBD_OK);
  EXPECT_EQ(driver.SetIRIlluminator(LIB_IR_DAYNIGHT, 9), LIBD_OK);
  EXPECT_EQ(kViewDr(driver), (Said{1, 0}));
  EXPECT_EQ(kXdnr(driver), (Said{1, 2}));
  EXPECT_EQ(kVisibility(driver), (Said{1, 2}));
  EXPECT_EQ(kIlluminator(driver), (Said{1, 0, 3}));
  SLibDCameraInfo info;
  EXPECT_EQ(driver.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(kViewDr(driver), (Said{1, 1}));
  EXPECT_EQ(kXdnr(driver), (Said{1, 0}));
  EXPECT_EQ(kVisibility(driver), (Said{1, 0}));
  EXPECT_EQ(kIlluminator(driver), (Said{1, 1, 9}));
}

TEST(ImageCache, LetsAReaderFinishBeforeASetterReturns) {
  const struct {
    Setter set;
    const char* path;
  } rows[] = {
      {[](SettingsDriver& d) { return d.SetViewDR(LIBD_VIEWDR_ON); }, "ViewDR=on"},
      {[](SettingsDriver& d) { return d.SetXdnrMode(LIBD_XDNR_OFF); }, "XDNR=off"},
      {[](SettingsDriver& d) { return d.SetVisibilityEnhancerMode(LIBD_VISIBILITY_OFF); }, "VisibilityEnhancer=off"},
      {[](SettingsDriver& d) { return d.SetIRIlluminator(LIB_IR_OFF, 1); }, "IRLed=off&IRLedMaxStrength=1"}};
  for (const auto& row : rows) {
    Driver play({command(std::string("/command/camera.cgi?") + row.path)});
    play.driver.m_CameraInquiryLock.Lock();
    std::atomic<long> setter{0};
    auto set = std::async(std::launch::async, [&] {
      setter = kernel_thread_id();
      return row.set(play.driver);
    });
    const auto has_returned = [&set] { return set.wait_for(std::chrono::seconds(0)) == std::future_status::ready; };
    // The camera has taken the command: what the setter waits for is the lock.
    EXPECT_TRUE(eventually([&] { return has_returned() || (play.played() && is_sleeping(setter)); }));
    EXPECT_FALSE(has_returned()) << row.path;
    play.driver.m_CameraInquiryLock.Unlock();
    EXPECT_EQ(set.get(), LIBD_OK);
  }
}

}  // namespace
}  // namespace vexa_test
