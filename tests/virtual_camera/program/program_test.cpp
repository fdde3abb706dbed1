// SPDX-License-Identifier: Apache-2.0
// The program vexa-camera: its command line, and one run from start to Ctrl-C.
#include <gtest/gtest.h>
#include <signal.h>
#include <spawn.h>
#include <sys/wait.h>

#include <array>
#include <cstdlib>
#include <fstream>
#include <iterator>
#include <string>
#include <vector>

#include "tests/support/temporary_folder.h"
#include "tests/virtual_camera/camera_client.h"
#include "virtual_camera/program/command_line.h"

extern char** environ;

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

CommandLine parse(std::vector<const char*> arguments) {
  arguments.insert(arguments.begin(), "vexa-camera");
  return parse_command_line(static_cast<int>(arguments.size()), arguments.data());
}

TEST(CommandLine, WithoutArgumentsItIsOneCameraOnTheUsualPorts) {
  const CommandLine line = parse({});
  ASSERT_FALSE(line.exit_code);
  EXPECT_EQ(line.options.count, 1U);
  EXPECT_EQ(line.options.camera.address, "127.0.0.2");
  EXPECT_EQ(line.options.camera.http_port, 80);
  EXPECT_EQ(line.options.camera.rtsp_port, 554);
  EXPECT_EQ(line.options.camera.user, "admin");
  EXPECT_EQ(line.options.camera.password, "admin");
  EXPECT_TRUE(line.options.camera.loop);
  EXPECT_EQ(line.options.camera.session_expiry, SessionExpiry::kNever);
  EXPECT_TRUE(line.options.camera.request_faults.empty());
}

TEST(CommandLine, EveryPacketFaultHasAnOption) {
  const CommandLine line = parse({"--loss",
                                  "0.1",
                                  "--burst-loss",
                                  "0.2",
                                  "--burst-length",
                                  "3",
                                  "--reorder",
                                  "0.3",
                                  "--reorder-distance",
                                  "4",
                                  "--duplicate",
                                  "0.4",
                                  "--duplicate-distance",
                                  "5",
                                  "--delay",
                                  "0.5",
                                  "--delay-ms",
                                  "60",
                                  "--corrupt",
                                  "0.6",
                                  "--corrupt-bits",
                                  "7",
                                  "--corrupt-header",
                                  "0.7",
                                  "--missing-marker",
                                  "0.8",
                                  "--restart-sequence",
                                  "10=500",
                                  "--restart-sequence",
                                  "20",
                                  "--restart-timestamp",
                                  "30=4294967295",
                                  "--seed",
                                  "9"});
  ASSERT_FALSE(line.exit_code);
  const PacketFaults& faults = line.options.camera.packet_faults;
  EXPECT_EQ(faults.loss, 0.1);
  EXPECT_EQ(faults.burst_loss, 0.2);
  EXPECT_EQ(faults.burst_length, 3U);
  EXPECT_EQ(faults.reorder, 0.3);
  EXPECT_EQ(faults.reorder_distance, 4U);
  EXPECT_EQ(faults.duplicate, 0.4);
  EXPECT_EQ(faults.duplicate_distance, 5U);
  EXPECT_EQ(faults.delay, 0.5);
  EXPECT_EQ(faults.delay_time, milliseconds(60));
  EXPECT_EQ(faults.corrupt_payload, 0.6);
  EXPECT_EQ(faults.corrupt_bits, 7U);
  EXPECT_EQ(faults.corrupt_header, 0.7);
  EXPECT_EQ(faults.missing_marker, 0.8);
  ASSERT_EQ(faults.sequence_restarts.size(), 2U);
  EXPECT_EQ(faults.sequence_restarts[0].picture, 10U);
  EXPECT_EQ(faults.sequence_restarts[0].value, 500);
  EXPECT_EQ(faults.sequence_restarts[1].value, std::nullopt);
  ASSERT_EQ(faults.timestamp_restarts.size(), 1U);
  EXPECT_EQ(faults.timestamp_restarts[0].value, 4294967295U);
  EXPECT_EQ(line.options.camera.seed, 9U);
}

TEST(CommandLine, EveryRequestFaultHasAnOption) {
  const struct {
    std::vector<const char*> arguments;
    FaultAction action;
    int time;
    std::size_t bytes;
    std::string text;
    bool hold;
  } cases[] = {{{"--no-answer", "PLAY#2"}, FaultAction::kNoAnswer, 0, 0, "", false},
               {{"--slow-answer", "PLAY#2", "70"}, FaultAction::kSlowAnswer, 70, 0, "", false},
               {{"--byte-at-a-time", "PLAY#2", "5"}, FaultAction::kByteAtATime, 5, 0, "", false},
               {{"--cut-answer", "PLAY#2", "9"}, FaultAction::kCutAfter, 0, 9, "", false},
               {{"--stall-answer", "PLAY#2", "9"}, FaultAction::kCutAfter, 0, 9, "", true},
               {{"--reset", "PLAY#2"}, FaultAction::kReset, 0, 0, "", false},
               {{"--status", "PLAY#2", "503 Busy"}, FaultAction::kStatus, 0, 0, "503 Busy", false},
               {{"--raw-answer", "PLAY#2", "a\\r\\nb\\\\"}, FaultAction::kRaw, 0, 0, "a\r\nb\\", false},
               {{"--wrong-credentials", "PLAY#2"}, FaultAction::kWrongCredentials, 0, 0, "", false},
               {{"--reboot", "PLAY#2", "3000"}, FaultAction::kReboot, 3000, 0, "", false}};
  for (const auto& c : cases) {
    const CommandLine line = parse(c.arguments);
    ASSERT_FALSE(line.exit_code) << c.arguments[0];
    ASSERT_EQ(line.options.camera.request_faults.size(), 1U) << c.arguments[0];
    const RequestFault& fault = line.options.camera.request_faults[0];
    EXPECT_EQ(fault.match, "PLAY");
    EXPECT_EQ(fault.occurrence, 2U);
    EXPECT_EQ(fault.action, c.action) << c.arguments[0];
    EXPECT_EQ(fault.time.count(), c.time) << c.arguments[0];
    EXPECT_EQ(fault.bytes, c.bytes) << c.arguments[0];
    EXPECT_EQ(fault.text, c.text) << c.arguments[0];
    EXPECT_EQ(fault.hold, c.hold) << c.arguments[0];
  }
}

TEST(CommandLine, EveryFaultOfAnHttpStreamHasAnOption) {
  using Action = HttpStreamFault::Action;
  const struct {
    std::vector<const char*> arguments;
    Action action;
    std::string text;
    std::size_t bytes;
    int time;
  } cases[] = {{{"--part-length", "3", "many"}, Action::kDataLength, "many", 0, 0},
               {{"--no-part-length", "3"}, Action::kNoDataLength, "", 0, 0},
               {{"--before-picture", "3", "a\\r\\nb"}, Action::kBefore, "a\r\nb", 0, 0},
               {{"--cut-picture", "3", "500"}, Action::kCut, "", 500, 0},
               {{"--close-stream", "3", "500"}, Action::kClose, "", 500, 0},
               {{"--silence-stream", "3", "500"}, Action::kSilence, "", 500, 0},
               {{"--pause-stream", "3", "70"}, Action::kPause, "", 0, 70},
               {{"--other-clip", "3", "b.m4v"}, Action::kOtherClip, "b.m4v", 0, 0}};
  for (const auto& c : cases) {
    const CommandLine line = parse(c.arguments);
    ASSERT_FALSE(line.exit_code) << c.arguments[0];
    ASSERT_EQ(line.options.camera.stream_faults.size(), 1U) << c.arguments[0];
    const HttpStreamFault& fault = line.options.camera.stream_faults[0];
    EXPECT_EQ(fault.index, 3U) << c.arguments[0];
    EXPECT_EQ(fault.action, c.action) << c.arguments[0];
    EXPECT_EQ(fault.text, c.text) << c.arguments[0];
    EXPECT_EQ(fault.bytes, c.bytes) << c.arguments[0];
    EXPECT_EQ(fault.time.count(), c.time) << c.arguments[0];
  }
  EXPECT_EQ(parse({"--stream-piece", "7"}).options.camera.stream_piece, 7U);
  EXPECT_EQ(parse({"--cut-picture", "x", "5"}).exit_code, 2);
  EXPECT_EQ(parse({"--pause-stream", "3", "-5"}).exit_code, 2);
}

TEST(CommandLine, StreamOptionsReachTheCamera) {
  const CommandLine line = parse({"--once",
                                  "--pictures",
                                  "7",
                                  "--fps",
                                  "30",
                                  "--speed",
                                  "4",
                                  "--max-payload",
                                  "900",
                                  "--start-sequence",
                                  "65535",
                                  "--start-timestamp",
                                  "4294967295",
                                  "--session-timeout",
                                  "5",
                                  "--range-clock",
                                  "20240131T235959.250Z",
                                  "--lock-after",
                                  "5",
                                  "--count",
                                  "3"});
  ASSERT_FALSE(line.exit_code);
  const CameraOptions& camera = line.options.camera;
  EXPECT_FALSE(camera.loop);
  EXPECT_EQ(camera.pictures, 7U);
  EXPECT_EQ(camera.frames_per_second, 30);
  EXPECT_EQ(camera.speed, 4);
  EXPECT_EQ(camera.max_payload, 900U);
  EXPECT_EQ(camera.start_sequence, 65535);
  EXPECT_EQ(camera.start_timestamp, 4294967295U);
  EXPECT_EQ(camera.session_timeout.count(), 5);
  EXPECT_EQ(camera.session_expiry, SessionExpiry::kWhenSilent);
  EXPECT_EQ(camera.range_clock, "20240131T235959.250Z");
  EXPECT_EQ(camera.lock_after, 5U);
  EXPECT_EQ(line.options.count, 3U);
}

TEST(CommandLine, HelpEndsWellAndMistakesEndWithTwo) {
  EXPECT_EQ(parse({"--help"}).exit_code, 0);
  const std::vector<const char*> mistakes[] = {{"--nonsense"},
                                               {"--loss", "2"},
                                               {"--loss", "x"},
                                               {"--rtsp-port", "65536"},
                                               {"--count", "0"},
                                               {"--speed", "0"},
                                               {"--clip", "/nowhere/clip"},
                                               {"--password-file", "/nowhere/file"},
                                               {"--fleet", "2", "--count", "2"},
                                               {"--cameras-file", "cameras.json"},
                                               {"--max-viewers", "0"},
                                               {"--cut-answer", "PLAY", "-1"},
                                               {"--slow-answer", "PLAY"},
                                               {"--slow-answer", "PLAY", "soon"},
                                               {"--no-answer", "PLAY#x"},
                                               {"--restart-sequence", "1=65536"},
                                               {"--restart-sequence", "=1"}};
  for (const auto& mistake : mistakes) EXPECT_EQ(parse(mistake).exit_code, 2) << mistake[0];
}

// The program as a child process, one of its outputs on a pipe.
class Program {
 public:
  // `channel` is what line() reads: the program's output, or its error output.
  explicit Program(std::vector<std::string> arguments, int channel = STDOUT_FILENO) {
    std::array<int, 2> ends{};
    EXPECT_EQ(::pipe(ends.data()), 0);
    posix_spawn_file_actions_t actions;
    posix_spawn_file_actions_init(&actions);
    posix_spawn_file_actions_adddup2(&actions, ends[1], channel);
    posix_spawn_file_actions_addclose(&actions, ends[0]);
    posix_spawn_file_actions_addclose(&actions, ends[1]);
    arguments.insert(arguments.begin(), std::string(VEXA_BINARY_DIR) + "/bin/vexa-camera");
    std::vector<char*> words;
    for (std::string& argument : arguments) words.push_back(argument.data());
    words.push_back(nullptr);
    EXPECT_EQ(::posix_spawn(&id_, words[0], &actions, nullptr, words.data(), environ), 0);
    posix_spawn_file_actions_destroy(&actions);
    ::close(ends[1]);
    out_ = ends[0];
  }
  ~Program() { ::close(out_); }
  Program(const Program&) = delete;
  Program& operator=(const Program&) = delete;

  std::string line() {
    std::string text;
    char c = 0;
    pollfd waiting{out_, POLLIN, 0};
    while (::poll(&waiting, 1, kPatience) == 1 && ::read(out_, &c, 1) == 1 && c != '\n') text += c;
    return text;
  }

  int end_by(int signal) {
    if (signal != 0) ::kill(id_, signal);
    int status = 0;
    ::waitpid(id_, &status, 0);
    return WIFEXITED(status) ? WEXITSTATUS(status) : -1;
  }

 private:
  pid_t id_ = 0;
  int out_ = -1;
};

std::uint16_t http_port_of(const std::string& line) {
  return static_cast<std::uint16_t>(std::stoul(line.substr(line.rfind(':', line.find(' ')) + 1)));
}

TEST(Program, AnnouncesItsCamerasServesJournalsAndEndsOnASignal) {
  std::string journal = testing::TempDir() + "vexa-camera-XXXXXX";
  const int file = ::mkstemp(journal.data());
  ASSERT_GE(file, 0);
  ::close(file);
  Program program({"--address", own_loopback(1), "--count", "2", "--http-port", "0", "--rtsp-port", "0", "--journal",
                   journal, "--password", "secret"});
  const std::string first = program.line();
  const std::string second = program.line();
  ASSERT_EQ(first.substr(0, 7 + own_loopback(1).size()), "http://" + own_loopback(1));
  EXPECT_NE(first.find(" rtsp://" + own_loopback(1) + ":"), std::string::npos);
  EXPECT_EQ(first.substr(first.size() - 13), "/media/video1");
  ASSERT_EQ(second.substr(0, 7), "http://");
  Client client(own_loopback(1), http_port_of(first));
  client.send("GET /command/inquiry.cgi?inq=system HTTP/1.0\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n");
  EXPECT_EQ(client.read_to_end().substr(0, 15), "HTTP/1.0 200 OK");
  EXPECT_EQ(program.end_by(SIGINT), 0);
  std::ifstream written(journal);
  const std::string text{std::istreambuf_iterator<char>(written), std::istreambuf_iterator<char>()};
  EXPECT_NE(text.find("\"request\":\"GET /command/inquiry.cgi?inq=system HTTP/1.0\\r\\n"), std::string::npos);
  EXPECT_EQ(text.back(), '\n');
  ::unlink(journal.c_str());
}

TEST(Program, EndsByItselfAfterItsDuration) {
  Program program({"--address", own_loopback(1), "--http-port", "0", "--rtsp-port", "0", "--duration", "0.05"});
  EXPECT_NE(program.line(), "");
  EXPECT_EQ(program.end_by(0), 0);
}

TEST(Program, AnAddressThatIsNotOursEndsWithOne) {
  Program program({"--address", "192.0.2.1"});
  EXPECT_EQ(program.line(), "");
  EXPECT_EQ(program.end_by(0), 1);
}

TEST(Program, AWrongProfileEndsWithOneAndNamesFileLineAndKey) {
  const vexa_test::TemporaryFolder folder;
  const std::string wrong = folder.make_file("wrong.json", "{\n\"model\": \"T-1\",\n\"description\": 1}\n");
  Program program({"--address", own_loopback(1), "--http-port", "0", "--rtsp-port", "0", "--profile", wrong},
                  STDERR_FILENO);
  EXPECT_EQ(program.line(), "vexa-camera: " + wrong + ":3: description: must be a text");
  EXPECT_EQ(program.end_by(0), 1);
}

TEST(Program, AFleetNamesItsCamerasAndItsControlPortAndWritesTheFileOfCameras) {
  const vexa_test::TemporaryFolder folder;
  const std::string profile = std::string(VEXA_SOURCE_DIR) + "/models/profiles/VX-2000.json";
  Program program({"--fleet", "2", "--profile", profile, "--drawn", "--address", own_loopback(1), "--http-port", "0",
                   "--rtsp-port", "0", "--control-port", "0", "--cameras-file", folder / "cameras.json"});
  EXPECT_EQ(program.line().substr(0, 18 + own_loopback(1).size()), "vx-2000-1 http://" + own_loopback(1) + ":");
  EXPECT_EQ(program.line().substr(0, 17), "vx-2000-2 http://");
  EXPECT_EQ(program.line().substr(0, 25), "control http://127.0.0.1:");
  EXPECT_NE(vexa_test::contents_of(folder / "cameras.json").find("\"name\": \"vx-2000-2\""), std::string::npos);
  EXPECT_EQ(program.end_by(SIGTERM), 0);
}

TEST(Program, AFleetOfTheInstalledProfilesTakesOneAfterTheOther) {
  Program program({"--fleet", "3", "--drawn", "--address", own_loopback(1), "--http-port", "0", "--rtsp-port", "0"});
  EXPECT_EQ(program.line().substr(0, 11), "lmx-a100-1 ");
  EXPECT_EQ(program.line().substr(0, 11), "lmx-c100-2 ");
  EXPECT_EQ(program.line().substr(0, 11), "lmx-h100-3 ");
  EXPECT_EQ(program.end_by(SIGTERM), 0);
}

TEST(Program, AFleetThatCannotStartEndsWithOneAndReportsWhy) {
  const vexa_test::TemporaryFolder folder;
  const std::string wrong = folder.make_file("fleet.json", "{\"cameras\": [\n{\"colour\": 1}]}");
  Program of_a_file({"--fleet", wrong}, STDERR_FILENO);
  EXPECT_EQ(of_a_file.line(), "vexa-camera: " + wrong + ":2: colour: is no key of a camera");
  EXPECT_EQ(of_a_file.end_by(0), 1);
  Program of_a_number({"--fleet", "1001"}, STDERR_FILENO);
  EXPECT_EQ(of_a_number.line(), "vexa-camera: a fleet has 1 to 1000 cameras");
  EXPECT_EQ(of_a_number.end_by(0), 1);
}

}  // namespace
}  // namespace vexa::camera
