// SPDX-License-Identifier: Apache-2.0
// vexactl info, against a virtual camera.
#include <filesystem>
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;
using InfoCommand = WithCamera;

TEST_F(InfoCommand, ShowsWhatTheCameraIsAsATable) {
  start_camera();
  const ProgramResult result = run({"info", place()});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.out, "Camera            " + place() +
                            "\n"
                            "Maker             Vexa Corporation\n"
                            "Model             VX-2000\n"
                            "Software version  1.02.00\n"
                            "Serial number     100001\n"
                            "MAC address       02:00:00:00:00:01\n"
                            "Video stream 1    H.264 1920x1080, 25 fps, 8000 kbit/s\n"
                            "Driver version    1.0.0.0\n");
  EXPECT_EQ(result.err, "");
}

TEST_F(InfoCommand, PrintsJsonForScripts) {
  start_camera();
  const ProgramResult result = run({"info", "--json", "--camera", place()});
  EXPECT_EQ(result.exit_code, 0);
  const auto expected = nlohmann::json::parse(R"({
    "maker": "Vexa Corporation", "modelName": "VX-2000", "softwareVersion": "1.02.00", "serialNumber": "100001",
    "macAddress": "02:00:00:00:00:01",
    "video": {"stream": 1, "codec": "H.264", "width": 1920, "height": 1080, "framesPerSecond": 25,
              "kilobitsPerSecond": 8000, "quality": 0},
    "driverVersion": "1.0.0.0"})");
  auto json = nlohmann::json::parse(result.out, nullptr, false);
  EXPECT_EQ(json["camera"], place());
  json.erase("camera");
  EXPECT_EQ(json, expected);
  EXPECT_EQ(result.err, "");
}

TEST_F(InfoCommand, ShowsControlCharactersOfTheCameraEscaped) {
  start_camera();
  camera().settings().set("system", "ModelName", "VX\x1b[2J");
  const ProgramResult result = run({"info", place()});
  EXPECT_NE(result.out.find("Model             VX\\x1b[2J\n"), std::string::npos) << result.out;
}

TEST_F(InfoCommand, KeepsBytesThatAreNoUtf8OutOfJson) {
  start_camera();
  camera().settings().set("system", "ModelName", "VX\xff");
  const auto json = nlohmann::json::parse(run({"info", place(), "--json"}).out, nullptr, false);
  EXPECT_EQ(json["modelName"], "VX\xef\xbf\xbd");
}

TEST_F(InfoCommand, ARefusedPasswordEndsWithThreeAndIsNotRepeated) {
  start_camera();
  const ProgramResult result = run({"info", place()}, {"VEXACTL_USER=operator", "VEXACTL_PASSWORD=swordfish"});
  EXPECT_EQ(result.exit_code, 3);
  EXPECT_EQ(result.out, "");
  EXPECT_EQ(result.err, "vexactl: the camera " + place() +
                            " refuses user name and password: Unauthorized\n"
                            "  Give them with --user and --password-file, --credentials FILE, or VEXACTL_USER and "
                            "VEXACTL_PASSWORD.\n");
}

TEST_F(InfoCommand, APasswordThatTheCameraSendsBackIsHidden) {
  start_camera();
  camera().add_request_fault(RequestFault::raw(
      "inquiry", std::string("HTTP/1.0 500 no ") + kPassword + " nor " + kBasicToken + " here\r\n\r\n"));
  const ProgramResult result = run({"info", place()});
  EXPECT_EQ(result.exit_code, 2);
  expect_no_password(result);
  EXPECT_EQ(result.err, "vexactl: the camera " + place() +
                            " cannot be used: no *** nor *** here\n"
                            "  Check that address and HTTP port are the camera's.\n");
}

TEST_F(InfoCommand, AnAddressWithoutACameraEndsWithTwo) {
  const ProgramResult result = run({"info", own_loopback(2)});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.err, "vexactl: the camera " + own_loopback(2) +
                            ":80 cannot be used: Connection refused\n"
                            "  Check that address and HTTP port are the camera's.\n");
}

TEST_F(InfoCommand, ACameraThatNeverAnswersEndsWithTwoAfterTheTimeOut) {
  start_camera();
  camera().add_request_fault(RequestFault::no_answer("inquiry"));
  const ProgramResult result = run({"info", place(), "--timeout", "200"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.err, "vexactl: the camera " + place() +
                            " did not answer within 200 ms: no answer\n"
                            "  Check address, power and network; a slow camera needs a longer --timeout.\n");
}

TEST_F(InfoCommand, AnAnswerCutOffInItsBodyEndsWithTwo) {
  start_camera();
  camera().add_request_fault(RequestFault::status("inq=network", "503 Service Unavailable"));
  const ProgramResult result = run({"info", place()});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.out, "");
  EXPECT_NE(result.err.find("cannot be used: Service Unavailable"), std::string::npos) << result.err;
}

TEST_F(InfoCommand, AMisspeltNameIsCalledOne) {
  const ProgramResult result = run({"info", "no-such-camera.invalid"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(result.err.find("vexactl: cannot find the camera no-such-camera.invalid: "), 0u) << result.err;
}

TEST_F(InfoCommand, TakesCredentialsFromFiles) {
  start_camera();
  const std::string password = folder().make_file("password", std::string(kPassword) + "\n");
  const std::string both = folder().make_file("both", std::string(kUser) + ":" + kPassword + "\r\nanything else");
  EXPECT_EQ(run({"info", place(), "--user", kUser, "--password-file", password}, {}).exit_code, 0);
  EXPECT_EQ(run({"info", place(), "--credentials", both}, {}).exit_code, 0);
}

TEST_F(InfoCommand, TracesRequestsWithoutCredentialsOnStandardErrorOnly) {
  start_camera();
  const ProgramResult plain = run({"info", place()});
  const ProgramResult traced = run({"info", place(), "--trace"});
  EXPECT_EQ(traced.exit_code, 0);
  EXPECT_EQ(traced.out, plain.out);
  expect_no_password(traced);
}

TEST_F(InfoCommand, LeavesNothingInTheWorkingFolder) {
  start_camera();
  run({"info", place()});
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(folder().path())) {
    names.push_back(entry.path().filename());
  }
  EXPECT_THAT(names, testing::UnorderedElementsAre(".out", ".err"));
}

TEST_F(InfoCommand, AFullStandardOutputEndsWithFive) {
  start_camera();
  const ProgramResult result =
      ProgramRun(folder(), {"/bin/sh", "-c", VEXA_BINARY_DIR "/bin/vexactl info " + place() + " >/dev/full"},
                 kCredentials)
          .wait();
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_EQ(result.err,
            "vexactl: cannot write standard output: No space left on device\n"
            "  Check where it is redirected to.\n");
}

TEST_F(InfoCommand, AClosedStandardOutputEndsWithFive) {
  start_camera();
  const ProgramResult result =
      ProgramRun(folder(), {"/bin/sh", "-c", VEXA_BINARY_DIR "/bin/vexactl info " + place() + " >&-"}, kCredentials)
          .wait();
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_EQ(result.err,
            "vexactl: cannot write standard output: Bad file descriptor\n"
            "  Check where it is redirected to.\n");
}

}  // namespace
}  // namespace vexa_test
