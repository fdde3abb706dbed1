// SPDX-License-Identifier: Apache-2.0
#include "host/recording/recording_files.h"

#include <gtest/gtest.h>

#include <vector>

#include "host/recording/frame_file.h"
#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using std::chrono::microseconds;
using std::chrono::seconds;
using vexa_test::contents_of;
using vexa_test::TemporaryFolder;

constexpr seconds kTime{1706745599};  // 2024-01-31T23:59:59Z

class FilesOfARecording : public testing::Test {
 protected:
  RecordingFiles files(std::optional<microseconds> segment) {
    return RecordingFiles(folder_ / "live.h264", segment,
                          [](const std::string& path) { return std::make_unique<FrameFile>(path); });
  }
  // Whether the picture was kept.
  static bool write(RecordingFiles& files, char text, bool key, microseconds later, Codec codec = Codec::kH264) {
    const auto byte = static_cast<unsigned char>(text);
    bool kept = false;
    EXPECT_FALSE(files.write({&byte, 1, codec, key, kTime + later}, kept));
    return kept;
  }
  [[nodiscard]] std::string file(const std::string& name) const { return contents_of(folder_ / name); }
  [[nodiscard]] const TemporaryFolder& folder() const { return folder_; }

 private:
  TemporaryFolder folder_;
};

TEST_F(FilesOfARecording, WithoutSegmentsIsOneOfTheNameGiven) {
  RecordingFiles one = files(std::nullopt);
  EXPECT_EQ(one.count(), 0U);
  EXPECT_TRUE(write(one, 'K', true, seconds(0)));
  EXPECT_TRUE(write(one, 'd', false, seconds(1)));
  EXPECT_TRUE(write(one, 'K', true, seconds(100000)));
  EXPECT_FALSE(one.close());
  EXPECT_EQ(file("live.h264"), "KdK");
  EXPECT_EQ(one.count(), 1U);
}

TEST_F(FilesOfARecording, BeginsWithTheFirstKeyPictureAfterEachLoss) {
  RecordingFiles one = files(std::nullopt);
  EXPECT_FALSE(write(one, 'd', false, seconds(0)));
  EXPECT_EQ(one.count(), 0U);
  EXPECT_TRUE(write(one, 'K', true, seconds(1)));
  one.miss();
  EXPECT_FALSE(write(one, 'd', false, seconds(2)));
  EXPECT_TRUE(write(one, 'L', true, seconds(3)));
  EXPECT_FALSE(one.close());
  EXPECT_EQ(file("live.h264"), "KL");
}

TEST_F(FilesOfARecording, ASegmentEndsWithTheFirstKeyPictureAfterItsLength) {
  RecordingFiles many = files(seconds(2));
  write(many, 'K', true, seconds(0));
  write(many, 'd', false, seconds(1));
  write(many, 'L', true, microseconds(1999999));
  write(many, 'e', false, seconds(5));
  write(many, 'M', true, seconds(6));
  EXPECT_EQ(many.path(), folder() / "live-20240201T000005Z.h264");
  EXPECT_FALSE(many.close());
  EXPECT_EQ(file("live-20240131T235959Z.h264"), "KdLe");
  EXPECT_EQ(file("live-20240201T000005Z.h264"), "M");
  EXPECT_EQ(many.count(), 2U);
}

TEST_F(FilesOfARecording, ASegmentOfExactlyItsLengthIsWhole) {
  RecordingFiles many = files(seconds(2));
  write(many, 'K', true, seconds(0));
  write(many, 'L', true, seconds(2));
  EXPECT_EQ(many.count(), 2U);
}

TEST_F(FilesOfARecording, AnotherStreamBeginsAFileAndReplacesNone) {
  RecordingFiles files = this->files(std::nullopt);
  (void)folder().make_file("live-20240201T000000Z.h264", "former");
  write(files, 'K', true, seconds(0));
  files.begin_anew();
  EXPECT_FALSE(write(files, 'd', false, seconds(1)));
  EXPECT_TRUE(write(files, 'L', true, seconds(1)));
  EXPECT_TRUE(write(files, 'J', true, seconds(1), Codec::kJpeg));
  EXPECT_FALSE(files.close());
  EXPECT_EQ(file("live.h264"), "K");
  EXPECT_EQ(file("live-20240201T000000Z.h264"), "former");
  EXPECT_EQ(file("live-20240201T000000Z-2.h264"), "L");
  EXPECT_EQ(file("live-20240201T000000Z-3.h264"), "J");
}

TEST_F(FilesOfARecording, AFileThatCannotBeWrittenIsReported) {
  RecordingFiles one("/dev/full", std::nullopt,
                     [](const std::string& path) { return std::make_unique<FrameFile>(path); });
  bool kept = false;
  const auto problem = one.write({reinterpret_cast<const unsigned char*>("K"), 1, Codec::kH264, true, kTime}, kept);
  ASSERT_TRUE(problem);
  EXPECT_EQ(problem->text, "cannot write /dev/full: No space left on device");
}

TEST(NameWithTime, HasTheTimeBeforeTheNamesEnd) {
  EXPECT_EQ(name_with_time("a.mp4", kTime), "a-20240131T235959Z.mp4");
  EXPECT_EQ(name_with_time("a", kTime), "a-20240131T235959Z");
  EXPECT_EQ(name_with_time("no/such.d/a", kTime), "no/such.d/a-20240131T235959Z");
  EXPECT_EQ(name_with_time("no/.hidden", kTime), "no/.hidden-20240131T235959Z");
  EXPECT_EQ(name_with_time("a.b.mkv", kTime), "a.b-20240131T235959Z.mkv");
}

}  // namespace
}  // namespace vexa::host
