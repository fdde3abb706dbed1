// SPDX-License-Identifier: Apache-2.0
// The command line of vexactl: help, refusals, and what they must not repeat.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/host/program_run.h"

namespace vexa_test {
namespace {

ProgramResult run(std::vector<std::string> arguments) {
  const TemporaryFolder folder;
  folder.make_file("password", "x\n");
  folder.make_file("no-colon", "operator\n");
  folder.make_file("long", std::string(200, 'u') + ":" + std::string(55, 'p') + "\n");
  arguments.insert(arguments.begin(), VEXA_BINARY_DIR "/bin/vexactl");
  return ProgramRun(folder, std::move(arguments)).wait();
}

TEST(CommandLine, HelpNamesCommandsEnvironmentAndExitCodes) {
  const ProgramResult result = run({"--help"});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.err, "");
  for (const char* part : {"info", "record", "log", "VEXACTL_USER", "VEXACTL_PASSWORD", "Exit codes:", "    0  done",
                           "    1  the command line", "    2  the camera cannot be reached",
                           "    3  the camera refuses user name and password", "    4  the camera sends no picture",
                           "    5  a result cannot be written", "  130  interrupted"}) {
    EXPECT_THAT(result.out, testing::HasSubstr(part));
  }
}

TEST(CommandLine, HelpOfACommandListsItsOptions) {
  const ProgramResult result = run({"record", "--help"});
  EXPECT_EQ(result.exit_code, 0);
  for (const char* part : {"--out", "--seconds", "--frames", "--stream", "--credentials", "--password-file", "--user",
                           "--timeout", "--json", "--trace", "--cgi-log", "--quiet", "camera"}) {
    EXPECT_THAT(result.out, testing::HasSubstr(part));
  }
}

TEST(CommandLine, ShowsItsVersion) {
  const ProgramResult result = run({"--version"});
  EXPECT_EQ(result.exit_code, 0);
  EXPECT_EQ(result.out, "vexactl " VEXA_VERSION "\n");
}

struct Refusal {
  std::vector<std::string> arguments;
  const char* err;
};

TEST(CommandLine, EachMistakeEndsWithOneAndNamesWhatToDo) {
  const Refusal refusals[] = {
      {{}, "vexactl: the command is missing or unknown\n  See vexactl --help for the commands.\n"},
      {{"inof", "cam"}, "vexactl: there is no command \"inof\"\n  See vexactl --help for the commands.\n"},
      {{"Hunter2", "cam"}, "vexactl: the command is missing or unknown\n  See vexactl --help for the commands.\n"},
      {{"info"}, "vexactl: --camera is required\n  See vexactl info --help.\n"},
      {{"info", "cam", "extra"},
       "vexactl: there are too many arguments, from \"extra\" on\n  See vexactl info --help.\n"},
      {{"info", "cam", "hunter2"}, "vexactl: there are too many arguments\n  See vexactl info --help.\n"},
      {{"info", "cam", "--password=hunter2"}, "vexactl: unknown option --password\n  See vexactl info --help.\n"},
      {{"info", "cam", "--password", "hunter2"}, "vexactl: unknown option --password\n  See vexactl info --help.\n"},
      {{"info", "cam", "-phunter2"}, "vexactl: unknown option -p\n  See vexactl info --help.\n"},
      {{"info", "cam", "--user"}, "vexactl: --user: 1 required NAME missing\n  See vexactl info --help.\n"},
      {{"info", "cam", "--timeout", "hunter2"},
       "vexactl: the value of --timeout cannot be used\n  See vexactl info --help.\n"},
      {{"info", "cam", "--json=hunter2"}, "vexactl: the value of --json cannot be used\n  See vexactl info --help.\n"},
      {{"info", "cam", "--camera", "hunter2"},
       "vexactl: --camera: At Most 1 required but received 2\n  See vexactl info --help.\n"},
      {{"record", "cam", "--out", "f", "--frames", "-1"},
       "vexactl: --frames is not a number above 0\n  For instance: --frames 250.\n"},
      {{"info", "cam", "--timeout", "0"},
       "vexactl: --timeout is not a number from 1 to 600000\n  It is in milliseconds; 5000 when not given.\n"},
      {{"info", "cam", "--timeout", "600001"},
       "vexactl: --timeout is not a number from 1 to 600000\n  It is in milliseconds; 5000 when not given.\n"},
      {{"info", "cam", "--user", "a", "--credentials", "b"},
       "vexactl: --user excludes --credentials\n  See vexactl info --help.\n"},
      {{"info", "admin:hunter2@cam"},
       "vexactl: the camera's address is HOST or HOST:PORT, not a URL\n"
       "  User name and password have options of their own: --user, --password-file, --credentials.\n"},
      {{"info", "cam:0"},
       "vexactl: the port in the camera's address is not a number from 1 to 65535\n  For instance: cam1:80.\n"},
      {{"info", "cam", "--user", "admin:hunter2"},
       "vexactl: a user name cannot hold a colon\n  A password goes into --password-file or --credentials.\n"},
      {{"info", "cam", "--password-file", "missing"},
       "vexactl: cannot read missing: No such file or directory\n"
       "  Check the file's name and that you may read it.\n"},
      {{"info", "cam", "--credentials", "no-colon"},
       "vexactl: the first line of no-colon is not USER:PASSWORD\n"
       "  Write both on one line, with a colon between them.\n"},
      {{"info", "cam", "--credentials", "long"},
       "vexactl: user name and password are longer than 254 characters together\n"
       "  Choose shorter ones on the camera.\n"},
      {{"info", "127.0.0.1", "--cgi-log", ""},
       "vexactl: --cgi-log names no file\n  For instance: --cgi-log cgi.log.\n"},
      {{"info", "127.0.0.1", "--cgi-log", std::string(1024, 'f')},
       "vexactl: the name of --cgi-log is longer than 1023 characters\n  Choose a shorter one.\n"},
      {{"ptz", "cam"}, "vexactl: the action is missing, or not one of the command's\n  See vexactl ptz --help.\n"},
      {{"ptz", "cam", "fly"}, "vexactl: ptz has no action \"fly\"\n  See vexactl ptz --help.\n"},
      {{"ptz", "cam", "watch", "--count", "0"},
       "vexactl: the value of --count cannot be used\n  See vexactl ptz CAMERA watch --help.\n"},
      {{"record", "cam", "--out", "x.avi"},
       "vexactl: the end of x.avi names no format of video\n"
       "  End --out in .mkv, .mp4, .h264, .m4v or .mjpeg, or give --format mkv, mp4, h264, m4v or mjpeg.\n"},
      {{"record", "cam", "--out", "x.mkv", "--format", "avi"},
       "vexactl: unknown format \"avi\"\n  Choose mkv, mp4, h264, m4v or mjpeg.\n"},
      {{"output", "cam", "1", "up"},
       "vexactl: an output is switched on or off, not \"up\"\n  See vexactl output --help.\n"},
      {{"tampering", "cam", "maybe"},
       "vexactl: tampering is switched on or off, not \"maybe\"\n  See vexactl tampering --help.\n"},
      {{"set", "cam", "codecs=H.264"},
       "vexactl: unknown setting \"codecs\"\n"
       "  The settings are: codec, size, frame-rate, bit-rate, quality, rotation, day-night, noise-reduction, "
       "wide-dynamic-range, visibility-enhancer, infrared, infrared-strength, back-light, exposure.\n"},
      {{"ptz", "cam", "pan"}, "vexactl: direction is required\n  See vexactl ptz CAMERA pan --help.\n"},
      {{"ptz", "cam", "pan", "left", "--password=hunter2"},
       "vexactl: unknown option --password\n  See vexactl ptz CAMERA pan --help.\n"},
      {{"profile", "show"}, "vexactl: profile is required\n  See vexactl profile show --help.\n"},
      {{"log"}, "vexactl: file is required\n  See vexactl log --help.\n"},
      {{"log", "missing"},
       "vexactl: cannot read missing: No such file or directory\n"
       "  Check the file's name and that you may read it.\n"},
      {{"log", "."}, "vexactl: cannot read .: Is a directory\n  Check the file's name and that you may read it.\n"},
      {{"log", "/dev/null", "--follow"},
       "vexactl: /dev/null is not a regular file\n  --follow needs one; leave it out to read this once.\n"},
      {{"record", "cam"}, "vexactl: --out is required\n  See vexactl record --help.\n"},
      {{"record", "cam", "--out", ""}, "vexactl: --out names no file\n  For instance: --out live.h264.\n"},
      {{"record", "cam", "--out", "f", "--seconds", "0"},
       "vexactl: --seconds is not a number above 0\n  For instance: --seconds 10.\n"},
      {{"record", "cam", "--out", "f", "--seconds", "-1"},
       "vexactl: --seconds is not a number above 0\n  For instance: --seconds 10.\n"},
      {{"record", "cam", "--out", "f", "--seconds", "nan"},
       "vexactl: --seconds is not a number above 0\n  For instance: --seconds 10.\n"},
      {{"record", "cam", "--out", "f", "--frames", "0"},
       "vexactl: --frames is not a number above 0\n  For instance: --frames 250.\n"},
      {{"record", "cam", "--out", "f", "--stream", "0"},
       "vexactl: --stream is not a number from 1 to 16\n  1 is the camera's first stream.\n"},
      {{"record", "cam", "--out", "f", "--stream", "17"},
       "vexactl: --stream is not a number from 1 to 16\n  1 is the camera's first stream.\n"},
      {{"record", "cam", "--out", "f", "--transport", "tcp"},
       "vexactl: --transport is neither udp nor http\n  udp when not given.\n"},
      {{"listen", "cam", "--out", "f", "--codec", "g711"},
       "vexactl: --codec must be g711_64, g726_40, g726_32, g726_24 or g726_16\n  For instance: --codec "
       "g711_64.\n"},
      {{"listen", "cam", "--out", "f", "--seconds", "0"},
       "vexactl: --seconds is not a number above 0\n  For instance: --seconds 10.\n"},
  };
  for (const Refusal& refusal : refusals) {
    SCOPED_TRACE(testing::PrintToString(refusal.arguments));
    const ProgramResult result = run(refusal.arguments);
    EXPECT_EQ(result.exit_code, 1);
    EXPECT_EQ(result.out, "");
    EXPECT_EQ(result.err, refusal.err);
  }
}

}  // namespace
}  // namespace vexa_test
