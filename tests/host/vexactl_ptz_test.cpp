// SPDX-License-Identifier: Apache-2.0
// vexactl ptz, preset, tour and shadow, against a virtual camera of a model.
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

class PtzByCommand : public WithCamera {
 protected:
  void start_model(const std::string& model, const std::string& user_data = "") {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
    options.user_data = user_data;
    start_camera(options);
  }

  // The commands that changed something, without the folder and what follows the path.
  std::vector<std::string> orders() {
    std::vector<std::string> found;
    for (const auto& request : camera().journal().snapshot()) {
      const std::size_t from = request.bytes.find("/command/");
      if (from == std::string::npos || request.bytes.find("inquiry.cgi") != std::string::npos) continue;
      const std::size_t begin = from + std::string("/command/").size();
      found.push_back(request.bytes.substr(begin, request.bytes.find(' ', begin) - begin));
    }
    return found;
  }
  std::string last_order() { return orders().empty() ? "" : orders().back(); }

  // `command CAMERA arguments...`
  ProgramResult act(const std::string& command, std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), {command, place()});
    return run(std::move(arguments));
  }
};

struct Order {
  std::vector<std::string> arguments;
  std::string order;
};

TEST_F(PtzByCommand, EachMoveIsOneRequestOfSignedSpeeds) {
  start_model("LMX-P200");
  for (const Order& one : {Order{{"pan", "left"}, "ptzf.cgi?ContinuousPanTiltZoom=-50,0,"},
                           {{"pan", "right", "--speed", "1"}, "ptzf.cgi?ContinuousPanTiltZoom=1,0,"},
                           {{"tilt", "up", "--speed", "100"}, "ptzf.cgi?ContinuousPanTiltZoom=0,100,"},
                           {{"tilt", "down"}, "ptzf.cgi?ContinuousPanTiltZoom=0,-50,"},
                           {{"zoom", "tele"}, "ptzf.cgi?ContinuousPanTiltZoom=,,50"},
                           {{"zoom", "wide", "--speed", "7"}, "ptzf.cgi?ContinuousPanTiltZoom=,,-7"},
                           {{"zoom", "tele", "--step", "50"}, "ptzf.cgi?RelativeZoom=0800"},
                           {{"zoom", "wide", "--step", "100"}, "ptzf.cgi?RelativeZoom=FFFFF000"},
                           {{"zoom", "1"}, "ptzf.cgi?AbsoluteZoom=0000"},
                           {{"zoom", "30x"}, "ptzf.cgi?AbsoluteZoom=7AC0"},
                           {{"focus", "auto"}, "camera.cgi?FocusMode=auto"},
                           {{"focus", "manual"}, "camera.cgi?FocusMode=manual"},
                           {{"focus", "near", "--speed", "100"}, "ptzf.cgi?Move=near,8"},
                           {{"focus", "far", "--speed", "1"}, "ptzf.cgi?Move=far,1"},
                           {{"focus", "0"}, "ptzf.cgi?AbsoluteFocus=1000"},
                           {{"focus", "100"}, "ptzf.cgi?AbsoluteFocus=F000"},
                           {{"goto", "-45", "90"}, "ptzf.cgi?AbsolutePanTilt=FFFFE3E0,3840,24"},
                           {{"goto", "0", "0", "--scale"}, "ptzf.cgi?AbsolutePanTilt=FFFF8F80,FFFFF6A0,24"},
                           {{"area", "100", "100"}, "ptzf.cgi?AreaZoom=959,539,0,0,image1"},
                           {{"area", "50", "0", "25.5", "10"}, "ptzf.cgi?AreaZoom=0,-540,489,108,image1"}}) {
    SCOPED_TRACE(testing::PrintToString(one.arguments));
    const std::size_t before = orders().size();
    const ProgramResult result = act("ptz", one.arguments);
    EXPECT_EQ(result.exit_code, 0) << result.err;
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(orders().size(), before + 1);
    EXPECT_EQ(last_order(), one.order);
  }
}

TEST_F(PtzByCommand, CamerasOfDirectionWordsGetWords) {
  start_model("LMX-P100");
  EXPECT_EQ(act("ptz", {"pan", "left", "--speed", "100"}).exit_code, 0);
  EXPECT_EQ(last_order(), "ptzf.cgi?Move=left,24");
  EXPECT_EQ(act("ptz", {"zoom", "wide"}).exit_code, 0);
  EXPECT_EQ(last_order(), "ptzf.cgi?Move=wide,4");
  EXPECT_EQ(act("ptz", {"tilt", "up", "--speed", "5"}).exit_code, 0);
  EXPECT_EQ(last_order(), "ptzf.cgi?Move=up,1");
  const ProgramResult slow = act("ptz", {"tilt", "up", "--speed", "4"});
  EXPECT_EQ(slow.exit_code, 1);
  EXPECT_EQ(slow.err,
            "vexactl: the camera does not move as slowly as 4 percent\n"
            "  It has 24 speeds: --speed 5 is the slowest.\n");
}

TEST_F(PtzByCommand, AMoveForATimeEndsWithItsStop) {
  start_model("LMX-P200");
  EXPECT_EQ(act("ptz", {"pan", "left", "--for", "0.01"}).exit_code, 0);
  EXPECT_EQ(act("ptz", {"zoom", "tele", "--for", "0.01"}).exit_code, 0);
  EXPECT_EQ(act("ptz", {"focus", "near", "--for", "0.01"}).exit_code, 0);
  EXPECT_EQ(orders(),
            (std::vector<std::string>{"ptzf.cgi?ContinuousPanTiltZoom=-50,0,", "ptzf.cgi?ContinuousPanTiltZoom=0,0,",
                                      "ptzf.cgi?ContinuousPanTiltZoom=,,50", "ptzf.cgi?ContinuousPanTiltZoom=,,0",
                                      "ptzf.cgi?Move=near,4", "ptzf.cgi?Move=stop,focus"}));
}

TEST_F(PtzByCommand, CtrlCStopsAMoveForATime) {
  start_model("LMX-P200");
  ProgramRun move(folder(), vexactl({"ptz", place(), "pan", "left", "--for", "600"}), kCredentials);
  ASSERT_TRUE(eventually([&] { return last_order() == "ptzf.cgi?ContinuousPanTiltZoom=-50,0,"; }));
  move.signal(SIGINT);
  EXPECT_EQ(move.wait().exit_code, 130);
  EXPECT_EQ(last_order(), "ptzf.cgi?ContinuousPanTiltZoom=0,0,");
}

TEST_F(PtzByCommand, StopEndsEveryMotionThatTheModelHas) {
  start_model("LMX-C100");
  EXPECT_EQ(act("ptz", {"stop"}).exit_code, 0);
  EXPECT_EQ(orders(), (std::vector<std::string>{"ptzf.cgi?Move=stop,motor", "ptzf.cgi?Move=stop,zoom"}));
}

TEST_F(PtzByCommand, WhatTheModelCannotDoIsRefused) {
  start_model("LMX-C100");
  EXPECT_EQ(act("ptz", {"focus", "auto"}).err,
            "vexactl: cameras of model LMX-C100 have no focus motor\n"
            "  vexactl profile show lists what a model has.\n");
  EXPECT_EQ(act("ptz", {"zoom", "19"}).err,
            "vexactl: the zoom is out of the lens's range\n  It magnifies 1 to 18 times.\n");
  EXPECT_EQ(act("ptz", {"goto", "0", "0", "--zoom", "19"}).exit_code, 1);
  EXPECT_EQ(act("ptz", {"goto", "181", "0"}).exit_code, 1);
  EXPECT_EQ(act("ptz", {"goto", "0", "-91"}).exit_code, 1);
  EXPECT_EQ(act("preset", {"recall", "17"}).err, "vexactl: the camera has no preset 17\n  It has presets 1 to 16.\n");
  EXPECT_EQ(act("tour", {"start", "2"}).exit_code, 1);
  EXPECT_EQ(act("tour", {"set", "1", "16,17"}).exit_code, 1);
  EXPECT_EQ(act("tour", {"set", "1", "1,2", "--speed", "19"}).exit_code, 1);
  EXPECT_EQ(act("shadow", {"show"}).err,
            "vexactl: cameras of model LMX-C100 have no shadow tours\n"
            "  vexactl profile show lists what a model has.\n");
  EXPECT_EQ(orders(), std::vector<std::string>());
}

TEST_F(PtzByCommand, AFixedCameraDoesNotMove) {
  start_model("VX-2000");
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"ptz", "stop"}, {"preset", "list"}, {"tour", "show"}, {"shadow", "stop"}}) {
    EXPECT_EQ(act(arguments[0], {arguments[1]}).exit_code, 1);
  }
  EXPECT_EQ(orders(), std::vector<std::string>());
}

TEST_F(PtzByCommand, MistakesAreRefusedBeforeTheCameraIsAsked) {
  start_model("LMX-P200");
  for (const std::vector<std::string>& arguments : {std::vector<std::string>{"ptz"},
                                                    {"ptz", "fly"},
                                                    {"ptz", "pan"},
                                                    {"ptz", "pan", "up"},
                                                    {"ptz", "tilt", "left"},
                                                    {"ptz", "pan", "left", "--speed", "0"},
                                                    {"ptz", "pan", "left", "--speed", "101"},
                                                    {"ptz", "pan", "left", "--for", "0"},
                                                    {"ptz", "pan", "left", "--for", "3601"},
                                                    {"ptz", "pan", "left", "--for", "nan"},
                                                    {"ptz", "zoom", "in"},
                                                    {"ptz", "zoom", "0"},
                                                    {"ptz", "zoom", "-2"},
                                                    {"ptz", "zoom", "nan"},
                                                    {"ptz", "zoom", "x"},
                                                    {"ptz", "zoom", "tele", "--step", "101"},
                                                    {"ptz", "focus", "-1"},
                                                    {"ptz", "focus", "101"},
                                                    {"ptz", "focus", "sharp"},
                                                    {"ptz", "goto", "1"},
                                                    {"ptz", "goto", "1", "nan"},
                                                    {"ptz", "goto", "1", "x"},
                                                    {"ptz", "goto", "1", "2", "--zoom", "0"},
                                                    {"ptz", "goto", "1", "10001", "--scale"},
                                                    {"ptz", "goto", "-1", "2", "--scale"},
                                                    {"ptz", "goto", "1.5", "2", "--scale"},
                                                    {"ptz", "area", "1"},
                                                    {"ptz", "area", "1", "2", "3"},
                                                    {"ptz", "area", "1", "100.1"},
                                                    {"ptz", "area", "-1", "2", "3", "4"},
                                                    {"ptz", "stop", "now"},
                                                    {"ptz", "watch", "--count", "0"},
                                                    {"preset"},
                                                    {"preset", "recall", "0"},
                                                    {"preset", "clear", "x"},
                                                    {"preset", "set", "1"},
                                                    {"preset", "set", "1", ""},
                                                    {"tour", "set", "1", "3"},
                                                    {"tour", "set", "0", "1,2"},
                                                    {"tour", "set", "1", "1,0"},
                                                    {"tour", "set", "1", "1,,2"},
                                                    {"tour", "set", "1", "1,2,"},
                                                    {"tour", "set", "1", "1;2"},
                                                    {"tour", "set", "1", "1,2", "--stay", "0"},
                                                    {"tour", "set", "1", "1,2", "--stay", "10000"},
                                                    {"tour", "set", "1", "1,2", "--speed", "0"},
                                                    {"tour", "set", "1", "1,2", "--resume", "-1"},
                                                    {"tour", "start", "0"},
                                                    {"tour", "start"},
                                                    {"shadow", "record", "0"},
                                                    {"shadow", "record", "2x"},
                                                    {"shadow", "start", "stop"},
                                                    {"shadow", "resume", "10000"}}) {
    const ProgramResult result = act(arguments[0], {arguments.begin() + 1, arguments.end()});
    EXPECT_EQ(result.exit_code, 1) << testing::PrintToString(arguments);
    EXPECT_NE(result.err, "");
  }
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

TEST_F(PtzByCommand, PresetsAreStoredRecalledAndCleared) {
  start_model("LMX-P200");
  EXPECT_EQ(act("preset", {"set", "3", "Gate 1&2"}).exit_code, 0);
  EXPECT_EQ(last_order(), "presetposition.cgi?PresetSet=3,Gate%201%262,on");
  EXPECT_EQ(act("preset", {"recall", "3"}).exit_code, 0);
  EXPECT_EQ(last_order(), "presetposition.cgi?PresetCall=3,24");
  EXPECT_EQ(act("preset", {"clear", "1"}).exit_code, 0);
  EXPECT_EQ(last_order(), "presetposition.cgi?PresetClear=1");
}

TEST_F(PtzByCommand, PresetsAreListedByTheirNames) {
  start_model("LMX-C100");
  camera().settings().set_answer("presetposition", "PresetNum=2&PresetName=1,Gate,3,Door\x1b[2J");
  EXPECT_EQ(act("preset", {"list"}).out, "  1  Gate\n  3  Door\\x1b[2J\n");
  EXPECT_EQ(nlohmann::json::parse(act("preset", {"list", "--json"}).out),
            nlohmann::json::parse(R"([{"preset": 1, "name": "Gate"}, {"preset": 3, "name": "Door\u001b[2J"}])"));
  const ProgramResult all = act("preset", {"list", "--all"});
  EXPECT_EQ(std::count(all.out.begin(), all.out.end(), '\n'), 16);
}

TEST_F(PtzByCommand, ACameraWithoutNamedPresetsHasAnEmptyList) {
  start_model("LMX-P200");
  const ProgramResult result = act("preset", {"list"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(result.out, "");
  EXPECT_EQ(act("preset", {"list", "--json"}).out, "[]\n");
}

TEST_F(PtzByCommand, ATourIsSetStartedAndStopped) {
  start_model("LMX-C100");
  EXPECT_EQ(act("tour", {"start", "1"}).err,
            "vexactl: tour 1 has no presets\n  Give it some: vexactl tour CAMERA set 1 1,2,3.\n");
  EXPECT_EQ(act("tour", {"stop"}).err,
            "vexactl: no tour has presets, so none is running\n"
            "  vexactl tour CAMERA set gives a tour its presets.\n");
  EXPECT_EQ(orders(), std::vector<std::string>());
  EXPECT_EQ(act("tour", {"set", "1", "1,16,3", "--stay", "15", "--speed", "18", "--resume", "30"}).exit_code, 0);
  const std::string tour = "&TourASequence=1,16,3&TourAStaytime=15&TourAPeriod=always&TourASpeed=18";
  EXPECT_EQ(last_order(), "presetposition.cgi?Tour=off&TourResume=on&TourRsmTime=30&TourA=off" + tour);
  EXPECT_EQ(act("tour", {"start", "1"}).exit_code, 0);
  EXPECT_EQ(last_order(), "presetposition.cgi?Tour=on&TourResume=on&TourRsmTime=30&TourA=on" + tour);
  EXPECT_EQ(act("tour", {"show"}).out,
            "Tours are on; resumed after 30 s\n1  on     15 s each  speed  18  presets 1,16,3\n");
  EXPECT_EQ(act("tour", {"stop"}).exit_code, 0);
  EXPECT_EQ(last_order(), "presetposition.cgi?Tour=off&TourResume=on&TourRsmTime=30&TourA=off" + tour);
}

TEST_F(PtzByCommand, ToursWithoutPresetsGetThoseOfTheOneSet) {
  start_model("LMX-P200");
  EXPECT_EQ(act("tour", {"set", "2", "4,5"}).exit_code, 0);
  const auto shown = nlohmann::json::parse(act("tour", {"show", "--json"}).out);
  EXPECT_EQ(shown.at("enabled"), false);
  EXPECT_EQ(shown.at("resumeSeconds"), nullptr);
  ASSERT_EQ(shown.at("tours").size(), 5U);
  for (const auto& tour : shown.at("tours")) {
    EXPECT_EQ(tour.at("presets"), nlohmann::json({4, 5}));
    EXPECT_EQ(tour.at("enabled"), false);
  }
  EXPECT_EQ(shown.at("tours")[1], nlohmann::json::parse(R"({"tour": 2, "enabled": false, "presets": [4, 5],
                                                            "staySeconds": 10, "speed": 24})"));
}

TEST_F(PtzByCommand, ShadowToursAreRecordedPreviewedAndPlayed) {
  start_model("LMX-P200");
  for (const Order& one : {Order{{"record", "2"}, "STourRecord=B"},
                           {{"record", "stop"}, "STourRecord=stop"},
                           {{"preview", "2"}, "STourPreview=B"},
                           {{"preview", "stop"}, "STourPreview=stop"},
                           {{"start", "1"}, "STour=on&STourA=on&STourB=off&STourC=off&STourD=off&STourE=off"},
                           {{"stop"}, "STour=off&STourA=off&STourB=off&STourC=off&STourD=off"}}) {
    const ProgramResult result = act("shadow", one.arguments);
    EXPECT_EQ(result.exit_code, 0) << result.err;
    EXPECT_EQ(last_order(), "presetposition.cgi?" + one.order);
  }
  EXPECT_EQ(act("shadow", {"start", "6"}).err,
            "vexactl: the camera has no shadow tour 6\n  It has shadow tours 1 to 5.\n");
}

TEST_F(PtzByCommand, ShadowToursAreShownAndTheirResumingIsSet) {
  start_model("LMX-P200");
  EXPECT_EQ(act("shadow", {"resume", "20"}).exit_code, 0);
  EXPECT_EQ(last_order(),
            "presetposition.cgi?STour=off&STourResume=on&STourRsmTime=20&STourA=off&STourAPeriod=always&STourB=off"
            "&STourBPeriod=always&STourC=off&STourCPeriod=always&STourD=off&STourDPeriod=always&STourE=off"
            "&STourEPeriod=always");
  const auto shown = nlohmann::json::parse(act("shadow", {"show", "--json"}).out);
  EXPECT_EQ(shown.at("enabled"), false);
  ASSERT_EQ(shown.at("tours").size(), 5U);
  EXPECT_EQ(shown.at("tours")[4], nlohmann::json::parse(R"({"tour": 5, "enabled": false, "recordedSeconds": 0})"));
  EXPECT_THAT(act("shadow", {"show"}).out, testing::StartsWith("Shadow tours are off; "));
}

TEST_F(PtzByCommand, WatchShowsTheCamerasPosition) {
  start_model("LMX-P200", "CamPos: 111E3E006401B58M");
  const ProgramResult text = act("ptz", {"watch", "--count", "1"});
  EXPECT_EQ(text.exit_code, 0) << text.err;
  EXPECT_THAT(text.out, testing::MatchesRegex("....-..-..T..:..:..\\....Z  pan  -45.000  tilt  10.000  view 29.000 x "
                                              "17.000  zoom 2.00  moving\n"));
  const auto json = nlohmann::json::parse(act("ptz", {"watch", "--count", "1", "--json"}).out);
  EXPECT_EQ(json.at("pan"), -45.0);
  EXPECT_EQ(json.at("tilt"), 10.0);
  EXPECT_EQ(json.at("horizontalAngle"), 29.0);
  EXPECT_EQ(json.at("verticalAngle"), 17.0);
  EXPECT_EQ(json.at("zoom"), 2.0);
  EXPECT_EQ(json.at("moving"), true);
  EXPECT_EQ(json.at("time").get<std::string>().size(), 24U);
}

TEST_F(PtzByCommand, WatchEndsWithCtrlC) {
  start_model("LMX-P200");
  ProgramRun watch(folder(), vexactl({"ptz", place(), "watch"}), kCredentials);
  ASSERT_TRUE(eventually([&] { return !contents_of(folder() / ".out").empty(); }));
  watch.signal(SIGINT);
  EXPECT_EQ(watch.wait().exit_code, 130);
  EXPECT_TRUE(camera().journal().wait_for_count("TEARDOWN", 1, std::chrono::seconds(30)));
}

TEST_F(PtzByCommand, WatchEndsWhenNobodyReadsItAnyMoreThoughNothingMoves) {
  start_model("LMX-P200", "CamPos: 111E3E006401B58M");
  ReadRun watch(folder(), vexactl({"ptz", place(), "watch"}), kCredentials, ReadRun::Reader::kPipe);
  EXPECT_THAT(watch.read_lines(1), testing::HasSubstr("pan  -45.000"));
  watch.stop_reading();
  const ProgramResult result = watch.program().wait();
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_EQ(result.err, "vexactl: cannot write standard output: Broken pipe\n  Check where it is redirected to.\n");
}

TEST_F(PtzByCommand, APresetIsNotCalledUnstoredWhenTheConnectionHasFailed) {
  start_model("LMX-P200");
  camera().add_request_fault(vexa::camera::RequestFault::reset("PresetCall=7"));
  const ProgramResult result = act("preset", {"recall", "7"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_THAT(result.err, testing::HasSubstr("reset"));
  EXPECT_THAT(result.err, testing::Not(testing::HasSubstr("never stored")));
}

TEST_F(PtzByCommand, APresetThatWasNeverStoredIsRefusedWithAdviceThatFits) {
  start_model("LMX-P200");
  camera().add_request_fault(vexa::camera::RequestFault::status("PresetCall=7", "400 Bad Request"));
  const ProgramResult result = act("preset", {"recall", "7"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.err, "vexactl: the camera " + place() +
                            " does not go to preset 7\n"
                            "  A preset that was never stored cannot be recalled: vexactl preset CAMERA list shows "
                            "those stored.\n");
}

TEST_F(PtzByCommand, ATableHasAHeadingOnATerminalOnly) {
  start_model("LMX-P200");
  ASSERT_EQ(act("preset", {"set", "3", "Gate"}).exit_code, 0);
  EXPECT_EQ(act("preset", {"list"}).out, "  3  Gate\n");
  ReadRun list(folder(), vexactl({"preset", place(), "list"}), kCredentials, ReadRun::Reader::kTerminal);
  EXPECT_EQ(list.read_lines(), "  #  name\n  3  Gate\n");
  EXPECT_EQ(list.program().wait().exit_code, 0);
}

TEST_F(PtzByCommand, ADirectionThatThereIsNotIsNamed) {
  EXPECT_EQ(run({"ptz", "cam", "pan", "upp"}).err, "vexactl: unknown direction \"upp\"\n  It is left or right.\n");
}

}  // namespace
}  // namespace vexa_test
