// SPDX-License-Identifier: Apache-2.0
// The hosts to copy from: they record, and give their reasons when they cannot.
#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

vexa::camera::CameraOptions options_at(unsigned address) {
  vexa::camera::CameraOptions options;
  options.address = own_loopback(address);
  options.http_port = 80;
  options.clip_path = VEXA_CLIPS "/small.h264";
  options.speed = 4;
  return options;
}

class ExampleHosts : public WithCamera {
 protected:
  ProgramResult run_example(const std::string& name, std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), VEXA_BINARY_DIR "/bin/" + name);
    const ProgramResult result = ProgramRun(folder(), std::move(arguments)).wait();
    EXPECT_FALSE(is_there(folder() / "Log.txt"));
    return result;
  }
};

TEST_F(ExampleHosts, TheRawHostRecordsLiveVideo) {
  vexa::camera::VirtualCamera camera(options_at(3));
  ASSERT_TRUE(camera.start()) << camera.error();
  const ProgramResult result = run_example("raw-host", {own_loopback(3), "50", "live.h264"});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.err, "");
  EXPECT_TRUE(contents_of(folder() / "live.h264") == pictures(50));
}

TEST_F(ExampleHosts, TheRawHostGivesItsReasons) {
  const struct {
    const char* what;
    vexa::camera::RequestFault fault;
    const char* message;
  } cases[] = {
      {"unauthorized", vexa::camera::RequestFault::status("inq=camera", "401 Unauthorized"),
       "cannot set the codec: Unauthorized (code -201)\n"},
      {"refused", vexa::camera::RequestFault::status("SETUP", "453 Not Enough Bandwidth"),
       "start 1 of 3: Not Enough Bandwidth (code -103)\n"
       "start 2 of 3: Not Enough Bandwidth (code -103)\n"
       "no more video: Not Enough Bandwidth (code -103)\n"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.what);
    auto options = options_at(3);
    options.request_faults = {row.fault};
    vexa::camera::VirtualCamera camera(options);
    ASSERT_TRUE(camera.start()) << camera.error();
    const ProgramResult result = run_example("raw-host", {own_loopback(3), "50", "live.h264"});
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.err, row.message);
  }
}

TEST_F(ExampleHosts, TheWallHostTakesFrom32CamerasInOneThread) {
  constexpr unsigned kCameras = 4;
  constexpr unsigned kSessions = 8;
  std::vector<std::unique_ptr<vexa::camera::VirtualCamera>> cameras;
  std::vector<std::string> arguments = {"10"};
  for (unsigned i = 0; i < kCameras; ++i) {
    cameras.push_back(std::make_unique<vexa::camera::VirtualCamera>(options_at(4 + i)));
    ASSERT_TRUE(cameras.back()->start()) << cameras.back()->error();
    arguments.insert(arguments.end(), kSessions, own_loopback(4 + i));
  }
  const ProgramResult result = run_example("wall-host", arguments);
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_THAT(result.err, testing::MatchesRegex("32 of 32 cameras, [0-9]+ bytes\n"));
}

TEST_F(ExampleHosts, TheWallHostGoesOnWithoutACameraThatDoesNotAnswer) {
  vexa::camera::VirtualCamera camera(options_at(3));
  ASSERT_TRUE(camera.start()) << camera.error();
  const ProgramResult result = run_example("wall-host", {"5", own_loopback(9), own_loopback(3)});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_THAT(result.err, testing::MatchesRegex(own_loopback(9) + ": cannot open the video: Connection refused " +
                                                "\\(code 0\\)\n1 of 2 cameras, [0-9]+ bytes\n"));
}

}  // namespace
}  // namespace vexa_test
