#include "virtual_camera/drawn_h264.h"

#include <gtest/gtest.h>

#include <string>

#include "tests/support/decoder.h"
#include "tests/support/temporary_folder.h"
#include "virtual_camera/clip.h"

namespace vexa::camera {
namespace {

struct DrawnCase {
  DrawnVideo video;
  const char* size;
};

TEST(DrawnH264, ADecoderFindsTwoSecondsOfTheSizeAskedFor) {
  const DrawnCase cases[] = {{{1920, 1080, 5}, "1920x1080"}, {{640, 480, 30}, "640x480"}, {{640, 368, 25}, "640x368"},
                             {{160, 120, 60}, "160x120"},    {{16, 16, 10}, "16x16"},     {{2, 2, 1}, "2x2"},
                             {{720, 576, 1}, "720x576"},     {{319, 191, 2}, "320x192"}};
  for (const DrawnCase& c : cases) {
    SCOPED_TRACE(c.size);
    const vexa_test::TemporaryFolder folder;
    const auto bytes = draw_h264(c.video);
    const std::string file = folder.make_file("drawn.h264", std::string(bytes.begin(), bytes.end()));
    const vexa_test::Decoded decoded = vexa_test::decode(file, "h264");
    EXPECT_TRUE(decoded.flawless);
    EXPECT_EQ(decoded.frames, 2 * static_cast<std::size_t>(c.video.frame_rate));
    EXPECT_EQ(decoded.size, c.size);
  }
}

TEST(DrawnH264, BeginsEachSecondWithAKeyPictureBehindItsParameterSets) {
  const Clip clip = Clip::from_annex_b(draw_h264({320, 240, 5}));
  ASSERT_EQ(clip.access_units().size(), 10U);
  for (std::size_t i = 0; i < clip.access_units().size(); ++i) {
    const AccessUnit& picture = clip.access_units()[i];
    EXPECT_EQ(picture.key, i % 5 == 0) << i;
    EXPECT_EQ(picture.units.front().type, i % 5 == 0 ? 7 : 1) << i;
  }
}

TEST(DrawnH264, ChangesFromPictureToPicture) {
  const Clip clip = Clip::from_annex_b(draw_h264({320, 240, 10}));
  for (std::size_t i = 1; i < clip.access_units().size(); ++i) {
    EXPECT_NE(clip.access_units()[i].bytes, clip.access_units()[i - 1].bytes) << i;
  }
}

}  // namespace
}  // namespace vexa::camera
