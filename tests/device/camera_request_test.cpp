// SPDX-License-Identifier: Apache-2.0
// SetCameraInfo on the wire.
#include <gtest/gtest.h>

#include <string>

#include "tests/device/camera_info_fields.h"
#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

using Driver = Played<CVexaCommon>;

SLibDCameraInfo settings(const char* codec, int rotation = 0) {
  SLibDCameraInfo info;
  info.codecName = codec;
  info.imageWidth = 1280;
  info.imageHeight = 720;
  info.frameRate = 30;
  info.quality = 6;
  info.bitRate = 4000;
  info.rotation = rotation;
  return info;
}

struct RequestRow {
  const char* codec;
  int flip;
  int rotation;
  const char* path;
};

class CameraRequest : public testing::TestWithParam<RequestRow> {};

TEST_P(CameraRequest, IsSentAsOneChange) {
  const RequestRow& row = GetParam();
  Driver play({command(row.path)});
  play.driver.m_FixedCameraInfo.electronicFlip = row.flip;
  SLibDCameraInfo info = settings(row.codec, row.rotation);
  EXPECT_EQ(play.driver.SetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(play.driver.m_CameraInfo, info);
}

#define PATH_TO(codec, bound) "/command/camera.cgi?ImageCodec1=" codec "&ImageSize1=1280,720&FrameRate1=30&" bound
constexpr RequestRow kRequests[] = {{"H.264", 0, 0, PATH_TO("h264", "BitRate1=4000")},
                                    {"MPEG4", 0, 0, PATH_TO("mpeg4", "BitRate1=4000")},
                                    {"JPEG", 0, 0, PATH_TO("jpeg", "Quality1=6")},
                                    {"", 0, 0, PATH_TO("jpeg", "Quality1=6")},
                                    {"h264", 0, 0, PATH_TO("jpeg", "Quality1=6")},
                                    {"H.264", 0, 180, PATH_TO("h264", "BitRate1=4000")},
                                    {"H.264", 1, 0, PATH_TO("h264", "BitRate1=4000&Eflip=off")},
                                    {"H.264", 1, 180, PATH_TO("h264", "BitRate1=4000&Eflip=on")},
                                    {"MPEG4", -1, 180, PATH_TO("mpeg4", "BitRate1=4000&Eflip=on")},
                                    {"JPEG", 2, 90, PATH_TO("jpeg", "Quality1=6&Eflip=off")},
                                    {"JPEG", 1, 179, PATH_TO("jpeg", "Quality1=6&Eflip=off")},
                                    {"JPEG", 1, 181, PATH_TO("jpeg", "Quality1=6&Eflip=off")},
                                    {"JPEG", 1, -180, PATH_TO("jpeg", "Quality1=6&Eflip=off")}};
#undef PATH_TO
INSTANTIATE_TEST_SUITE_P(Rows, CameraRequest, testing::ValuesIn(kRequests));

TEST(SetCameraInfo, NumbersEveryKeyByTheStream) {
  Driver play(
      {command("/command/camera.cgi?ImageCodec-7=h264&ImageSize-7=2147483647,-2147483648&FrameRate-7=-1&"
               "BitRate-7=0")});
  SLibDCameraInfo info = settings("H.264");
  info.streamNumber = -7;
  info.imageWidth = 2147483647;
  info.imageHeight = -2147483647 - 1;
  info.frameRate = -1;
  info.bitRate = 0;
  EXPECT_EQ(play.driver.SetCameraInfo(info), LIBD_OK);
}

TEST(SetCameraInfo, StoresAllFields) {
  SLibDCameraInfo info = marked_camera_info(4);
  Driver play({command("/command/camera.cgi?ImageCodec403=jpeg&ImageSize403=405,406&FrameRate403=409&Quality403=411")});
  EXPECT_EQ(play.driver.SetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(play.driver.m_CameraInfo, marked_camera_info(4));
}

TEST(SetCameraInfo, StoresNothingWhenTheRequestFails) {
  SLibDCameraInfo info = settings("JPEG");
  Driver play({refusal("/command/camera.cgi?ImageCodec1=jpeg&ImageSize1=1280,720&FrameRate1=30&Quality1=6")});
  play.driver.m_CameraInfo = marked_camera_info(3);
  EXPECT_EQ(play.driver.SetCameraInfo(info), LIBD_UNAUTHORIZED);
  EXPECT_EQ(play.driver.m_CameraInfo, marked_camera_info(3));
}

TEST(SetCameraInfo, ReportsTheLatestErrorWhenNobodyListens) {
  SettingsDriver driver;
  driver.use(own_loopback(0), refusing_port());
  SLibDCameraInfo info = settings("JPEG");
  EXPECT_EQ(driver.SetCameraInfo(info), LIBD_FAILED);
  EXPECT_EQ(driver.m_CameraInfo, SLibDCameraInfo());
  EXPECT_EQ(driver.GetCameraInfo(info), LIBD_FAILED);
}

}  // namespace
}  // namespace vexa_test
