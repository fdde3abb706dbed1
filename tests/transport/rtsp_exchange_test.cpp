// Every exchange of tests/data/exchanges/rtsp, byte for byte.
#include "tests/support/exchange_run.h"

namespace vexa_test {
namespace {

class RtspExchange : public ExchangeTest {
 protected:
  RtspExchange() : ExchangeTest("rtsp") {
    driver_.m_RangeClockSeconds = 77;
    driver_.m_RangeClockMicros = 78;
    driver_.m_NoTearDown = has("no_teardown");
    driver_.m_EdgeStoragePlayback = has("playback");
    driver_.m_PlaybackScale = std::stoi(before("playback", before("scale", "1")));
  }

  void expect_session() {
    expect_result("session", std::to_string(driver_.m_RtspSession));
    expect_result("rate", std::to_string(driver_.m_RtpClockRate));
    expect_result("seconds", std::to_string(driver_.m_RangeClockSeconds));
    expect_result("micros", std::to_string(driver_.m_RangeClockMicros));
  }
};

TEST_P(RtspExchange, GoesAsWritten) {
  const std::string call = before("call", "");
  ASSERT_TRUE(call == "open" || call == "close") << "no such call: " << call;
  ScriptedCamera camera(script());
  driver_.use(camera.host(), camera.port(), std::stoi(before("timeout", "20000")));
  testing::internal::CaptureStdout();
  driver_.m_RtspSocket =
      driver_.rtp_over_udp_open("rtsp://%s:%d/media/video%d", camera.host().c_str(), camera.port(), 1);
  std::string result = driver_.m_RtspSocket == -1 ? "-1" : "open";
  EXPECT_NE(driver_.m_StreamSocket, -1);
  expect_session();
  if (call == "close") {
    driver_.rtp_over_udp_close();
    result = driver_.m_RtspSocket == -1 && driver_.m_StreamSocket == -1 ? "closed" : "still open";
  }
  expect_latest_error();
  driver_.rtp_stream_socket_close_all();
  testing::internal::GetCapturedStdout();
  EXPECT_EQ(camera.finish(), "");
  expect_result("result", result);
  expect_result("cseq", std::to_string(driver_.m_RtspCSeq));
  expect_nothing_left_open();
}

INSTANTIATE_TEST_SUITE_P(Files, RtspExchange, testing::ValuesIn(exchange_names(VEXA_TEST_DATA "/exchanges/rtsp")),
                         name_of_exchange);

}  // namespace
}  // namespace vexa_test
