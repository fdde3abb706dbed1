// SPDX-License-Identifier: Apache-2.0
// vexactl doctor, against virtual cameras.
#include <map>
#include <nlohmann/json.hpp>

#include "tests/host/camera_fixture.h"
#include "tests/host/json_schema.h"

namespace vexa_test {
namespace {

using vexa::camera::RequestFault;

class DoctorCommand : public WithCamera {
 protected:
  static vexa::camera::CameraOptions model(const std::string& name) {
    vexa::camera::CameraOptions options;
    options.profile_path = VEXA_SOURCE_DIR "/models/profiles/" + name + ".json";
    return options;
  }
  ProgramResult examine(std::vector<std::string> more = {}, std::vector<std::string> environment = kCredentials) {
    std::vector<std::string> arguments = {"doctor", place().empty() ? own_loopback(2) : place(), "--seconds", length_};
    arguments.insert(arguments.end(), more.begin(), more.end());
    return run(arguments, std::move(environment));
  }
  // The checks by their names.
  std::map<std::string, nlohmann::json> checks_of(const ProgramResult& result) {
    std::map<std::string, nlohmann::json> checks;
    const auto report = nlohmann::json::parse(result.out, nullptr, false);
    EXPECT_FALSE(report.is_discarded()) << result.out << result.err;
    if (report.is_discarded()) return checks;
    for (const auto& check : report["checks"]) checks[check["name"]] = check;
    return checks;
  }

  std::string length_ = "0.2";
};

TEST_F(DoctorCommand, FindsThatAWholeCameraWorks) {
  start_as_set(model("VX-2000"));
  const ProgramResult result = examine({"--json"});
  EXPECT_EQ(result.exit_code, 0) << result.out << result.err;
  EXPECT_EQ(JsonSchema().violation(result.out, "doctor"), "");
  auto checks = checks_of(result);
  for (const char* name : {"name", "route", "http port", "rtsp port", "http", "rtsp keep-alive", "credentials",
                           "system", "profile", "inquiry system", "inquiry camera", "stream 1 by rtp",
                           "stream 1 by http", "stream 2 by rtp", "stream 2 by http"}) {
    EXPECT_EQ(checks[name]["status"], "works") << name << " " << checks[name];
  }
  EXPECT_GT(checks["reception"]["evidence"]["pictures"], 0);
  EXPECT_EQ(checks["system"]["evidence"]["model"], "VX-2000");
  EXPECT_EQ(checks["profile"]["evidence"]["profile"], "VX-2000");
  EXPECT_EQ(checks["http"]["evidence"]["status"], 401);
  EXPECT_EQ(checks["stream 2 by rtp"]["evidence"]["codec"], "JPEG");
  EXPECT_EQ(checks["codec MPEG4"]["status"], "not tried");
  EXPECT_EQ(checks["card"]["status"], "not there");
}

TEST_F(DoctorCommand, ChangesNothingButTheTimeOutThatEveryStartOfVideoSets) {
  start_as_set(model("VX-2000"));
  examine();
  for (const auto& request : camera().journal().snapshot()) {
    const bool inquiry = request.bytes.find("/command/") == std::string::npos ||
                         request.bytes.find("/command/inquiry.cgi?") != std::string::npos ||
                         request.bytes.find("Timeout=") != std::string::npos;
    EXPECT_TRUE(inquiry) << request.bytes;
  }
}

TEST_F(DoctorCommand, ReportsAnAddressWhereNothingListens) {
  const ProgramResult result = examine({"--json"});
  EXPECT_EQ(result.exit_code, 2);
  auto checks = checks_of(result);
  EXPECT_EQ(checks["http port"]["status"], "does not work");
  EXPECT_EQ(checks["http port"]["evidence"]["error"], "Connection refused");
  EXPECT_EQ(checks["credentials"]["status"], "not tried");
  EXPECT_EQ(checks["reception"]["status"], "not tried");
}

TEST_F(DoctorCommand, ReportsANameThatNobodyKnows) {
  const ProgramResult result = run({"doctor", "no-such-camera.invalid", "--json", "--timeout", "2000"});
  EXPECT_EQ(result.exit_code, 2);
  EXPECT_EQ(checks_of(result)["name"]["status"], "does not work");
  EXPECT_EQ(result.out.find("no-such-camera"), std::string::npos);
}

TEST_F(DoctorCommand, ReportsRefusedCredentialsAndSendsThemOnce) {
  start_as_set(model("VX-2000"));
  const ProgramResult result = examine({"--json"}, {"VEXACTL_USER=operator", "VEXACTL_PASSWORD=swordfish"});
  EXPECT_EQ(result.exit_code, 3);
  EXPECT_EQ(checks_of(result)["credentials"]["status"], "does not work");
  EXPECT_EQ(checks_of(result)["system"]["status"], "not tried");
  EXPECT_EQ(camera().journal().count("Authorization: Basic"), 1U);
}

TEST_F(DoctorCommand, ReportsSectionsThatTheCameraLacksOrRefusesAsNotThere) {
  start_as_set(model("VX-2000"));
  camera().add_request_fault(RequestFault::status("inq=a-slot", "500 Internal Server Error"));
  camera().settings().erase_section("lod");
  auto checks = checks_of(examine({"--json"}));
  EXPECT_EQ(checks["inquiry lod"]["status"], "not there");
  EXPECT_EQ(checks["inquiry a-slot"]["status"], "not there");
  EXPECT_EQ(checks["inquiry camera"]["status"], "works");
}

TEST_F(DoctorCommand, ACameraThatNeverAnswersCostsItsTimeOutsOnly) {
  start_as_set(model("VX-2000"));
  camera().add_request_fault(RequestFault::no_answer(""));
  const ProgramResult result = examine({"--json", "--timeout", "100"});
  EXPECT_EQ(result.exit_code, 2);
  auto checks = checks_of(result);
  EXPECT_EQ(checks["http port"]["status"], "works");
  EXPECT_EQ(checks["http"]["status"], "does not work");
  EXPECT_EQ(checks["http"]["evidence"]["error"], "Connection timed out");
}

TEST_F(DoctorCommand, ReportsPacketsThatAreLostOnTheWay) {
  vexa::camera::CameraOptions options;
  options.packet_faults.loss = 0.5;
  options.packet_faults.first_picture = 2;  // the key picture comes whole
  options.speed = 4;
  start_camera(options);
  length_ = "1";
  auto checks = checks_of(examine({"--json"}));
  EXPECT_EQ(checks["reception"]["status"], "works in part") << checks["reception"];
  EXPECT_GT(checks["reception"]["evidence"]["lost"], 0);
  EXPECT_NE(checks["reception"]["remedy"], "");
}

TEST_F(DoctorCommand, ProposesAProfileForAModelThatItDoesNotKnow) {
  start_as_set(model("VX-2000"));
  camera().settings().set("system", "ModelName", "VX-NEW");
  const ProgramResult result = examine({"--json", "--write-profile", "new.json"});
  EXPECT_EQ(result.exit_code, 0) << result.err;
  EXPECT_EQ(checks_of(result)["profile"]["status"], "works in part");
  const ProgramResult checked = run({"profile", "check", "new.json"});
  EXPECT_EQ(checked.exit_code, 0) << checked.err;
  const auto shown = nlohmann::json::parse(run({"profile", "show", "new.json", "--json"}).out, nullptr, false);
  EXPECT_EQ(shown["model"], "VX-NEW");
  EXPECT_EQ(shown["streams"], 2);
}

TEST_F(DoctorCommand, ReplacesNoFileWithAProfile) {
  start_as_set(model("VX-2000"));
  folder().make_file("mine.json", "mine");
  EXPECT_EQ(examine({"--write-profile", "mine.json"}).exit_code, 5);
  EXPECT_EQ(contents_of(folder() / "mine.json"), "mine");
}

// What a camera's owner would not publish, planted wherever the camera can put it.
TEST_F(DoctorCommand, NoOutputHoldsASecret) {
  const std::vector<std::string> secrets = {kPassword,    kBasicToken,  "SN-71c9e5",   "02:5E:C2:E7",
                                            "front-door", "10.98.76.5", "hall.example"};
  vexa::camera::CameraOptions options = model("LMX-P200");
  options.card_bytes = 1U << 20U;
  start_as_set(options);
  auto& settings = camera().settings();
  settings.set("system", "ModelName", "VX " + secrets[0] + secrets[1]);
  settings.set("system", "SoftVersion", "1.0 " + secrets[0]);
  settings.set("system", "Serial", secrets[2]);
  settings.set("network", "MacAddress", secrets[3] + ":00:01");
  settings.set("network", "HostName", secrets[6]);
  settings.set("presetposition", "PresetName", "1," + secrets[4]);
  settings.set("edgestorage", "EsAlmRec1WatchAddress", secrets[5]);
  camera().add_request_fault(RequestFault::raw("inq=sensor", "HTTP/1.0 500 " + secrets[0] + " " + secrets[1] + " " +
                                                                 secrets[2] + "\r\nX: " + secrets[3] + "\r\n\r\n" +
                                                                 secrets[4]));
  std::string outputs;
  for (const std::vector<std::string>& more : std::vector<std::vector<std::string>>{
           {}, {"--json"}, {"--trace"}, {"--json", "--write-profile", "new.json"}, {"--cgi-log", "cgi.log"}}) {
    const ProgramResult result = examine(more);
    outputs += result.out + result.err;
  }
  outputs += contents_of(folder() / "new.json");
  EXPECT_NE(outputs.find("inquiry presetposition"), std::string::npos);
  for (const std::string& secret : secrets) EXPECT_EQ(outputs.find(secret), std::string::npos) << secret << outputs;
  // The driver's log has the camera's status lines, and still no credentials.
  const std::string log = contents_of(folder() / "cgi.log");
  EXPECT_NE(log.find("inq=sensor"), std::string::npos);
  for (const char* credential : {kPassword, kBasicToken}) EXPECT_EQ(log.find(credential), std::string::npos) << log;
}

TEST_F(DoctorCommand, ALengthThatIsNoneEndsWithOne) {
  for (const char* seconds : {"0", "-1", "3601", "nan"}) {
    EXPECT_EQ(run({"doctor", own_loopback(2), "--seconds", seconds}).exit_code, 1) << seconds;
  }
}

}  // namespace
}  // namespace vexa_test
