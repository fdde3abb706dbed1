// Connection and system records when memory is short.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/temporary_folder.h"

namespace {

using vexa_test::AllocationFailure;
using vexa_test::inquiry;
using vexa_test::ScriptedCamera;
using vexa_test::TestDriver;

/// A text of more than a text holds by itself.
std::string long_record_text() { return std::string(40, 't'); }

/// The host's records, made before memory runs short.
struct HostRecords {
  SLibDFixedSystemInfo fixed_system;
  SLibDFixedConnectionInfo fixed_connection;
  SLibDSystemInfo system;
  SLibDConnectionInfo connection;
};

struct RecordRow {
  const char* name;
  ELibDReturnCode (*call)(TestDriver& driver, HostRecords& host);
};

const RecordRow kRecordRows[] = {
    {"GetFixedSystemInfo", [](TestDriver& d, HostRecords& host) { return d.GetFixedSystemInfo(host.fixed_system); }},
    {"GetFixedConnectionInfo",
     [](TestDriver& d, HostRecords& host) { return d.GetFixedConnectionInfo(host.fixed_connection); }},
    {"GetCurrentSystemInfo", [](TestDriver& d, HostRecords& host) { return d.GetCurrentSystemInfo(host.system); }},
    {"GetCurrentConnectionInfo",
     [](TestDriver& d, HostRecords& host) { return d.GetCurrentConnectionInfo(host.connection); }}};

/// How many allocations of the call there are; each that fails is reported.
int failed_records(const RecordRow& row) {
  for (int nth = 0; nth < 1000; ++nth) {
    ScriptedCamera camera({inquiry("system", "ModelName=" + long_record_text() + "&Serial=" + long_record_text()),
                           inquiry("network", "MacAddress=" + long_record_text())});
    TestDriver driver;
    driver.use(camera.host(), camera.port(), vexa_test::kPatientTimeout);
    driver.m_FixedSystemInfo.modelName = driver.m_FixedConnectionInfo.text = long_record_text();
    driver.m_ConnectionInfo.proxyHost = long_record_text();
    HostRecords host;
    ELibDReturnCode result = LIBD_OK;
    bool happened = false;
    {
      const AllocationFailure failure(nth);
      result = row.call(driver, host);
      happened = failure.happened();
    }
    EXPECT_EQ(result, happened ? LIBD_FAILED : LIBD_OK) << row.name << nth;
    if (!happened) return nth;
    EXPECT_EQ(driver.LatestErrorText(), "Cannot allocate memory") << row.name << nth;
  }
  return 1000;
}

TEST(RecordsShortOfMemory, AreAFailure) {
  for (const RecordRow& row : kRecordRows) {
    const int failed = failed_records(row);
    EXPECT_GT(failed, 0) << row.name;
    EXPECT_LT(failed, 1000) << row.name;
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
  const vexa_test::TemporaryFolder folder;
  SLibDConnectionInfo given;
  given.host = given.proxyHost = long_record_text();
  given.timeout = 1234;
  bool happened = true;
  int nth = 0;
  for (; happened && nth < 1000; ++nth) {
    TestDriver driver;
    driver.SetCGILogPath((folder / "cgi.log").c_str());
    const SLibDConnectionInfo before = driver.m_ConnectionInfo;
    const AllocationFailure failure(nth);
    const bool copied = nth >= 2;  // both long texts
    const ELibDReturnCode result = driver.SetCurrentConnectionInfo(given);
    EXPECT_TRUE(result == LIBD_FAILED || (copied && result == LIBD_OK)) << nth;
    EXPECT_EQ(driver.m_ConnectionInfo.host, copied ? given.host : before.host) << nth;
    EXPECT_EQ(driver.m_ConnectionInfo.timeout, copied ? 1234 : before.timeout) << nth;
    EXPECT_EQ(driver.m_SavedTimeout, copied ? 1234 : before.timeout) << nth;
    happened = failure.happened();
  }
  EXPECT_GT(nth, 3);
  EXPECT_LT(nth, 1000);
}

}  // namespace
