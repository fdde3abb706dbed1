// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <climits>

#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

SLibDSystemInfo info_from_before() {
  SLibDSystemInfo info;
  info.maker = "maker";
  info.modelName = "model";
  info.softwareVersion = "version";
  info.serialNumber = "serial";
  info.macAddress = "mac";
  return info;
}

TEST(FixedSystemInfo, OfAFreshDriverIsUnknown) {
  TestDriver driver;
  SLibDFixedSystemInfo info;
  info.modelName = info.reserved2 = info.reserved3 = info.version = info.maker = "before";
  info.capability1 = info.capability2 = 9;
  info.flag1 = info.flag4 = true;
  EXPECT_EQ(driver.GetFixedSystemInfo(info), LIBD_OK);
  EXPECT_EQ(info.modelName, "Unknown");
  EXPECT_EQ(info.reserved2, "Unknown");
  EXPECT_EQ(info.reserved3, "Unknown");
  EXPECT_EQ(info.version, "1.0.0.0");
  EXPECT_EQ(info.maker, "Vexa Corporation");
  EXPECT_EQ(info.capability1, -1);
  for (const int capability :
       {info.capability2, info.capability3, info.capability4, info.capability5, info.capability6}) {
    EXPECT_EQ(capability, 0);
  }
  for (const bool flag : {info.flag1, info.flag2, info.flag3, info.flag4}) EXPECT_FALSE(flag);
}

TEST(FixedSystemInfo, IsWhatTheModelClassHasFilledIn) {
  TestDriver driver;
  driver.m_FixedSystemInfo.modelName = "X1";
  driver.m_FixedSystemInfo.capability6 = 6;
  driver.m_FixedSystemInfo.flag2 = true;
  SLibDFixedSystemInfo info;
  driver.GetFixedSystemInfo(info);
  EXPECT_EQ(info.modelName, "X1");
  EXPECT_EQ(info.capability6, 6);
  EXPECT_TRUE(info.flag2);
}

TEST(FixedConnectionInfo, IsHandedOutWhole) {
  TestDriver driver;
  SLibDFixedConnectionInfo info;
  info.flag1 = false;
  info.flag2 = true;
  info.text = "before";
  EXPECT_EQ(driver.GetFixedConnectionInfo(info), LIBD_OK);
  EXPECT_TRUE(info.flag1);
  EXPECT_FALSE(info.flag2);
  EXPECT_FALSE(info.flag3);
  EXPECT_FALSE(info.flag4);
  EXPECT_EQ(info.text, "0-0");
  driver.m_FixedConnectionInfo.text = "1-2";
  driver.GetFixedConnectionInfo(info);
  EXPECT_EQ(info.text, "1-2");
}

TEST(CommonSystemInfo, TakesEveryKeyOfTheAnswer) {
  TestDriver driver;
  SLibDSystemInfo info = info_from_before();
  EXPECT_EQ(driver.GetCommonSystemInfo(info,
                                       "ModelName=X1&SoftVersion=1.02.00&Serial=000123&ContinuousPanTiltZoomFunc=1&"
                                       "ChannelId=3&Other=x"),
            LIBD_OK);
  EXPECT_EQ(info.maker, "Vexa Corporation");
  EXPECT_EQ(info.modelName, "X1");
  EXPECT_EQ(info.softwareVersion, "1.02.00");
  EXPECT_EQ(info.serialNumber, "000123");
  EXPECT_EQ(info.macAddress, "mac");
  EXPECT_TRUE(driver.m_ContinuousPTZ);
  EXPECT_EQ(driver.m_ChannelId, 3);
}

TEST(CommonSystemInfo, LeavesWhatTheAnswerDoesNotName) {
  TestDriver driver;
  driver.m_ContinuousPTZ = true;
  driver.m_ChannelId = 5;
  SLibDSystemInfo info = info_from_before();
  EXPECT_EQ(driver.GetCommonSystemInfo(info, ""), LIBD_OK);
  EXPECT_EQ(info.maker, "Vexa Corporation");
  EXPECT_EQ(info.modelName, "model");
  EXPECT_EQ(info.softwareVersion, "version");
  EXPECT_EQ(info.serialNumber, "serial");
  EXPECT_TRUE(driver.m_ContinuousPTZ);
  EXPECT_EQ(driver.m_ChannelId, 5);
}

TEST(CommonSystemInfo, TakesAValueAtTheEndOfTheAnswer) {
  TestDriver driver;
  SLibDSystemInfo info;
  driver.GetCommonSystemInfo(info, "Serial=1&ModelName=X1\r\n");
  EXPECT_EQ(info.modelName, "X1\r\n");
}

TEST(CommonSystemInfo, StoresEmptyValues) {
  TestDriver driver;
  driver.m_ChannelId = 5;
  SLibDSystemInfo info = info_from_before();
  driver.GetCommonSystemInfo(info, "ModelName=&SoftVersion=&Serial=&ChannelId=");
  EXPECT_EQ(info.modelName, "");
  EXPECT_EQ(info.softwareVersion, "");
  EXPECT_EQ(info.serialNumber, "");
  EXPECT_EQ(driver.m_ChannelId, 0);
}

TEST(CommonSystemInfo, KnowsContinuousMotionByExactlyOne) {
  const struct {
    const char* value;
    bool continuous;
  } cases[] = {{"1", true}, {"1&x=2", true}, {"0", false}, {"11", false}, {"1 ", false}, {"", false}, {"on", false}};
  for (const auto& c : cases) {
    TestDriver driver;
    driver.m_ContinuousPTZ = !c.continuous;
    SLibDSystemInfo info;
    driver.GetCommonSystemInfo(info, std::string("ContinuousPanTiltZoomFunc=") + c.value);
    EXPECT_EQ(driver.m_ContinuousPTZ, c.continuous) << c.value;
  }
}

TEST(CommonSystemInfo, ReadsTheChannelAsStrtolDoes) {
  const struct {
    const char* value;
    int channel;
  } cases[] = {{"3", 3}, {" -2x", -2}, {"x", 0}, {"99999999999", INT_MAX}};
  for (const auto& c : cases) {
    TestDriver driver;
    SLibDSystemInfo info;
    driver.GetCommonSystemInfo(info, std::string("ChannelId=") + c.value);
    EXPECT_EQ(driver.m_ChannelId, c.channel) << c.value;
  }
}

TEST(CommonNetworkInfo, TakesTheAddressAndNothingElse) {
  TestDriver driver;
  SLibDSystemInfo info = info_from_before();
  EXPECT_EQ(driver.GetCommonNetworkInfo(info, "ModelName=no&MacAddress=00:11:22:33:44:55&Dhcp=on"), LIBD_OK);
  EXPECT_EQ(info.macAddress, "00:11:22:33:44:55");
  EXPECT_EQ(info.modelName, "model");
  EXPECT_EQ(info.maker, "maker");
  EXPECT_EQ(driver.GetCommonNetworkInfo(info, ""), LIBD_OK);
  EXPECT_EQ(info.macAddress, "00:11:22:33:44:55");
}

class CurrentSystemInfo : public testing::Test {
 protected:
  ELibDReturnCode ask(SLibDSystemInfo& info, Script script) {
    return with_script(driver_, std::move(script), [&] { return driver_.GetCurrentSystemInfo(info); });
  }

  TestDriver driver_;
};

TEST_F(CurrentSystemInfo, AsksForSystemAndNetwork) {
  SLibDSystemInfo info;
  EXPECT_EQ(ask(info, {inquiry("system", "ModelName=X1&Serial=7"), inquiry("network", "MacAddress=00:11")}), LIBD_OK);
  EXPECT_EQ(info.maker, "Vexa Corporation");
  EXPECT_EQ(info.modelName, "X1");
  EXPECT_EQ(info.serialNumber, "7");
  EXPECT_EQ(info.macAddress, "00:11");
}

TEST_F(CurrentSystemInfo, AsksNothingMoreAfterAFailure) {
  SLibDSystemInfo info = info_from_before();
  EXPECT_EQ(ask(info, {refusal("/command/inquiry.cgi?inq=system")}), LIBD_UNAUTHORIZED);
  EXPECT_EQ(info.maker, "maker");
  EXPECT_EQ(driver_.LatestErrorText(), "Unauthorized");
}

TEST_F(CurrentSystemInfo, KeepsWhatWasReadBeforeAFailure) {
  SLibDSystemInfo info = info_from_before();
  EXPECT_EQ(ask(info, {inquiry("system", "ModelName=X1"), refusal("/command/inquiry.cgi?inq=network")}),
            LIBD_UNAUTHORIZED);
  EXPECT_EQ(info.modelName, "X1");
  EXPECT_EQ(info.macAddress, "mac");
}

TEST_F(CurrentSystemInfo, CannotBeSet) {
  SLibDSystemInfo info;
  EXPECT_EQ(driver_.SetCurrentSystemInfo(info), LIBD_NOT_SUPPORTED);
}

}  // namespace
}  // namespace vexa_test
