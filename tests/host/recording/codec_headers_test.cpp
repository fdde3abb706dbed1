#include "host/recording/codec_headers.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

using HeaderText = std::vector<std::uint8_t>;

TEST(CodecHeaders, OfH264AreItsParameterSetsWithLongStartCodes) {
  EXPECT_EQ(codec_headers("H.264", {0, 0, 0, 1, 9, 16, 0, 0, 0, 1, 0x67, 1, 2, 0, 0, 1, 0x68, 3, 0, 0, 0, 1, 0x65, 4}),
            (HeaderText{0, 0, 0, 1, 0x67, 1, 2, 0, 0, 0, 1, 0x68, 3}));
}

TEST(CodecHeaders, OfMpeg4AreWhatStandsBeforeItsGroupOrPlane) {
  const HeaderText sequence = {0, 0, 1, 0xB0, 1, 0, 0, 1, 0x20, 7};
  for (const std::uint8_t code : HeaderText{0xB3, 0xB6}) {
    HeaderText picture = sequence;
    picture.insert(picture.end(), {0, 0, 1, code, 5, 0, 0, 1, 0xB6});
    EXPECT_EQ(codec_headers("MPEG4", picture), sequence);
  }
}

TEST(CodecHeaders, AreEmptyWhereThereAreNone) {
  const struct {
    const char* codec;
    HeaderText picture;
  } cases[] = {{"JPEG", {0, 0, 0, 1, 0x67, 1}},
               {"H.264", {}},
               {"H.264", {0, 0, 1}},
               {"H.264", {0, 0, 1, 0x65, 1}},
               {"MPEG4", {0, 0, 1}},
               {"MPEG4", {0, 0, 1, 0xB0, 1}},
               {"MPEG4", {}},
               {"", {0, 0, 1, 0xB6}}};
  for (const auto& c : cases) EXPECT_EQ(codec_headers(c.codec, c.picture), HeaderText()) << c.codec;
}

}  // namespace
}  // namespace vexa::host
