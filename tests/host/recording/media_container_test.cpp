// SPDX-License-Identifier: Apache-2.0
// Containers, read back by programs that are not ours.
#include "host/recording/media_container.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <fstream>
#include <vector>

#include "host/recording/recording_target.h"
#include "tests/support/temporary_folder.h"
#include "virtual_camera/codec/image_clip.h"

namespace vexa::host {
namespace {

using std::chrono::microseconds;
using vexa_test::TemporaryFolder;

#ifdef VEXA_WITH_FFMPEG

std::vector<std::string> lines_of(const std::string& command) {
  std::vector<std::string> lines;
  std::FILE* output = popen((command + " 2>&1 </dev/null").c_str(), "r");
  if (output == nullptr) return lines;
  char line[512];
  while (std::fgets(line, sizeof line, output) != nullptr) {
    lines.emplace_back(line);
    while (!lines.back().empty() && lines.back().back() == '\n') lines.back().pop_back();
  }
  pclose(output);
  return lines;
}

// The hashes of the decoded pictures.
std::vector<std::string> decoded_pictures(const std::string& input) {
  std::vector<std::string> hashes;
  for (const std::string& line :
       lines_of("ffmpeg -v warning -nostdin " + input + " -fps_mode passthrough -f framemd5 -")) {
    if (line[0] != '#') hashes.push_back(line.substr(line.rfind(' ') + 1));
  }
  return hashes;
}

struct ContainedCodec {
  const char* name;
  Codec codec;
  const char* clip;
  const char* format;
  bool has_headers;  // which a container keeps before the pictures
};

constexpr ContainedCodec kContained[] = {{"H264", Codec::kH264, VEXA_CLIPS "/small.h264", "h264", true},
                                         {"Mpeg4", Codec::kMpeg4, VEXA_CLIPS "/small.m4v", "m4v", true},
                                         {"Jpeg", Codec::kJpeg, VEXA_CLIPS "/plain.mjpeg", "mjpeg", false}};

class MediaContainerOf : public testing::TestWithParam<ContainedCodec> {
 protected:
  static constexpr std::size_t kPictures = 30;

  // Writes pictures with these times, and as they are beside them.
  void write(const std::string& path, ContainerFormat format, const std::vector<microseconds>& times) {
    const auto clip = vexa::camera::ImageClip::load(GetParam().clip);
    ASSERT_TRUE(clip);
    MediaContainer container(path, format);
    std::ofstream pictures(folder_ / "pictures", std::ios::binary);
    for (std::size_t i = 0; i < times.size(); ++i) {
      const std::string& picture = clip->pictures()[i];
      pictures << picture;
      const auto* data = reinterpret_cast<const unsigned char*>(picture.data());
      const auto problem = container.write({data, picture.size(), GetParam().codec, i % 25 == 0, times[i]});
      ASSERT_FALSE(problem) << problem->text;
    }
    ASSERT_FALSE(container.close());
  }

  static std::vector<std::string> times_in(const std::string& path) {
    return lines_of("ffprobe -v warning -select_streams v -show_entries packet=pts_time -of csv=p=0 " + path);
  }

  TemporaryFolder folder_;
};

TEST_P(MediaContainerOf, HoldsEveryPictureWithItsTime) {
  std::vector<microseconds> times;
  std::vector<std::string> wanted;
  for (std::size_t i = 0; i < kPictures; ++i) {
    const auto since = static_cast<std::int64_t>(i * 40 + (i % 3) * 7);  // milliseconds, unevenly
    times.emplace_back(1700000000000000 + since * 1000);
    char text[32];
    std::snprintf(text, sizeof text, "%d.%03d000", static_cast<int>(since / 1000), static_cast<int>(since % 1000));
    wanted.emplace_back(text);
  }
  for (const char* name : {"a.mkv", "a.mp4"}) {
    const std::string path = folder_ / name;
    write(path, *RecordingTarget(name, -1).container(), times);
    EXPECT_EQ(times_in(path), wanted) << name;
    const auto decoded = decoded_pictures("-i " + path);
    EXPECT_EQ(decoded.size(), kPictures) << name;
    EXPECT_EQ(decoded, decoded_pictures(std::string("-f ") + GetParam().format + " -i " + (folder_ / "pictures")))
        << name;
  }
}

TEST_P(MediaContainerOf, StatesTheSizeAndKeepsTheHeadersOfTheFirstPicture) {
  for (const char* name : {"a.mkv", "a.mp4"}) {
    const std::string path = folder_ / name;
    write(path, *RecordingTarget(name, -1).container(), {microseconds(0), microseconds(40000)});
    EXPECT_EQ(lines_of("ffprobe -v warning -show_entries stream=width,height -of csv=p=0 " + path),
              std::vector<std::string>{"320,240"});
    // A player reads them without a picture: before the first, and after a jump to any other.
    const auto headers = lines_of("ffprobe -v warning -show_entries stream=extradata_size -of csv=p=0 " + path);
    const bool kept = !headers.empty() && !headers[0].empty() && headers[0] != "N/A" && headers[0] != "0";
    EXPECT_EQ(kept, GetParam().has_headers) << name << ": " << testing::PrintToString(headers);
  }
}

TEST_P(MediaContainerOf, NoTwoPicturesHaveTheSameTime) {
  write(folder_ / "a.mkv", ContainerFormat::kMatroska,
        {microseconds(5000000), microseconds(5000000), microseconds(4000000), microseconds(5010000)});
  EXPECT_EQ(times_in(folder_ / "a.mkv"), (std::vector<std::string>{"0.000000", "0.001000", "0.002000", "0.010000"}));
}

INSTANTIATE_TEST_SUITE_P(Of, MediaContainerOf, testing::ValuesIn(kContained),
                         [](const auto& tested) { return tested.param.name; });

TEST(MediaContainer, WhatCannotBeWrittenIsReported) {
  const auto clip = vexa::camera::ImageClip::load(VEXA_CLIPS "/plain.mjpeg");
  ASSERT_TRUE(clip);
  const std::string& picture = clip->pictures()[0];
  const auto write = [&picture](const std::string& path) {
    MediaContainer container(path, ContainerFormat::kMatroska);
    const auto* data = reinterpret_cast<const unsigned char*>(picture.data());
    std::optional<Problem> problem = container.write({data, picture.size(), Codec::kJpeg, true, microseconds(1)});
    return problem ? problem : container.close();
  };
  const auto missing = write("no/such/folder/a.mkv");
  ASSERT_TRUE(missing);
  EXPECT_EQ(missing->code, ExitCode::kCannotWrite);
  EXPECT_EQ(missing->text, "cannot write no/such/folder/a.mkv: No such file or directory");
  const auto full = write("/dev/full");
  ASSERT_TRUE(full);
  EXPECT_EQ(full->text, "cannot write /dev/full: No space left on device");
}

TEST(MediaContainer, AFirstPictureThatIsNoneIsRefusedAndLeavesNoFile) {
  const TemporaryFolder folder;
  MediaContainer container(folder / "a.mkv", ContainerFormat::kMatroska);
  const unsigned char nonsense[] = {1, 2, 3, 4};
  const auto problem = container.write({nonsense, sizeof nonsense, Codec::kH264, true, microseconds(1)});
  ASSERT_TRUE(problem);
  EXPECT_EQ(problem->code, ExitCode::kNoVideo);
  EXPECT_FALSE(container.close());
  EXPECT_FALSE(std::ifstream(folder / "a.mkv").good());
}

#else

TEST(MediaContainer, IsRefusedWithoutTheLibraries) {
  MediaContainer container("a.mkv", ContainerFormat::kMatroska);
  const auto problem = container.check();
  ASSERT_TRUE(problem);
  EXPECT_EQ(problem->text, "this vexactl was built without FFmpeg's libraries; writing .mkv and .mp4 needs them");
}

#endif

}  // namespace
}  // namespace vexa::host
