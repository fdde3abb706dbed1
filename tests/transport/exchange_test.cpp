// Every exchange of tests/data/exchanges, byte for byte, and what the reader of their files takes and refuses.
#include "tests/support/exchange_run.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "tests/support/exchange_file.h"
#include "tests/support/temporary_folder.h"

namespace vexa_test {
namespace {

class HttpExchange : public ExchangeTest {
 protected:
  HttpExchange() : ExchangeTest("http") {}
};

TEST_P(HttpExchange, GoesAsWritten) {
  ScriptedCamera camera(script());
  driver_.use(camera.host(), camera.port(), std::stoi(before("timeout", "20000")));
  const std::string call = before("call", "");
  const std::string argument = call.substr(call.find(' ') + 1);
  std::string answer = "untouched";
  const bool inquires = call.starts_with("inquire ");
  ASSERT_TRUE(inquires || call.starts_with("command ")) << "no such call: " << call;
  const ELibDReturnCode result =
      inquires ? driver_.SendInqCommand(argument, answer) : driver_.camera().send("%s", argument.c_str());
  EXPECT_EQ(camera.finish(), "");
  expect_result("result", std::to_string(result));
  expect_result("answer", answer);
  expect_latest_error();
  expect_nothing_left_open();
}

INSTANTIATE_TEST_SUITE_P(Files, HttpExchange, testing::ValuesIn(exchange_names(VEXA_TEST_DATA "/exchanges/http")),
                         name_of_exchange);

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

class ExchangeFiles : public testing::Test {
 protected:
  ExchangeFile read(const std::string& text) {
    const std::string path = folder_ / "odd.txt";
    std::ofstream(path) << text;
    return read_exchange(path);
  }

  TemporaryFolder folder_;
};

TEST_F(ExchangeFiles, TakeFromAnotherWhatItHasAlready) {
  std::ofstream(folder_ / "model.txt") << "call a\n>>>\n1\n<<< pause=7\nx\n>>>\n2\n<<<\ny\n===\nresult 1\ncode 0\n";
  const ExchangeFile file = read("call b\nafter model 1\n>>> as model\n<<<\nz\n=== as model\ncode 5\n");
  ASSERT_EQ(file.script.size(), 2u);
  EXPECT_EQ(file.script[0].expected + file.script[0].answer, "1x");
  EXPECT_EQ(file.script[0].pause, 7);
  EXPECT_EQ(file.script[1].expected + file.script[1].answer, "2z");
  EXPECT_EQ(file.before, (std::map<std::string, std::string>{{"call", "b"}}));
  EXPECT_EQ(file.results, (std::map<std::string, std::string>{{"result", "1"}, {"code", "5"}}));
  EXPECT_EQ(read(">>>\n0\n<<< as model\n===\nresult 1\n").script[0].answer, "x");
}

TEST_F(ExchangeFiles, WithWhatNobodyUnderstandsAreRefused) {
  std::ofstream(folder_ / "model.txt") << ">>>\n1\n===\nresult 1\n";
  for (const char* text :
       {"cal open\n===\nresult 1\n", "call open\n===\nresutl 1\n", "call open\n===\nresult 1\nresult 2\n",
        "call open\n>>>\n\\q\n===\n", "call open\n>>>\n<<< peace=1\n===\n", "call open\n>>>\n<<< then=leave\n===\n",
        "call open\n", "<<<\n===\n", "after gone 1\n===\n", "after model\n===\n", "after model 2\n===\n",
        "after model 1\n>>> as model\n===\n"}) {
    EXPECT_THROW(read(text), std::runtime_error) << text;
  }
}

}  // namespace
}  // namespace vexa_test
