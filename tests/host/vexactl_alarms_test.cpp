// SPDX-License-Identifier: Apache-2.0
// vexactl io, output, watch, detection, tampering and audio-detection, against a virtual camera of a model.
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using Kind = vexa::camera::AlarmEvent::Kind;

class AlarmsByCommand : public WithCamera {
 protected:
  void start_model(const std::string& model) {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
    options.speed = 10;
    start_camera(options);
  }
  void happen(Kind kind, int number, int value) { ASSERT_TRUE(camera().alarms().happen({kind, number, value})); }

  bool was_asked(const std::string& text) {
    for (const auto& request : camera().journal().snapshot()) {
      if (request.bytes.find(text) != std::string::npos) return true;
    }
    return false;
  }
};

TEST_F(AlarmsByCommand, IoShowsPinsAndStates) {
  start_model("LMX-M300");
  happen(Kind::kContact, 2, 1);
  const ProgramResult result = run({"io", place()});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(result.out,
            " 1  input      on   inactive\n"
            " 2  input      on   active\n"
            " 1  output     on   not reported\n"
            " 2  output     on   not reported\n"
            " 3  tampering  off  inactive\n"
            " 4  audio      off  inactive\n");
  EXPECT_TRUE(was_asked("AlarmData=off"));
}

TEST_F(AlarmsByCommand, IoIsJsonForScripts) {
  start_model("LMX-C100");
  const ProgramResult result = run({"io", place(), "--json"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(nlohmann::json::parse(result.out), nlohmann::json::parse(R"([
    {"pin": 1, "kind": "input", "enabled": true, "state": "inactive"},
    {"pin": 1, "kind": "output", "enabled": true, "state": null}])"));
}

TEST_F(AlarmsByCommand, OutputIsSwitched) {
  start_model("LMX-M300");
  const ProgramResult on = run({"output", place(), "2", "on"});
  EXPECT_EQ(on.exit_code, 0);
  EXPECT_EQ(on.err, "vexactl: output 2 of " + place() + " is switched on\n");
  EXPECT_TRUE(was_asked("/command/main.cgi?Trigger=alarmout2on "));
  EXPECT_EQ(run({"output", place(), "2", "off"}).exit_code, 0);
  EXPECT_TRUE(was_asked("/command/main.cgi?Trigger=alarmout2off "));
}

TEST_F(AlarmsByCommand, AnOutputThatTheModelLacksIsRefused) {
  start_model("LMX-M300");
  ProgramResult result = run({"output", place(), "9", "on"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err, "vexactl: cameras of model LMX-M300 have no output 9\n  They have outputs 1 to 2.\n");
  start_model("LMX-C100");
  result = run({"output", place(), "2", "on"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err, "vexactl: cameras of model LMX-C100 have no output 2\n  They have one, 1.\n");
  EXPECT_FALSE(was_asked("Trigger="));
}

TEST_F(AlarmsByCommand, ATableOfPinsHasAHeadingOnATerminal) {
  start_model("LMX-C100");
  ReadRun io(folder(), vexactl({"io", place()}), kCredentials, ReadRun::Reader::kTerminal);
  EXPECT_EQ(io.read_lines(),
            " #  kind       on   state\n"
            " 1  input      on   inactive\n"
            " 1  output     on   not reported\n");
  EXPECT_EQ(io.program().wait().exit_code, 0);
}

TEST_F(AlarmsByCommand, MistakesAreRefusedBeforeTheCameraIsAsked) {
  start_model("LMX-M300");
  for (const std::vector<std::string>& arguments : {std::vector<std::string>{"output", place(), "0", "on"},
                                                    {"output", place(), "1", "up"},
                                                    {"output", place(), "x", "on"},
                                                    {"output", place()},
                                                    {"tampering", place(), "maybe"},
                                                    {"tampering", place(), "on", "--level", "extreme"},
                                                    {"audio-detection", place(), "loud"},
                                                    {"detection", place(), "draw"},
                                                    {"detection", place(), "set", "--sensitivity", "101"},
                                                    {"detection", place(), "set", "--window", "5"},
                                                    {"watch", place(), "--count", "0"}}) {
    EXPECT_EQ(run(arguments).exit_code, 1) << testing::PrintToString(arguments);
  }
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

TEST_F(AlarmsByCommand, WatchShowsALineForEachAlarm) {
  start_model("LMX-M300");
  ProgramRun watch(folder(), vexactl({"watch", place(), "--count", "3"}), kCredentials);
  // The present states are asked for after the stream is open: what happens before is in both.
  ASSERT_TRUE(eventually([&] { return was_asked("inq=sensor"); }));
  happen(Kind::kContact, 2, 1);
  happen(Kind::kContact, 2, 0);
  happen(Kind::kMotion, 1, 9);
  const ProgramResult result = watch.wait();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_THAT(result.out, testing::MatchesRegex(R"(....-..-..T..:..:..\....Z   2  input      active
....-..-..T..:..:..\....Z   2  input      inactive
....-..-..T..:..:..\....Z   3  motion     active
)"));
}

TEST_F(AlarmsByCommand, WatchGivesJsonLinesAndMetadata) {
  start_model("LMX-P200");
  happen(Kind::kMotion, 3, 9);
  const ProgramResult result = run({"watch", place(), "--count", "4", "--json", "--metadata"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  std::size_t frames = 0;
  std::size_t from = 0;
  for (std::size_t end = 0; (end = result.out.find('\n', from)) != std::string::npos; from = end + 1) {
    const auto line = nlohmann::json::parse(result.out.substr(from, end - from));
    EXPECT_EQ(line.at("time").get<std::string>().size(), 24U);
    if (line.at("kind") != "metadata") continue;
    EXPECT_EQ(line.at("windows"), nlohmann::json({0, 0, 9, 0}));
    ++frames;
  }
  EXPECT_GE(frames, 3U);
}

TEST_F(AlarmsByCommand, WatchEndsWhenNobodyReadsItAnyMoreThoughNoAlarmComes) {
  start_model("LMX-M300");
  ReadRun watch(folder(), vexactl({"watch", place()}), kCredentials, ReadRun::Reader::kPipe);
  ASSERT_TRUE(eventually([&] { return was_asked("inq=sensor"); }));
  watch.stop_reading();
  EXPECT_EQ(watch.program().wait().exit_code, 5);
  EXPECT_TRUE(was_asked("AlarmData=off"));
}

TEST_F(AlarmsByCommand, WatchEndsWithCtrlC) {
  start_model("LMX-M300");
  ProgramRun watch(folder(), vexactl({"watch", place()}), kCredentials);
  ASSERT_TRUE(eventually([&] { return was_asked("inq=sensor"); }));
  happen(Kind::kContact, 2, 1);
  ASSERT_TRUE(eventually([&] { return !contents_of(folder() / ".out").empty(); }));
  watch.signal(SIGINT);
  EXPECT_EQ(watch.wait().exit_code, 130);
  EXPECT_TRUE(was_asked("AlarmData=off"));
}

TEST_F(AlarmsByCommand, DetectionOfASimpleCameraIsSetAndShown) {
  start_model("LMX-M300");
  EXPECT_EQ(run({"detection", place(), "set", "--size", "large", "--sensitivity", "77"}).exit_code, 0);
  EXPECT_TRUE(was_asked("/command/lod.cgi?LODMinObjectSize=large&LODSensitivity=77 "));
  const ProgramResult shown = run({"detection", place(), "show", "--json"});
  EXPECT_EQ(nlohmann::json::parse(shown.out), nlohmann::json::parse(R"({"size": "large", "sensitivity": 77})"));
  EXPECT_EQ(run({"detection", place(), "show"}).out, "size         large\nsensitivity  77\n");
}

TEST_F(AlarmsByCommand, DetectionByWindowsIsSetAndShown) {
  start_model("LMX-P200");
  const ProgramResult set = run({"detection", place(), "set", "--window", "2", "--area", "10", "20", "30", "40",
                                 "--enabled", "on", "--mode", "mask", "--sensitivity", "33"});
  EXPECT_EQ(set.exit_code, 0) << set.err;
  EXPECT_TRUE(was_asked("Od99Win2=on&Od99Win2Area=10,20,30,40&Od99Win2Mode=mask "));
  const auto shown = nlohmann::json::parse(run({"detection", place(), "show", "--json"}).out);
  ASSERT_EQ(shown.size(), 1U);
  EXPECT_EQ(shown[0].at("number"), 99);
  EXPECT_EQ(shown[0].at("sensitivity"), 33);
  EXPECT_EQ(shown[0].at("windows")[1],
            nlohmann::json::parse(R"({"enabled": true, "mode": "mask", "area": [[10, 20], [30, 40]]})"));
  EXPECT_THAT(run({"detection", place(), "show"}).out,
              testing::AllOf(testing::StartsWith("setting 99: sensitivity 33, objects of "),
                             testing::HasSubstr("\n  window 2  on   mask    10,20 30,40\n")));
}

TEST_F(AlarmsByCommand, DetectorsAreSwitched) {
  start_model("LMX-M300");
  EXPECT_EQ(run({"tampering", place(), "on", "--level", "high"}).exit_code, 0);
  EXPECT_TRUE(was_asked("/command/system.cgi?TamperingFunc=on&TamperingLevel=high "));
  EXPECT_EQ(run({"audio-detection", place(), "on"}).exit_code, 0);
  EXPECT_TRUE(was_asked("/command/audiodetection.cgi?ADFunc=on "));
}

TEST_F(AlarmsByCommand, ADetectorThatTheModelLacksIsRefused) {
  start_model("LMX-C100");
  const ProgramResult result = run({"audio-detection", place(), "on"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_NE(result.err.find("have no audio detection"), std::string::npos) << result.err;
  expect_no_password(result);
}

}  // namespace
}  // namespace vexa_test
