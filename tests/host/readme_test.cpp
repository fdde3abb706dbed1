// SPDX-License-Identifier: Apache-2.0
// The host that the README shows: it is the one that is built, and it works.
#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using FirstHost = WithCamera;
using ModelHost = WithCamera;

TEST(Readme, ShowsTheHostThatIsBuilt) {
  const std::string readme = contents_of(VEXA_SOURCE_DIR "/README.md");
  const std::string source = contents_of(VEXA_SOURCE_DIR "/host/example/first_host.cpp");
  ASSERT_NE(source, "");
  EXPECT_NE(readme.find("```cpp\n" + source + "```\n"), std::string::npos);
}

TEST_F(FirstHost, KeepsThePicturesUntilEnter) {
  vexa::camera::CameraOptions options = four_times_faster();
  options.address = own_loopback(3);
  options.http_port = 80;
  options.user = options.password = "admin";
  options.clip_path = VEXA_CLIPS "/small.h264";
  vexa::camera::VirtualCamera camera(options);
  ASSERT_TRUE(camera.start()) << camera.error();
  int keyboard[2];
  ASSERT_EQ(pipe2(keyboard, O_CLOEXEC), 0);
  ProgramRun program(folder(), {VEXA_BINARY_DIR "/bin/first-host", own_loopback(3)}, {},
                     ProgramRun::StandardError::kFile, -1, keyboard[0]);
  close(keyboard[0]);
  const auto kept = [this] { return contents_of(folder() / "live.h264").size(); };
  const std::size_t some = pictures(50).size();
  ASSERT_TRUE(eventually([&] { return kept() >= some; }));
  close(keyboard[1]);
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_THAT(result.out, testing::HasSubstr(own_loopback(3) + ":80: Live.\n"));
}

TEST_F(ModelHost, RecordsLiveVideo) {
  vexa::camera::CameraOptions options = four_times_faster();
  options.address = own_loopback(3);
  options.http_port = 80;
  options.clip_path = VEXA_CLIPS "/small.h264";
  vexa::camera::VirtualCamera camera(options);
  ASSERT_TRUE(camera.start()) << camera.error();
  ProgramRun program(folder(), {VEXA_BINARY_DIR "/bin/model-host", own_loopback(3)});
  EXPECT_EQ(program.wait().exit_code, 0);
  EXPECT_TRUE(contents_of(folder() / "live.h264") == pictures(250));
}

TEST_F(ModelHost, ReportsWhyItEndsEarly) {
  const struct {
    const char* what;
    vexa::camera::RequestFault fault;
    const char* message;
  } cases[] = {
      {"no settings", vexa::camera::RequestFault::status("inq=camera", "503 Service Unavailable"),
       "cannot read the video settings: Service Unavailable (code 0)\n"},
      {"refused", vexa::camera::RequestFault::status("SETUP", "453 Not Enough Bandwidth"),
       "cannot open the video: Not Enough Bandwidth (code -103)\n"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.what);
    vexa::camera::CameraOptions options;
    options.address = own_loopback(3);
    options.http_port = 80;
    options.clip_path = VEXA_CLIPS "/small.h264";
    options.request_faults = {row.fault};
    vexa::camera::VirtualCamera camera(options);
    ASSERT_TRUE(camera.start()) << camera.error();
    const ProgramResult result = ProgramRun(folder(), {VEXA_BINARY_DIR "/bin/model-host", own_loopback(3)}).wait();
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.err, row.message);
  }
}

TEST_F(ModelHost, EndsWhenTheCameraFallsSilent) {
  vexa::camera::CameraOptions options;
  options.address = own_loopback(3);
  options.http_port = 80;
  options.clip_path = VEXA_CLIPS "/small.h264";
  options.packet_faults.loss = 1;
  options.packet_faults.first_picture = 10;
  vexa::camera::VirtualCamera camera(options);
  ASSERT_TRUE(camera.start()) << camera.error();
  const ProgramResult result = ProgramRun(folder(), {VEXA_BINARY_DIR "/bin/model-host", own_loopback(3)}).wait();
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_THAT(result.err, testing::MatchesRegex("the video has ended early: .*\\(code -200\\)\n"));
}

}  // namespace
}  // namespace vexa_test
