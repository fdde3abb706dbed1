#include <gtest/gtest.h>
#include <sys/socket.h>
#include <unistd.h>

#include <ctime>

#include "tests/support/test_driver.h"

namespace vexa_test {
namespace {

std::time_t set_time = 0;
std::time_t time_as_set() { return set_time; }

class KeepAlive : public testing::Test {
 protected:
  KeepAlive() {
    int ends[2];
    EXPECT_EQ(socketpair(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0, ends), 0);
    camera_ = ends[1];
    driver_.m_RtspSocket = ends[0];
    driver_.m_RtspUrl = "rtsp://camera/media/video1";
    driver_.m_RtspSession = 12345678;
    driver_.m_RtspCSeq = 3;
    driver_.base64Encode("admin:secret", driver_.m_BasicCredentials);
    driver_.state().now = time_as_set;
    set_time = 1000000;
  }
  ~KeepAlive() override {
    driver_.rtp_stream_socket_close_all();
    close(camera_);
  }

  static std::string request(int cseq) {
    return "GET_PARAMETER rtsp://camera/media/video1 RTSP/1.0\r\nCSeq: " + std::to_string(cseq) +
           "\r\nSession: 12345678\r\nAccept: application/sdp\r\nAuthorization: Basic YWRtaW46c2VjcmV0\r\n\r\n";
  }

  void answer(const std::string& bytes = "RTSP/1.0 200 OK\r\n\r\n") const {
    ASSERT_EQ(send(camera_, bytes.data(), bytes.size(), MSG_NOSIGNAL), static_cast<ssize_t>(bytes.size()));
  }

  /// Lets it keep the session alive, and gives what was written to standard output.
  std::string trace() {
    testing::internal::CaptureStdout();
    driver_.KeepAlive();
    return testing::internal::GetCapturedStdout();
  }

  std::string heard() const {
    char bytes[4096];
    const ssize_t got = recv(camera_, bytes, sizeof bytes, MSG_DONTWAIT);
    return {bytes, static_cast<std::size_t>(std::max<ssize_t>(got, 0))};
  }

  TestDriver driver_;
  int camera_ = -1;
};

TEST_F(KeepAlive, SendsAndTracesARequest) {
  answer();
  EXPECT_EQ(trace(), "send <" + request(4) + ">\nsuccessfully sending getparameter\n");
  EXPECT_EQ(heard(), request(4));
  EXPECT_EQ(driver_.m_RtspCSeq, 4);
  EXPECT_EQ(driver_.m_LastKeepAliveTime, 1000000);
}

TEST_F(KeepAlive, ComesAgainAfterTheInterval) {
  const struct {
    int period, interval;
  } cases[] = {{120, 30}, {61, 30}, {60, 30}, {59, 29}, {10, 5}, {3, 1}, {2, 1}, {1, 1}, {0, 1}, {-7, 1}};
  for (const auto& c : cases) {
    driver_.m_KeepAlivePeriod = c.period;
    driver_.m_LastKeepAliveTime = 500;
    driver_.m_RtspCSeq = 3;
    set_time = 500 + c.interval - 1;
    EXPECT_EQ(trace(), "") << c.period;
    EXPECT_EQ(driver_.m_RtspCSeq, 3);
    EXPECT_EQ(driver_.m_LastKeepAliveTime, 500);
    set_time = 500 + c.interval;
    answer();
    EXPECT_NE(trace(), "") << c.period;
    EXPECT_EQ(heard(), request(4)) << c.period;
    EXPECT_EQ(driver_.m_LastKeepAliveTime, set_time);
  }
}

TEST_F(KeepAlive, IsSentAtOnceAfterATimeInTheFuture) {
  driver_.m_KeepAlivePeriod = 60;
  driver_.m_LastKeepAliveTime = set_time + 1;
  answer();
  trace();
  EXPECT_EQ(heard(), request(4));
}

TEST_F(KeepAlive, IsHeldBackBySocketZeroAlone) {
  const int socket = driver_.m_RtspSocket;
  driver_.m_RtspSocket = 0;
  EXPECT_EQ(trace(), "");
  EXPECT_EQ(driver_.m_RtspCSeq, 3);
  driver_.m_RtspSocket = -1;
  EXPECT_EQ(trace(), "send <" + request(4) + ">\nerror sending getparameter\nerror receiving getparameter\n");
  EXPECT_EQ(driver_.m_RtspCSeq, 4);
  driver_.m_RtspSocket = socket;
}

TEST_F(KeepAlive, SendsATooLongRequestCut) {
  driver_.m_RtspUrl = std::string(2000, 'u');
  const std::string cut = ("GET_PARAMETER " + driver_.m_RtspUrl).substr(0, 1023);
  answer();
  EXPECT_EQ(trace(), "send <" + cut + ">\nsuccessfully sending getparameter\n");
  EXPECT_EQ(heard(), cut);
  EXPECT_EQ(driver_.LatestErrorText(), "URL too long\n");
}

TEST_F(KeepAlive, DoesNotExamineTheAnswer) {
  for (const char* bytes : {"RTSP/1.0 454 Session Not Found\r\n\r\n", "RTSP/1.0 401 No\r\n\r\n", "garbage\r\n\r\n"}) {
    driver_.soil_latest_error();
    set_time += 100;
    answer(bytes);
    EXPECT_EQ(trace().find("error"), std::string::npos) << bytes;
    EXPECT_EQ(driver_.LatestErrorText(), "from before");
    heard();
  }
}

TEST_F(KeepAlive, TracesASilentCamera) {
  EXPECT_EQ(trace(), "send <" + request(4) + ">\nsuccessfully sending getparameter\nerror receiving getparameter\n");
}

TEST_F(KeepAlive, OfACameraThatHasClosedRaisesNoSignal) {
  close(camera_);
  camera_ = -1;
  EXPECT_EQ(trace(), "send <" + request(4) + ">\nerror sending getparameter\nerror receiving getparameter\n");
}

TEST_F(KeepAlive, IsSentAgainOnlyWhenTheOneBeforeIsOver) {
  vexa::DriverState& state = driver_.state();
  testing::internal::CaptureStdout();
  state.begin_keep_alive();
  set_time += 100;
  state.begin_keep_alive();
  state.look_for_keep_alive();
  EXPECT_EQ(heard(), request(4));
  answer();
  state.look_for_keep_alive();
  state.begin_keep_alive();
  EXPECT_EQ(heard(), request(5));
  EXPECT_EQ(testing::internal::GetCapturedStdout(), "send <" + request(4) + ">\nsuccessfully sending getparameter\n" +
                                                        "send <" + request(5) +
                                                        ">\nsuccessfully sending getparameter\n");
}

TEST_F(KeepAlive, ThatIsBegunAndCutOffByTheCameraTimesOutAtOnce) {
  driver_.soil_latest_error();
  answer("RTSP/1.0 200");
  EXPECT_EQ(shutdown(camera_, SHUT_WR), 0);
  EXPECT_EQ(trace(), "send <" + request(4) + ">\nsuccessfully sending getparameter\nerror receiving getparameter\n");
  EXPECT_EQ(driver_.LatestErrorText(), "Receive timed out");
}

TEST(KeepAliveClock, IsTheSystemsUnlessATestSetsIt) {
  TestDriver driver;
  const std::time_t before = std::time(nullptr);
  EXPECT_GE(driver.state().now(), before);
}

}  // namespace
}  // namespace vexa_test
