// Ctrl-C and SIGTERM at any moment.
#include <gtest/gtest.h>
#include <poll.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <random>
#include <string>
#include <thread>
#include <vector>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;
using Clock = std::chrono::steady_clock;

constexpr int kWorkers = 4;
constexpr int kUsualMoments = 24;
constexpr int kLatestMoment = 700;  // milliseconds after the program was started
// Programs end within a second of the signal; on a machine that runs many at a time they get more, which is still less
// than any wait that a signal could fail to end.
constexpr std::chrono::milliseconds kMost{4500};

/// More of them: VEXA_INTERRUPT_MOMENTS=200.
int moments() {
  const char* wanted = std::getenv("VEXA_INTERRUPT_MOMENTS");
  return wanted == nullptr ? kUsualMoments : std::atoi(wanted);
}

/// Cameras that answer everything, or leave one kind of request unanswered.
class Cameras {
 public:
  Cameras() {
    add({});
    add({RequestFault::no_answer("DESCRIBE")});
    add({RequestFault::no_answer("TEARDOWN"), RequestFault::no_answer("GET_PARAMETER")});
    add({RequestFault::no_answer("inq=system")});
    add({RequestFault::no_answer("AlarmData=on"), RequestFault::no_answer("inq=edgestorage")});
  }

  std::string place(unsigned index) const {
    const auto& camera = cameras_[index % cameras_.size()];
    return camera->address() + ":" + std::to_string(camera->http_port());
  }

 private:
  void add(std::vector<RequestFault> faults) {
    vexa::camera::CameraOptions options;
    options.address = own_address(static_cast<unsigned>(cameras_.size()) + 1);
    options.user = kUser;
    options.password = kPassword;
    options.clip_path = VEXA_CLIPS "/small.h264";
    options.request_faults = std::move(faults);
    cameras_.push_back(std::make_unique<vexa::camera::VirtualCamera>(options));
    EXPECT_TRUE(cameras_.back()->start()) << cameras_.back()->error();
  }

  std::vector<std::unique_ptr<vexa::camera::VirtualCamera>> cameras_;
};

/// One run of a program, and when it is interrupted.
struct Moment {
  std::vector<std::string> command;
  int signal;
  std::chrono::milliseconds after;
};

std::vector<std::string> command_for(const std::string& place, unsigned choice, const std::string& file) {
  const std::string vexactl = VEXA_BINARY_DIR "/bin/vexactl";
  const std::string camera = VEXA_BINARY_DIR "/bin/vexa-camera";
  const std::string timeout = "--timeout=60000";
  const std::vector<std::vector<std::string>> commands = {
      {vexactl, "info", place, timeout},
      {vexactl, "record", place, timeout, "--seconds", "60", "--out", file + ".h264"},
      {vexactl, "record", place, timeout, "--transport", "http", "--out", file + ".mjpeg"},
      {vexactl, "snapshot", place, timeout, "--out", file + ".jpg"},
      {vexactl, "watch", place, timeout},
      {vexactl, "watch", place, timeout, "--metadata"},
      {vexactl, "listen", place, timeout, "--out", file + ".wav"},
      {vexactl, "ptz", place, "watch", timeout},
      {vexactl, "ptz", place, "pan", "50", "--for", "60", timeout},
      {vexactl, "edge", place, "list", timeout},
      {camera, "--address", own_address(40 + choice % 20), "--rtsp-port", "0"},
  };
  return commands[choice % commands.size()];
}

std::vector<Moment> drawn_moments(const Cameras& cameras, const TemporaryFolder& folder) {
  std::mt19937 random(20240131);
  std::vector<Moment> drawn;
  for (int i = 0; i < moments(); ++i) {
    const std::string place = cameras.place(static_cast<unsigned>(random()));
    const auto choice = static_cast<unsigned>(random());
    const int signal = random() % 2 == 0 ? SIGINT : SIGTERM;
    const std::chrono::milliseconds after(random() % kLatestMoment);
    drawn.push_back({command_for(place, choice, folder / ("out" + std::to_string(i))), signal, after});
  }
  return drawn;
}

std::chrono::milliseconds time_to_end(const Moment& moment) {
  const TemporaryFolder folder;
  ProgramRun run(folder, moment.command, kCredentials);
  poll(nullptr, 0, static_cast<int>(moment.after.count()));
  const auto begin = Clock::now();
  run.signal(moment.signal);
  run.wait();
  return std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now() - begin);
}

std::string text_of(const Moment& moment) {
  std::string text;
  for (const std::string& word : moment.command) text += word + " ";
  return text + (moment.signal == SIGINT ? "SIGINT" : "SIGTERM") + " after " + std::to_string(moment.after.count());
}

TEST(Interruption, EndsTheProgramsAtAnyMoment) {
  const Cameras cameras;
  const TemporaryFolder folder;
  const std::vector<Moment> all = drawn_moments(cameras, folder);
  std::vector<std::chrono::milliseconds> times(all.size());
  std::atomic<std::size_t> next{0};
  std::vector<std::thread> workers;
  for (int i = 0; i < kWorkers; ++i) {
    workers.emplace_back([&] {
      for (std::size_t mine = next++; mine < all.size(); mine = next++) times[mine] = time_to_end(all[mine]);
    });
  }
  for (std::thread& worker : workers) worker.join();
  for (std::size_t i = 0; i < all.size(); ++i) EXPECT_LT(times[i], kMost) << text_of(all[i]);
  RecordProperty("longest", static_cast<int>(std::max_element(times.begin(), times.end())->count()));
}

class Interrupted : public WithCamera {};

TEST_F(Interrupted, WhileTheCameraIsAskedIsReportedAsThatAndNotAsASilentCamera) {
  vexa::camera::CameraOptions options;
  options.request_faults = {RequestFault::no_answer("DESCRIBE")};
  start_camera(options);
  ProgramRun run(folder(), vexactl({"record", place(), "--timeout", "60000", "--out", "live.h264"}), kCredentials);
  ASSERT_TRUE(eventually([&] {
    for (const auto& request : camera().journal().snapshot()) {
      if (request.bytes.rfind("DESCRIBE", 0) == 0) return true;
    }
    return false;
  }));
  run.signal(SIGINT);
  const ProgramResult result = run.wait();
  EXPECT_EQ(result.exit_code, 130);
  EXPECT_THAT(result.err, testing::HasSubstr("interrupted while the camera was asked"));
}

}  // namespace
}  // namespace vexa_test
