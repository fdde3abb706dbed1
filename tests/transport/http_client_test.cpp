// SPDX-License-Identifier: Apache-2.0
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <unistd.h>

#include <climits>
#include <cstring>
#include <thread>

#include "tests/support/in_child.h"
#include "tests/support/interruptions.h"
#include "tests/support/process_state.h"
#include "tests/support/scripted_camera.h"
#include "tests/support/temporary_folder.h"
#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

constexpr int kPatient = 20000;  // milliseconds, where the answer comes
constexpr const char* kOk = "HTTP/1.0 200 OK\r\n\r\n";

std::string get_request(const std::string& host, const std::string& path) {
  return "GET http://" + host + path + " HTTP/1.0\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
}

ScriptStep step(const std::string& path, const std::string& answer, Then then = Then::kClose) {
  ScriptStep made;
  made.expected = get_request("{host}:{port}", path);
  made.answer = answer;
  made.then = then;
  return made;
}

/// The latest error as "code text".
class HttpOpen : public testing::Test {
 protected:
  HttpOpen() { driver_.soil_latest_error(); }

  int open(const ScriptedCamera& camera, const std::string& path, int timeout = 5000) {
    driver_.use(camera.host(), camera.port(), timeout);
    return driver_.http_open("%s", path.c_str());
  }

  /// Opens a path of "camera.example:8080" over a proxy, so that the request does not depend on the proxy's port.
  int open_through(const ScriptedCamera& proxy, const std::string& path) {
    driver_.use("camera.example", 8080, 5000);
    driver_.m_ConnectionInfo.useProxy = true;
    driver_.m_ConnectionInfo.proxyHost = proxy.host();
    driver_.m_ConnectionInfo.proxyPort = proxy.port();
    return driver_.http_open("%s", path.c_str());
  }

  TestDriver driver_;
  const std::size_t descriptors_ = open_descriptors();
};

TEST_F(HttpOpen, LeavesTheBodyForItsReader) {
  ScriptedCamera camera({step("/image1", std::string(kOk) + "body\r\n\r\nmore")});
  const int socket = open(camera, "/image1");
  char body[32] = {};
  EXPECT_EQ(driver_.http_recvn(socket, body, sizeof body, 5000), 12);
  EXPECT_STREQ(body, "body\r\n\r\nmore");
  driver_.http_close(socket);
  EXPECT_EQ(camera.finish(), "");
  EXPECT_EQ(open_descriptors(), descriptors_);
}

TEST_F(HttpOpen, GivesASocketThatDoesNotBlockAndIsClosedInChildren) {
  ScriptedCamera camera({step("/image1", kOk)});
  const int socket = open(camera, "/image1");
  EXPECT_NE(fcntl(socket, F_GETFL) & O_NONBLOCK, 0);
  EXPECT_NE(fcntl(socket, F_GETFD) & FD_CLOEXEC, 0);
  int size = 0;
  socklen_t length = sizeof size;
  EXPECT_EQ(getsockopt(socket, SOL_SOCKET, SO_RCVBUF, &size, &length), 0);
  EXPECT_EQ(size, 2 * 131072);  // Linux reports twice what was asked for
  driver_.http_close(socket);
}

TEST_F(HttpOpen, FormatsThePathFromItsArguments) {
  ScriptedCamera camera({step("/command/x.cgi?a=5&b=%20%s", kOk)});
  driver_.use(camera.host(), camera.port(), 5000);
  driver_.http_close(driver_.http_open("/command/x.cgi?a=%d&b=%%20%s", 5, "%s"));
  EXPECT_EQ(camera.finish(), "");
}

TEST_F(HttpOpen, GoesToTheProxyAndNamesTheCamera) {
  ScriptStep proxied = step("", kOk);
  proxied.expected = get_request("camera.example:8080", "/x");
  ScriptedCamera proxy({proxied});
  const int socket = open_through(proxy, "/x");
  EXPECT_NE(socket, -1);
  driver_.http_close(socket);
  EXPECT_EQ(proxy.finish(), "");
}

TEST_F(HttpOpen, AuthorisesWithoutUserAndPasswordToo) {
  ScriptStep anonymous = step("/x", kOk);
  anonymous.expected = "GET http://{host}:{port}/x HTTP/1.0\r\nAuthorization: Basic Og==\r\n\r\n";
  ScriptedCamera camera({anonymous});
  driver_.use(camera.host(), camera.port(), 5000);
  driver_.m_ConnectionInfo.userName.clear();
  driver_.m_ConnectionInfo.password.clear();
  driver_.http_close(driver_.http_open("/x"));
  EXPECT_EQ(camera.finish(), "");
}

TEST_F(HttpOpen, CutsCredentialsAt255Characters) {
  std::string token;  // 255 times "A" in Base64: the user fills the room, and nothing of ":" and password is left
  for (int group = 0; group < 85; ++group) token += "QUFB";
  ScriptStep long_one = step("/x", kOk);
  long_one.expected = "GET http://{host}:{port}/x HTTP/1.0\r\nAuthorization: Basic " + token + "\r\n\r\n";
  ScriptedCamera camera({long_one});
  driver_.use(camera.host(), camera.port(), 5000);
  driver_.m_ConnectionInfo.userName = std::string(400, 'A');
  driver_.http_close(driver_.http_open("/x"));
  EXPECT_EQ(camera.finish(), "");
}

TEST_F(HttpOpen, SendsARequestOf1023Characters) {
  const std::string path(1023 - get_request("camera.example:8080", "").size(), 'p');
  ScriptStep longest = step("", kOk);
  longest.expected = get_request("camera.example:8080", path);
  ScriptedCamera proxy({longest});
  const int socket = open_through(proxy, path);
  EXPECT_NE(socket, -1);
  driver_.http_close(socket);
  EXPECT_EQ(proxy.finish(), "");
}

TEST_F(HttpOpen, RefusesALongerRequestAfterConnectingWithNothingSent) {
  for (const std::size_t length : {1024U, 2000U, 100000U}) {
    ScriptStep nothing;
    nothing.then = Then::kStay;
    ScriptedCamera proxy({nothing});
    driver_.soil_latest_error();
    EXPECT_EQ(open_through(proxy, std::string(length - get_request("camera.example:8080", "").size(), 'p')), -1);
    EXPECT_EQ(driver_.latest_error(), "0 URL too long");
    EXPECT_TRUE(eventually([&] { return proxy.played(); }));
    EXPECT_EQ(proxy.finish(), "");
    EXPECT_EQ(open_descriptors(), descriptors_);
  }
}

TEST_F(HttpOpen, ReportsThatTheConnectionWasRefused) {
  driver_.use(own_loopback(0), refusing_port(), 5000);
  EXPECT_EQ(driver_.http_open("/x"), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Connection refused");
  EXPECT_EQ(open_descriptors(), descriptors_);
}

TEST_F(HttpOpen, ReportsThatTheConnectionTimedOut) {
  const FullListener camera;
  const std::size_t descriptors = open_descriptors();
  driver_.use(camera.host(), camera.port(), 30);
  EXPECT_EQ(driver_.http_open("/x"), -1);
  EXPECT_EQ(driver_.latest_error(), "-200 Connection timed out");
  EXPECT_EQ(open_descriptors(), descriptors);
}

TEST_F(HttpOpen, ShowsTheResolversNumberAsASystemError) {
  driver_.use("256.256.256.256", 80, 5000);
  EXPECT_EQ(driver_.http_open("/x"), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Operation not permitted");
  driver_.use(std::string(1100, '0') + "177.1", 80, 5000);
  EXPECT_EQ(driver_.http_open("/x"), -1);
  EXPECT_EQ(driver_.latest_error(), "0 Unknown error -1");
  EXPECT_EQ(open_descriptors(), descriptors_);
}

TEST_F(HttpOpen, ReportsThatThereIsNoDescriptorLeft) {
  driver_.use(own_loopback(0), refusing_port(), 5000);
  EXPECT_EQ(in_child([&driver = driver_] {
              driver.http_open("/x");  // sanitizers look at new types with a descriptor
              const rlimit none{0, 0};
              if (setrlimit(RLIMIT_NOFILE, &none) != 0) return std::string("no limit");
              const int socket = driver.http_open("/x");
              return std::to_string(socket) + " " + driver.latest_error();
            }),
            "-1 0 Too many open files");
}

/// Opens descriptors until one of them is above 1023; what select could not serve.
bool pass_descriptor_1023() {
  rlimit limit{};
  if (getrlimit(RLIMIT_NOFILE, &limit) != 0 || limit.rlim_max < 1200) return false;
  limit.rlim_cur = 1200;
  if (setrlimit(RLIMIT_NOFILE, &limit) != 0) return false;
  while (const int twin = dup(2)) {
    if (twin < 0 || twin >= 1030) return twin >= 1030;
  }
  return false;
}

TEST_F(HttpOpen, WorksWithADescriptorAbove1023) {
  EXPECT_EQ(in_child([this] {
              if (!pass_descriptor_1023()) return std::string("too few descriptors allowed");
              ScriptedCamera camera({step("/x", kOk)});
              const int socket = open(camera, "/x");
              if (socket < 1024) return "socket " + std::to_string(socket) + ": " + driver_.LatestErrorText();
              char nothing = 0;
              const int received = driver_.http_recv(socket, &nothing, 1, 5000);
              driver_.http_close(socket);
              return std::to_string(received) + camera.finish();
            }),
            "0");
}

TEST_F(HttpOpen, IsNotEndedBySignals) {
  ScriptStep slow = step("/x", std::string(kOk) + "body");
  slow.piece = 4;
  slow.pause = 3;
  const Interruptions interruptions;
  EXPECT_TRUE(interruptions.come_during([&] {
    ScriptedCamera camera({slow});
    const int socket = open(camera, "/x", kPatient);
    char body[4];
    EXPECT_EQ(driver_.http_recvn(socket, body, 4, kPatient), 4);
    driver_.http_close(socket);
    EXPECT_EQ(camera.finish(), "");
  }));
}

TEST_F(HttpOpen, FailsOnEveryCutHeaderWithoutALeak) {
  const std::string answer = kOk;
  for (std::size_t length = 0; length < answer.size(); ++length) {
    ScriptedCamera camera({step("/x", answer.substr(0, length))});
    driver_.soil_latest_error();
    EXPECT_EQ(open(camera, "/x", 10), -1) << length;
    EXPECT_EQ(driver_.latest_error(), "0 from before") << length;
    EXPECT_EQ(camera.finish(), "");
  }
  EXPECT_EQ(open_descriptors(), descriptors_);
}

TEST_F(HttpOpen, ReadsAnAnswerSplitAnywhere) {
  const std::string answer = "HTTP/1.0 401 No\r\n\r\n";
  for (std::size_t piece = 1; piece < answer.size(); ++piece) {
    ScriptStep split = step("/x", answer);
    split.piece = piece;
    split.pause = 1;
    ScriptedCamera camera({split});
    EXPECT_EQ(open(camera, "/x"), -1);
    EXPECT_EQ(driver_.latest_error(), "-201 No") << piece;
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST_F(HttpOpen, TakesAHeaderOf1023BytesAndNoLongerOne) {
  for (const std::size_t length : {1022U, 1023U, 1024U, 1025U}) {
    const std::string begin = "HTTP/1.0 200 OK\r\nServer: ";
    ScriptedCamera camera({step("/x", begin + std::string(length - begin.size() - 4, 's') + "\r\n\r\n")});
    const int socket = open(camera, "/x", length <= 1023 ? kPatient : 200);
    EXPECT_EQ(socket != -1, length <= 1023) << length;
    driver_.http_close(socket);
    EXPECT_EQ(camera.finish(), "");
  }
}

TEST_F(HttpOpen, LogsThePathAndTheStatus) {
  const TemporaryFolder folder;
  ScriptedCamera camera({step("/command/a.cgi?x=1", "HTTP/1.0 503 Not now\r\n\r\n")});
  driver_.m_CGILogger.SetFileName((folder / "cgi.log").c_str());
  driver_.m_CGILogger.OpenFile();
  driver_.m_CGILogEnabled = true;
  open(camera, "/command/a.cgi?x=1");
  driver_.m_CGILogger.CloseFile();
  const std::string log = contents_of(folder / "cgi.log");
  EXPECT_NE(log.find("\tCGI\tTo\t/command/a.cgi?x=1\r\n"), std::string::npos) << log;
  EXPECT_NE(log.find("\tCGI\tFrom\t503 Not now\n"), std::string::npos) << log;
  EXPECT_EQ(log.find("YWRtaW46c2VjcmV0"), std::string::npos);
}

TEST_F(HttpOpen, LogsNothingWhileTheLogIsOff) {
  const TemporaryFolder folder;
  ScriptedCamera camera({step("/x", kOk)});
  driver_.m_CGILogger.SetFileName((folder / "cgi.log").c_str());
  driver_.m_CGILogger.OpenFile();
  driver_.http_close(open(camera, "/x"));
  driver_.m_CGILogger.CloseFile();
  EXPECT_EQ(contents_of(folder / "cgi.log").find("CGI"), std::string::npos);
}

TEST(SendInqCommand, CutsAnAnswerAtTheTablesSize) {
  for (const std::size_t length : {511U, 512U, 513U, 5000U}) {
    TestDriver driver;
    const std::string body(length, 'b');
    ScriptedCamera camera({step("/command/inquiry.cgi?inq=sensor", kOk + body)});
    driver.use(camera.host(), camera.port(), 5000);
    std::string answer;
    EXPECT_EQ(driver.SendInqCommand("sensor", answer), LIBD_OK);
    EXPECT_EQ(answer, body.substr(0, 512)) << length;
  }
}

TEST(SendInqCommand, DoesNotWaitForTheCloseOfAFullAnswer) {
  TestDriver driver;
  ScriptedCamera camera({step("/command/inquiry.cgi?inq=sensor", kOk + std::string(512, 'b'), Then::kStay)});
  driver.use(camera.host(), camera.port(), 600000);
  std::string answer;
  EXPECT_EQ(driver.SendInqCommand("sensor", answer), LIBD_OK);
  EXPECT_EQ(answer.size(), 512U);
  EXPECT_EQ(camera.finish(), "");
}

TEST(SendCommand, GivesTheLatestErrorsCode) {
  TestDriver driver;
  driver.soil_latest_error();
  driver.use(own_loopback(0), refusing_port(), 5000);
  EXPECT_EQ(driver.camera().send("/command/x.cgi?a=%d", 1), LIBD_FAILED);
  EXPECT_EQ(driver.latest_error(), "0 Connection refused");
}

}  // namespace
}  // namespace vexa_test
