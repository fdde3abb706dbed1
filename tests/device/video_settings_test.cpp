// SPDX-License-Identifier: Apache-2.0
// GetCameraInfo on the wire.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include "tests/device/camera_info_fields.h"
#include "tests/device/settings_exchange.h"

namespace vexa_test {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;
using Driver = Played<CVexaCommon>;
using VideoParams = SettingsDriver::VideoParams;

/// What a driver that knew `before` knows after the camera has answered `answer` for stream `stream`.
SLibDCameraInfo after_answer(const SLibDCameraInfo& before, const std::string& answer, int stream = 1) {
  Driver play({inquiry("camera", answer)});
  play.driver.m_CameraInfo = before;
  SLibDCameraInfo info;
  info.streamNumber = stream;
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(info, play.driver.m_CameraInfo);
  return info;
}

using Change = void (*)(SLibDCameraInfo&);

struct AnswerRow {
  const char* answer;
  Change change;  // from the marked record, its codec type 0
};

/// What stays when an answer has no key of interest.
SLibDCameraInfo before_answer() {
  SLibDCameraInfo info = marked_camera_info(3);
  info.streamNumber = 1;
  info.codecType = 0;
  return info;
}

void stays(SLibDCameraInfo&) {}

class CameraAnswer : public testing::TestWithParam<AnswerRow> {};

TEST_P(CameraAnswer, ChangesTheFieldsItNamesAndNoOthers) {
  SLibDCameraInfo expected = before_answer();
  GetParam().change(expected);
  EXPECT_EQ(after_answer(before_answer(), GetParam().answer), expected) << GetParam().answer;
}

constexpr AnswerRow kCodecRows[] = {
    {"ImageCodec1=jpeg", [](SLibDCameraInfo& i) { i.codecName = "JPEG"; }},
    {"ImageCodec1=jpeg-mpeg4", [](SLibDCameraInfo& i) { i.codecName = "JPEG"; }},
    {"ImageCodec1=mpeg4", [](SLibDCameraInfo& i) { i.codecName = "MPEG4", i.codecType = 1; }},
    {"ImageCodec1=mpeg4-jpeg", [](SLibDCameraInfo& i) { i.codecName = "MPEG4", i.codecType = 1; }},
    {"ImageCodec1=h264", [](SLibDCameraInfo& i) { i.codecName = "H.264", i.codecType = 2; }},
    {"ImageCodec1=MPEG4", stays},
    {"ImageCodec1=", stays},
    {"ImageCodec1", stays},
    {"imagecodec1=h264", stays},
    {"ImageCodec=h264", stays},
    {"ImageCodec11=h264", stays},
    {"ImageCodec2=h264", stays},
    {"ImageCodec1=h264&ImageCodec1=mpeg4", [](SLibDCameraInfo& i) { i.codecName = "H.264", i.codecType = 2; }},
    {"ImageCodec1=off&ImageCodec1=mpeg4", stays}};
INSTANTIATE_TEST_SUITE_P(Codec, CameraAnswer, testing::ValuesIn(kCodecRows));

constexpr AnswerRow kSizeRows[] = {
    {"ImageSize1=1280,720",
     [](SLibDCameraInfo& i) { i.imageWidth = 1280, i.imageHeight = 720, i.imageSizeText = "1280x720"; }},
    {"ImageSize1=160,0",
     [](SLibDCameraInfo& i) { i.imageWidth = 160, i.imageHeight = 120, i.imageSizeText = "160x120"; }},
    {"ImageSize1=320,0",
     [](SLibDCameraInfo& i) { i.imageWidth = 320, i.imageHeight = 240, i.imageSizeText = "320x240"; }},
    {"ImageSize1=384,0",
     [](SLibDCameraInfo& i) { i.imageWidth = 384, i.imageHeight = 288, i.imageSizeText = "384x288"; }},
    {"ImageSize1=640,0",
     [](SLibDCameraInfo& i) { i.imageWidth = 640, i.imageHeight = 480, i.imageSizeText = "640x480"; }},
    {"ImageSize1=800,0", [](SLibDCameraInfo& i) { i.imageWidth = 800, i.imageHeight = 0; }},
    {"ImageSize1=", [](SLibDCameraInfo& i) { i.imageWidth = i.imageHeight = 0; }},
    {"ImageSize1=640x480", [](SLibDCameraInfo& i) { i.imageWidth = i.imageHeight = 0; }},
    {"ImageSize1=320,240&ImageSize1=640,480",
     [](SLibDCameraInfo& i) { i.imageWidth = 320, i.imageHeight = 240, i.imageSizeText = "320x240"; }},
    {"ImageSize2=320,240", stays}};
INSTANTIATE_TEST_SUITE_P(Size, CameraAnswer, testing::ValuesIn(kSizeRows));

constexpr AnswerRow kRateRows[] = {
    {"FrameRate1=30", [](SLibDCameraInfo& i) { i.frameRate = 30, i.frameRateText = "30fps"; }},
    {"FrameRate1=08", [](SLibDCameraInfo& i) { i.frameRate = 8, i.frameRateText = "08fps"; }},
    {"FrameRate1= +12.5", [](SLibDCameraInfo& i) { i.frameRate = 12, i.frameRateText = " +12.5fps"; }},
    {"FrameRate1=fast", [](SLibDCameraInfo& i) { i.frameRate = 0, i.frameRateText = "fastfps"; }},
    {"FrameRate1=", [](SLibDCameraInfo& i) { i.frameRate = 0, i.frameRateText = "fps"; }},
    {"FrameRate1=99999999999",
     [](SLibDCameraInfo& i) { i.frameRate = 2147483647, i.frameRateText = "99999999999fps"; }},
    {"FrameRate1=5&FrameRate1=6", [](SLibDCameraInfo& i) { i.frameRate = 5, i.frameRateText = "5fps"; }},
    {"FrameRate2=5", stays}};
INSTANTIATE_TEST_SUITE_P(FrameRate, CameraAnswer, testing::ValuesIn(kRateRows));

constexpr AnswerRow kBoundRows[] = {
    {"ImageCodec1=jpeg&Quality1=5&BitRate1=2000",
     [](SLibDCameraInfo& i) { i.codecName = "JPEG", i.quality = 5, i.qualityText = "Level 5"; }},
    {"ImageCodec1=mpeg4&Quality1=5&BitRate1=2000",
     [](SLibDCameraInfo& i) {
       i.codecName = "MPEG4", i.codecType = 1, i.bitRate = 2000, i.bitRateText = "2000kbit/s";
     }},
    {"ImageCodec1=h264&Quality1=5&BitRate1=2000",
     [](SLibDCameraInfo& i) {
       i.codecName = "H.264", i.codecType = 2, i.bitRate = 2000, i.bitRateText = "2000kbit/s";
     }},
    {"ImageCodec1=h264&Quality1=5", [](SLibDCameraInfo& i) { i.codecName = "H.264", i.codecType = 2; }},
    {"ImageCodec1=jpeg&BitRate1=2000", [](SLibDCameraInfo& i) { i.codecName = "JPEG"; }},
    {"ImageCodec1=other&Quality1=7&BitRate1=2000",
     [](SLibDCameraInfo& i) { i.quality = 7, i.qualityText = "Level 7"; }},
    {"Quality1=7", [](SLibDCameraInfo& i) { i.quality = 7, i.qualityText = "Level 7"; }},
    {"Quality1=", [](SLibDCameraInfo& i) { i.quality = 0, i.qualityText = "Level "; }},
    {"BitRate1=2000", stays},
    {"ImageCodec1=mpeg4&BitRate1=",
     [](SLibDCameraInfo& i) { i.codecName = "MPEG4", i.codecType = 1, i.bitRate = 0, i.bitRateText = "kbit/s"; }},
    {"ImageCodec1=h264&BitRate1=512&BitRate1=64",
     [](SLibDCameraInfo& i) { i.codecName = "H.264", i.codecType = 2, i.bitRate = 512, i.bitRateText = "512kbit/s"; }},
    {"ImageCodec1=h264&BitRate1=2M",
     [](SLibDCameraInfo& i) { i.codecName = "H.264", i.codecType = 2, i.bitRate = 2, i.bitRateText = "2Mkbit/s"; }},
    {"ImageCodec1=h264&BitRate2=64&BitRate11=64", [](SLibDCameraInfo& i) { i.codecName = "H.264", i.codecType = 2; }},
    {"Quality2=7", stays},
    {"Quality1=7&Quality1=8", [](SLibDCameraInfo& i) { i.quality = 7, i.qualityText = "Level 7"; }}};
INSTANTIATE_TEST_SUITE_P(QualityAndBitRate, CameraAnswer, testing::ValuesIn(kBoundRows));

constexpr AnswerRow kPropertyRows[] = {
    {"VideoStd=pal", [](SLibDCameraInfo& i) { i.videoStandard = 0; }},
    {"VideoStd=ntsc", [](SLibDCameraInfo& i) { i.videoStandard = 1; }},
    {"VideoStd=", [](SLibDCameraInfo& i) { i.videoStandard = 0; }},
    {"VideoStd=NTSC", [](SLibDCameraInfo& i) { i.videoStandard = 0; }},
    {"VideoStd=ntsc&VideoStd=pal", [](SLibDCameraInfo& i) { i.videoStandard = 1; }},
    {"VidCapSize=1280,720", [](SLibDCameraInfo& i) { i.captureWidth = 1280, i.captureHeight = 720; }},
    {"VidCapSize=1280,1024x", [](SLibDCameraInfo& i) { i.captureWidth = 1280, i.captureHeight = 1024; }},
    {"VidCapSize=1280", stays},
    {"VidCapSize=1280x720", stays},
    {"VidCapSize=,720", stays},
    {"VidCapSize=", stays},
    {"VidCapSize=x&VidCapSize=1280,720", stays},
    {"SolidPTZ=on", [](SLibDCameraInfo& i) { i.solidPtz = true; }},
    {"SolidPTZ=off", [](SLibDCameraInfo& i) { i.solidPtz = false; }},
    {"SolidPTZ=On", [](SLibDCameraInfo& i) { i.solidPtz = false; }},
    {"SolidPTZ=on ", [](SLibDCameraInfo& i) { i.solidPtz = false; }},
    {"SolidPTZ=", [](SLibDCameraInfo& i) { i.solidPtz = false; }},
    {"SolidPTZ=off&SolidPTZ=on", [](SLibDCameraInfo& i) { i.solidPtz = false; }},
    {"ImageMaxSize=640,480", [](SLibDCameraInfo& i) { i.maxImageWidth = 640, i.maxImageHeight = 480; }},
    {"ImageMaxSize=640", stays},
    {"ImageMaxSize=", stays},
    {"ImageMaxSize=1,2&ImageMaxSize=3,4", [](SLibDCameraInfo& i) { i.maxImageWidth = 1, i.maxImageHeight = 2; }}};
INSTANTIATE_TEST_SUITE_P(Properties, CameraAnswer, testing::ValuesIn(kPropertyRows));

constexpr AnswerRow kPortRows[] = {{"UcVideoPort=1", [](SLibDCameraInfo& i) { i.unicastVideoPort = 1; }},
                                   {"UcVideoPort1=2", [](SLibDCameraInfo& i) { i.unicastVideoPort1 = 2; }},
                                   {"UcVideoPort2=3", [](SLibDCameraInfo& i) { i.unicastVideoPort2 = 3; }},
                                   {"RTSPPort=554", [](SLibDCameraInfo& i) { i.rtspPort = 554; }},
                                   {"RTSPPort=", [](SLibDCameraInfo& i) { i.rtspPort = 0; }},
                                   {"UcVideoPort=", [](SLibDCameraInfo& i) { i.unicastVideoPort = 0; }},
                                   {"UcVideoPort1=x", [](SLibDCameraInfo& i) { i.unicastVideoPort1 = 0; }},
                                   {"UcVideoPort2=-5x", [](SLibDCameraInfo& i) { i.unicastVideoPort2 = -5; }},
                                   {"RTSPPort=1&RTSPPort=2", [](SLibDCameraInfo& i) { i.rtspPort = 1; }},
                                   {"UcVideoPort3=9", stays}};
INSTANTIATE_TEST_SUITE_P(Ports, CameraAnswer, testing::ValuesIn(kPortRows));

constexpr AnswerRow kOddRows[] = {{"", stays},
                                  {"&&&&", stays},
                                  {"=&=", stays},
                                  {"nothing of interest", stays},
                                  {"\xff\xfe\x01&\x80=\x81", stays},
                                  {"\r\nRTSPPort=7\r\n", [](SLibDCameraInfo& i) { i.rtspPort = 7; }}};
INSTANTIATE_TEST_SUITE_P(Odd, CameraAnswer, testing::ValuesIn(kOddRows));

const std::vector<std::string> kWholeAnswer = {
    "ModelName=X",      "VideoStd=ntsc",     "VidCapSize=1280,960", "SolidPTZ=on",    "ImageMaxSize=1024,768",
    "ImageCodec1=h264", "ImageCodec2=jpeg",  "ImageSize1=640,0",    "ImageSize2=1,1", "FrameRate1=25",
    "FrameRate2=2",     "Quality1=6",        "Quality2=3",          "BitRate1=2000",  "BitRate2=64",
    "UcVideoPort=1024", "UcVideoPort1=1025", "UcVideoPort2=1026",   "RTSPPort=8554"};

std::string joined(const std::vector<std::string>& pairs, const std::vector<std::size_t>& order) {
  std::string answer;
  for (const std::size_t place : order) answer += (answer.empty() ? "" : "&") + pairs[place];
  return answer;
}

SLibDCameraInfo whole_record() {
  SLibDCameraInfo info = before_answer();
  info.videoStandard = LIBD_VIDEO_NTSC;
  info.captureWidth = 1280;
  info.captureHeight = 960;
  info.solidPtz = true;
  info.maxImageWidth = 1024;
  info.maxImageHeight = 768;
  info.codecName = "H.264";
  info.codecType = 2;
  info.imageSizeText = "640x480";
  info.imageWidth = 640;
  info.imageHeight = 480;
  info.frameRate = 25;
  info.frameRateText = "25fps";
  info.bitRate = 2000;
  info.bitRateText = "2000kbit/s";
  info.unicastVideoPort = 1024;
  info.unicastVideoPort1 = 1025;
  info.unicastVideoPort2 = 1026;
  info.rtspPort = 8554;
  return info;
}

TEST(GetCameraInfo, ReadsItsKeysInAnyOrder) {
  std::vector<std::size_t> order(kWholeAnswer.size());
  std::iota(order.begin(), order.end(), std::size_t{0});
  std::mt19937 random(1);
  for (int round = 0; round < 50; ++round) {
    const std::string answer = joined(kWholeAnswer, order);
    EXPECT_EQ(after_answer(before_answer(), answer), whole_record()) << answer;
    std::shuffle(order.begin(), order.end(), random);
  }
}

TEST(GetCameraInfo, ReadsOnlyTheKeysOfTheStreamAskedFor) {
  std::vector<std::size_t> order(kWholeAnswer.size());
  std::iota(order.begin(), order.end(), std::size_t{0});
  const SLibDCameraInfo info = after_answer(before_answer(), joined(kWholeAnswer, order), 2);
  EXPECT_EQ(info.codecName, "JPEG");
  EXPECT_EQ(info.codecType, 0);
  EXPECT_EQ(info.imageSizeText, "1x1");
  EXPECT_EQ(info.frameRate, 2);
  EXPECT_EQ(info.quality, 3);
  EXPECT_EQ(info.bitRate, before_answer().bitRate);
}

TEST(GetCameraInfo, HandsBackTheStoredStreamNumber) {
  EXPECT_EQ(after_answer(before_answer(), "ImageCodec2=jpeg", 2).streamNumber, 1);
}

TEST(GetCameraInfo, FindsAKeyAtTheEndOfALongerOne) {
  EXPECT_EQ(after_answer(before_answer(), "SubImageCodec1=h264&ImageCodec1=jpeg").codecName, "H.264");
}

TEST(GetCameraInfo, MakesTheTypeZeroWhenTheCodecIsMissingOrUnknown) {
  SLibDCameraInfo before = before_answer();
  before.codecType = 2;
  EXPECT_EQ(after_answer(before, "FrameRate1=5").codecType, 0);
  EXPECT_EQ(after_answer(before, "ImageCodec1=vc1").codecType, 0);
  EXPECT_EQ(after_answer(before, "ImageCodec1=vc1").codecName, before.codecName);
}

TEST(GetCameraInfo, CachesTheAnswer) {
  Driver play({inquiry("camera", "RTSPPort=1"), inquiry("camera", "RTSPPort=2")});
  SLibDCameraInfo info;
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(play.driver.cached_inquiry(), "RTSPPort=1");
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(play.driver.cached_inquiry(), "RTSPPort=2");
}

TEST(GetCameraInfo, LeavesAllButTheCacheWhenTheInquiryFails) {
  Driver play({refusal("/command/inquiry.cgi?inq=camera")});
  play.driver.m_CameraInfo = before_answer();
  play.driver.cache_inquiry("old");
  SLibDCameraInfo info = marked_camera_info(5);
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_UNAUTHORIZED);
  EXPECT_EQ(info, marked_camera_info(5));
  EXPECT_EQ(play.driver.m_CameraInfo, before_answer());
  EXPECT_EQ(play.driver.cached_inquiry(), "");
  EXPECT_THAT(play.driver.told, IsEmpty());
}

TEST(GetCameraInfo, CallsTheModelClassOnceForAChangedProperty) {
  const std::string answer = "VideoStd=ntsc&VidCapSize=1280,960&SolidPTZ=on&ImageMaxSize=640,480";
  Driver play({inquiry("camera", answer), inquiry("camera", answer)});
  SLibDCameraInfo info;
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
  EXPECT_THAT(play.driver.told, ElementsAre(VideoParams{LIBD_VIDEO_NTSC, 1280, 960}));
  play.driver.m_FixedCameraInfo.codecs.clear();
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
  EXPECT_EQ(play.driver.told.size(), 1u);
  EXPECT_THAT(play.driver.m_FixedCameraInfo.codecs, IsEmpty());
}

TEST(GetCameraInfo, CallsTheModelClassForEachProperty) {
  for (const char* property :
       {"VideoStd=ntsc", "VidCapSize=1,0", "VidCapSize=0,1", "SolidPTZ=on", "ImageMaxSize=1,0", "ImageMaxSize=0,1"}) {
    Driver play({inquiry("camera", property)});
    SLibDCameraInfo info;
    EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
    EXPECT_EQ(play.driver.told.size(), 1u) << property;
  }
}

TEST(GetCameraInfo, OffersWhatAllReportedPropertiesLeave) {
  Driver play({inquiry("camera", "VidCapSize=1280,960&ImageMaxSize=800,600&SolidPTZ=on")});
  play.driver.m_FixedSystemInfo.modelName = "LMX-M100";
  SLibDCameraInfo info;
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_OK);
  std::vector<std::string> sizes;
  ASSERT_EQ(play.driver.m_FixedCameraInfo.codecs.size(), 3u);
  for (const auto& size : play.driver.m_FixedCameraInfo.codecs[0].resolutions) sizes.push_back(size.text);
  EXPECT_THAT(sizes, ElementsAre("640x480", "320x240", "160x120"));
}

// The filter keeps its criterion at a word that it does not know: "On" reaches it as neither "on" nor "off".
TEST(GetCameraInfo, GivesTheFilterTheCamerasOwnWordOfSolidPtz) {
  for (const char* before : {"on", "off"}) {
    SettingsDriver driver;
    driver.m_ResolutionFilter.Initialize("LMX-P100");
    driver.m_ResolutionFilter.SetFilterItemCriteria("SolidPTZFilter", before);
    std::vector<SLibDVideoCodecInfo> expected;
    driver.m_ResolutionFilter.GetFilteredResolutionList(expected);
    std::size_t pos = 0;
    bool changed = false;
    driver.ParseSolidPTZFromCameraProperty("SolidPTZ=On", pos, changed);
    EXPECT_FALSE(driver.m_CameraInfo.solidPtz);
    EXPECT_FALSE(changed);
    std::vector<SLibDVideoCodecInfo> offered;
    driver.m_ResolutionFilter.GetFilteredResolutionList(offered);
    EXPECT_EQ(offered[0].resolutions[0].text, expected[0].resolutions[0].text) << before;
  }
}

TEST(GetCameraInfo, MovesAParsersPlaceToTheValuesEnd) {
  SettingsDriver driver;
  const std::string answer = "A=1&VideoStd=ntsc&VidCapSize=1,2&SolidPTZ=on&ImageMaxSize=3,4";
  const struct {
    void (SettingsDriver::*parse)(const std::string&, std::size_t&, bool&);
    std::size_t key;
    std::size_t end;
  } rows[] = {{&SettingsDriver::ParseVideoStandardFromCameraProperty, 4, 17},
              {&SettingsDriver::ParseVideoCapSizeFromCameraProperty, 18, 32},
              {&SettingsDriver::ParseSolidPTZFromCameraProperty, 33, 44},
              {&SettingsDriver::ParseImageMaxSizeFromCameraProperty, 45, 61}};
  for (const auto& row : rows) {
    for (const bool differs : {true, false}) {
      std::size_t pos = row.key;
      bool changed = false;
      (driver.*row.parse)(answer, pos, changed);
      EXPECT_EQ(pos, row.end);
      EXPECT_EQ(changed, differs) << row.key;
    }
  }
}

TEST(GetCameraInfo, MovesAStreamParsersPlaceToTheValuesEnd) {
  SettingsDriver driver;
  const std::string answer = "A=1&ImageCodec7=h264&ImageSize7=640,480&FrameRate7=25&BitRate7=64&Quality7=5";
  std::int32_t codec = 0;
  const auto end_of = [&answer](std::size_t key, auto parse) {
    std::size_t pos = key;
    parse(pos);
    return answer.substr(key, pos - key);
  };
  EXPECT_EQ(end_of(4, [&](std::size_t& pos) { driver.SetCurrentStreamMode(answer, pos, codec, "ImageCodec7="); }),
            "ImageCodec7=h264");
  EXPECT_EQ(end_of(21, [&](std::size_t& pos) { driver.SetCurrentResolution(answer, pos, "ImageSize7="); }),
            "ImageSize7=640,480");
  EXPECT_EQ(end_of(40, [&](std::size_t& pos) { driver.SetCurrentFrameRate(answer, pos, "FrameRate7="); }),
            "FrameRate7=25");
  EXPECT_EQ(end_of(54, [&](std::size_t& pos) { driver.SetCurrentQualityBitrate(answer, pos, codec, "BitRate7="); }),
            "BitRate7=64");
  EXPECT_EQ(end_of(66, [&](std::size_t& pos) { driver.SetCurrentQualityBitrate(answer, pos, 0, "Quality7="); }),
            "Quality7=5");
  EXPECT_EQ(codec, 2);
  EXPECT_EQ(driver.m_CameraInfo.imageSizeText, "640x480");
  EXPECT_EQ(driver.m_CameraInfo.frameRate, 25);
  EXPECT_EQ(driver.m_CameraInfo.bitRate, 64);
  EXPECT_EQ(driver.m_CameraInfo.quality, 5);
}

TEST(GetCameraInfo, ReadsNothingForAParsersPlaceOutsideTheAnswer) {
  SettingsDriver driver;
  for (const std::size_t place : {std::size_t{1}, std::size_t{3}, std::size_t{4}, std::string::npos}) {
    std::size_t pos = place;
    bool changed = false;
    driver.ParseVideoCapSizeFromCameraProperty("A=1", pos, changed);
    EXPECT_EQ(pos, 3u);
    EXPECT_FALSE(changed);
    pos = place;
    driver.SetCurrentFrameRate("A=1", pos, "FrameRate1=");
    EXPECT_EQ(pos, 3u);
    EXPECT_EQ(driver.m_CameraInfo.frameRateText, "fps");
  }
}

}  // namespace
}  // namespace vexa_test
