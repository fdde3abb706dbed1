// SPDX-License-Identifier: Apache-2.0
#include "vexa/flight_record.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

#include "device/flight_recorder.h"
#include "tests/device/settings_exchange.h"
#include "tests/support/failing_new.h"
#include "tests/support/folder_fixture.h"
#include "tests/support/in_child.h"

namespace vexa_test {
namespace {

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::MatchesRegex;
using testing::Not;
using testing::SizeIs;

using Lines = std::vector<std::string>;

/// What stands after the time, the driver's number and the camera.
std::string event_of(const std::string& line) {
  std::size_t at = 0;
  for (int word = 0; word < 3; ++word) at = line.find(' ', at) + 1;
  return line.substr(at);
}

Lines record_of(CVexaCommon& driver) {
  Lines lines;
  EXPECT_TRUE(vexa::ReadFlightRecord(driver, lines));
  return lines;
}

Lines events_of(CVexaCommon& driver) {
  Lines events;
  for (const std::string& line : record_of(driver)) events.push_back(event_of(line));
  return events;
}

Lines lines_of(const std::string& text) {
  Lines lines;
  std::istringstream in(text);
  for (std::string line; std::getline(in, line);) lines.push_back(line);
  return lines;
}

/// What WriteFlightRecords writes.
std::string written_records(const TemporaryFolder& folder) {
  const std::string path = folder / "crash.txt";
  const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0600);
  vexa::WriteFlightRecords(file);
  close(file);
  return contents_of(path);
}

/// VEXA_TRACE for the drivers that are made meanwhile.
class TraceVariable {
 public:
  explicit TraceVariable(const std::string& path) { setenv("VEXA_TRACE", path.c_str(), 1); }
  ~TraceVariable() { unsetenv("VEXA_TRACE"); }
  TraceVariable(const TraceVariable&) = delete;
  TraceVariable& operator=(const TraceVariable&) = delete;
};

using FlightRecord = InTemporaryFolder;

TEST_F(FlightRecord, IsOffByDefaultAndOffAgainAfterItsEnd) {
  TestDriver driver;
  EXPECT_FALSE(driver.state().recorder.is_on());
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  EXPECT_TRUE(driver.state().recorder.is_on());
  driver.state().recorder.note("video", "kept");
  vexa::EndFlightRecord(driver);
  EXPECT_FALSE(driver.state().recorder.is_on());
  driver.state().recorder.note("video", "not kept");
  EXPECT_THAT(record_of(driver), IsEmpty());
  vexa::EndFlightRecord(driver);
}

TEST_F(FlightRecord, BegunTwiceGoesOn) {
  TestDriver driver;
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  driver.state().recorder.note("video", "before");
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  EXPECT_THAT(events_of(driver), ElementsAre("video before"));
}

TEST_F(FlightRecord, HoldsRequestsAnswersAndFailedCalls) {
  Played<CVexaCommon> play({inquiry("system", "ModelName=V1&Serial=1"), refusal("/command/inquiry.cgi?inq=camera")});
  EXPECT_TRUE(vexa::BeginFlightRecord(play.driver));
  std::string answer;
  EXPECT_EQ(play.driver.SendInqCommand("system", answer), LIBD_OK);
  SLibDCameraInfo info;
  EXPECT_EQ(play.driver.GetCameraInfo(info), LIBD_UNAUTHORIZED);
  EXPECT_THAT(events_of(play.driver),
              ElementsAre("call SendInqCommand", "http > /command/inquiry.cgi?inq=system", "http < 200 OK",
                          "http < ModelName=V1&Serial=1", "call GetCameraInfo",
                          "http > /command/inquiry.cgi?inq=camera", "http < 401 Unauthorized", "http ! Unauthorized",
                          "call GetCameraInfo: LIBD_UNAUTHORIZED Unauthorized"));
}

TEST_F(FlightRecord, ALineBeginsWithTimeNumberAndCamera) {
  TestDriver driver;
  TestDriver other;
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  EXPECT_TRUE(vexa::BeginFlightRecord(other));
  driver.use("192.168.0.100", 8080, 1000);
  driver.state().recorder.note("video", "x");
  other.state().recorder.note("video", "x");
  const std::string line = record_of(driver).at(0);
  EXPECT_THAT(line, MatchesRegex("[0-9]{4}-[0-9]{2}-[0-9]{2}T[0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{6}Z [0-9]+ "
                                 "192\\.168\\.0\\.100:8080 video x"));
  const auto number_in = [](const std::string& text) { return std::stoul(text.substr(text.find(' ') + 1)); };
  EXPECT_EQ(number_in(record_of(other).at(0)), number_in(line) + 1);
}

TEST_F(FlightRecord, HasNoPasswordInAnyForm) {
  TestDriver driver;
  driver.use("host", 80, 1000);
  driver.m_ConnectionInfo.password = "se cret";
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  driver.state().recorder.note("http <", "se cret, se%20cret and YWRtaW46c2UgY3JldA== of admin");
  EXPECT_THAT(events_of(driver), ElementsAre("http < ***, *** and *** of admin"));
}

TEST_F(FlightRecord, ShowsBytesOfTheCameraAsPrintableText) {
  TestDriver driver;
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  driver.state().recorder.note("rtsp <", "RTSP/1.0 200 OK\r\nCSeq: 1\r\n\r\n");
  driver.state().recorder.note("http <", std::string("a\x1b[31m\0\xffz", 9));
  EXPECT_THAT(events_of(driver), ElementsAre("rtsp < RTSP/1.0 200 OK | CSeq: 1", "http < a?[31m??z"));
}

TEST_F(FlightRecord, CutsLongLines) {
  TestDriver driver;
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  driver.state().recorder.note("http <", std::string(100000, 'x'));
  EXPECT_THAT(record_of(driver).at(0), SizeIs(240));
}

TEST_F(FlightRecord, HoldsTheLatestThousandLines) {
  for (const std::uint32_t count : {0u, 1u, 999u, 1000u, 1001u, 1999u, 2000u, 2001u, 5500u}) {
    TestDriver driver;
    EXPECT_TRUE(vexa::BeginFlightRecord(driver));
    for (std::uint32_t i = 0; i < count; ++i) driver.state().recorder.note("video", std::to_string(i));
    const Lines events = events_of(driver);
    ASSERT_THAT(events, SizeIs(std::min(count, vexa::kFlightRecordLines)));
    for (std::size_t i = 0; i < events.size(); ++i)
      ASSERT_EQ(events[i], "video " + std::to_string(count - events.size() + i));
  }
}

TEST_F(FlightRecord, ShortOfMemoryIsNotBegunAndReadsNothing) {
  TestDriver driver;
  {
    const AllocationFailure failure(0);
    EXPECT_FALSE(vexa::BeginFlightRecord(driver));
    EXPECT_TRUE(failure.happened());
  }
  EXPECT_FALSE(driver.state().recorder.is_on());
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  driver.state().recorder.note("video", "a line that is too long to be kept in a string itself");
  Lines lines{"before"};
  const AllocationFailure failure(0);
  EXPECT_FALSE(vexa::ReadFlightRecord(driver, lines));
  EXPECT_EQ(lines.size(), 1u);
}

TEST_F(FlightRecord, OfAllDriversIsWrittenAndOfEndedOnesNot) {
  TestDriver first;
  TestDriver second;
  auto gone = std::make_unique<TestDriver>();
  for (TestDriver* driver : {&first, &second, gone.get()}) EXPECT_TRUE(vexa::BeginFlightRecord(*driver));
  first.state().recorder.note("video", "of the first");
  second.state().recorder.note("video", "of the second");
  gone->state().recorder.note("video", "of one that is gone");
  gone.reset();
  EXPECT_THAT(written_records(folder_), HasSubstr("video of the first\n"));
  EXPECT_THAT(written_records(folder_), HasSubstr("video of the second\n"));
  EXPECT_THAT(written_records(folder_), Not(HasSubstr("gone")));
  vexa::EndFlightRecord(first);
  EXPECT_THAT(written_records(folder_), Not(HasSubstr("of the first")));
}

TEST_F(FlightRecord, IsWrittenWithoutMemoryAndLeavesErrnoAsItWas) {
  TestDriver driver;
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  driver.state().recorder.note("video", "x");
  int ends[2];
  ASSERT_EQ(pipe(ends), 0);
  {
    const AllocationFailure failure(0);
    errno = 77;
    vexa::WriteFlightRecords(ends[1]);
    EXPECT_EQ(errno, 77);
    vexa::WriteFlightRecords(-1);
    EXPECT_EQ(errno, 77);
    EXPECT_FALSE(failure.happened());
  }
  char text[512];
  const ssize_t length = read(ends[0], text, sizeof text);
  ASSERT_GT(length, 0);
  EXPECT_THAT(std::string(text, static_cast<std::size_t>(length)), HasSubstr("video x\n"));
  close(ends[0]);
  close(ends[1]);
}

int crash_descriptor = -1;

extern "C" void report_the_crash(int) {
  vexa::WriteFlightRecords(crash_descriptor);
  _exit(0);
}

TEST_F(FlightRecord, IsInACrashReport) {
  const std::string path = folder_ / "crash.txt";
  crash_descriptor = open(path.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
  ASSERT_GE(crash_descriptor, 0);
  in_child([&] {
    std::signal(SIGUSR1, report_the_crash);
    TestDriver driver;
    vexa::BeginFlightRecord(driver);
    driver.state().recorder.note("video", "the last event");
    raise(SIGUSR1);
    return std::string();
  });
  close(crash_descriptor);
  EXPECT_THAT(contents_of(path), HasSubstr("video the last event\n"));
}

TEST_F(FlightRecord, OfManyThreadsDoesNotRace) {
  TestDriver driver;
  TestDriver other;
  EXPECT_TRUE(vexa::BeginFlightRecord(driver));
  const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
  constexpr int kRounds = 200;
  std::vector<std::thread> threads;
  for (int i = 0; i < 2; ++i) {
    threads.emplace_back([&] {
      for (int n = 0; n < kRounds; ++n) driver.state().recorder.note("video", "event");
    });
  }
  threads.emplace_back([&] {
    for (int n = 0; n < kRounds; ++n) vexa::WriteFlightRecords(nowhere);
  });
  threads.emplace_back([&] {
    for (int n = 0; n < kRounds; ++n) {
      vexa::BeginFlightRecord(other);
      other.state().recorder.note("video", "other");
      vexa::EndFlightRecord(other);
    }
  });
  for (std::thread& thread : threads) thread.join();
  close(nowhere);
  for (const std::string& event : events_of(driver)) EXPECT_EQ(event, "video event");
  EXPECT_THAT(record_of(driver), SizeIs(2 * kRounds));
}

using TraceFile = InTemporaryFolder;

TEST_F(TraceFile, HoldsTheEventsOfEachDriverMadeMeanwhile) {
  const std::string path = folder_ / "trace.txt";
  TestDriver before;
  {
    const TraceVariable variable(path);
    TestDriver driver;
    TestDriver other;
    EXPECT_TRUE(driver.state().recorder.is_on());
    driver.state().recorder.note("video", std::string(3000, 'x'));
    other.state().recorder.note("video", std::string(5000, 'y'));
    EXPECT_TRUE(vexa::BeginFlightRecord(driver));
    vexa::EndFlightRecord(driver);
    EXPECT_TRUE(driver.state().recorder.is_on());
  }
  TestDriver after;
  EXPECT_FALSE(before.state().recorder.is_on());
  EXPECT_FALSE(after.state().recorder.is_on());
  const Lines lines = lines_of(contents_of(path));
  ASSERT_THAT(lines, SizeIs(2));
  EXPECT_EQ(event_of(lines[0]), "video " + std::string(3000, 'x'));
  EXPECT_THAT(lines[1], SizeIs(4000));
}

TEST_F(TraceFile, IsItsOwnersAloneAndAppendedTo) {
  const std::string path = folder_ / "trace.txt";
  for (int i = 0; i < 2; ++i) {
    const TraceVariable variable(path);
    TestDriver driver;
    driver.state().recorder.note("video", "x");
  }
  struct stat status {};
  ASSERT_EQ(stat(path.c_str(), &status), 0);
  EXPECT_EQ(status.st_mode & 0777u, 0600u);
  EXPECT_THAT(lines_of(contents_of(path)), SizeIs(2));
}

TEST_F(TraceFile, ThatCannotBeOpenedIsNamedAndTheDriverWorks) {
  const std::string pipe = folder_ / "pipe";
  ASSERT_EQ(mkfifo(pipe.c_str(), 0600), 0);
  const struct {
    std::string path;
    const char* reason;
  } rows[] = {{folder_ / "gone/trace.txt", "No such file or directory"},
              {folder_.path(), "Is a directory"},
              {pipe, "No such device or address"}};
  for (const auto& row : rows) {
    const TraceVariable variable(row.path);
    EXPECT_EQ(stderr_of([] {
                TestDriver driver;
                EXPECT_FALSE(driver.state().recorder.is_on());
              }),
              "VEXA_TRACE: cannot open " + row.path + ": " + row.reason + "\n");
  }
}

TEST_F(TraceFile, ThatIsFullLosesItsLinesAndTheDriverWorks) {
  const TraceVariable variable("/dev/full");
  Played<CVexaCommon> play({inquiry("system", "ModelName=V1")});
  std::string answer;
  EXPECT_EQ(play.driver.SendInqCommand("system", answer), LIBD_OK);
  EXPECT_EQ(answer, "ModelName=V1");
}

TEST_F(TraceFile, AnEmptyNameIsNone) {
  const TraceVariable variable("");
  TestDriver driver;
  EXPECT_FALSE(driver.state().recorder.is_on());
}

}  // namespace
}  // namespace vexa_test
