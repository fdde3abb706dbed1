// The host that the README shows: it is the one that is built, and it works.
#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using FirstHost = WithCamera;

TEST(Readme, ShowsTheHostThatIsBuilt) {
  const std::string readme = contents_of(VEXA_SOURCE_DIR "/README.md");
  const std::string source = contents_of(VEXA_SOURCE_DIR "/host/example/first_host.cpp");
  ASSERT_NE(source, "");
  EXPECT_NE(readme.find("```cpp\n" + source + "```\n"), std::string::npos);
}

TEST_F(FirstHost, RecordsLiveVideo) {
  vexa::camera::CameraOptions options = four_times_faster();
  options.address = own_address(3);
  options.http_port = 80;
  options.clip_path = VEXA_CLIPS "/small.h264";
  vexa::camera::VirtualCamera camera(options);
  ASSERT_TRUE(camera.start()) << camera.error();
  ProgramRun program(folder(), {VEXA_BINARY_DIR "/bin/first-host", own_address(3)});
  EXPECT_EQ(program.wait().exit_code, 0);
  EXPECT_TRUE(contents_of(folder() / "live.h264") == pictures(250));
}

}  // namespace
}  // namespace vexa_test
