#include <gtest/gtest.h>

#include <atomic>
#include <string>
#include <thread>

#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "vexa/failure.h"

namespace vexa_test {
namespace {

TEST(CodeName, IsTheEnumerators) {
  const struct {
    ELibDReturnCode code;
    const char* name;
  } rows[] = {{LIBD_OK, "LIBD_OK"},
              {LIBD_FAILED, "LIBD_FAILED"},
              {LIBD_NOT_SUPPORTED, "LIBD_NOT_SUPPORTED"},
              {LIBD_INVALID_ARGUMENT, "LIBD_INVALID_ARGUMENT"},
              {LIBD_INVALID_MODE, "LIBD_INVALID_MODE"},
              {LIBD_STREAM_OPEN_FAILED, "LIBD_STREAM_OPEN_FAILED"},
              {LIBD_TIMEOUT, "LIBD_TIMEOUT"},
              {LIBD_UNAUTHORIZED, "LIBD_UNAUTHORIZED"},
              {LIBD_NO_FRAME, "LIBD_NO_FRAME"},
              {LIBD_FRAME_DAMAGED, "LIBD_FRAME_DAMAGED"},
              {LIBD_BUFFER_TOO_SMALL, "LIBD_BUFFER_TOO_SMALL"},
              {static_cast<ELibDReturnCode>(7), "unknown"}};
  for (const auto& row : rows) EXPECT_STREQ(vexa::CodeName(row.code), row.name);
}

TEST(LastFailure, OfANewDriverIsNone) {
  TestDriver driver;
  const vexa::FailureReport report = vexa::LastFailure(driver);
  EXPECT_EQ(report.size, sizeof(vexa::FailureReport));
  EXPECT_EQ(report.code, LIBD_OK);
  EXPECT_FALSE(report.cancelled);
  EXPECT_EQ(report.text + report.operation + report.camera, "");
}

TEST(LastFailure, SaysWhatFailedWhereAndWhy) {
  ScriptedCamera camera({refusal("/command/inquiry.cgi?inq=camera")});
  TestDriver driver;
  driver.use(camera.host(), camera.port(), kPatientTimeout);
  SLibDCameraInfo info;
  EXPECT_EQ(driver.GetCameraInfo(info), LIBD_UNAUTHORIZED);
  const vexa::FailureReport report = vexa::LastFailure(driver);
  EXPECT_EQ(report.code, LIBD_UNAUTHORIZED);
  EXPECT_FALSE(report.cancelled);
  EXPECT_EQ(report.text, driver.LatestErrorText());
  EXPECT_EQ(report.operation, "GetCameraInfo");
  EXPECT_EQ(report.camera, camera.host() + ":" + std::to_string(camera.port()));
}

TEST(LastFailure, HasARefusedArgumentTooAndNoTextOfAnother) {
  TestDriver driver;
  driver.Fail({LIBD_TIMEOUT, "of another"});
  EXPECT_EQ(vexa::LastFailure(driver).text, "of another");
  EXPECT_EQ(driver.PanTilt(1000000, 0), LIBD_INVALID_ARGUMENT);
  const vexa::FailureReport report = vexa::LastFailure(driver);
  EXPECT_EQ(report.code, LIBD_INVALID_ARGUMENT);
  EXPECT_EQ(report.operation, "PanTilt");
  EXPECT_EQ(report.text, "");
}

TEST(LastFailure, StaysWhenAnOperationSucceeds) {
  TestDriver driver;
  EXPECT_EQ(driver.PanTilt(1000000, 0), LIBD_INVALID_ARGUMENT);
  SLibDFixedSystemInfo info;
  EXPECT_EQ(driver.GetFixedSystemInfo(info), LIBD_OK);
  EXPECT_EQ(vexa::LastFailure(driver).operation, "PanTilt");
}

TEST(LastFailure, HasTheCodeThatIsReturnedNotThatOfAStep) {
  ScriptedCamera camera(
      {refusal("/command/edgestorage.cgi?Edgestorage=off&EsOverWrite=off&EsRec1=image1,off&"
               "EsAlmRec1Time=0,0&EsRec1Mode=alarm&EsAlmRec1WatchAddress=&EsAlmRec1Trigger="
               "disconnected&EsRec1Period=always")});
  TestDriver driver;
  driver.m_EdgeStorageSupported = true;
  driver.use(camera.host(), camera.port(), kPatientTimeout);
  SLibDEdgeStorageMode mode;
  mode.imageNumber = 1;
  EXPECT_EQ(driver.SetEdgeStorageMode(mode), LIBD_TIMEOUT);
  EXPECT_EQ(vexa::LastFailure(driver).code, LIBD_TIMEOUT);
  EXPECT_EQ(vexa::LastFailure(driver).text, driver.LatestErrorText());
}

TEST(LastFailure, CutsAHostThatIsTooLong) {
  TestDriver driver;
  driver.use(std::string(1000, 'h'), 80, 1000);
  EXPECT_EQ(driver.PanTilt(1000000, 0), LIBD_INVALID_ARGUMENT);
  const std::string camera = vexa::LastFailure(driver).camera;
  EXPECT_EQ(camera, std::string(camera.size(), 'h'));
  EXPECT_GE(camera.size(), 255u);
}

TEST(LastFailure, ShortOfMemoryHasNoTexts) {
  TestDriver driver;
  driver.Fail({LIBD_TIMEOUT, std::string(100, 't')});
  vexa::FailureReport report;
  {
    const AllocationFailure failure(0);
    vexa::GetLastFailure(driver, report);
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_EQ(report.code, LIBD_TIMEOUT);
  EXPECT_EQ(report.text, "");
}

TEST(LastFailure, IsOfOneOperationWhateverThreadsFail) {
  TestDriver driver;
  std::atomic<bool> over{false};
  const auto repeat = [&](auto fail) {
    return std::thread([&, fail] {
      while (!over) fail();
    });
  };
  std::thread pan = repeat([&] { driver.PanTilt(1000000, 0); });
  std::thread card = repeat([&] {
    SLibDEdgeStorageMode mode;
    driver.GetEdgeStorageMode(mode);
  });
  for (int i = 0; i < 2000; ++i) {
    const vexa::FailureReport report = vexa::LastFailure(driver);
    if (report.code == LIBD_OK) continue;
    EXPECT_EQ(report.code == LIBD_INVALID_ARGUMENT, report.operation == "PanTilt");
    EXPECT_EQ(report.code == LIBD_NOT_SUPPORTED, report.operation == "GetEdgeStorageMode");
  }
  over = true;
  pan.join();
  card.join();
}

}  // namespace
}  // namespace vexa_test
