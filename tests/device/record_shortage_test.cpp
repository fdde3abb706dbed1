// Connection and system records when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/temporary_folder.h"

namespace vexa_test {
namespace {

/// A text of more than a text holds by itself.
std::string long_text() { return std::string(40, 't'); }

/// The host's records, made before memory runs short.
struct HostRecords {
  SLibDFixedSystemInfo fixed_system;
  SLibDFixedConnectionInfo fixed_connection;
  SLibDSystemInfo system;
  SLibDConnectionInfo connection;
};

struct Row {
  const char* name;
  ELibDReturnCode (*call)(TestDriver& driver, HostRecords& host);
};

const Row kRows[] = {
    {"GetFixedSystemInfo", [](TestDriver& d, HostRecords& host) { return d.GetFixedSystemInfo(host.fixed_system); }},
    {"GetFixedConnectionInfo",
     [](TestDriver& d, HostRecords& host) { return d.GetFixedConnectionInfo(host.fixed_connection); }},
    {"GetCurrentSystemInfo", [](TestDriver& d, HostRecords& host) { return d.GetCurrentSystemInfo(host.system); }},
    {"GetCurrentConnectionInfo",
     [](TestDriver& d, HostRecords& host) { return d.GetCurrentConnectionInfo(host.connection); }}};

TEST(RecordsShortOfMemory, AreAFailure) {
  const std::string text = long_text();
  for (const Row& row : kRows) {
    SCOPED_TRACE(row.name);
    fails_at_every_allocation([&](Shortage& shortage) {
      ScriptedCamera camera(
          {inquiry("system", "ModelName=" + text + "&Serial=" + text), inquiry("network", "MacAddress=" + text)});
      TestDriver driver;
      driver.use(camera.host(), camera.port(), kPatientTimeout);
      driver.m_FixedSystemInfo.modelName = driver.m_FixedConnectionInfo.text = text;
      driver.m_ConnectionInfo.proxyHost = text;
      HostRecords host;
      expect_failure_told(shortage, driver, [&] { return row.call(driver, host); });
    });
  }
}

TEST(GetLatestErrorText, ShortOfMemoryFailsAndKeepsTheText) {
  TestDriver driver;
  driver.Fail({LIBD_FAILED, "a text of more than a text holds by itself"});
  std::string text = "before";
  {
    const AllocationFailure failure(0);
    EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_FAILED);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(text, "before");
  EXPECT_EQ(driver.GetLatestErrorText(text), LIBD_OK);
  EXPECT_EQ(text, "a text of more than a text holds by itself");
}

TEST(SetCurrentConnectionInfo, ShortOfMemoryKeepsTheConnectionWholeAndThrowsNothing) {
  const TemporaryFolder folder;
  SLibDConnectionInfo given;
  given.host = given.proxyHost = long_text();
  given.timeout = 1234;
  fails_at_every_allocation(
      [&](Shortage& shortage) {
        TestDriver driver;
        driver.SetCGILogPath((folder / "cgi.log").c_str());
        const SLibDConnectionInfo before = driver.m_ConnectionInfo;
        const bool copied = shortage.nth() >= 2;  // both long texts
        const ELibDReturnCode result = shortage.run([&] { return driver.SetCurrentConnectionInfo(given); });
        EXPECT_TRUE(result == LIBD_FAILED || (copied && result == LIBD_OK));
        EXPECT_EQ(driver.m_ConnectionInfo.host, copied ? given.host : before.host);
        EXPECT_EQ(driver.m_ConnectionInfo.timeout, copied ? 1234 : before.timeout);
        EXPECT_EQ(driver.m_SavedTimeout, copied ? 1234 : before.timeout);
      },
      2);
}

}  // namespace
}  // namespace vexa_test
