// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>

#include "tests/support/in_child.h"
#include "tests/support/temporary_folder.h"
#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

/// A connection in which no field has its default.
SLibDConnectionInfo full_info() {
  return {1, "camera.example", 8080, true, true, "proxy.example", 3128, 4321, "admin", "secret"};
}

void expect_full(const SLibDConnectionInfo& info) {
  EXPECT_EQ(info.streamTransport, 1);
  EXPECT_EQ(info.host, "camera.example");
  EXPECT_EQ(info.port, 8080);
  EXPECT_TRUE(info.reserved4);
  EXPECT_TRUE(info.useProxy);
  EXPECT_EQ(info.proxyHost, "proxy.example");
  EXPECT_EQ(info.proxyPort, 3128);
  EXPECT_EQ(info.timeout, 4321);
  EXPECT_EQ(info.userName, "admin");
  EXPECT_EQ(info.password, "secret");
}

class Connection : public testing::Test {
 protected:
  Connection() { driver_.SetCGILogPath(log().c_str()); }

  std::string log() const { return folder_ / "cgi.log"; }

  const TemporaryFolder folder_;
  TestDriver driver_;
};

TEST_F(Connection, IsHandedBackAsItWasGiven) {
  SLibDConnectionInfo info = full_info();
  EXPECT_EQ(driver_.SetCurrentConnectionInfo(info), LIBD_OK);
  expect_full(info);
  SLibDConnectionInfo handed_back;
  EXPECT_EQ(driver_.GetCurrentConnectionInfo(handed_back), LIBD_OK);
  expect_full(handed_back);
}

TEST_F(Connection, OfAFreshDriverIsEmpty) {
  SLibDConnectionInfo info = full_info();
  EXPECT_EQ(driver_.GetCurrentConnectionInfo(info), LIBD_OK);
  EXPECT_EQ(info.host, "");
  EXPECT_EQ(info.timeout, 0);
  EXPECT_FALSE(info.useProxy);
}

TEST_F(Connection, KeepsACopyOfItsTimeout) {
  SLibDConnectionInfo info = full_info();
  driver_.SetCurrentConnectionInfo(info);
  EXPECT_EQ(driver_.m_SavedTimeout, 4321);
  info.timeout = -1;
  EXPECT_EQ(driver_.m_SavedTimeout, 4321);
  driver_.SetCurrentConnectionInfo(info);
  EXPECT_EQ(driver_.m_SavedTimeout, -1);
}

TEST_F(Connection, OpensTheLogAlsoWhileLoggingIsOff) {
  SLibDConnectionInfo info = full_info();
  driver_.SetCurrentConnectionInfo(info);
  EXPECT_NE(contents_of(log()).find("LogFile Opened. "), std::string::npos);
}

TEST_F(Connection, OpensTheLogAnewOnEveryCall) {
  SLibDConnectionInfo info = full_info();
  driver_.SetCurrentConnectionInfo(info);
  const std::string second = folder_ / "second.log";
  driver_.SetCGILogPath(second.c_str());
  EXPECT_FALSE(std::filesystem::exists(second));
  driver_.SetCurrentConnectionInfo(info);
  EXPECT_TRUE(std::filesystem::exists(second));
  EXPECT_NE(contents_of(log()).find("LogFile Closed"), std::string::npos);
}

TEST_F(Connection, IsSetThoughTheLogCannotBeOpened) {
  driver_.SetCGILogPath((folder_ / "missing/cgi.log").c_str());
  SLibDConnectionInfo info = full_info();
  testing::internal::CaptureStderr();
  EXPECT_EQ(driver_.SetCurrentConnectionInfo(info), LIBD_OK);
  testing::internal::GetCapturedStderr();
  SLibDConnectionInfo handed_back;
  driver_.GetCurrentConnectionInfo(handed_back);
  expect_full(handed_back);
}

TEST_F(Connection, WithoutALogPathLogsToTheWorkingFolder) {
  EXPECT_EQ(in_child([this] {
              if (chdir(folder_.path().c_str()) != 0) return std::string("no folder");
              TestDriver driver;
              SLibDConnectionInfo info = full_info();
              driver.SetCurrentConnectionInfo(info);
              return std::string(std::filesystem::exists("Log.txt") ? "Log.txt" : "nothing");
            }),
            "Log.txt");
}

TEST_F(Connection, PutsNoPasswordIntoTheLog) {
  SLibDConnectionInfo info = full_info();
  driver_.SetCGILogLevel(true);
  driver_.SetCurrentConnectionInfo(info);
  EXPECT_EQ(contents_of(log()).find("secret"), std::string::npos);
}

}  // namespace
}  // namespace vexa_test
