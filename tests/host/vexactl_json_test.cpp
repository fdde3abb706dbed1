// SPDX-License-Identifier: Apache-2.0
// What vexactl prints with --json, against the schema that docs/ publishes.
#include <regex>

#include "tests/host/camera_fixture.h"
#include "tests/host/json_schema.h"

namespace vexa_test {
namespace {

using Kind = vexa::camera::AlarmEvent::Kind;

class JsonOfCommands : public WithCamera {
 protected:
  void start_model(const std::string& model) {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + model + ".json";
    options.user_data = "CamPos: 111E3E006401B58M";
    options.sound_path = VEXA_CLIPS "/tone";
    options.card_bytes = 16U << 20U;
    options.speed = 4;
    start_camera(options);
  }

  // On the camera's card: two pictures from 2024-01-31T23:59:59Z on.
  std::string record() {
    vexa::camera::RecordingHead head;
    head.start = std::chrono::seconds(1706745599);
    const std::string name = camera().card().begin(head);
    const auto clip = vexa::camera::Clip::load(VEXA_CLIPS "/small.h264");
    for (std::size_t i = 0; i < 2; ++i) {
      const auto bytes = clip->access_units()[i].as_delivered();
      EXPECT_TRUE(camera().card().add({std::make_shared<const std::string>(bytes.begin(), bytes.end()), i == 0,
                                       std::chrono::milliseconds(40 * i)}));
    }
    camera().card().finish();
    return name;
  }

  // What the camera does within a moment is no matter of JSON: the exit code may be one of several.
  void expect_as_described(const std::string& definition, std::vector<std::string> arguments,
                           const std::vector<int>& codes = {0}) {
    arguments.emplace_back("--json");
    const ProgramResult result = run(arguments);
    EXPECT_THAT(codes, testing::Contains(result.exit_code)) << result.err;
    EXPECT_EQ(schema_.violation(result.out, definition), "") << testing::PrintToString(arguments);
  }

  JsonSchema schema_;
};

void expect_camel_case(const nlohmann::json& node) {
  static const std::regex kCamelCase("[a-z][a-zA-Z0-9]*");
  if (node.is_object() && node.contains("properties")) {
    for (const auto& [name, member] : node["properties"].items())
      EXPECT_TRUE(std::regex_match(name, kCamelCase)) << name;
  }
  for (const auto& child : node) {
    if (child.is_structured()) expect_camel_case(child);
  }
}

TEST_F(JsonOfCommands, EveryNameIsInCamelCase) {
  ASSERT_GE(schema_.definitions().size(), 20U);
  for (const auto& definition : schema_.definitions()) expect_camel_case(definition);
}

TEST_F(JsonOfCommands, OfACameraWithEverythingIsAsTheSchemaDescribes) {
  start_model("LMX-P200");
  const std::string recording = record();
  ASSERT_TRUE(camera().alarms().happen({Kind::kMotion, 3, 9}));
  ASSERT_EQ(run({"preset", place(), "set", "3", "Gate"}).exit_code, 0);
  expect_as_described("info", {"info", place(), "--cgi-log", "cgi.log"});
  expect_as_described("record", {"record", place(), "--frames", "5", "--out", "live.h264"});
  expect_as_described("recordMany", {"record", place(), "--forever", "--frames", "5", "--out", "more.h264"});
  expect_as_described("stats", {"stats", place(), "--seconds", "0.1"}, {0, 4});
  expect_as_described("listen", {"listen", place(), "--seconds", "0.1", "--codec", "g711_64", "--out", "live.wav"});
  expect_as_described("settings", {"settings", place()});
  expect_as_described("settings", {"set", place(), "frame-rate=25"});
  expect_as_described("daynight", {"daynight", place()});
  expect_as_described("codecs", {"codecs", place()});
  expect_as_described("exposure", {"exposure", place()});
  expect_as_described("profileList", {"profile", "list"});
  expect_as_described("profileShow", {"profile", "show", "LMX-P200"});
  expect_as_described("ptzWatch", {"ptz", place(), "watch", "--count", "1"});
  expect_as_described("presetList", {"preset", place(), "list"});
  expect_as_described("tourShow", {"tour", place(), "show"});
  expect_as_described("shadowShow", {"shadow", place(), "show"});
  expect_as_described("io", {"io", place()});
  expect_as_described("watch", {"watch", place(), "--count", "1"});
  expect_as_described("watch", {"watch", place(), "--count", "1", "--metadata"});
  expect_as_described("detectionWindows", {"detection", place(), "show"});
  expect_as_described("edgeMode", {"edge", place(), "mode"});
  expect_as_described("edgeList", {"edge", place(), "list"});
  expect_as_described("edgeTaken", {"edge", place(), "play", recording, "--scale", "4"});
  expect_as_described("edgeTaken", {"edge", place(), "get", recording, "--scale", "4", "--out", "got.h264"});
  expect_as_described("edgeBackfill",
                      {"edge", place(), "backfill", "--since", "2024-01-01T00:00:00", "--scale", "4", "--out", "gap"});
  const std::string log = run({"log", "cgi.log", "--json"}).out;
  EXPECT_EQ(schema_.violation(log.substr(0, log.find('\n')), "log"), "");
}

TEST_F(JsonOfCommands, OfASimpleCameraIsAsTheSchemaDescribes) {
  start_model("LMX-M300");
  expect_as_described("detectionSize", {"detection", place(), "show"});
  expect_as_described("io", {"io", place()});
  expect_as_described("settings", {"settings", place()});
}

TEST_F(JsonOfCommands, OfASnapshotIsAsTheSchemaDescribes) {
  vexa::camera::CameraOptions options;
  options.clip_path = options.image_path = VEXA_CLIPS "/plain.mjpeg";
  start_camera(options);
  camera().settings().set("camera", "ImageCodec1", "jpeg");
  expect_as_described("snapshot", {"snapshot", place(), "--transport", "http", "--out", "live.jpg"});
}

}  // namespace
}  // namespace vexa_test
