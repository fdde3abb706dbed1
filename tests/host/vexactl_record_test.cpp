// SPDX-License-Identifier: Apache-2.0
// vexactl record, against a virtual camera.
#include <sys/stat.h>

#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using vexa::camera::CameraOptions;
using vexa::camera::RequestFault;
using RecordCommand = WithCamera;

TEST_F(RecordCommand, RecordsExactlyTheClipsPictures) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--frames", "300", "--out", "live.h264"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(result.err, "");
  EXPECT_TRUE(contents_of(folder() / "live.h264") == pictures(300));
}

TEST_F(RecordCommand, SummarisesTheRecordingAsJson) {
  start_camera();
  const ProgramResult result = run({"record", place(), "--frames", "30", "--out", "live.h264", "--json"});
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  EXPECT_EQ(json["camera"], place());
  EXPECT_EQ(json["modelName"], "VX-2000");
  EXPECT_EQ(json["file"], "live.h264");
  EXPECT_EQ(json["end"], "complete");
  EXPECT_EQ(json["frames"], 30);
  EXPECT_EQ(json["keyFrames"], 2);
  EXPECT_EQ(json["bytes"], pictures(30).size());
#ifdef VEXA_WITH_FFMPEG
  EXPECT_EQ(json["width"], 320);
  EXPECT_EQ(json["height"], 240);
#else
  EXPECT_EQ(json["width"], nullptr);
  EXPECT_EQ(json["height"], nullptr);
#endif
  EXPECT_EQ(json["statedFramesPerSecond"], 25);
  EXPECT_GT(json["seconds"], 0);
  EXPECT_GT(json["bitsPerSecond"], 0);
  EXPECT_GT(json["expectedFrames"], 0);
  EXPECT_GE(json["missingFramesEstimate"], 0);
}

TEST_F(RecordCommand, SummarisesTheRecordingInALine) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--frames", "30", "--out", "live.h264"});
  EXPECT_THAT(result.out, testing::StartsWith("live.h264: 30 frames in "));
  EXPECT_THAT(result.out, testing::HasSubstr(", 2 key frames, " + std::to_string(pictures(30).size()) + " bytes, "));
#ifdef VEXA_WITH_FFMPEG
  EXPECT_THAT(result.out, testing::HasSubstr(", 320x240, about "));
#endif
  EXPECT_THAT(result.out, testing::EndsWith(" frames missing at 25 fps\n"));
}

TEST_F(RecordCommand, EndsAfterTheSecondsAskedFor) {
  start_camera();
  const ProgramResult result = run({"record", place(), "--seconds", "1.5", "--out", "live.h264", "--json"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  EXPECT_GE(json["seconds"], 1.5);
  EXPECT_EQ(contents_of(folder() / "live.h264"), pictures(json["frames"]));
}

TEST_F(RecordCommand, ClosesTheSessionOnTheCamera) {
  start_camera(four_times_faster());
  run({"record", place(), "--frames", "5", "--out", "live.h264"});
  EXPECT_EQ(camera().journal().count("TEARDOWN"), 1u);
}

TEST_F(RecordCommand, AsksForTheStreamNamed) {
  start_camera(four_times_faster());
  camera().settings().set("camera", "ImageCodec2", "h264");
  run({"record", place(), "--stream", "2", "--frames", "5", "--out", "live.h264"});
  EXPECT_GE(camera().journal().count("DESCRIBE rtsp://" + own_loopback(1) + ":554/media/video2 "), 1u);
}

TEST_F(RecordCommand, AStreamOfAnotherCodecEndsWithFour) {
  start_camera();
  camera().settings().set("camera", "ImageCodec1", "jpeg");
  const ProgramResult result = run({"record", place(), "--out", "live.h264"});
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err,
            "vexactl: video stream 1 of the camera is set to JPEG\n"
            "  Set it to H.264 on the camera, choose another with --stream, or end --out in .mjpeg or .mkv.\n");
}

TEST_F(RecordCommand, WritesPicturesToStandardOutputAndTheSummaryBesideThem) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--frames", "30", "--out", "-", "--json"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_TRUE(result.out == pictures(30));
  EXPECT_EQ(nlohmann::json::parse(result.err, nullptr, false)["frames"], 30);
}

TEST_F(RecordCommand, CtrlCEndsARecordingCleanly) {
  for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
    SCOPED_TRACE(signal);
    start_camera();
    ProgramRun program(folder(), vexactl({"record", place(), "--out", "live.h264", "--json"}), kCredentials);
    ASSERT_TRUE(eventually([this] { return has_bytes("live.h264"); }));
    program.signal(signal);
    const ProgramResult result = program.wait();
    EXPECT_EQ(result.exit_code, 130);
    EXPECT_EQ(result.err, "vexactl: interrupted; what was recorded is complete up to here\n");
    const auto json = nlohmann::json::parse(result.out, nullptr, false);
    EXPECT_EQ(json["end"], "interrupted");
    EXPECT_TRUE(contents_of(folder() / "live.h264") == pictures(json["frames"]));
    EXPECT_TRUE(camera().journal().wait_for_count("TEARDOWN", 1, std::chrono::seconds(30)));
    std::filesystem::remove(folder() / "live.h264");
  }
}

TEST_F(RecordCommand, CtrlCBeforeAnythingIsOpenEndsAtOnce) {
  start_camera();
  camera().add_request_fault(RequestFault::no_answer("inquiry"));
  ProgramRun program(folder(), vexactl({"record", place(), "--out", "live.h264", "--timeout", "60000"}), kCredentials);
  ASSERT_TRUE(camera().journal().wait_for_count("inquiry", 1, std::chrono::seconds(30)));
  program.signal(SIGINT);
  const ProgramResult result = program.wait();
  EXPECT_EQ(result.exit_code, 130);
  EXPECT_EQ(result.err, "\nvexactl: interrupted\n");
  EXPECT_FALSE(std::filesystem::exists(folder() / "live.h264"));
}

TEST_F(RecordCommand, ASecondCtrlCDoesNotWaitForTheCamera) {
  start_camera();
  camera().add_request_fault(RequestFault::no_answer("TEARDOWN"));
  ProgramRun program(folder(), vexactl({"record", place(), "--out", "live.h264"}), kCredentials);
  ASSERT_TRUE(eventually([this] { return has_bytes("live.h264"); }));
  program.signal(SIGINT);
  ASSERT_TRUE(camera().journal().wait_for_count("TEARDOWN", 1, std::chrono::seconds(30)));
  program.signal(SIGINT);
  EXPECT_EQ(program.wait().exit_code, 130);
}

TEST_F(RecordCommand, ACameraThatFallsSilentEndsWithFourAndKeepsWhatCame) {
  CameraOptions options = four_times_faster();
  options.pictures = 20;
  start_camera(options);
  const ProgramResult result = run({"record", place(), "--out", "live.h264", "--timeout", "1000", "--json"});
  EXPECT_EQ(result.exit_code, 4);
  EXPECT_EQ(result.err,
            "vexactl: the camera has sent no picture for 2000 ms\n"
            "  Check its network and encoder settings; --timeout makes the wait longer.\n");
  EXPECT_EQ(nlohmann::json::parse(result.out, nullptr, false)["end"], "silent");
  EXPECT_TRUE(contents_of(folder() / "live.h264") == pictures(20));
}

TEST_F(RecordCommand, ARefusedSessionEndsWithThreeOrTwo) {
  const struct {
    RequestFault fault;
    int exit_code;
    const char* text;
  } cases[] = {
      {RequestFault::wrong_credentials("DESCRIBE"), 3, " refuses user name and password: Unauthorized\n"},
      {RequestFault::status("SETUP", "453 Not Enough Bandwidth"), 2,
       " does not open its video: Not Enough Bandwidth\n"},
      {RequestFault::status("PLAY", "404 Not Found"), 2, " does not open its video: Not Found\n"},
      {RequestFault::status("RTSPTimeout", "500 Broken"), 2, " cannot be used: Broken\n"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.text);
    start_camera();
    camera().add_request_fault(row.fault);
    const ProgramResult result = run({"record", place(), "--out", "live.h264"});
    EXPECT_EQ(result.exit_code, row.exit_code);
    EXPECT_THAT(result.err, testing::HasSubstr(row.text));
    EXPECT_FALSE(std::filesystem::exists(folder() / "live.h264"));
  }
}

TEST_F(RecordCommand, AFailedStartLeavesAFormerRecordingAlone) {
  folder().make_file("live.h264", "former");
  const ProgramResult result = run({"record", own_loopback(2), "--out", "live.h264"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(contents_of(folder() / "live.h264"), "former");
}

TEST_F(RecordCommand, AnUnwritableFileEndsWithFiveBeforeTheCameraIsAsked) {
  start_camera();
  folder().make_folder("folder");
  for (const char* out : {"no/such/folder/live.h264", "folder", "folder/"}) {
    SCOPED_TRACE(out);
    const ProgramResult result = run({"record", place(), "--out", out});
    EXPECT_EQ(result.exit_code, 5);
    EXPECT_THAT(result.err, testing::StartsWith(std::string("vexactl: cannot write ") + out + ": "));
    EXPECT_EQ(result.out, "");
  }
  EXPECT_TRUE(camera().journal().snapshot().empty());
}

TEST_F(RecordCommand, AFullDiskEndsWithFiveAndClosesTheSession) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--out", "/dev/full", "--json"});
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_THAT(result.err, testing::StartsWith("vexactl: cannot write /dev/full: No space left on device\n"));
  EXPECT_EQ(nlohmann::json::parse(result.out, nullptr, false)["end"], "cannotWrite");
  EXPECT_EQ(camera().journal().count("TEARDOWN"), 1u);
}

TEST_F(RecordCommand, AReaderThatHasGoneEndsWithFiveAndNotWithASignal) {
  start_camera(four_times_faster());
  const std::string record = VEXA_BINARY_DIR "/bin/vexactl record " + place() + " --out -";
  const ProgramResult result =
      ProgramRun(folder(), {"/bin/sh", "-c", "(" + record + "; echo $? >code) | true"}, kCredentials).wait();
  EXPECT_EQ(contents_of(folder() / "code"), "5\n");
  EXPECT_THAT(result.err, testing::HasSubstr("cannot write standard output: Broken pipe\n"));
}

TEST_F(RecordCommand, ShowsProgressOnATerminal) {
  start_camera();
  const ProgramResult result =
      ProgramRun(folder(), vexactl({"record", place(), "--frames", "40", "--out", "live.h264"}), kCredentials,
                 ProgramRun::StandardError::kTerminal)
          .wait();
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_THAT(result.err, testing::StartsWith("connecting\r\x1b[K"));
  EXPECT_THAT(result.err, testing::ContainsRegex("s +[0-9]+ frames +[0-9.]+ Mbit/s  drops ~[0-9]+"));
  EXPECT_THAT(result.err, testing::EndsWith("\r\x1b[K"));
}

TEST_F(RecordCommand, QuietShowsNoProgressOnATerminal) {
  start_camera(four_times_faster());
  const ProgramResult result =
      ProgramRun(folder(), vexactl({"record", place(), "--frames", "40", "--out", "live.h264", "--quiet"}),
                 kCredentials, ProgramRun::StandardError::kTerminal)
          .wait();
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.err, "");
}

TEST_F(RecordCommand, TheTraceShowsEveryRequestWithoutCredentials) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--frames", "5", "--out", "live.h264", "--trace"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  expect_no_password(result);
  const std::string url = "rtsp://" + own_loopback(1) + ":554/media/video1";
  EXPECT_THAT(result.err, testing::StartsWith("driver: send <DESCRIBE " + url +
                                              " RTSP/1.0\n"
                                              "driver: CSeq: 1\n"
                                              "driver: Accept: application/sdp\n"
                                              "driver: Authorization: Basic ***\n"
                                              "driver: \n"
                                              "driver: >\n"
                                              "driver: send <SETUP " +
                                              url + "/video RTSP/1.0\n"));
  EXPECT_THAT(result.err, testing::HasSubstr("driver: send <TEARDOWN " + url + " RTSP/1.0\n"));
  EXPECT_THAT(result.out, testing::StartsWith("live.h264: 5 frames"));
}

TEST_F(RecordCommand, KeepsTheDriversTraceOutOfItsOutput) {
  start_camera(four_times_faster());
  const ProgramResult result = run({"record", place(), "--frames", "5", "--out", "live.h264"});
  EXPECT_EQ(result.err, "");
  EXPECT_EQ(result.out.find("send"), std::string::npos);
  expect_no_password(result);
}

TEST_F(RecordCommand, CountsPicturesThatALossHasCost) {
  CameraOptions options;
  options.packet_faults.loss = 1;
  options.packet_faults.first_picture = 10;
  options.packet_faults.last_picture = 10;
  start_camera(options);
  const ProgramResult result = run({"record", place(), "--frames", "40", "--out", "live.h264", "--json"});
  const auto json = nlohmann::json::parse(result.out, nullptr, false);
  // Picture 10 is lost, and all up to the next key picture, 25, with it.
  EXPECT_GE(json["missingFramesEstimate"], 14);
  EXPECT_EQ(json["missingFramesEstimate"], json["expectedFrames"].get<int>() - 40);
}

}  // namespace
}  // namespace vexa_test
