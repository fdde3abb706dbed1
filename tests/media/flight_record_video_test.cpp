// SPDX-License-Identifier: Apache-2.0
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

#include "device/stream_watch.h"
#include "tests/media/live_camera.h"
#include "vexa/failure.h"
#include "vexa/flight_record.h"

namespace vexa_test {
namespace {

using testing::AllOf;
using testing::Contains;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;

std::vector<std::string> record_of(CVexaCommon& driver) {
  std::vector<std::string> lines;
  EXPECT_TRUE(vexa::ReadFlightRecord(driver, lines));
  return lines;
}

TEST(FlightRecordOfVideo, HoldsTheSessionAndTheStream) {
  LiveCamera camera(camera_options());
  MediaDriver driver;
  camera.introduce(driver);
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  testing::internal::CaptureStdout();
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  EXPECT_EQ(driver.StopVideoStreaming(), LIBD_OK);
  testing::internal::GetCapturedStdout();
  const std::vector<std::string> lines = record_of(driver);
  for (const char* request : {"DESCRIBE", "SETUP", "PLAY", "TEARDOWN"})
    EXPECT_THAT(lines, Contains(HasSubstr(std::string(" rtsp > send <") + request + " rtsp://")));
  EXPECT_THAT(lines, Contains(HasSubstr(" rtsp < RTSP/1.0 200 OK | ")));
  EXPECT_THAT(lines, Contains(EndsWith(" video start of live video: LIBD_OK")));
  EXPECT_THAT(lines, Contains(EndsWith(" video stopped")));
  for (const std::string& line : lines)
    EXPECT_THAT(line, AllOf(Not(HasSubstr("secret")), Not(HasSubstr("YWRtaW46c2VjcmV0"))));
}

TEST(FlightRecordOfVideo, HoldsARefusedSession) {
  MediaDriver driver;
  LiveCamera camera(camera_options());
  camera.introduce(driver);
  driver.m_ConnectionInfo.password = "wrong";
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  testing::internal::CaptureStdout();
  const ELibDReturnCode started = driver.StartVideoStreaming();
  testing::internal::GetCapturedStdout();
  ASSERT_NE(started, LIBD_OK);
  EXPECT_THAT(record_of(driver),
              Contains(EndsWith(std::string(" video start of live video: ") + vexa::CodeName(started))));
  EXPECT_THAT(record_of(driver), Contains(HasSubstr(" call StartVideoStreaming: ")));
}

TEST(StreamWatch, NotesWhatRoseAndEachChangeOfCondition) {
  MediaDriver driver;
  vexa::DriverState& state = driver.state();
  vexa::StreamWatch watch(state);
  watch.look(LIBD_TIMEOUT);
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  watch.look(LIBD_NO_FRAME);
  state.ledger.begin_stream(vexa::StreamTransport::kUdp);
  state.ledger.publish();
  watch.look(LIBD_OK);
  state.ledger.datagram(3, {});
  state.ledger.refuse(vexa::StreamLedger::Refusal::kNotRtp);
  state.ledger.publish();
  watch.look(LIBD_NO_FRAME);
  watch.look(LIBD_TIMEOUT);
  watch.look(LIBD_TIMEOUT);
  watch.look(LIBD_OK);
  watch.look(LIBD_NO_FRAME);
  std::vector<std::string> events;
  for (const std::string& line : record_of(driver)) events.push_back(line.substr(line.find(" video ") + 7));
  EXPECT_THAT(events, testing::ElementsAre("sources +1 = 1", "packets discarded +1 = 1", "LIBD_TIMEOUT", "goes on"));
}

}  // namespace
}  // namespace vexa_test
