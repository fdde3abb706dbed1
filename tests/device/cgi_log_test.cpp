#include <gtest/gtest.h>
#include <unistd.h>

#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/support/in_child.h"
#include "tests/support/log_text.h"
#include "tests/support/scripted_camera.h"
#include "tests/support/temporary_folder.h"
#include "tests/support/test_driver.h"
#include "vexa/real_time.h"

namespace vexa_test {
namespace {

constexpr std::size_t kPathRoom = 1024;

class LoggingDriver : public TestDriver {
 public:
  LoggingDriver() = default;
  /// Logs to `path`, and is switched on.
  explicit LoggingDriver(const std::string& path) {
    SetCGILogPath(path.c_str());
    reopen();
    SetCGILogLevel(true);
  }

  /// What the host does to open the log; the connection stays as it is.
  void reopen() {
    SLibDConnectionInfo info = m_State->connection.copy();
    SetCurrentConnectionInfo(info);
  }
};

std::string log_text(const std::string& path) { return without_times(contents_of(path)); }

std::string line(const std::string& direction, const std::string& message) {
  return "\r\n00-00-0000\t00:00:00.000\tCGI\t" + direction + "\t" + message;
}

/// The request that a driver with the user "admin" and the password "secret" makes.
std::string request(const std::string& path) {
  return "GET http://{host}:{port}" + path + " HTTP/1.0\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
}

TEST(CgiLog, BeginsOffAndWithoutAPath) {
  const LoggingDriver driver;
  EXPECT_FALSE(driver.m_CGILogEnabled);
  EXPECT_STREQ(driver.m_CGILogPath, "");
}

TEST(CgiLog, LevelSwitchesItOnAndOff) {
  LoggingDriver driver;
  EXPECT_EQ(driver.SetCGILogLevel(true), LIBD_OK);
  EXPECT_TRUE(driver.m_CGILogEnabled);
  EXPECT_EQ(driver.SetCGILogLevel(false), LIBD_OK);
  EXPECT_FALSE(driver.m_CGILogEnabled);
}

TEST(CgiLog, PathIsTakenUpTo1023Characters) {
  for (const std::size_t length :
       {std::size_t{0}, std::size_t{1}, kPathRoom - 2, kPathRoom - 1, kPathRoom, kPathRoom + 1, std::size_t{4096}}) {
    LoggingDriver driver;
    driver.SetCGILogPath("what was there before");
    const std::string path(length, 'p');
    EXPECT_EQ(driver.SetCGILogPath(path.c_str()), LIBD_OK);
    EXPECT_EQ(driver.m_CGILogPath, path.substr(0, kPathRoom - 1));
    EXPECT_EQ(driver.m_CGILogPath[kPathRoom - 1], '\0');
  }
}

TEST(CgiLog, NullPathIsIgnored) {
  LoggingDriver driver;
  driver.SetCGILogPath("kept");
  EXPECT_EQ(driver.SetCGILogPath(nullptr), LIBD_OK);
  EXPECT_STREQ(driver.m_CGILogPath, "kept");
}

TEST(CgiLog, ThePathCountsFromTheNextConnectionOn) {
  const TemporaryFolder folder;
  LoggingDriver driver(folder / "1");
  driver.SetCGILogPath((folder / "2").c_str());
  driver.Log("To", "/a");
  EXPECT_NE(access((folder / "2").c_str(), F_OK), 0);
  driver.reopen();
  driver.Log("To", "/b");
  EXPECT_EQ(log_text(folder / "1"), opening_banner() + line("To", "/a") + closing_banner());
  EXPECT_EQ(log_text(folder / "2"), opening_banner() + line("To", "/b"));
}

TEST(CgiLog, AnEmptyPathLeavesTheFormerName) {
  const TemporaryFolder folder;
  LoggingDriver driver(folder / "1");
  driver.SetCGILogPath("");
  driver.reopen();
  EXPECT_EQ(log_text(folder / "1"), opening_banner() + closing_banner() + opening_banner());
}

TEST(CgiLog, WithoutAPathTheFileIsLogTxtInTheWorkingFolder) {
  const TemporaryFolder folder;
  EXPECT_EQ(in_child([&] {
              if (chdir(folder.path().c_str()) != 0) return std::string("no folder");
              LoggingDriver driver;
              driver.reopen();
              return log_text(folder / "Log.txt");
            }),
            opening_banner());
}

TEST(CgiLog, TheFileIsOpenedAlsoWhileItIsOff) {
  const TemporaryFolder folder;
  LoggingDriver driver;
  driver.SetCGILogPath((folder / "Log.txt").c_str());
  driver.reopen();
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner());
}

TEST(CgiLog, ALineIsBreakTimeDirectionAndMessage) {
  const TemporaryFolder folder;
  LoggingDriver driver(folder / "Log.txt");
  driver.Log("To", "/command/inquiry.cgi?inq=system");
  driver.Log("From", "200 OK");
  EXPECT_EQ(log_text(folder / "Log.txt"),
            opening_banner() + line("To", "/command/inquiry.cgi?inq=system") + line("From", "200 OK"));
}

TEST(CgiLog, ALineTellsTheLocalTime) {
  const TemporaryFolder folder;
  LoggingDriver driver(folder / "Log.txt");
  const std::string before = CRealTime::GetTheCurrentTime().Format("%Y%O%D%H%M%S%03L", true);
  driver.Log("To", "/");
  const std::string after = CRealTime::GetTheCurrentTime().Format("%Y%O%D%H%M%S%03L", true);
  CRealTime told;
  ASSERT_EQ(told.Scan(contents_of(folder / "Log.txt").substr(opening_banner().size()).c_str(),
                      "\n%D-%O-%Y\t%H:%M:%S.%L", false),
            7);
  EXPECT_GE(told.Format("%Y%O%D%H%M%S%03L", true), before);
  EXPECT_LE(told.Format("%Y%O%D%H%M%S%03L", true), after);
}

TEST(CgiLog, TextsEnterTheFileAsTheyAre) {
  const TemporaryFolder folder;
  LoggingDriver driver(folder / "Log.txt");
  const std::string long_text(100000, 'x');
  for (const std::string& text :
       {std::string("%n%s%d%%"), std::string("a\r\n\x01\x7F\xFF b"), std::string(), long_text}) {
    driver.Log(text.c_str(), text.c_str());
  }
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner() + line("%n%s%d%%", "%n%s%d%%") +
                                              line("a\r\n\x01\x7F\xFF b", "a\r\n\x01\x7F\xFF b") + line("", "") +
                                              line(long_text, long_text));
}

TEST(CgiLog, NullTextsAreIgnored) {
  const TemporaryFolder folder;
  LoggingDriver driver(folder / "Log.txt");
  driver.Log(nullptr, "/");
  driver.Log("To", nullptr);
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner());
}

TEST(CgiLog, TheDriversEndClosesTheFile) {
  const TemporaryFolder folder;
  { const LoggingDriver driver(folder / "Log.txt"); }
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner() + closing_banner());
}

TEST(CgiLog, DriversOfOnePathShareTheFile) {
  const TemporaryFolder folder;
  LoggingDriver first(folder / "Log.txt");
  auto second = std::make_unique<LoggingDriver>(folder / "Log.txt");
  first.Log("To", "/1");
  second->Log("To", "/2");
  second.reset();
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner() + line("To", "/1") + line("To", "/2"));
}

TEST(CgiLog, HoldsEachRequestAndEachStatus) {
  const TemporaryFolder folder;
  ScriptedCamera camera(
      {{.expected = request("/command/inquiry.cgi?inq=system"), .answer = "HTTP/1.0 200 OK\r\n\r\nModelName=V1&"},
       {.new_connection = true,
        .expected = request("/command/main.cgi?System=reset"),
        .answer = "HTTP/1.0 503 Busy now\r\n\r\n"}});
  LoggingDriver driver(folder / "Log.txt");
  driver.use(camera.host(), camera.port(), 5000);
  std::string answer;
  EXPECT_EQ(driver.SendInqCommand("system", answer), LIBD_OK);
  EXPECT_EQ(driver.http_open("/command/main.cgi?System=%s", "reset"), -1);
  EXPECT_EQ(camera.finish(), "");
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner() + line("To", "/command/inquiry.cgi?inq=system") +
                                              line("From", "200 OK") + line("To", "/command/main.cgi?System=reset") +
                                              line("From", "503 Busy now"));
}

TEST(CgiLog, HoldsNoPassword) {
  const TemporaryFolder folder;
  ScriptedCamera camera({{.expected = request("/"), .answer = "HTTP/1.0 401 Unauthorized\r\n\r\n"}});
  LoggingDriver driver(folder / "Log.txt");
  driver.use(camera.host(), camera.port(), 5000);
  driver.reopen();
  EXPECT_EQ(driver.http_open("/"), -1);
  EXPECT_EQ(camera.finish(), "");
  const std::string text = contents_of(folder / "Log.txt");
  EXPECT_NE(text.find("CGI\tFrom\t401 Unauthorized"), std::string::npos);
  EXPECT_EQ(text.find("secret"), std::string::npos);
  EXPECT_EQ(text.find("YWRtaW46c2VjcmV0"), std::string::npos);
}

TEST(CgiLog, HidesTheCredentialsThatACameraSendsBack) {
  const struct {
    const char* reason;
    const char* logged;
  } cases[] = {{"no secret, please", "no ***, please"},
               {"YWRtaW46c2VjcmV0 is not admin:secret", "*** is not admin:***"},
               {"Secrets of admin", "Secrets of admin"}};
  for (const auto& c : cases) {
    const TemporaryFolder folder;
    ScriptedCamera camera({{.expected = request("/"), .answer = std::string("HTTP/1.0 500 ") + c.reason + "\r\n\r\n"}});
    LoggingDriver driver(folder / "Log.txt");
    driver.use(camera.host(), camera.port(), 5000);
    EXPECT_EQ(driver.http_open("/"), -1);
    EXPECT_EQ(camera.finish(), "");
    EXPECT_EQ(log_text(folder / "Log.txt"),
              opening_banner() + line("To", "/") + line("From", std::string("500 ") + c.logged));
    EXPECT_EQ(driver.LatestErrorText(), c.reason);
  }
}

TEST(CgiLog, HidesNothingForAnEmptyPassword) {
  const TemporaryFolder folder;
  const std::string expected = "GET http://{host}:{port}/ HTTP/1.0\r\nAuthorization: Basic YWRtaW46\r\n\r\n";
  ScriptedCamera camera({{.expected = expected, .answer = "HTTP/1.0 500 YWRtaW46\r\n\r\n"}});
  LoggingDriver driver(folder / "Log.txt");
  driver.use(camera.host(), camera.port(), 5000);
  driver.m_ConnectionInfo.password.clear();
  EXPECT_EQ(driver.http_open("/"), -1);
  EXPECT_EQ(camera.finish(), "");
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner() + line("To", "/") + line("From", "500 YWRtaW46"));
}

TEST(CgiLog, IsEmptyWhileItIsOff) {
  const TemporaryFolder folder;
  ScriptedCamera camera({{.expected = request("/"), .answer = "HTTP/1.0 200 OK\r\n\r\n"}});
  LoggingDriver driver(folder / "Log.txt");
  driver.SetCGILogLevel(false);
  driver.use(camera.host(), camera.port(), 5000);
  const int socket = driver.http_open("/");
  EXPECT_GE(socket, 0);
  driver.http_close(socket);
  EXPECT_EQ(camera.finish(), "");
  EXPECT_EQ(log_text(folder / "Log.txt"), opening_banner());
}

TEST(CgiLog, TheDriverGoesOnWhenTheFileCannotBeOpenedOrWritten) {
  const TemporaryFolder folder;
  for (const std::string& path : {folder / "gone/Log.txt", folder.path(), std::string("/dev/full")}) {
    ScriptedCamera camera({{.expected = request("/"), .answer = "HTTP/1.0 204 No Content\r\n\r\n"}});
    stderr_of([&] {
      LoggingDriver driver(path);
      driver.use(camera.host(), camera.port(), 5000);
      const int socket = driver.http_open("/");
      EXPECT_GE(socket, 0);
      driver.http_close(socket);
      EXPECT_EQ(driver.LatestErrorCode(), 0);
    });
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST(CgiLog, AStreamGoesOnWhenTheFileCannotBeWritten) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  driver.SetCGILogPath("/dev/full");
  SLibDConnectionInfo info;
  driver.SetCurrentConnectionInfo(info);
  driver.SetCGILogLevel(true);
  camera.play(driver);
  FrameTaker host;
  EXPECT_EQ(host.take_all(driver, 10).size(), 10U);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
}

TEST(CgiLog, LinesAndReopeningsOfSeveralThreadsDoNotRace) {
  const TemporaryFolder folder(memory_folder());
  constexpr int kWriters = 4;
  constexpr int kLinesEach = 500;
  constexpr int kReopenings = 200;  // few enough for the banners not to fill a file
  LoggingDriver driver(folder / "a");
  std::vector<std::thread> threads;
  for (int i = 0; i < kWriters; ++i) {
    threads.emplace_back([&driver] {
      for (int number = 0; number < kLinesEach; ++number) {
        driver.SetCGILogLevel(number % 2 == 0);
        driver.Log("To", "/command");
      }
    });
  }
  threads.emplace_back([&] {
    for (int number = 0; number < kReopenings; ++number) {
      driver.SetCGILogPath((folder / (number % 2 == 0 ? "b" : "a")).c_str());
      driver.reopen();
    }
  });
  for (std::thread& thread : threads) thread.join();
  int lines = 0;
  for (const char* name : {"a", "b"}) {
    const std::string text = contents_of(folder / name);
    for (std::size_t at = 0; (at = text.find("CGI\tTo\t/command", at)) != std::string::npos; ++at) ++lines;
  }
  EXPECT_EQ(lines, kWriters * kLinesEach);
}

}  // namespace
}  // namespace vexa_test
