// SPDX-License-Identifier: Apache-2.0
// vexactl edge: recordings on the card of a virtual camera.
#include <cmath>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"
#include "tests/host/program_run.h"

namespace vexa_test {
namespace {

using vexa::camera::Recording;

constexpr std::int64_t kRecordedFrom = 1706745599;  // 2024-01-31T23:59:59Z

// When a picture of a recording was taken after its first: 25 a second, unevenly.
std::chrono::milliseconds taken_at(std::size_t picture) {
  return std::chrono::milliseconds(40 * picture + picture % 3 * 7);
}

std::string bytes_of(const Recording& recording) {
  std::string bytes;
  for (const auto& picture : recording.pictures) bytes += *picture.bytes;
  return bytes;
}

#ifdef VEXA_WITH_FFMPEG

constexpr char kFilled[] = ".mkv";  // the files that a gap is filled with

// The file holds every picture of the recording, at its time.
void expect_filled(const std::string& path, const Recording& recording) {
  std::vector<long> times;
  for (const std::string& time : probed("packet=pts_time", path)) times.push_back(std::lround(std::stod(time) * 1000));
  std::vector<long> stored;
  for (const auto& picture : recording.pictures) stored.push_back((picture.at.count() + 500) / 1000);
  EXPECT_EQ(times, stored);
}

#else

constexpr char kFilled[] = ".h264";

void expect_filled(const std::string& path, const Recording& recording) {
  EXPECT_TRUE(contents_of(path) == bytes_of(recording));
}

#endif

class EdgeByCommand : public WithCamera {
 protected:
  void SetUp() override {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/VX-2000.json";
    options.card_bytes = 16U << 20U;
    options.speed = 4;
    start_camera(options);
  }

  // Puts pictures of the camera's clip onto the card: the first `later` than a quarter past kRecordedFrom.
  std::string record(std::size_t count, std::chrono::seconds later = {}) {
    vexa::camera::RecordingHead head;
    head.start = std::chrono::seconds(kRecordedFrom) + later + std::chrono::milliseconds(250);
    head.bit_rate = 512;
    const std::string name = camera().card().begin(head);
    const auto clip = vexa::camera::Clip::load(VEXA_CLIPS "/small.h264");
    for (std::size_t i = 0; i < count; ++i) {
      const auto& unit = clip->access_units()[i];
      const auto bytes = unit.as_delivered();
      EXPECT_TRUE(camera().card().add(
          {std::make_shared<const std::string>(bytes.begin(), bytes.end()), i % 25 == 0, taken_at(i)}));
    }
    camera().card().finish();
    return name;
  }

  ProgramResult edge(std::vector<std::string> arguments) {
    arguments.insert(arguments.begin(), {"edge", place()});
    return run(std::move(arguments));
  }
  nlohmann::json edge_json(std::vector<std::string> arguments) {
    arguments.emplace_back("--json");
    const ProgramResult result = edge(std::move(arguments));
    EXPECT_EQ(result.exit_code, 0) << result.err;
    return nlohmann::json::parse(result.out, nullptr, false);
  }
  std::size_t asked(const std::string& text) { return camera().journal().count(text); }
  std::vector<Recording> held() { return camera().card().recordings().value_or(std::vector<Recording>()); }
};

TEST_F(EdgeByCommand, ModeShowsTheCamerasSettings) {
  EXPECT_EQ(edge({"mode"}).out,
            "recording        off\n"
            "stream           1\n"
            "watched address  -\n"
            "seconds before   0\n"
            "seconds after    0\n"
            "free space       16384 KB\n");
  EXPECT_EQ(edge({"mode", "on", "--watch", "10.0.0.1", "--before", "3", "--after", "5"}).exit_code, 0);
  const auto mode = edge_json({"mode"});
  EXPECT_EQ(mode["enabled"], true);
  EXPECT_EQ(mode["stream"], 1);
  EXPECT_EQ(mode["watch"], "10.0.0.1");
  EXPECT_EQ(mode["secondsBefore"], 3);
  EXPECT_EQ(mode["secondsAfter"], 5);
  EXPECT_EQ(mode["freeKilobytes"], 16384);
}

TEST_F(EdgeByCommand, ModeChangesWhatIsNamedAndNothingElse) {
  const std::string end = "&EsAlmRec1Trigger=disconnected&EsRec1Period=always HTTP/1.0\r\n";
  const struct {
    std::vector<std::string> arguments;
    std::string sent;
  } cases[] = {
      {{"mode", "on", "--watch", "10.0.0.1", "--before", "3", "--after", "5"},
       "Edgestorage=on&EsOverWrite=off&EsRec1=image1,off&EsAlmRec1Time=3,5&EsRec1Mode=alarm"
       "&EsAlmRec1WatchAddress=10.0.0.1"},
      {{"mode", "off"},
       "Edgestorage=off&EsOverWrite=off&EsRec1=image1,off&EsAlmRec1Time=3,5&EsRec1Mode=alarm"
       "&EsAlmRec1WatchAddress=10.0.0.1"},
      {{"mode", "on", "--after", "7", "--stream", "2"},
       "Edgestorage=on&EsOverWrite=off&EsRec1=image2,off&EsAlmRec1Time=0,7&EsRec1Mode=alarm"
       "&EsAlmRec1WatchAddress=10.0.0.1"},
  };
  for (const auto& row : cases) {
    const ProgramResult result = edge(row.arguments);
    EXPECT_EQ(result.exit_code, 0) << result.err;
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(asked("/command/edgestorage.cgi?" + row.sent + end), 1u) << row.sent;
  }
}

TEST_F(EdgeByCommand, ModeOnNeedsAnAddressToWatch) {
  const ProgramResult result = edge({"mode", "on"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err, "vexactl: the camera watches no address yet\n  Name one with --watch.\n");
  EXPECT_EQ(asked("Edgestorage="), 0u);
}

TEST_F(EdgeByCommand, AMissingCardIsReportedWhenRecordingIsSwitchedOn) {
  camera().card().set_health(vexa::camera::CardHealth::kMissing);
  const ProgramResult result = edge({"mode", "on", "--watch", "10.0.0.1"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.err,
            "vexactl: the card is full or missing; recording is on\n"
            "  vexactl edge CAMERA delete makes room.\n");
  EXPECT_EQ(edge({"list"}).exit_code, 2);
}

TEST_F(EdgeByCommand, ListShowsTheRecordingsFromTheOldestOn) {
  EXPECT_EQ(edge({"list"}).out, "start                 seconds  codec          KB  name\n");
  const std::string names[] = {record(30), record(1, std::chrono::hours(1))};
  const auto kilobytes = [this](std::size_t i) { return std::to_string((held()[i].bytes + 1023) / 1024); };
  const auto row = [&](const char* start, std::size_t i) {
    return start + std::string(9 - kilobytes(i).size(), ' ') + kilobytes(i) + "  " + names[i] + "\n";
  };
  EXPECT_EQ(edge({"list"}).out, "start                 seconds  codec          KB  name\n" +
                                    row("2024-01-31T23:59:59Z        1  h264    ", 0) +
                                    row("2024-02-01T00:59:59Z        0  h264    ", 1));
  const auto list = edge_json({"list"});
  ASSERT_EQ(list.size(), 2u);
  EXPECT_EQ(list[0], (nlohmann::json{{"name", names[0]},
                                     {"start", "2024-01-31T23:59:59Z"},
                                     {"end", "2024-02-01T00:00:00Z"},
                                     {"seconds", 1},
                                     {"codec", "h264"},
                                     {"imageSize", "640,480"},
                                     {"frameRate", 25},
                                     {"bitRate", 512},
                                     {"quality", 0},
                                     {"audioCodec", "none"},
                                     {"kilobytes", std::stoi(kilobytes(0))},
                                     {"status", "normal"}}));
  EXPECT_EQ(list[1]["name"], names[1]);
}

TEST_F(EdgeByCommand, GetKeepsEveryPictureWithTheTimesOfTheRecording) {
  const std::string name = record(50);
  const auto got = edge_json({"get", name, "--out", "got.h264", "--scale", "4"});
  EXPECT_TRUE(contents_of(folder() / "got.h264") == bytes_of(held()[0]));
  EXPECT_EQ(got["end"], "complete");
  EXPECT_EQ(got["frames"], 50);
  EXPECT_EQ(got["bytes"], held()[0].bytes);
  EXPECT_EQ(got["firstMicroseconds"], 1706745599250000);
  EXPECT_EQ(got["lastMicroseconds"], 1706745599250000 + 49 * 40000 + 7000);
  EXPECT_EQ(asked("\r\nScale: 4\r\n"), 1u);
  EXPECT_EQ(asked("TEARDOWN"), 1u);
}

TEST_F(EdgeByCommand, PlayCountsThePicturesAndWritesNothing) {
  const std::string name = record(30);
  EXPECT_EQ(edge({"play", name, "--scale", "2"}).out,
            name + ": 30 frames, 1.174 s from 2024-01-31T23:59:59Z, " + std::to_string(held()[0].bytes) + " bytes\n");
  EXPECT_EQ(asked("\r\nScale: 2\r\n"), 1u);
  const auto backward = edge_json({"play", name, "--scale", "-1", "--timeout", "500"});
  EXPECT_EQ(backward["frames"], 2) << "the key pictures";
  EXPECT_EQ(asked("\r\nScale: -1\r\n"), 1u);
}

TEST_F(EdgeByCommand, WhatTheCardDoesNotHoldIsNotAskedFor) {
  const std::string name = record(1);
  for (const std::vector<std::string>& arguments :
       {std::vector<std::string>{"get", "none", "--out", "a.h264"}, {"play", "none"}, {"delete", "none", "--yes"}}) {
    const ProgramResult result = edge(arguments);
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.err,
              "vexactl: the card has no recording of that name\n  vexactl edge CAMERA list shows what it has.\n");
  }
  const ProgramResult other = edge({"get", name, "--out", "a.m4v"});
  EXPECT_EQ(other.exit_code, 4);
  EXPECT_EQ(other.err, "vexactl: the recording is of h264\n  End --out in .h264 or .mkv.\n");
  EXPECT_EQ(asked("DESCRIBE"), 0u);
  EXPECT_EQ(asked("DeletebyName"), 0u);
}

TEST_F(EdgeByCommand, ARecordingDeletedWhileItPlaysKeepsWhatCame) {
  const std::string name = record(100);
  ProgramRun program(folder(), vexactl({"edge", place(), "get", name, "--out", "got.h264", "--timeout", "500"}),
                     kCredentials);
  const std::string whole = bytes_of(held()[0]);
  ASSERT_TRUE(eventually([this] { return has_bytes("got.h264"); }));
  camera().card().erase_all();
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err,
            "vexactl: the camera has stopped sending before the end of the recording\n"
            "  What came is kept. vexactl edge CAMERA list shows whether the recording is still there.\n");
  const std::string got = contents_of(folder() / "got.h264");
  EXPECT_GT(got.size(), 0u);
  EXPECT_EQ(got, whole.substr(0, got.size()));
}

TEST_F(EdgeByCommand, CtrlCEndsAFetchCleanly) {
  const std::string name = record(100);
  ProgramRun program(folder(), vexactl({"edge", place(), "get", name, "--out", "got.h264"}), kCredentials);
  ASSERT_TRUE(eventually([this] { return has_bytes("got.h264"); }));
  program.signal(SIGINT);
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 130);
  EXPECT_EQ(result.err, "vexactl: interrupted; what was taken is complete up to here\n");
  EXPECT_TRUE(camera().journal().wait_for_count("TEARDOWN", 1, std::chrono::seconds(30)));
}

TEST_F(EdgeByCommand, DeleteAsksFirstUnlessToldNotTo) {
  const std::string names[] = {record(1), record(1), record(1), record(1)};
  const auto answered = [&](const std::string& answer, const std::string& what) {
    const std::string command = VEXA_BINARY_DIR "/bin/vexactl edge " + place() + " delete " + what;
    return ProgramRun(folder(), {"/bin/sh", "-c", "echo '" + answer + "' | " + command}, kCredentials).wait();
  };
  const ProgramResult no_answer = edge({"delete", names[0]});
  EXPECT_EQ(no_answer.exit_code, 1);
  EXPECT_EQ(no_answer.err, "Delete the recording " + names[0] +
                               "? [y/N]\nvexactl: nothing was deleted: no answer was given\n"
                               "  Answer y, or give --yes.\n");
  for (const char* no : {"", "n", "Y es"}) {
    const ProgramResult result = answered(no, "--all");
    EXPECT_EQ(result.exit_code, 0);
    EXPECT_EQ(result.err, "Delete all recordings? [y/N]\nvexactl: nothing was deleted\n");
  }
  EXPECT_EQ(asked("delete=") + asked("DeletebyName"), 0u);
  EXPECT_EQ(answered("y", names[0]).exit_code, 0);
  EXPECT_EQ(asked("/command/edgestorage.cgi?DeletebyName=" + names[0] + " "), 1u);
  EXPECT_EQ(edge({"delete", names[1], "--yes"}).exit_code, 0);
  EXPECT_EQ(held().size(), 2u);
  EXPECT_EQ(edge({"delete", "--all", "--yes"}).err, "");
  EXPECT_EQ(asked("/command/edgestorage.cgi?delete=all "), 1u);
  EXPECT_TRUE(held().empty());
}

TEST_F(EdgeByCommand, MistakesAreReportedBeforeTheCameraIsAsked) {
  folder().make_file("file", "");
  const std::vector<std::vector<std::string>> lines = {
      {},
      {"format"},
      {"mode", "maybe"},
      {"mode", "--watch", "10.0.0.1"},
      {"mode", "off", "--after", "5"},
      {"mode", "on", "--watch", ""},
      {"mode", "on", "--watch", "10.0.0.1", "--before", "-1"},
      {"mode", "on", "--watch", "10.0.0.1", "--after", "x"},
      {"list", "extra"},
      {"play"},
      {"play", "a", "--scale", "0"},
      {"play", "a", "--scale", "fast"},
      {"get", "a"},
      {"get", "--out", "a.h264"},
      {"get", "a", "--out", ""},
      {"get", "a", "--out", "a.h264", "--scale", "0"},
      {"delete"},
      {"delete", "a", "--all"},
      {"backfill", "--out", "gap"},
      {"backfill", "--since", "2024-01-31T23:59:59"},
      {"backfill", "--since", "2024-01-31T23:59:59", "--out", ""},
      {"backfill", "--since", "2024-01-31T23:59:59", "--out", "gap", "--scale", "0"},
      {"backfill", "--since", "yesterday", "--out", "gap"},
      {"backfill", "--since", "2024-02-30T00:00:00", "--out", "gap"},
      {"backfill", "--since", "2024-01-31", "--out", "gap"},
      {"backfill", "--since", "2024-01-31T23:59:59+01:00", "--out", "gap"}};
  for (const auto& line : lines) EXPECT_EQ(edge(line).exit_code, 1) << testing::PrintToString(line);
  EXPECT_EQ(edge({"get", "a", "--out", "no/such/folder/a.h264"}).exit_code, 5);
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

TEST_F(EdgeByCommand, AFolderThatCannotBeMadeEndsWithFive) {
  record(1);
  folder().make_file("file", "");
  const ProgramResult result = edge({"backfill", "--since", "2024-01-31T23:59:59", "--out", "file/gap"});
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_EQ(result.err,
            "vexactl: cannot make the folder file/gap: Not a directory\n"
            "  Give --out a folder that is there, or a name in one that you may write to.\n");
  EXPECT_EQ(asked("DESCRIBE"), 0u);
}

TEST_F(EdgeByCommand, ModelsWithoutACardAreRefused) {
  vexa::camera::CameraOptions options;
  options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-C100.json";
  start_camera(options);
  const ProgramResult result = edge({"list"});
  EXPECT_EQ(result.exit_code, 1);
  EXPECT_EQ(result.err,
            "vexactl: cameras of model LMX-C100 have no card to record on\n"
            "  vexactl profile show lists what a model has.\n");
}

TEST_F(EdgeByCommand, BackfillFetchesTheSecondsWithoutNetworkAndNothingElse) {
  record(10);
  ASSERT_EQ(edge({"mode", "on", "--watch", "127.0.0.1"}).exit_code, 0);
  const std::string http_place = place();
  camera().unplug();
  EXPECT_EQ(edge({"list"}).exit_code, 2) << "it is away";
  ASSERT_TRUE(eventually([this] { return held().size() == 2 && held()[1].pictures.size() >= 30; }));
  camera().plug();
  ASSERT_TRUE(eventually([this] { return held()[1].finished; }));
  EXPECT_EQ(own_loopback(1) + ":" + std::to_string(camera().http_port()), http_place);
  const auto filled = edge_json({"backfill", "--since", "2024-02-01T00:01:00", "--out", "a/gap", "--scale", "4"});
  const Recording gap = held()[1];
  ASSERT_EQ(filled.size(), 1u);
  EXPECT_EQ(filled[0]["name"], gap.name);
  EXPECT_EQ(filled[0]["file"], "a/gap/" + gap.name + kFilled);
  EXPECT_EQ(filled[0]["frames"], gap.pictures.size());
  EXPECT_EQ(filled[0]["bytes"], gap.bytes);
  EXPECT_EQ(filled[0]["firstMicroseconds"], gap.head.start.count());
  EXPECT_EQ(filled[0]["lastMicroseconds"], gap.end().count());
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder() / "a/gap"), {}), 1);
  expect_filled(folder() / ("a/gap/" + gap.name + kFilled), gap);
}

TEST_F(EdgeByCommand, BackfillTakesEveryRecordingThatReachesIntoTheGap) {
  const std::string names[] = {record(2), record(2, std::chrono::seconds(1)), record(2, std::chrono::hours(1))};
  const ProgramResult result = edge({"backfill", "--since", "2024-02-01T00:00:00Z", "--out", "gap", "--scale", "4"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(std::distance(std::filesystem::directory_iterator(folder() / "gap"), {}), 2);
  const std::string size = std::to_string(held()[1].bytes);
  EXPECT_EQ(result.out, "gap/" + names[1] + kFilled + ": 2 frames, 0.047 s from 2024-02-01T00:00:00Z, " + size +
                            " bytes\n" + "gap/" + names[2] + kFilled +
                            ": 2 frames, 0.047 s from 2024-02-01T00:59:59Z, " + size + " bytes\n");
  EXPECT_EQ(edge({"backfill", "--since", "2024-02-01T01:00:00", "--out", "none"}).out, "");
}

#ifdef VEXA_WITH_FFMPEG

TEST_F(EdgeByCommand, GetFillsAContainerWithTheTimesOfTheRecording) {
  const std::string name = record(30);
  const ProgramResult result = edge({"get", name, "--out", "got.mkv", "--scale", "4"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  expect_filled(folder() / "got.mkv", held()[0]);
}

#else

TEST_F(EdgeByCommand, GetRefusesAContainerBeforeAnythingIsAsked) {
  for (const char* file : {"got.mkv", "got.mp4"}) {
    EXPECT_EQ(edge({"get", "a", "--out", file}).exit_code, 1);
  }
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

#endif

}  // namespace
}  // namespace vexa_test
