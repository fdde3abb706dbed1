// SPDX-License-Identifier: Apache-2.0
// vexactl settings, set, codecs, exposure, daynight and profile, against a virtual camera of a model.
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;

class SettingsOfACamera : public WithCamera {
 protected:
  void start_model(const std::string& model) {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
    start_camera(options);
  }

  /// What the camera was asked to change, without the rest of the requests.
  std::vector<std::string> commands() {
    std::vector<std::string> paths;
    for (const auto& request : camera().journal().snapshot()) {
      const std::size_t from = request.bytes.find("/command/");
      const std::string path = request.bytes.substr(from, request.bytes.find(" HTTP/") - from);
      if (path.find("inquiry.cgi") == std::string::npos) paths.push_back(path);
    }
    return paths;
  }
};

TEST_F(SettingsOfACamera, ShowAsATable) {
  start_model("LMX-H100");
  const ProgramResult result = run({"settings", place()});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.out,
            "stream               1\n"
            "codec                H.264\n"
            "size                 1920x1080\n"
            "frame-rate           25\n"
            "bit-rate             4000\n"
            "quality              -\n"
            "video-standard       pal\n"
            "capture-size         1920x1080\n"
            "max-image-size       1920x1080\n"
            "solid-ptz            off\n"
            "unicast-port         50000\n"
            "unicast-port-1       50002\n"
            "unicast-port-2       50004\n"
            "rtsp-port            554\n"
            "day-night            auto\n"
            "noise-reduction      off\n"
            "wide-dynamic-range   off\n"
            "visibility-enhancer  off\n"
            "infrared             off\n"
            "infrared-strength    10\n"
            "video-output         -\n");
  EXPECT_EQ(result.err, "");
}

TEST_F(SettingsOfACamera, AreJsonForScripts) {
  start_model("LMX-C100");
  const ProgramResult result = run({"settings", place(), "--json"});
  EXPECT_EQ(result.exit_code, 0);
  const auto expected = nlohmann::json::parse(R"({
    "stream": 1, "codec": "MPEG4", "size": "640x480", "frameRate": 25, "bitRate": 1024, "quality": null,
    "videoStandard": "pal", "captureSize": "768x576", "maxImageSize": "768x576", "solidPtz": "off",
    "unicastPort": 50000, "unicastPort1": 50002, "unicastPort2": 50004, "rtspPort": 554, "dayNight": "auto",
    "noiseReduction": null, "wideDynamicRange": null,
    "visibilityEnhancer": null, "infrared": null, "infraredStrength": null, "videoOutput": "ip"})");
  EXPECT_EQ(nlohmann::json::parse(result.out, nullptr, false), expected);
}

TEST_F(SettingsOfACamera, OfAnotherStreamAreItsOwn) {
  start_model("LMX-H100");
  const auto json = nlohmann::json::parse(run({"settings", place(), "--stream", "2", "--json"}).out, nullptr, false);
  EXPECT_EQ(json["stream"], 2);
  EXPECT_EQ(json["codec"], "JPEG");
  EXPECT_EQ(json["size"], "640x368");
  EXPECT_EQ(json["quality"], 5);
}

TEST_F(SettingsOfACamera, OfAStreamThatItDoesNotHaveEndWithOne) {
  start_model("LMX-H100");
  for (const std::vector<std::string>& command : std::vector<std::vector<std::string>>{
           {"settings", place()}, {"set", place(), "frame-rate=5"}, {"codecs", place()}}) {
    std::vector<std::string> arguments = command;
    arguments.insert(arguments.end(), {"--stream", "3"});
    const ProgramResult result = run(arguments);
    EXPECT_EQ(result.exit_code, 1) << command[0];
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err,
              "vexactl: the camera reports no video stream 3\n  --stream counts from 1, the camera's first.\n");
  }
  EXPECT_TRUE(commands().empty());
}

TEST_F(SettingsOfACamera, ThatCannotBeAskedAreAFailureAndNotUnknown) {
  start_model("LMX-C100");
  // The first two system inquiries are for the model; the third is for the video output.
  RequestFault fault = RequestFault::status("inq=system", "401 Unauthorized");
  fault.occurrence = 2;
  camera().add_request_fault(fault);
  const ProgramResult result = run({"settings", place()});
  EXPECT_EQ(result.exit_code, 3);
  EXPECT_EQ(result.out, "");
  EXPECT_THAT(result.err, testing::HasSubstr("refuses user name and password"));
}

TEST_F(SettingsOfACamera, NeedTheRateOfACodecOfTheOtherKind) {
  start_model("LMX-H100");
  const ProgramResult to_jpeg = run({"set", place(), "codec=JPEG"});
  EXPECT_EQ(to_jpeg.exit_code, 1);
  EXPECT_EQ(to_jpeg.err, "vexactl: JPEG needs quality\n  The camera reports the rate of its present codec only.\n");
  const ProgramResult to_h264 = run({"set", place(), "--stream", "2", "codec=H.264"});
  EXPECT_EQ(to_h264.exit_code, 1);
  EXPECT_EQ(to_h264.err, "vexactl: H.264 needs bit-rate\n  The camera reports the rate of its present codec only.\n");
  EXPECT_TRUE(commands().empty());
  EXPECT_EQ(run({"set", place(), "codec=JPEG", "quality=7"}).exit_code, 0);
  EXPECT_EQ(run({"set", place(), "--stream", "2", "codec=H.264", "bit-rate=512"}).exit_code, 0);
  EXPECT_THAT(commands(),
              testing::ElementsAre(testing::HasSubstr("&Quality1=7&"), testing::HasSubstr("&BitRate2=512&")));
}

TEST_F(SettingsOfACamera, OfTheInfraredLightFailWithTheRequest) {
  start_model("LMX-H100");
  camera().add_request_fault(RequestFault::status("inq=camera", "503 Service Unavailable"));
  const ProgramResult busy = run({"set", place(), "infrared-strength=3"});
  EXPECT_EQ(busy.exit_code, 2);
  EXPECT_THAT(busy.err, testing::HasSubstr("Service Unavailable"));
}

TEST_F(SettingsOfACamera, OfTheInfraredLightAreNotThereWithoutIt) {
  start_model("LMX-C100");
  const ProgramResult result = run({"set", place(), "infrared-strength=3"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err.find("vexactl: cameras of model LMX-C100 have no infrared\n"), 0U) << result.err;
}

TEST_F(SettingsOfACamera, ChangeInOneRequestForTheStream) {
  start_model("LMX-H100");
  const ProgramResult result = run({"set", place(), "codec=H.264", "size=1280x720", "bit-rate=2048", "rotation=180",
                                    "noise-reduction=mid", "infrared-strength=3", "day-night=night", "back-light=on"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_THAT(result.out, testing::HasSubstr("size                 1280x720\n"));
  EXPECT_THAT(result.out, testing::HasSubstr("noise-reduction      mid\n"));
  EXPECT_THAT(commands(), testing::ElementsAre(
                              "/command/camera.cgi?ImageCodec1=h264&ImageSize1=1280,720&FrameRate1=25&"
                              "BitRate1=2048&Eflip=on",
                              "/command/camera.cgi?DayNightMode=manual&DayNight=on", "/command/camera.cgi?XDNR=mid",
                              "/command/camera.cgi?IRLed=off&IRLedMaxStrength=3", "/command/camera.cgi?BLComp=on"));
}

TEST_F(SettingsOfACamera, ThatTheCameraDoesNotOfferAreRefusedBeforeItIsAsked) {
  start_model("LMX-H100");
  const ProgramResult size = run({"set", place(), "size=1280x960"});
  EXPECT_EQ(size.exit_code, 1);
  EXPECT_EQ(size.err, "vexactl: the camera does not offer 1280x960 in H.264 as it is set\n  vexactl codecs " + place() +
                          " lists what it offers.\n");
  EXPECT_EQ(run({"set", place(), "codec=MPEG4"}).exit_code, 1);
  EXPECT_TRUE(commands().empty());
}

TEST_F(SettingsOfACamera, ThatTheCameraRefusesEndWithTwo) {
  start_model("LMX-A100");
  const ProgramResult result = run({"set", place(), "noise-reduction=mid"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.err, "vexactl: the camera " + place() +
                            " refuses to change noise-reduction: Bad Request\n"
                            "  vexactl settings shows what the camera has, vexactl codecs what each codec offers.\n");
}

TEST_F(SettingsOfACamera, ThatTheDriverDoesNotOfferEndWithOne) {
  start_model("LMX-H100");
  const ProgramResult result = run({"set", place(), "exposure=Full auto"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: cameras of model LMX-H100 have no exposure\n  vexactl settings shows what the camera has.\n");
}

TEST_F(SettingsOfACamera, CodecsListWhatRemainsAsTheCameraIsSet) {
  start_model("LMX-P100");
  ASSERT_TRUE(camera().settings().apply("camera", "SolidPTZ=on"));
  const ProgramResult result = run({"codecs", place()});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(result.out,
            "JPEG\n"
            "  sizes        1280x720 640x368 320x192\n"
            "  frame-rates  1 2 3 4 5 6 8 10 12 15 20 25 30\n"
            "  qualities    1 2 3 4 5 6 7 8 9 10\n"
            "H.264\n"
            "  sizes        1280x720 640x368 320x192\n"
            "  frame-rates  1 2 3 4 5 6 8 10 12 15 20 25 30\n"
            "  bit-rates    64 128 256 384 512 768 1024 1536 2000 2048 3072 4000 4096 6144 8000 8192\n");
  const auto json = nlohmann::json::parse(run({"codecs", place(), "--json"}).out, nullptr, false);
  EXPECT_EQ(json[1]["codec"], "H.264");
  EXPECT_EQ(json[1]["sizes"], nlohmann::json({"1280x720", "640x368", "320x192"}));
}

TEST_F(SettingsOfACamera, ExposureListsAndSteps) {
  start_model("LMX-M300");
  const ProgramResult list = run({"exposure", place()});
  EXPECT_EQ(list.exit_code, 0) << list.err;
  EXPECT_EQ(list.out.find("Full auto\nShutter Priority\n  1/50 s, 1/60 s, "), 0U) << list.out;
  ASSERT_EQ(run({"exposure", place(), "--mode", "Shutter Priority", "--level", "10000"}).exit_code, 0);
  ASSERT_EQ(run({"exposure", place(), "--mode", "Shutter Priority", "--step", "-1"}).exit_code, 0);
  const std::string mode = "/command/camera.cgi?ExpMode=autoirislens&AutoShutter=off&AutoSlowShutter=off";
  EXPECT_THAT(commands(),
              testing::ElementsAre(mode, "/command/camera.cgi?Shutter=17", mode, "/command/camera.cgi?Shutter=14"));
}

TEST_F(SettingsOfACamera, ExposureOfAModelWithoutItEndsWithOne) {
  start_model("LMX-H100");
  const ProgramResult result = run({"exposure", place()});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: the camera's model offers no exposure modes\n"
            "  Its profile decides; --profile names another.\n");
}

TEST_F(SettingsOfACamera, ExposureChangesAlsoWithoutAProfile) {
  start_camera();
  ASSERT_TRUE(camera().settings().apply("system", "ModelName=T-9"));
  const ProgramResult result = run({"exposure", place(), "--mode", "Full auto"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(result.out, "");
  EXPECT_THAT(commands(), testing::ElementsAre("/command/camera.cgi?ExpMode=full"));
}

TEST_F(SettingsOfACamera, ExposureReportsWhatIsWrong) {
  start_model("LMX-P100");
  const struct {
    std::vector<std::string> arguments;
    const char* text;
  } cases[] = {
      {{"--level", "1"}, "vexactl: --level and --step need --mode\n"},
      {{"--mode", "Full auto", "--level", "1"}, "vexactl: this exposure mode has no steps\n"},
      {{"--mode", "Full auto", "--level", "1", "--step", "1"}, "vexactl: --level and --step exclude each other\n"},
      {{"--mode", "Iris Priority", "--level", "10001"}, "vexactl: --level is not a number from 0 to 10000\n"},
      {{"--mode", "Iris Priority", "--step", "0"}, "vexactl: --step is not a number below or above 0\n"}};
  for (const auto& c : cases) {
    std::vector<std::string> arguments = {"exposure", place()};
    arguments.insert(arguments.end(), c.arguments.begin(), c.arguments.end());
    const ProgramResult result = run(arguments);
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.err.find(c.text), 0U) << result.err;
  }
}

TEST_F(SettingsOfACamera, DayNightShowsAndSets) {
  start_model("LMX-H100");
  EXPECT_EQ(run({"daynight", place()}).out, "auto\n");
  EXPECT_EQ(run({"daynight", place(), "night"}).out, "night\n");
  EXPECT_EQ(run({"daynight", place(), "--json"}).out, "{\n  \"dayNight\": \"night\"\n}\n");
  const ProgramResult wrong = run({"daynight", place(), "dusk"});
  EXPECT_EQ(wrong.exit_code, 1);
  EXPECT_EQ(wrong.err, "vexactl: unknown day/night mode \"dusk\"\n  Choose auto, day or night.\n");
}

TEST_F(SettingsOfACamera, AProfileOnTheCommandLineWins) {
  start_model("LMX-P100");
  const ProgramResult result = run({"exposure", place(), "--profile", "LMX-M300"});
  EXPECT_EQ(result.out.find("Iris Priority"), std::string::npos);
  const ProgramResult missing = run({"codecs", place(), "--profile", "nowhere.json"});
  EXPECT_EQ(missing.exit_code, 1);
  EXPECT_EQ(missing.err.find("vexactl: nowhere.json: cannot be read: No such file or directory\n"), 0U) << missing.err;
}

using ProfileCommands = WithCamera;

TEST_F(ProfileCommands, ListShowAndCheck) {
  const ProgramResult list = run({"profile", "list"});
  EXPECT_EQ(list.exit_code, 0);
  EXPECT_THAT(list.out, testing::HasSubstr("LMX-H100    Fixed HD camera\n"));
  const ProgramResult show = run({"profile", "show", "LMX-C100"});
  EXPECT_EQ(show.out,
            "name           LMX-C100\n"
            "description    SD camera that pans and tilts, with an analog output\n"
            "model          LMX-C100\n"
            "driver         simple-ptz\n"
            "camera-types   ptz, sd, analog-output\n"
            "streams        1\n"
            "codecs         JPEG to 768x576, MPEG4 to 768x576, H.264 to 768x576\n"
            "exposure       Full auto, Shutter Priority, Iris Priority\n"
            "ptz            move\n"
            "presets        16\n"
            "alarm-inputs   1\n"
            "alarm-outputs  1\n"
            "edge-storage   no\n");
  const auto json = nlohmann::json::parse(run({"profile", "show", "LMX-C100", "--json"}).out, nullptr, false);
  EXPECT_EQ(json["ptz"], "move");
  const ProgramResult check = run({"profile", "check", VEXA_SOURCE_DIR "/models/profiles/VX-2000.json"});
  EXPECT_EQ(check.exit_code, 0);
  EXPECT_EQ(check.out, VEXA_SOURCE_DIR "/models/profiles/VX-2000.json: valid\n");
}

TEST_F(ProfileCommands, CheckNamesFileLineAndKey) {
  const std::string file = folder().make_file("wrong.json", "{\n\"description\": \"x\",\n\"driver\": \"none\"\n}\n");
  const ProgramResult result = run({"profile", "check", file});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.out, "");
  EXPECT_EQ(result.err.find("vexactl: " + file + ":3: driver: must be one of "), 0U) << result.err;
}

}  // namespace
}  // namespace vexa_test
