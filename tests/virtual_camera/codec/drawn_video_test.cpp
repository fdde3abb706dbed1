#include "virtual_camera/codec/drawn_video.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <set>
#include <string>

#include "tests/support/decoder.h"
#include "tests/support/temporary_folder.h"
#include "virtual_camera/codec/clip.h"
#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/source/drawn_source.h"

namespace vexa::camera {
namespace {

using Draw = std::string (*)(const DrawnVideo&, std::uint64_t);

std::string drawn(Draw draw, const DrawnVideo& video, std::uint64_t pictures) {
  std::string bytes;
  for (std::uint64_t i = 0; i < pictures; ++i) bytes += draw(video, i);
  return bytes;
}

struct Case {
  const char* format;  // the decoder's word
  Draw draw;
  DrawnVideo video;
  const char* size;
};

constexpr Case kCases[] = {{"h264", draw_h264, {1920, 1080, 5}, "1920x1080"},
                           {"h264", draw_h264, {640, 480, 30}, "640x480"},
                           {"h264", draw_h264, {640, 368, 25}, "640x368"},
                           {"h264", draw_h264, {160, 120, 60}, "160x120"},
                           {"h264", draw_h264, {2, 2, 1}, "2x2"},
                           {"h264", draw_h264, {319, 191, 2}, "320x192"},
                           {"m4v", draw_mpeg4, {1920, 1080, 5}, "1920x1080"},
                           {"m4v", draw_mpeg4, {640, 480, 30}, "640x480"},
                           {"m4v", draw_mpeg4, {720, 576, 1}, "720x576"},
                           {"m4v", draw_mpeg4, {160, 120, 60}, "160x120"},
                           {"m4v", draw_mpeg4, {16, 16, 2}, "16x16"},
                           {"m4v", draw_mpeg4, {319, 191, 3}, "319x191"},
                           {"mjpeg", draw_jpeg, {1920, 1080, 2}, "1920x1080"},
                           {"mjpeg", draw_jpeg, {640, 480, 5}, "640x480"},
                           {"mjpeg", draw_jpeg, {320, 192, 30}, "320x192"},
                           {"mjpeg", draw_jpeg, {8, 8, 2}, "8x8"},
                           {"mjpeg", draw_jpeg, {319, 191, 3}, "319x191"}};

TEST(DrawnVideo, ADecoderFindsEveryPictureInTheSizeAskedFor) {
  for (const Case& c : kCases) {
    SCOPED_TRACE(std::string(c.format) + " " + c.size);
    const vexa_test::TemporaryFolder folder(vexa_test::memory_folder());
    const std::size_t pictures = 2 * static_cast<std::size_t>(c.video.frame_rate);
    const std::string file = folder.make_file("drawn", drawn(c.draw, c.video, pictures));
    const vexa_test::Decoded decoded = vexa_test::decode(file, c.format);
    EXPECT_TRUE(decoded.flawless);
    EXPECT_EQ(decoded.frames, pictures);
    EXPECT_EQ(decoded.size, c.size);
  }
}

TEST(DrawnVideo, BeginsEachSecondWithAKeyPicture) {
  for (const Codec codec : {Codec::kH264, Codec::kMpeg4, Codec::kJpeg}) {
    DrawnSource source(codec, {320, 240, 5});
    EXPECT_EQ(source.format().codec, codec);
    EXPECT_EQ(source.format().frames_per_second, 5);
    EXPECT_EQ(source.format().sequence_parameters.empty(), codec != Codec::kH264);
    for (std::uint64_t i = 0; i < 12; ++i) {
      const auto picture = source.next();
      ASSERT_TRUE(picture);
      EXPECT_EQ(picture->key, codec == Codec::kJpeg || i % 5 == 0) << i;
      EXPECT_EQ(is_key_picture(codec, *picture->bytes), picture->key) << i;
      EXPECT_EQ(picture->due, std::chrono::milliseconds(200 * i));
    }
    EXPECT_FALSE(source.ended());
  }
}

TEST(DrawnVideo, ChangesFromPictureToPicture) {
  for (const Draw draw : {draw_h264, draw_mpeg4, draw_jpeg}) {
    std::set<std::string> pictures;
    for (std::uint64_t i = 0; i < 10; ++i) pictures.insert(draw({320, 240, 10}, i));
    EXPECT_EQ(pictures.size(), 10U);
  }
}

TEST(DrawnVideo, RtpCarriesItsPictures) {
  const DrawnVideo video{640, 368, 5};
  for (std::uint64_t i = 0; i < 6; ++i) {
    EXPECT_TRUE(packetise(Codec::kH264, draw_h264(video, i), "", 1400)) << i;
    EXPECT_TRUE(packetise(Codec::kMpeg4, draw_mpeg4(video, i), "", 1400)) << i;
    EXPECT_TRUE(packetise(Codec::kJpeg, draw_jpeg(video, i), "", 1400)) << i;
  }
}

/// The brightness of the middle of each square of the first row, as a decoder sees picture `last` of a run.
std::string first_row(Draw draw, const char* format, std::uint64_t last) {
  const vexa_test::TemporaryFolder folder(vexa_test::memory_folder());
  const std::string file = folder.make_file("drawn", drawn(draw, {320, 192, 100}, last + 1));
  const std::string command = "ffmpeg -v error -nostdin -f " + std::string(format) + " -i '" + file +
                              "' -vf extractplanes=y,crop=320:1:0:8 -f rawvideo - | tail -c 320";
  std::string row(320, '\0');
  std::FILE* output = popen(command.c_str(), "r");
  if (output == nullptr || std::fread(row.data(), 1, row.size(), output) != row.size()) ADD_FAILURE() << "no picture";
  if (output != nullptr) pclose(output);
  std::string middles;
  for (std::size_t column = 8; column < row.size(); column += 16) middles += row[column];
  return middles;
}

TEST(DrawnVideo, ShowsItsSquaresAndTheOneThatChanges) {
  const SquareGrid grid({320, 192, 100});
  for (const std::uint64_t last : {0U, 1U, 22U}) {  // the changes of 0, 1 and 22 fall into the first row
    std::string wanted;
    for (std::uint32_t column = 0; column < grid.columns; ++column) {
      wanted += static_cast<char>(square_colour(column, 0).y);
    }
    std::string moving = wanted;
    moving[changed_square(grid, last)] = static_cast<char>(changed_colour(last).y);
    EXPECT_EQ(first_row(draw_jpeg, "mjpeg", last), moving) << last;
    for (std::uint64_t i = 1; i <= last; ++i) {
      if (changed_square(grid, i) < grid.columns) {
        wanted[changed_square(grid, i)] = static_cast<char>(changed_colour(i).y);
      }
    }
    EXPECT_EQ(first_row(draw_mpeg4, "m4v", last), wanted) << last;
  }
}

}  // namespace
}  // namespace vexa::camera
