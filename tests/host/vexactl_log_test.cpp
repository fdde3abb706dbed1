// SPDX-License-Identifier: Apache-2.0
// vexactl --cgi-log and vexactl log, against a virtual camera.
#include <filesystem>
#include <nlohmann/json.hpp>
#include <sstream>

#include "tests/host/camera_fixture.h"

namespace vexa_test {
namespace {

using Json = nlohmann::json;
using testing::HasSubstr;
using vexa::camera::RequestFault;

constexpr char kTo[] = "\r\n21-11-2026\t03:40:51.100\tCGI\tTo\t";
constexpr char kFrom[] = "\r\n21-11-2026\t03:40:51.123\tCGI\tFrom\t";

std::string banner() { return "\n" + std::string(103, '-') + "\n21-11-2026 03:40:51.000 LogFile Opened. "; }

std::string exchange(const std::string& path, const std::string& answer) { return kTo + path + kFrom + answer; }

std::string row(const std::string& path, const std::string& reason) {
  return "2026-11-21 03:40:51.100      23     200  " + path + std::string(42 - path.size(), ' ') + reason + "\n";
}

const std::string kHead = "Time                         ms  Status  Request                                   Answer\n";

class LogCommand : public WithCamera {
 protected:
  // Each line of `vexactl log --json`.
  std::vector<Json> rows_of(const std::string& name) {
    const ProgramResult result = run({"log", name, "--json"});
    EXPECT_EQ(result.exit_code, 0) << result.err;
    std::istringstream lines(result.out);
    std::vector<Json> rows;
    for (std::string line; std::getline(lines, line);) rows.push_back(Json::parse(line, nullptr, false));
    return rows;
  }

  void append(const std::string& name, const std::string& text) const {
    std::ofstream(folder() / name, std::ios::binary | std::ios::app) << text;
  }

  // Whether the program that follows has written `text` so far.
  [[nodiscard]] bool shows(const std::string& text) const {
    return eventually([&] { return contents_of(folder() / ".out") == text; });
  }
};

TEST_F(LogCommand, ShowsEachRequestOfARunWithItsAnswer) {
  start_camera();
  ASSERT_EQ(run({"info", place(), "--cgi-log", "cgi.log"}).exit_code, 0);
  const std::vector<Json> rows = rows_of("cgi.log");
  ASSERT_FALSE(rows.empty());
  for (const Json& row : rows) {
    EXPECT_THAT(row["path"].get<std::string>(), HasSubstr("/command/inquiry.cgi?"));
    EXPECT_EQ(row["status"], 200);
    EXPECT_EQ(row["reason"], "OK");
    EXPECT_GE(row["milliseconds"], 0);
    EXPECT_EQ(row["time"].get<std::string>().size(), 23u);
  }
  const ProgramResult table = run({"log", "cgi.log"});
  EXPECT_EQ(table.err, "");
  EXPECT_THAT(table.out, testing::StartsWith(kHead));
  EXPECT_EQ(static_cast<std::size_t>(std::count(table.out.begin(), table.out.end(), '\n')), rows.size() + 1);
}

TEST_F(LogCommand, ARecordingIsLoggedToo) {
  start_camera(four_times_faster());
  ASSERT_EQ(run({"record", place(), "--frames", "5", "--out", "live.h264", "--cgi-log", "cgi.log"}).exit_code, 0);
  EXPECT_FALSE(rows_of("cgi.log").empty());
}

TEST_F(LogCommand, ASecondRunIsAppended) {
  start_camera();
  run({"info", place(), "--cgi-log", "cgi.log"});
  const std::size_t once = rows_of("cgi.log").size();
  run({"info", place(), "--cgi-log", "cgi.log"});
  EXPECT_EQ(rows_of("cgi.log").size(), 2 * once);
}

TEST_F(LogCommand, ARefusalIsShownWithItsStatus) {
  start_camera();
  run({"info", place(), "--cgi-log", "cgi.log"}, {"VEXACTL_USER=operator", "VEXACTL_PASSWORD=swordfish"});
  const std::vector<Json> rows = rows_of("cgi.log");
  ASSERT_FALSE(rows.empty());
  EXPECT_EQ(rows[0]["status"], 401);
  EXPECT_EQ(rows[0]["reason"], "Unauthorized");
  EXPECT_EQ(contents_of(folder() / "cgi.log").find("swordfish"), std::string::npos);
}

TEST_F(LogCommand, ARequestWithoutAnAnswerIsShownAsSuch) {
  start_camera();
  camera().add_request_fault(RequestFault::no_answer("inquiry"));
  run({"info", place(), "--timeout", "200", "--cgi-log", "cgi.log"});
  const std::vector<Json> rows = rows_of("cgi.log");
  ASSERT_FALSE(rows.empty());
  EXPECT_TRUE(rows[0]["status"].is_null());
  EXPECT_TRUE(rows[0]["milliseconds"].is_null());
  EXPECT_THAT(run({"log", "cgi.log"}).out, testing::EndsWith("  no answer\n"));
}

TEST_F(LogCommand, ACamerasWordsForgeNoRowAndSteerNoTerminal) {
  start_camera();
  camera().add_request_fault(
      RequestFault::raw("inquiry", "HTTP/1.0 500 \x1b[2Jno\t\v\n21-11-2026\t03:40:51.100\tCGI\tTo\t/forged\r\n\r\n"));
  run({"info", place(), "--cgi-log", "cgi.log"});
  const ProgramResult result = run({"log", "cgi.log"});
  EXPECT_THAT(result.out, HasSubstr("     500  /command/inquiry.cgi?"));
  EXPECT_THAT(result.out, testing::EndsWith("  \\x1b[2Jno\\x09\\x0b\n"));
  EXPECT_EQ(result.out.find("forged"), std::string::npos);
}

TEST_F(LogCommand, APasswordThatACameraSentBackIsHidden) {
  folder().make_file("cgi.log", banner() + exchange("/a", std::string("200 no ") + kPassword + " nor " + kBasicToken));
  for (const char* form : {"--json", "--"}) {
    const ProgramResult result = run({"log", form, "cgi.log"});
    EXPECT_EQ(result.exit_code, 0);
    EXPECT_THAT(result.out, HasSubstr("no *** nor ***"));
    expect_no_password(result);
  }
}

TEST_F(LogCommand, APasswordThatACameraSendsBackDoesNotEnterTheFile) {
  start_camera();
  camera().add_request_fault(RequestFault::status("inquiry", "500 no swordfish"));
  run({"info", place(), "--cgi-log", "cgi.log"}, {"VEXACTL_USER=operator", "VEXACTL_PASSWORD=swordfish"});
  const std::string text = contents_of(folder() / "cgi.log");
  EXPECT_THAT(text, HasSubstr("\tCGI\tFrom\t500 no ***"));
  EXPECT_EQ(text.find("swordfish"), std::string::npos);
}

TEST_F(LogCommand, WithoutTheOptionNoLogIsLeft) {
  start_camera();
  run({"info", place()});
  EXPECT_FALSE(std::filesystem::exists(folder() / "Log.txt"));
}

TEST_F(LogCommand, ALogThatCannotBeWrittenEndsWithFive) {
  folder().make_folder("folder");
  const std::pair<const char*, const char*> cases[] = {
      {"folder", "Is a directory"}, {"none/cgi.log", "No such file or directory"}, {"/dev/null", "not a regular file"}};
  for (const auto& [path, why] : cases) {
    const ProgramResult result = run({"info", own_loopback(2), "--cgi-log", path});
    EXPECT_EQ(result.exit_code, 5);
    EXPECT_EQ(result.err, std::string("vexactl: cannot write ") + path + ": " + why +
                              "\n  Give --cgi-log a file in a folder that exists and that you may write to.\n");
  }
}

TEST_F(LogCommand, AFileThatIsNoLogEndsWithOne) {
  folder().make_file("empty");
  folder().make_file("garbage", std::string("\0\x1b\xff\r\n\n", 6) + std::string(1 << 20, 'x'));
  const std::pair<const char*, const char*> cases[] = {{"empty", "is empty"}, {"garbage", "is not a CGI log"}};
  for (const auto& [name, why] : cases) {
    const ProgramResult result = run({"log", name});
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err,
              std::string("vexactl: ") + name + " " + why + "\n  The other commands write one with --cgi-log FILE.\n");
  }
}

TEST_F(LogCommand, ALogWithoutRequestsIsReported) {
  folder().make_file("cgi.log", banner());
  const ProgramResult result = run({"log", "cgi.log"});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.out, "");
  EXPECT_EQ(result.err, "vexactl: cgi.log holds no request\n");
}

TEST_F(LogCommand, ReportsHowManyLinesItLeftOut) {
  folder().make_file("cgi.log", banner() + "\r\nrubbish" + exchange("/a", "200 OK") + "\r\nmore");
  const ProgramResult result = run({"log", "cgi.log"});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.out, kHead + row("/a", "OK"));
  EXPECT_EQ(result.err, "vexactl: skipped lines that are not of a CGI log: 2 in cgi.log\n");
}

TEST_F(LogCommand, FollowsWhatIsAppendedThroughRotationAndTruncationUntilCtrlC) {
  folder().make_file("cgi.log", banner() + exchange("/a", "200 OK"));
  ProgramRun program(folder(), vexactl({"log", "cgi.log", "--follow"}));
  std::string expected = kHead + row("/a", "OK");
  EXPECT_TRUE(shows(expected));
  append("cgi.log", kTo + std::string("/b"));
  std::filesystem::rename(folder() / "cgi.log", folder() / "cgi1.log");
  append("cgi.log", banner() + kFrom + "200 rotated");
  expected += row("/b", "rotated");
  EXPECT_TRUE(shows(expected));
  std::filesystem::resize_file(folder() / "cgi.log", 0);
  append("cgi.log", exchange("/c", "200 cut"));
  expected += row("/c", "cut");
  EXPECT_TRUE(shows(expected));
  append("cgi.log", kTo + std::string("/d"));
  program.signal(SIGINT);
  EXPECT_EQ(program.wait().exit_code, 130);
}

TEST_F(LogCommand, FollowsALogThatIsStillEmpty) {
  folder().make_file("cgi.log");
  ProgramRun program(folder(), vexactl({"log", "cgi.log", "--follow"}));
  append("cgi.log", banner() + exchange("/a", "200 OK"));
  EXPECT_TRUE(shows(kHead + row("/a", "OK")));
  program.signal(SIGTERM);
  EXPECT_EQ(program.wait().exit_code, 130);
}

TEST_F(LogCommand, AFullStandardOutputEndsWithFive) {
  folder().make_file("cgi.log", banner() + exchange("/a", "200 OK"));
  const ProgramResult result =
      ProgramRun(folder(), {"/bin/sh", "-c", VEXA_BINARY_DIR "/bin/vexactl log cgi.log >/dev/full"}).wait();
  EXPECT_EQ(result.exit_code, 5);
  EXPECT_THAT(result.err, HasSubstr("cannot write standard output: No space left on device"));
}

TEST_F(LogCommand, FollowingEndsWhenNobodyReadsItAnyMoreThoughNothingIsAppended) {
  append("cgi.log", exchange("/command/main.cgi", "200 OK"));
  ReadRun log(folder(), vexactl({"log", "cgi.log", "--follow"}), {}, ReadRun::Reader::kPipe);
  EXPECT_EQ(log.read_lines(1), kHead);
  log.stop_reading();
  EXPECT_EQ(log.program().wait().exit_code, 5);
}

}  // namespace
}  // namespace vexa_test
