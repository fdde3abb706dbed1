// SPDX-License-Identifier: Apache-2.0
// Faults on requests, as a host meets them on both ports.
#include <gtest/gtest.h>

#include <memory>
#include <random>
#include <string>
#include <vector>

#include "tests/support/process_state.h"
#include "tests/virtual_camera/camera_client.h"
#include "virtual_camera/virtual_camera.h"

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;

const std::string kInquiry = http_get("/command/inquiry.cgi?inq=own");
const std::string kInquiryAnswer = "HTTP/1.0 200 OK\r\nContent-Type: text/plain\r\nContent-Length: 3\r\n\r\nA=1";
const std::string kOptions = "OPTIONS * RTSP/1.0\r\nCSeq: 1\r\n\r\n";
const std::string kOptionsAnswer =
    "RTSP/1.0 200 OK\r\nCSeq: 1\r\nPublic: OPTIONS, DESCRIBE, SETUP, PLAY, GET_PARAMETER, TEARDOWN\r\n\r\n";

class FaultyCamera : public testing::Test {
 protected:
  void SetUp() override {
    ASSERT_TRUE(camera_.start()) << camera_.error();
    camera_.settings().set_answer("own", "A=1");
  }

  std::unique_ptr<Client> http() { return std::make_unique<Client>(camera_.address(), camera_.http_port()); }
  std::unique_ptr<Client> rtsp() { return std::make_unique<Client>(camera_.address(), camera_.rtsp_port()); }

  VirtualCamera camera_{test_options()};
};

TEST_F(FaultyCamera, NoAnswerLeavesTheConnectionOpenAndSilent) {
  camera_.add_request_fault(RequestFault::no_answer(""));
  for (const auto& [client, request] : {std::pair(http(), kInquiry), std::pair(rtsp(), kOptions)}) {
    client->send(request);
    EXPECT_EQ(client->read_once(100), "");
    EXPECT_EQ(client->ended(), Ended::kNot);
  }
  EXPECT_EQ(camera_.journal().snapshot().at(0).status, 0);
}

TEST_F(FaultyCamera, ASlowAnswerComesWholeAfterItsTime) {
  camera_.add_request_fault(RequestFault::slow("", milliseconds(80)));
  const auto asked = std::chrono::steady_clock::now();
  EXPECT_EQ(rtsp()->ask(kOptions), kOptionsAnswer);
  EXPECT_GE(std::chrono::steady_clock::now() - asked, milliseconds(80));
  const auto client = http();
  client->send(kInquiry);
  EXPECT_EQ(client->read_to_end(), kInquiryAnswer);
}

TEST_F(FaultyCamera, AByteAtATimeStillMakesTheWholeAnswer) {
  camera_.add_request_fault(RequestFault::byte_at_a_time("", milliseconds(1)));
  // A read gives one byte, or a few when this reader comes late; one that comes too late for all asks again.
  EXPECT_TRUE(vexa_test::eventually([this] {
    const auto client = http();
    client->send(kInquiry);
    const std::string first = client->read_once();
    EXPECT_EQ(first + client->read_to_end(), kInquiryAnswer);
    return first.size() < kInquiryAnswer.size();
  }));
  const auto session = rtsp();
  session->send(kOptions);
  std::string answer;
  while (answer.size() < kOptionsAnswer.size()) {
    const std::string piece = session->read_once();
    ASSERT_FALSE(piece.empty());
    answer += piece;
  }
  EXPECT_EQ(answer, kOptionsAnswer);
}

TEST_F(FaultyCamera, ACutAnswerEndsAfterItsBytes) {
  for (const std::size_t size : {0U, 1U, 17U}) {
    camera_.clear_request_faults();
    camera_.add_request_fault(RequestFault::cut_after("", size));
    for (const auto& [client, request, answer] :
         {std::tuple(http(), kInquiry, kInquiryAnswer), std::tuple(rtsp(), kOptions, kOptionsAnswer)}) {
      client->send(request);
      EXPECT_EQ(client->read_to_end(), answer.substr(0, size));
      EXPECT_EQ(client->ended(), Ended::kClosed);
    }
  }
}

TEST_F(FaultyCamera, AStalledAnswerKeepsTheConnectionOpen) {
  camera_.add_request_fault(RequestFault::stall_after("", 17));
  const auto client = http();
  client->send(kInquiry);
  EXPECT_EQ(client->read_once(), kInquiryAnswer.substr(0, 17));
  EXPECT_EQ(client->read_once(100), "");
  EXPECT_EQ(client->ended(), Ended::kNot);
}

TEST_F(FaultyCamera, AResetTakesTheConnectionDown) {
  camera_.add_request_fault(RequestFault::reset(""));
  for (const auto& [client, request] : {std::pair(http(), kInquiry), std::pair(rtsp(), kOptions)}) {
    EXPECT_EQ(client->ask(request), "");
    EXPECT_EQ(client->ended(), Ended::kReset);
  }
}

TEST_F(FaultyCamera, AnyStatusCanAnswerAndTheRequestHasNoEffect) {
  camera_.add_request_fault(RequestFault::status("camera.cgi", "503 Service Unavailable"));
  camera_.add_request_fault(RequestFault::status("SETUP", "453 Not Enough Bandwidth"));
  const auto client = http();
  client->send(http_get("/command/camera.cgi?New=1"));
  EXPECT_EQ(client->read_to_end(),
            "HTTP/1.0 503 Service Unavailable\r\nContent-Type: text/plain\r\nContent-Length: 0\r\n\r\n");
  EXPECT_EQ(camera_.settings().get("camera", "New"), std::nullopt);
  EXPECT_EQ(rtsp()->ask(kAsk.setup(2, 5000)), "RTSP/1.0 453 Not Enough Bandwidth\r\nCSeq: 2\r\n\r\n");
  EXPECT_EQ(camera_.sessions(), 0U);
  EXPECT_EQ(camera_.journal().snapshot().at(0).status, 503);
}

TEST_F(FaultyCamera, RawBytesGoOutAsTheyAre) {
  const std::string raw("any\0thing\xff", 10);
  camera_.add_request_fault(RequestFault::raw("", raw));
  const auto client = http();
  client->send(kInquiry);
  EXPECT_EQ(client->read_to_end(), raw);
  const auto session = rtsp();
  EXPECT_EQ(session->ask(kOptions), raw);
  EXPECT_EQ(session->ended(), Ended::kNot);
}

TEST_F(FaultyCamera, RawBytesMayBeHeld) {
  RequestFault fault = RequestFault::raw("", "HTTP/1.0 200 OK\r\n\r\nA");
  fault.hold = true;
  camera_.add_request_fault(fault);
  const auto client = http();
  EXPECT_EQ(client->ask(kInquiry), "HTTP/1.0 200 OK\r\n\r\nA");
  EXPECT_EQ(client->read_once(100), "");
  EXPECT_EQ(client->ended(), Ended::kNot);
}

TEST_F(FaultyCamera, RightCredentialsCanBeRefused) {
  camera_.add_request_fault(RequestFault::wrong_credentials("").nth(1));
  const auto client = http();
  client->send(kInquiry);
  EXPECT_EQ(client->read_to_end().substr(0, 25), "HTTP/1.0 401 Unauthorized");
  EXPECT_EQ(rtsp()->ask(kOptions), kOptionsAnswer);
}

TEST_F(FaultyCamera, ARebootResetsEverythingAndComesBackWithoutSessions) {
  const auto idle = http();
  const auto session = rtsp();
  session->ask(kAsk.setup(1, 5000));
  camera_.add_request_fault(RequestFault::reboot("inq=own", milliseconds(300)).nth(1));
  const auto client = http();
  EXPECT_EQ(client->ask(kInquiry), "");
  EXPECT_EQ(client->ended(), Ended::kReset);
  EXPECT_EQ(session->read_once(), "");
  EXPECT_EQ(session->ended(), Ended::kReset);
  EXPECT_EQ(idle->read_once(), "");
  EXPECT_EQ(idle->ended(), Ended::kReset);
  EXPECT_EQ(camera_.sessions(), 0U);
  std::unique_ptr<Client> again = rtsp();
  const auto give_up = std::chrono::steady_clock::now() + milliseconds(kPatience);
  while (!again->connected() && std::chrono::steady_clock::now() < give_up) again = rtsp();
  EXPECT_EQ(again->ask(kAsk.get_parameter(2, 12345678)), "RTSP/1.0 454 Session Not Found\r\nCSeq: 2\r\n\r\n");
  EXPECT_NE(again->ask(kAsk.setup(3, 5000)).find("Session: 12345679;"), std::string::npos);
}

TEST_F(FaultyCamera, ARebootOnDemandRefusesConnectionsMeanwhile) {
  camera_.reboot(milliseconds(600000));
  EXPECT_FALSE(http()->connected());
  EXPECT_FALSE(rtsp()->connected());
}

TEST_F(FaultyCamera, GarbageOnBothPortsLeavesTheCameraServing) {
  std::mt19937 random(7);
  for (int round = 0; round < 200; ++round) {
    std::string garbage(random() % 3000, '\0');
    for (char& c : garbage) c = static_cast<char>(random());
    if (round % 2 == 0) garbage += "\r\n\r\n";
    http()->send(garbage);
    rtsp()->send(garbage);
    std::string damaged = kAsk.setup(1, 5000);
    damaged[random() % damaged.size()] = static_cast<char>(random());
    rtsp()->send(damaged);
  }
  EXPECT_EQ(rtsp()->ask(kOptions), kOptionsAnswer);
  const auto client = http();
  client->send(kInquiry);
  EXPECT_EQ(client->read_to_end(), kInquiryAnswer);
}

TEST_F(FaultyCamera, AFaultOfOneRequestSparesTheOthers) {
  camera_.add_request_fault(RequestFault::reset("SETUP"));
  EXPECT_EQ(rtsp()->ask(kOptions), kOptionsAnswer);
  EXPECT_EQ(rtsp()->ask(kAsk.setup(2, 5000)), "");
}

}  // namespace
}  // namespace vexa::camera
