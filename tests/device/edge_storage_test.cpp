#include <gtest/gtest.h>

#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

const ScriptStep kLiveTimeout = command("/command/camera.cgi?RTSPTimeout=60");
const ScriptStep kPlaybackTimeout = command("/command/edgestorage.cgi?EsRTSPRec1Timeout=60");

TEST(KeepAlivePeriod, IsTheTimeoutThatTheCameraTells) {
  const struct {
    const char* answer;
    int period;  // 9 stands from before
  } cases[] = {{"EsRTSPRec1Timeout=60&EsRec1=on", 60},
               {"EsRTSPRec1Timeout=5", 5},
               {"EsRTSPRec1Timeout=0", 9},
               {"EsRTSPRec1Timeout=", 9},
               {"EsRTSPRec1Timeout=x", 9},
               {"EsRec1=on", 9},
               {"EsRTSPRec1Timeout=-3", -3},
               {"", 9}};
  for (const auto& c : cases) {
    ScriptedCamera camera({kLiveTimeout, kPlaybackTimeout, inquiry("edgestorage", c.answer)});
    TestDriver driver;
    driver.use(camera.host(), camera.port(), kPatientTimeout);
    driver.m_KeepAlivePeriod = 9;
    EXPECT_TRUE(driver.InitEdgeStorageKeepAlivePeriod());
    EXPECT_EQ(driver.m_KeepAlivePeriod, c.period) << c.answer;
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST(KeepAlivePeriod, IsNotFoundWhenOneOfItsRequestsFails) {
  const Script scripts[] = {{refusal("/command/camera.cgi?RTSPTimeout=60")},
                            {kLiveTimeout, refusal("/command/edgestorage.cgi?EsRTSPRec1Timeout=60")},
                            {kLiveTimeout, kPlaybackTimeout, refusal("/command/inquiry.cgi?inq=edgestorage")}};
  for (const Script& script : scripts) {
    ScriptedCamera camera(script);
    TestDriver driver;
    driver.use(camera.host(), camera.port(), kPatientTimeout);
    EXPECT_FALSE(driver.InitEdgeStorageKeepAlivePeriod());
    EXPECT_EQ(driver.m_KeepAlivePeriod, 1);
    EXPECT_EQ(driver.LatestErrorCode(), LIBD_UNAUTHORIZED);
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST(MakeGmTime, CountsSecondsSince1970) {
  TestDriver driver;
  std::tm time{};
  time.tm_year = 124;
  time.tm_mon = 0;
  time.tm_mday = 31;
  time.tm_hour = 23;
  time.tm_min = 59;
  time.tm_sec = 59;
  EXPECT_EQ(driver._ld_mkgmtime(&time), 1706745599);
  time = {};
  time.tm_year = 70;
  time.tm_mday = 1;
  EXPECT_EQ(driver._ld_mkgmtime(&time), 0);
  time.tm_year = 138;
  time.tm_mday = 19;
  time.tm_hour = 3;
  time.tm_min = 14;
  time.tm_sec = 8;
  EXPECT_EQ(driver._ld_mkgmtime(&time), 2147483648);
}

TEST(IsLeapYear, FollowsTheGregorianRule) {
  TestDriver driver;
  const struct {
    int year;
    bool leap;
  } cases[] = {{2023, false}, {2024, true}, {1900, false}, {2000, true},
               {2100, false}, {4, true},    {0, true},     {-4, true}};
  for (const auto& c : cases) EXPECT_EQ(driver._ld_is_leap_year(c.year), c.leap) << c.year;
}

}  // namespace
}  // namespace vexa_test
