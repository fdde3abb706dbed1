// SPDX-License-Identifier: Apache-2.0
// vexactl on cameras of a file, through outages: record with sessions, and stats.
#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"
#include "tests/host/json_schema.h"
#include "tests/support/recording_camera.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;
using vexa::camera::RequestFault;
using Kind = vexa::camera::AlarmEvent::Kind;

class CamerasOfAFile : public WithCamera {
 protected:
  // A file with the camera as "gate", and as "yard" too.
  std::string cameras_file() {
    (void)folder().make_file("gate.cred", "operator:tr0ub4dor\n");
    return folder().make_file("cameras.json",
                              R"({"cameras": [
  {"name": "gate", "address": ")" +
                                  place() +
                                  R"(", "credentials": "gate.cred"},
  {"name": "yard", "address": ")" +
                                  place() +
                                  R"(", "userVariable": "YARD_USER", "passwordVariable": "YARD_PASSWORD"}
]})");
  }
  static std::vector<std::string> environment() { return {"YARD_USER=operator", "YARD_PASSWORD=tr0ub4dor"}; }

  [[nodiscard]] std::string file(const std::string& name) const { return contents_of(folder() / name); }
  [[nodiscard]] std::size_t size_of(const std::string& name) const {
    std::error_code error;
    const auto size = std::filesystem::file_size(folder() / name, error);
    return error ? 0 : static_cast<std::size_t>(size);
  }
  // Those of a recording in segments, by their order in time.
  [[nodiscard]] std::vector<std::string> files_like(const std::string& begin) const {
    std::vector<std::string> names;
    for (const auto& entry : std::filesystem::directory_iterator(folder().path())) {
      const std::string name = entry.path().filename();
      if (name.rfind(begin, 0) == 0) names.push_back(name);
    }
    std::sort(names.begin(), names.end(), [](const std::string& a, const std::string& b) {
      return a.size() != b.size() && a.substr(0, 20) == b.substr(0, 20) ? a.size() < b.size() : a < b;
    });
    return names;
  }
};

TEST_F(CamerasOfAFile, AreNamedInsteadOfTheirAddressByEveryCommand) {
  start_camera(four_times_faster());
  const std::string cameras = cameras_file();
  for (const char* const name : {"gate", "yard"}) {
    const ProgramResult result = run({"info", name, "--cameras", cameras, "--json"}, environment());
    EXPECT_EQ(result.exit_code, 0) << result.err;
    EXPECT_EQ(nlohmann::json::parse(result.out, nullptr, false)["camera"], place());
  }
  const ProgramResult recorded =
      run({"record", "gate", "--cameras", cameras, "--frames", "5", "--out", "{camera}.h264"}, {});
  EXPECT_EQ(recorded.exit_code, 0) << recorded.err;
  EXPECT_TRUE(file("gate.h264") == pictures(5));
  EXPECT_EQ(run({"settings", "gate", "--cameras", cameras}, {}).exit_code, 0);
}

TEST_F(CamerasOfAFile, MistakesAreRefusedBeforeACameraIsAsked) {
  start_camera();
  const std::string cameras = cameras_file();
  const std::string wrong = folder().make_file("wrong.json", "{\"cameras\": [\n{\"name\": 5}]}");
  const struct {
    std::vector<std::string> arguments;
    std::string text;
  } kCases[] = {
      {{"info", "hunter2", "--cameras", cameras}, "vexactl: " + cameras + " has no camera of that name\n"},
      {{"info", "gate", "--cameras", wrong}, "vexactl: " + wrong + ", line 2: \"name\" is not a text\n"},
      {{"stats", "--cameras", wrong}, "vexactl: " + wrong + ", line 2: \"name\" is not a text\n"},
      {{"info", "gate", "--cameras", "none.json"}, "vexactl: cannot read none.json: No such file or directory\n"},
      {{"info", "yard", "--cameras", cameras},
       "vexactl: " + cameras + ", line 3, camera yard: the environment has no variable YARD_USER\n"},
      {{"record", "--out", "live.h264"}, "vexactl: --camera is required\n"},
      {{"stats"}, "vexactl: --camera is required\n"},
      {{"stats", "gate", "--cameras", cameras, "--seconds", "0"}, "vexactl: --seconds is not a number above 0\n"},
      {{"record", "gate", "gate", "--cameras", cameras, "--out", "{camera}.h264"},
       "vexactl: a camera is named twice\n"},
      {{"record", "a", "b", "--out", "live.h264"}, "vexactl: --out names one file for several cameras\n"},
      {{"record", "a", "b", "--out", "-"}, "vexactl: standard output takes one recording of one camera\n"},
      {{"record", "a", "--out", "-", "--segment", "5"}, "vexactl: standard output takes one recording of one camera\n"},
      {{"record", "a", "--out", "-", "--backfill"}, "vexactl: --backfill writes files of its own, beside --out\n"},
      {{"record", "a", "--out", "a.h264", "--segment", "0"},
       "vexactl: --segment is not a number of seconds from 1 on\n"},
      {{"record", "a", "--out", "a.xyz", "--forever"}, "vexactl: the end of a.xyz names no format of video\n"},
      {{"record", "a", "--out", "a.h264", "--forever", "--trace"},
       "vexactl: --trace shows one driver's requests, without --forever, --segment and other cameras\n"},
  };
  for (const auto& row : kCases) {
    const ProgramResult result = run(row.arguments, {});
    EXPECT_EQ(result.exit_code, 1) << row.text;
    EXPECT_THAT(result.err, testing::StartsWith(row.text));
    EXPECT_EQ(result.err.find("hunter2"), std::string::npos);
  }
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

TEST_F(CamerasOfAFile, AreRecordedAtOnceEachIntoItsOwnFile) {
  start_camera(four_times_faster());
  const ProgramResult result =
      run({"record", "--cameras", cameras_file(), "--frames", "60", "--out", "{camera}.h264", "--json"}, environment());
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  ASSERT_EQ(json.size(), 2U) << result.out;
  for (std::size_t i = 0; i < 2; ++i) {
    const std::string name = i == 0 ? "gate" : "yard";
    EXPECT_EQ(json[i]["camera"], name);
    EXPECT_EQ(json[i]["file"], name + ".h264");
    EXPECT_EQ(json[i]["end"], "complete");
    EXPECT_EQ(json[i]["frames"], 60);
    EXPECT_TRUE(file(name + ".h264") == pictures(60)) << name;
  }
  expect_no_password(result);
}

TEST_F(CamerasOfAFile, ARecordingLivesThroughAnOutage) {
  start_camera();
  ProgramRun program(folder(),
                     vexactl({"record", place(), "--timeout", "500", "--forever", "--frames", "60", "--strict", "--out",
                              "live.h264", "--json"}),
                     kCredentials);
  ASSERT_TRUE(eventually([this] { return size_of("live.h264") > 0; }));
  camera().unplug();
  // It tries again and finds nobody there: then the network is back.
  ASSERT_TRUE(eventually([this] { return file(".err").find("attempt") != std::string::npos; }));
  camera().plug();
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 6) << result.err;
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  ASSERT_EQ(json.size(), 1U) << result.out;
  EXPECT_EQ(json[0]["frames"], 60);
  EXPECT_EQ(json[0]["end"], "complete");
  EXPECT_GE(json[0]["outages"], 1);
  EXPECT_GT(json[0]["outageSeconds"], 0);
  EXPECT_THAT(result.err, testing::HasSubstr(place() + ": Live.\n"));
  expect_no_password(result);
}

TEST_F(CamerasOfAFile, WhatTheCardRecordedDuringAnOutageIsFetchedIntoAFileOfItsOwn) {
  start_camera(with_card());
  record_while_away(camera().settings());
  ProgramRun program(folder(),
                     vexactl({"record", place(), "--timeout", "500", "--forever", "--backfill", "--frames", "60",
                              "--out", "live.h264", "--json"}),
                     kCredentials);
  ASSERT_TRUE(eventually([this] { return size_of("live.h264") > 0; }));
  camera().unplug();
  ASSERT_TRUE(eventually([this] {
    const auto recordings = camera().card().recordings();
    const bool recorded = !recordings->empty() && recordings->front().pictures.size() > 10;
    return recorded && file(".err").find("attempt") != std::string::npos;
  }));
  camera().plug();
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  ASSERT_EQ(json.size(), 1U) << result.out;
  EXPECT_EQ(json[0]["frames"], 60);
  EXPECT_EQ(JsonSchema().violation(result.out, "recordMany"), "");
  int frames = 0;
  for (const auto& gap : json[0]["gaps"]) frames += gap["frames"].get<int>();
  EXPECT_GT(frames, 0) << result.out;
  EXPECT_THAT(result.err, testing::HasSubstr(" on its card: "));
  // What the camera recorded, without a break.
  std::string held;
  const auto recordings = camera().card().recordings();
  for (const auto& picture : recordings->front().pictures) held += *picture.bytes;
  const std::vector<std::string> names = files_like("live-gap-");
  EXPECT_FALSE(names.empty());
  for (const std::string& name : names) {
    EXPECT_FALSE(file(name).empty()) << name;
    EXPECT_NE(held.find(file(name)), std::string::npos) << name;
  }
  EXPECT_TRUE(std::filesystem::exists(folder() / "live-gap.h264.journal"));
  expect_no_password(result);
}

TEST_F(CamerasOfAFile, SegmentsBeginWithAKeyPictureAndMakeTheWholeRecording) {
  start_camera();
  const ProgramResult result = run({"record", place(), "--segment", "1", "--frames", "80", "--out", "live.h264"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const std::vector<std::string> names = files_like("live-");
  ASSERT_GE(names.size(), 2U);
  const std::string key = pictures(1).substr(0, 30);  // the parameter sets, which each key picture begins with
  std::string all;
  for (const std::string& name : names) {
    EXPECT_EQ(file(name).substr(0, key.size()), key) << name;
    all += file(name);
  }
  EXPECT_TRUE(all == pictures(80));
}

TEST_F(CamerasOfAFile, RefusedCredentialsEndARecordingAtOnce) {
  start_camera();
  const ProgramResult result =
      run({"record", place(), "--forever", "--out", "live.h264"}, {"VEXACTL_USER=operator", "VEXACTL_PASSWORD=wrong"});
  EXPECT_EQ(result.exit_code, 3);
  EXPECT_THAT(result.err, testing::HasSubstr("refuses"));
  EXPECT_FALSE(std::filesystem::exists(folder() / "live.h264"));
  EXPECT_EQ(camera().journal().snapshot().size(), 1U);
}

TEST_F(CamerasOfAFile, CtrlCEndsALongRecordingWithWhatCame) {
  start_camera();
  ProgramRun program(folder(), vexactl({"record", place(), "--forever", "--out", "live.h264", "--json"}), kCredentials);
  ASSERT_TRUE(eventually([this] { return size_of("live.h264") > 0; }));
  program.signal(SIGINT);
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 130);
  EXPECT_EQ(result.err, "vexactl: interrupted; what was recorded is complete up to here\n");
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  ASSERT_EQ(json.size(), 1U) << result.out;
  EXPECT_EQ(json[0]["end"], "interrupted");
  EXPECT_TRUE(file("live.h264") == pictures(json[0]["frames"]));
}

TEST_F(CamerasOfAFile, AFullDiskEndsALongRecordingWithFive) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--forever", "--format", "h264", "--out", "/dev/full"});
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_THAT(result.err, testing::HasSubstr("vexactl: cannot write /dev/full: No space left on device\n"));
}

#ifdef VEXA_WITH_FFMPEG
TEST_F(CamerasOfAFile, ASegmentPlaysWhenTheProgramIsKilled) {
  start_camera(four_times_faster());
  ProgramRun program(folder(), vexactl({"record", place(), "--segment", "1", "--out", "live.mp4"}), kCredentials);
  ASSERT_TRUE(eventually([this] { return files_like("live-").size() >= 3; }));
  program.signal(SIGKILL);
  EXPECT_EQ(program.wait().exit_code, 128 + SIGKILL);
  // The last may have been killed with its first picture not yet written.
  const std::vector<std::string> names = files_like("live-");
  for (std::size_t i = 0; i + 1 < names.size(); ++i) {
    auto frames = probed("packet=flags", folder() / names[i]);
    // Remarks about the times of pictures that a slow machine has taken late.
    std::erase_if(frames, [](const std::string& line) { return line.empty() || line[0] == '['; });
    ASSERT_GE(frames.size(), 2U) << names[i];
    EXPECT_EQ(frames[0].substr(0, 1), "K") << names[i];
  }
}
#endif

TEST_F(CamerasOfAFile, LostPicturesAreCountedWithTheirReasonAndEndAStrictRecordingWithSix) {
  CameraOptions options;
  options.packet_faults.loss = 1;
  options.packet_faults.first_picture = 10;
  options.packet_faults.last_picture = 10;
  start_camera(options);
  const ProgramResult result = run({"record", place(), "--frames", "40", "--strict", "--out", "live.h264", "--json"});
  EXPECT_EQ(result.exit_code, 6);
  // Picture 10 is lost, and all up to the next key picture, 25, are without what they refer to.
  const auto lost = nlohmann::json::parse(result.out, nullptr, false)["lost"];
  EXPECT_GE(lost["lost"], 14);
  EXPECT_GE(lost["packetsMissing"], 1);
  EXPECT_THAT(result.err, testing::ContainsRegex("vexactl: [0-9]+ of [0-9]+ pictures were lost: [0-9]+ .*; [0-9]+ "
                                                 "packets? never came\n"));
}

TEST_F(CamerasOfAFile, AWatchWaitsForACameraThatIsNotThere) {
  start_camera();
  camera().unplug();
  ReadRun watched(folder(), vexactl({"watch", place(), "--timeout", "500", "--forever", "--count", "1", "--json"}),
                  kCredentials, ReadRun::Reader::kPipe);
  ASSERT_TRUE(eventually([this] { return file(".err").find("attempt") != std::string::npos; }));
  camera().alarms().happen({Kind::kContact, 1, 1});
  camera().plug();
  EXPECT_EQ(nlohmann::json::parse(watched.read_lines(1), nullptr, false)["state"], "active");
  EXPECT_EQ(watched.program().wait().exit_code, 0);
}

TEST_F(CamerasOfAFile, ASnapshotWaitsForACameraThatIsNotThere) {
  CameraOptions options;
  options.clip_path = options.image_path = VEXA_CLIPS "/plain.mjpeg";
  start_camera(options);
  camera().settings().set("camera", "ImageCodec1", "jpeg");
  camera().unplug();
  ProgramRun program(folder(), vexactl({"snapshot", place(), "--forever", "--transport", "http", "--out", "live.jpg"}),
                     kCredentials);
  ASSERT_TRUE(eventually([this] { return file(".err").find("attempt") != std::string::npos; }));
  camera().plug();
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(file("live.jpg").substr(0, 2), "\xFF\xD8");
}

TEST_F(CamerasOfAFile, SoundLivesThroughAnOutage) {
  CameraOptions options;
  options.sound_path = VEXA_CLIPS "/tone";
  start_camera(options);
  camera().settings().set("camera", "AudInCodec", "g711_64");
  ProgramRun program(
      folder(), vexactl({"listen", place(), "--timeout", "500", "--forever", "--seconds", "2", "--out", "live.wav"}),
      kCredentials);
  ASSERT_TRUE(eventually([this] { return size_of("live.wav") > 0; }));
  camera().unplug();
  ASSERT_TRUE(eventually([this] { return file(".err").find("attempt") != std::string::npos; }));
  camera().plug();
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_THAT(result.out, testing::StartsWith("live.wav: 2.00 s of G711 at 64 Kbps, 16000 bytes"));
}

TEST_F(CamerasOfAFile, StatsShowEachCamerasStateAndCounts) {
  start_camera();
  const std::string cameras = cameras_file();
  ReadRun watched(folder(), vexactl({"stats", "--cameras", cameras, "--watch", "--seconds", "0.5", "--json"}),
                  environment(), ReadRun::Reader::kPipe);
  nlohmann::json list;
  const auto live = [](const nlohmann::json& row) { return row["state"] == "live" && row["frames"] > 0; };
  for (int table = 0; table < 100; ++table) {
    list = nlohmann::json::parse(watched.read_lines(1), nullptr, false);
    ASSERT_EQ(list.size(), 2U) << list;
    if (live(list[0]) && live(list[1])) break;
  }
  EXPECT_TRUE(live(list[0]) && live(list[1])) << list;
  EXPECT_EQ(list[0]["camera"], "gate");
  EXPECT_EQ(list[1]["camera"], "yard");
  EXPECT_EQ(list[0]["why"], "Live.");
  EXPECT_GT(list[0]["packets"], 0);
  watched.stop_reading();
  EXPECT_NE(watched.program().wait().exit_code, 128 + SIGPIPE);
}

TEST_F(CamerasOfAFile, StatsSayWhyACameraIsNotLive) {
  start_camera();
  camera().add_request_fault(RequestFault::status("inq=system", "401 Unauthorized"));
  ReadRun watched(folder(),
                  vexactl({"stats", "gate", "--cameras", cameras_file(), "--watch", "--seconds", "0.2", "--json"}), {},
                  ReadRun::Reader::kPipe);
  nlohmann::json row;
  for (int table = 0; table < 200 && row["state"] != "refused"; ++table) {
    row = nlohmann::json::parse(watched.read_lines(1), nullptr, false)[0];
  }
  EXPECT_EQ(row["state"], "refused");
  EXPECT_EQ(row["cause"], "credentials");
  watched.stop_reading();
  (void)watched.program().wait();
}

TEST_F(CamerasOfAFile, StatsAreATableWithAHeading) {
  start_camera();
  const ProgramResult result = run({"stats", place(), "--seconds", "0.1"});
  EXPECT_THAT(result.out, testing::StartsWith("camera "));
  EXPECT_THAT(result.out, testing::HasSubstr("\n" + place() + " "));
}

}  // namespace
}  // namespace vexa_test
