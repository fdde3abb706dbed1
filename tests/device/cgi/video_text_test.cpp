// SPDX-License-Identifier: Apache-2.0
// The camera's texts of video settings.
#include "device/cgi/video_text.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>

namespace {

TEST(ValueAfter, RunsToTheNextAmpersandOrTheEnd) {
  const vexa::PlacedValue inner = vexa::value_after("A=1&B=22&C=3", 4, 2);
  EXPECT_EQ(inner.text, "22");
  EXPECT_EQ(inner.end, 8u);
  const vexa::PlacedValue last = vexa::value_after("A=1&B=22&C=3", 9, 2);
  EXPECT_EQ(last.text, "3");
  EXPECT_EQ(last.end, 12u);
}

TEST(ValueAfter, IsEmptyAfterAKeyWithoutAValue) {
  EXPECT_EQ(vexa::value_after("A=&B=", 0, 2).text, "");
  EXPECT_EQ(vexa::value_after("A=&B=", 0, 2).end, 2u);
  EXPECT_EQ(vexa::value_after("A=&B=", 3, 2).text, "");
  EXPECT_EQ(vexa::value_after("A=&B=", 3, 2).end, 5u);
}

TEST(ValueAfter, ReadsNothingOutsideTheAnswer) {
  for (const std::size_t at : {std::size_t{0}, std::size_t{1}, std::size_t{3}, std::size_t{4}, std::string::npos}) {
    for (const std::size_t length : {std::size_t{4}, std::size_t{5}, std::string::npos}) {
      const vexa::PlacedValue value = vexa::value_after("A=1", at, length);
      EXPECT_EQ(value.text, "") << at << " " << length;
      EXPECT_EQ(value.end, 3u) << at << " " << length;
    }
  }
}

TEST(StreamKey, CarriesTheStreamsNumberInDecimal) {
  EXPECT_EQ(vexa::stream_key("ImageCodec", 1), "ImageCodec1=");
  EXPECT_EQ(vexa::stream_key("FrameRate", 12), "FrameRate12=");
  EXPECT_EQ(vexa::stream_key("Quality", 0), "Quality0=");
  EXPECT_EQ(vexa::stream_key("BitRate", INT_MIN), "BitRate-2147483648=");
}

struct CodecRow {
  const char* word;
  const char* name;
  int type;
};

class CodecWords : public testing::TestWithParam<CodecRow> {};

TEST_P(CodecWords, NameTheFirstEncodersCodec) {
  const vexa::Codec* codec = vexa::video_codec_of(GetParam().word);
  ASSERT_NE(codec, nullptr);
  EXPECT_STREQ(codec->name, GetParam().name);
  EXPECT_EQ(static_cast<int>(codec->kind), GetParam().type);
}

INSTANTIATE_TEST_SUITE_P(Rows, CodecWords,
                         testing::Values(CodecRow{"jpeg", "JPEG", 0}, CodecRow{"jpeg-mpeg4", "JPEG", 0},
                                         CodecRow{"mpeg4", "MPEG4", 1}, CodecRow{"mpeg4-jpeg", "MPEG4", 1},
                                         CodecRow{"h264", "H.264", 2}));

TEST(CodecWords, AreComparedWhole) {
  for (const char* word : {"", "JPEG", "MPEG4", "H264", "h.264", "jpeg-h264", "jpeg ", " jpeg", "mpeg", "mpeg4-", "off",
                           "h264x", "jpeg-mpeg4-h264"}) {
    EXPECT_EQ(vexa::video_codec_of(word), nullptr) << word;
  }
}

TEST(VideoStandard, IsTheOneTheValueContains) {
  for (const char* value : {"pal", "PAL pal", "xpalx", "pal-b"}) {
    EXPECT_EQ(vexa::video_standard_of(value), LIBD_VIDEO_PAL) << value;
  }
  for (const char* value : {"ntsc", "xntscx", "ntsc-m"}) EXPECT_EQ(vexa::video_standard_of(value), LIBD_VIDEO_NTSC);
}

TEST(VideoStandard, IsPalWhenBothAreNamed) { EXPECT_EQ(vexa::video_standard_of("ntsc,pal"), LIBD_VIDEO_PAL); }

TEST(VideoStandard, IsPalWhenNoneIsNamed) {
  for (const char* value : {"", "NTSC", "secam", "nts"}) EXPECT_EQ(vexa::video_standard_of(value), LIBD_VIDEO_PAL);
}

struct SizeRow {
  const char* value;
  int width;
  int height;
  const char* text;  // null: none
};

class StreamSizes : public testing::TestWithParam<SizeRow> {};

TEST_P(StreamSizes, AreReadAsTheCameraWritesThem) {
  const vexa::StreamSize size = vexa::read_stream_size(GetParam().value);
  EXPECT_EQ(size.width, GetParam().width);
  EXPECT_EQ(size.height, GetParam().height);
  if (GetParam().text == nullptr) {
    EXPECT_FALSE(size.text) << *size.text;
  } else {
    ASSERT_TRUE(size.text);
    EXPECT_EQ(*size.text, GetParam().text);
  }
}

INSTANTIATE_TEST_SUITE_P(
    Pairs, StreamSizes,
    testing::Values(SizeRow{"1280,720", 1280, 720, "1280x720"}, SizeRow{"640,480", 640, 480, "640x480"},
                    SizeRow{"0640, 480", 640, 480, "0640x 480"}, SizeRow{"640,480,1", 640, 480, "640x480,1"},
                    SizeRow{"640px,480px", 640, 480, "640pxx480px"}, SizeRow{",480", 0, 480, "x480"},
                    SizeRow{"-1,-1", -1, -1, "-1x-1"}, SizeRow{"x,5", 0, 5, "xx5"}));

INSTANTIATE_TEST_SUITE_P(ClassicHeights, StreamSizes,
                         testing::Values(SizeRow{"160,0", 160, 120, "160x120"}, SizeRow{"320,0", 320, 240, "320x240"},
                                         SizeRow{"384,0", 384, 288, "384x288"}, SizeRow{"640,0", 640, 480, "640x480"},
                                         SizeRow{"640,", 640, 480, "640x480"}, SizeRow{"640,x", 640, 480, "640x480"}));

INSTANTIATE_TEST_SUITE_P(NoClassicHeight, StreamSizes,
                         testing::Values(SizeRow{"159,0", 159, 0, nullptr}, SizeRow{"161,0", 161, 0, nullptr},
                                         SizeRow{"319,0", 319, 0, nullptr}, SizeRow{"321,0", 321, 0, nullptr},
                                         SizeRow{"383,0", 383, 0, nullptr}, SizeRow{"385,0", 385, 0, nullptr},
                                         SizeRow{"639,0", 639, 0, nullptr}, SizeRow{"641,0", 641, 0, nullptr},
                                         SizeRow{"800,0", 800, 0, nullptr}, SizeRow{"-640,0", -640, 0, nullptr},
                                         SizeRow{"0,0", 0, 0, nullptr}, SizeRow{",", 0, 0, nullptr}));

INSTANTIATE_TEST_SUITE_P(NoComma, StreamSizes,
                         testing::Values(SizeRow{"", 0, 0, nullptr}, SizeRow{"640", 0, 0, nullptr},
                                         SizeRow{"640x480", 0, 0, nullptr}));

TEST(StreamSize, HoldsNumbersBeyondIntAtItsLimits) {
  const vexa::StreamSize size = vexa::read_stream_size("99999999999,-99999999999");
  EXPECT_EQ(size.width, INT_MAX);
  EXPECT_EQ(size.height, INT_MIN);
}

TEST(CodecRequest, AsksForTheBitRateOfMpeg4AndH264AndTheQualityOfAllElse) {
  const struct {
    const char* name;
    const char* word;
    const char* key;
    int rate;
  } rows[] = {{"MPEG4", "mpeg4", "BitRate", 2000}, {"H.264", "h264", "BitRate", 2000}, {"JPEG", "jpeg", "Quality", 7},
              {"", "jpeg", "Quality", 7},          {"mpeg4", "jpeg", "Quality", 7},    {"H264", "jpeg", "Quality", 7}};
  for (const auto& row : rows) {
    SLibDCameraInfo info;
    info.codecName = row.name;
    info.bitRate = 2000;
    info.quality = 7;
    const vexa::CodecRequest request = vexa::codec_request(info);
    EXPECT_STREQ(request.word, row.word) << row.name;
    EXPECT_STREQ(request.rateKey, row.key) << row.name;
    EXPECT_EQ(request.rate, row.rate) << row.name;
  }
}

}  // namespace
