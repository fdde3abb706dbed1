// Recordings on the camera's card: what the driver asks and what it makes of the answers.
#include <gtest/gtest.h>

#include <atomic>
#include <functional>
#include <string>
#include <vector>

#include "tests/device/edge_storage_reach.h"
#include "tests/support/failing_new.h"
#include "tests/support/process_state.h"

namespace vexa_test {
namespace {

const ScriptStep kLiveTimeout = command("/command/camera.cgi?RTSPTimeout=60");
const ScriptStep kPlaybackTimeout = command("/command/edgestorage.cgi?EsRTSPRec1Timeout=60");

TEST(KeepAlivePeriod, IsTheTimeoutThatTheCameraTells) {
  const struct {
    const char* answer;
    int period;  // 9 stands from before
  } cases[] = {{"EsRTSPRec1Timeout=60&EsRec1=on", 60},
               {"EsRTSPRec1Timeout=5", 5},
               {"EsRTSPRec1Timeout=0", 9},
               {"EsRTSPRec1Timeout=", 9},
               {"EsRTSPRec1Timeout=x", 9},
               {"EsRec1=on", 9},
               {"EsRTSPRec1Timeout=-3", -3},
               {"", 9}};
  for (const auto& c : cases) {
    EdgePlay play({kLiveTimeout, kPlaybackTimeout, inquiry("edgestorage", c.answer)});
    play.driver.m_KeepAlivePeriod = 9;
    EXPECT_TRUE(play.driver.InitEdgeStorageKeepAlivePeriod());
    EXPECT_EQ(play.driver.m_KeepAlivePeriod, c.period) << c.answer;
  }
}

TEST(KeepAlivePeriod, IsNotFoundWhenOneOfItsRequestsFails) {
  const Script scripts[] = {{refusal("/command/camera.cgi?RTSPTimeout=60")},
                            {kLiveTimeout, refusal("/command/edgestorage.cgi?EsRTSPRec1Timeout=60")},
                            {kLiveTimeout, kPlaybackTimeout, refusal("/command/inquiry.cgi?inq=edgestorage")}};
  for (const Script& script : scripts) {
    EdgePlay play(script);
    EXPECT_FALSE(play.driver.InitEdgeStorageKeepAlivePeriod());
    EXPECT_EQ(play.driver.m_KeepAlivePeriod, 1);
    EXPECT_EQ(play.driver.LatestErrorCode(), LIBD_UNAUTHORIZED);
  }
}

std::string mode_path(const std::string& on, int image, const std::string& times, const std::string& address) {
  return "/command/edgestorage.cgi?Edgestorage=" + on + "&EsOverWrite=off&EsRec1=image" + std::to_string(image) +
         ",off&EsAlmRec1Time=" + times + "&EsRec1Mode=alarm&EsAlmRec1WatchAddress=" + address +
         "&EsAlmRec1Trigger=disconnected&EsRec1Period=always";
}

SLibDEdgeStorageMode mode_of(bool enabled, int image, int time1, int time2, const std::string& address) {
  SLibDEdgeStorageMode mode;
  mode.enabled = enabled;
  mode.imageNumber = image;
  mode.alarmTime1 = time1;
  mode.alarmTime2 = time2;
  mode.watchAddress = address;
  return mode;
}

SLibDEdgeStorageMode stored_mode(EdgeDriver& driver) {
  SLibDEdgeStorageMode mode;
  EXPECT_EQ(driver.GetEdgeStorageMode(mode), LIBD_OK);
  return mode;
}

const ScriptStep kUserData = command("/command/camera.cgi?RTPUserData=on");

TEST(EdgeStorageMode, IsSentWholeWithTheFirstAlarmTimeOfImage1Alone) {
  const struct {
    SLibDEdgeStorageMode mode;
    std::string path;
  } rows[] = {{mode_of(false, 1, 5, 10, "10.0.0.1"), mode_path("off", 1, "5,10", "10.0.0.1")},
              {mode_of(false, 2, 5, 10, "10.0.0.1"), mode_path("off", 2, "0,10", "10.0.0.1")},
              {mode_of(false, 0, 5, 10, ""), mode_path("off", 0, "0,10", "")},
              {mode_of(false, -2147483647 - 1, 5, 2147483647, "host.example"),
               mode_path("off", -2147483647 - 1, "0,2147483647", "host.example")}};
  for (const auto& row : rows) {
    EdgePlay play({command(row.path)});
    EXPECT_EQ(play.driver.SetEdgeStorageMode(row.mode), LIBD_OK);
    const SLibDEdgeStorageMode stored = stored_mode(play.driver);
    EXPECT_EQ(stored.enabled, row.mode.enabled);
    EXPECT_EQ(stored.imageNumber, row.mode.imageNumber);
    EXPECT_EQ(stored.alarmTime1, row.mode.alarmTime1);
    EXPECT_EQ(stored.alarmTime2, row.mode.alarmTime2);
    EXPECT_EQ(stored.watchAddress, row.mode.watchAddress);
  }
}

TEST(EdgeStorageMode, SwitchedOnAsksForTheFreeSpaceAndTurnsUserDataOn) {
  const struct {
    ScriptStep space;
    ELibDReturnCode result;
  } rows[] = {{inquiry("a-slot", "ASlot=Free space : 100Kbyte"), LIBD_OK},
              {inquiry("a-slot", "ASlot=Free space : 0Kbyte"), LIBD_NO_FRAME},
              {inquiry("a-slot", "ASlot=none"), LIBD_NO_FRAME},
              {inquiry("a-slot", ""), LIBD_NO_FRAME}};
  for (const auto& row : rows) {
    EdgePlay play({command(mode_path("on", 1, "1,2", "a")), row.space, kUserData});
    EXPECT_EQ(play.driver.SetEdgeStorageMode(mode_of(true, 1, 1, 2, "a")), row.result) << row.space.answer;
    EXPECT_TRUE(stored_mode(play.driver).enabled);
  }
}

TEST(EdgeStorageMode, TakesACardThatCannotBeAskedForOneWithRoom) {
  EdgePlay play({command(mode_path("on", 1, "1,2", "a")), refusal("/command/inquiry.cgi?inq=a-slot"),
                 refusal("/command/camera.cgi?RTPUserData=on")});
  EXPECT_EQ(play.driver.SetEdgeStorageMode(mode_of(true, 1, 1, 2, "a")), LIBD_OK);
}

TEST(EdgeStorageMode, SwitchedOnOnceMoreOrOffDoesNotAskForTheFreeSpace) {
  const ScriptStep on = command(mode_path("on", 1, "1,2", "a"));
  const ScriptStep off = command(mode_path("off", 1, "1,2", "a"));
  const ScriptStep space = inquiry("a-slot", "ASlot=Free space : 1Kbyte");
  EdgePlay play({on, space, kUserData, on, off, off, on, space, kUserData});
  for (const bool enabled : {true, true, false, false, true}) {
    EXPECT_EQ(play.driver.SetEdgeStorageMode(mode_of(enabled, 1, 1, 2, "a")), LIBD_OK);
  }
}

TEST(EdgeStorageMode, ThatTheCameraDoesNotTakeIsATimeOutWhateverTheReasonAndIsNotStored) {
  EdgePlay play({refusal(mode_path("on", 2, "0,2", "b"))});
  EXPECT_EQ(play.driver.SetEdgeStorageMode(mode_of(true, 2, 1, 2, "b")), LIBD_TIMEOUT);
  EXPECT_EQ(text_of_latest_error(play.driver), "Unauthorized");
  EXPECT_EQ(stored_mode(play.driver).imageNumber, 0);
  EXPECT_EQ(play.driver.SetEdgeStorageMode(mode_of(true, 2, 1, 2, std::string(4096, 'x'))), LIBD_TIMEOUT);
  EXPECT_EQ(text_of_latest_error(play.driver), "URL too long");
}

TEST(EdgeStorageMode, HasAnAddressThatAddsNeitherAHeaderNorAnotherCommand) {
  EdgePlay play({command(mode_path("off", 2, "0,0", "a%0D%0AX:%20y%26Edgestorage=off%7F"))});
  EXPECT_EQ(play.driver.SetEdgeStorageMode(mode_of(false, 2, 0, 0, "a\r\nX: y&Edgestorage=off\x7f")), LIBD_OK);
}

TEST(EdgeStorage, OfAModelWithoutACardIsNotSupported) {
  EdgeDriver driver;
  driver.m_EdgeStorageSupported = false;
  driver.expect_no_exchange();
  SLibDEdgeStorageMode mode = mode_of(true, 7, 1, 2, "a");
  EXPECT_EQ(driver.GetEdgeStorageMode(mode), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(mode.imageNumber, 7);
  EXPECT_EQ(driver.SetEdgeStorageMode(mode), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(driver.SetEdgeStorageNoTearDown(true), LIBD_NOT_SUPPORTED);
  EXPECT_FALSE(driver.m_NoTearDown);
  EXPECT_TRUE(driver.had_no_exchange());
}

TEST(EdgeStorageMode, OfAFreshDriverIsEmpty) {
  EdgeDriver driver;
  SLibDEdgeStorageMode mode = mode_of(true, 7, 1, 2, "a");
  EXPECT_EQ(driver.GetEdgeStorageMode(mode), LIBD_OK);
  EXPECT_FALSE(mode.enabled);
  EXPECT_EQ(mode.imageNumber + mode.alarmTime1 + mode.alarmTime2, 0);
  EXPECT_EQ(mode.watchAddress, "");
}

TEST(EdgeStorage, TearDownIsSwitchedByTheHost) {
  EdgeDriver driver;
  EXPECT_EQ(driver.SetEdgeStorageNoTearDown(true), LIBD_OK);
  EXPECT_TRUE(driver.m_NoTearDown);
  EXPECT_EQ(driver.SetEdgeStorageNoTearDown(false), LIBD_OK);
  EXPECT_FALSE(driver.m_NoTearDown);
}

TEST(EdgeStorage, FreeSpaceIsMinusOneWhenTheInquiryFails) {
  EdgePlay play({refusal("/command/inquiry.cgi?inq=a-slot"), inquiry("a-slot", "ASlot=Free space : 5Kbyte")});
  EXPECT_EQ(play.driver.CheckEdgeStorageFreeSize(), -1);
  EXPECT_EQ(play.driver.CheckEdgeStorageFreeSize(), 5);
}

const std::string kOneRecord =
    "StreamName=a,Start=20240131T235959,End=20240201T000000,ImageCodec=h264,ImageSize=640,480,FrameRate=25,"
    "BitRate=512,AudioCodec=none,Size=1,Status=ok\r\n";

ScriptStep list_answer(const std::string& body) {
  return answered("/command/search?Order=oldest", "HTTP/1.0 200 OK\r\n\r\n" + body);
}

TEST(RecordList, IsReadToTheEndOfTheAnswerAndTakesThePlaceOfTheOneBefore) {
  std::string body;
  for (int i = 0; i < 500; ++i) body += kOneRecord;
  ScriptStep pieces = list_answer(body);
  pieces.piece = 9973;
  pieces.pause = 1;
  EdgePlay play({pieces, list_answer("")});
  SLibDEdgeStorageRecordList list;
  list.records.resize(3);
  EXPECT_EQ(play.driver.GetEdgeStorageRecordList(list), LIBD_OK);
  ASSERT_EQ(list.records.size(), 500u);
  EXPECT_EQ(list.records[499].start, 1706745599);
  EXPECT_EQ(play.driver.GetEdgeStorageRecordList(list), LIBD_OK);
  EXPECT_TRUE(list.records.empty());
}

TEST(RecordList, StaysAsItWasWhenTheCameraRefusesOrTearsTheConnection) {
  ScriptStep torn = list_answer(kOneRecord);
  torn.then = Then::kReset;
  EdgePlay play({refusal("/command/search?Order=oldest"), torn});
  SLibDEdgeStorageRecordList list;
  list.records.resize(3);
  EXPECT_EQ(play.driver.GetEdgeStorageRecordList(list), LIBD_UNAUTHORIZED);
  EXPECT_EQ(play.driver.GetEdgeStorageRecordList(list), LIBD_FAILED);
  EXPECT_EQ(text_of_latest_error(play.driver), "Connection reset by peer");
  EXPECT_EQ(list.records.size(), 3u);
}

/// The list of a camera for whose answer the driver waits no longer than some milliseconds.
ELibDReturnCode impatient_list(ScriptStep step, SLibDEdgeStorageRecordList& list) {
  EdgeDriver driver;
  step.meanwhile = [&] {
    const vexa::Guard guard(driver.m_ConnectionLock);
    driver.m_ConnectionInfo.timeout = 30;
  };
  ScriptedCamera camera({step});
  driver.use(camera.host(), camera.port());
  const ELibDReturnCode result = driver.GetEdgeStorageRecordList(list);
  EXPECT_EQ(text_of_latest_error(driver), "Receive timed out");
  EXPECT_EQ(driver.m_ConnectionInfo.timeout, kPatientTimeout);
  EXPECT_EQ(camera.finish(), "");
  return result;
}

TEST(RecordList, ThatDoesNotEndIsGivenUpAndTheOneBeforeStays) {
  ScriptStep silent = list_answer(kOneRecord);
  silent.then = Then::kStay;
  ScriptStep trickling = list_answer(std::string(200000, 'x'));
  trickling.piece = 50;
  trickling.pause = 5;
  const ScriptStep racing = list_answer(kOneRecord + std::string(std::size_t{40} << 20, 'x'));
  const std::size_t descriptors = open_descriptors();
  for (const ScriptStep& step : {silent, trickling, racing}) {
    SLibDEdgeStorageRecordList list;
    list.records.resize(3);
    EXPECT_EQ(impatient_list(step, list), LIBD_TIMEOUT) << step.answer.size();
    EXPECT_EQ(list.records.size(), 3u) << step.answer.size();
    EXPECT_EQ(open_descriptors(), descriptors) << step.answer.size();
  }
}

SLibDEdgeStorageStreamingInfo recording(const std::string& name) {
  SLibDEdgeStorageStreamingInfo info;
  info.streamName = name;
  return info;
}

TEST(RecordDeletion, NamesTheRecordingOrAll) {
  EdgePlay play({command("/command/edgestorage.cgi?DeletebyName=20240131_rec1"),
                 command("/command/edgestorage.cgi?DeletebyName=a/b?c=d%41\xc3\xa4#"),
                 command("/command/edgestorage.cgi?delete=all")});
  EXPECT_EQ(play.driver.DeleteEdgeStorageRecordByName(recording("20240131_rec1")), LIBD_OK);
  EXPECT_EQ(play.driver.DeleteEdgeStorageRecordByName(recording("a/b?c=d%41\xc3\xa4#")), LIBD_OK);
  EXPECT_EQ(play.driver.DeleteAllEdgeStorageRecord(), LIBD_OK);
}

TEST(RecordDeletion, OfAnEmptyNameSendsNothing) {
  EdgeDriver driver;
  driver.expect_no_exchange();
  EXPECT_EQ(driver.DeleteEdgeStorageRecordByName(recording("")), LIBD_FAILED);
  EXPECT_TRUE(driver.had_no_exchange());
}

TEST(RecordDeletion, HasANameThatAddsNeitherAHeaderNorAnotherCommand) {
  using std::string_literals::operator""s;
  const std::string name = "x HTTP/1.0\r\nHost: y\r\n\r\nGET /&delete=all\0z\x7f"s;
  EdgePlay play(
      {command("/command/edgestorage.cgi?DeletebyName="
               "x%20HTTP/1.0%0D%0AHost:%20y%0D%0A%0D%0AGET%20/%26delete=all%00z%7F")});
  EXPECT_EQ(play.driver.DeleteEdgeStorageRecordByName(recording(name)), LIBD_OK);
  EXPECT_EQ(play.driver.DeleteEdgeStorageRecordByName(recording(std::string(4096, 'n'))), LIBD_FAILED);
  EXPECT_EQ(text_of_latest_error(play.driver), "URL too long");
}

struct SlowRow {
  std::string path;
  std::function<ELibDReturnCode(EdgeDriver&)> call;
  int timeout;  ///< milliseconds while the request is under way
};

const std::vector<SlowRow>& slow_rows() {
  static const std::vector<SlowRow> rows = {
      {"/command/search?Order=oldest",
       [](EdgeDriver& d) {
         SLibDEdgeStorageRecordList list;
         return d.GetEdgeStorageRecordList(list);
       },
       10000},
      {"/command/edgestorage.cgi?DeletebyName=a",
       [](EdgeDriver& d) { return d.DeleteEdgeStorageRecordByName(recording("a")); }, 10000},
      {"/command/edgestorage.cgi?delete=all", [](EdgeDriver& d) { return d.DeleteAllEdgeStorageRecord(); }, 20000}};
  return rows;
}

TEST(RecordRequests, WaitLongerThanTheConnectionAllowsAndPutTheTimeOutBack) {
  for (const SlowRow& row : slow_rows()) {
    for (const bool taken : {true, false}) {
      ScriptStep step = taken ? command(row.path) : refusal(row.path);
      step.piece = 9;
      step.pause = 30;
      std::atomic<EdgeDriver*> driver{nullptr};
      int seen = 0;
      step.meanwhile = [&] {
        const vexa::Guard guard(driver.load()->m_ConnectionLock);
        seen = driver.load()->m_ConnectionInfo.timeout;
      };
      EdgePlay play({step});
      driver = &play.driver;
      play.driver.m_ConnectionInfo.timeout = 20;
      play.driver.m_SavedTimeout = 1234;
      EXPECT_EQ(row.call(play.driver), taken ? LIBD_OK : LIBD_UNAUTHORIZED) << row.path;
      EXPECT_EQ(play.driver.m_ConnectionInfo.timeout, 1234) << row.path;
      EXPECT_EQ(seen, row.timeout) << row.path;
    }
  }
}

struct ShortRow {
  Script script;
  std::function<ELibDReturnCode(EdgeDriver&)> call;
  ELibDReturnCode failed;
};

TEST(EdgeStorage, RequestsFailWhenAnyOneAllocationDoes) {
  const std::string name(40, 'n');
  const ShortRow rows[] = {{{list_answer(kOneRecord + kOneRecord)}, slow_rows()[0].call, LIBD_FAILED},
                           {{command("/command/edgestorage.cgi?DeletebyName=" + name)},
                            [&](EdgeDriver& d) { return d.DeleteEdgeStorageRecordByName(recording(name)); },
                            LIBD_FAILED},
                           {{command("/command/edgestorage.cgi?delete=all")}, slow_rows()[2].call, LIBD_FAILED},
                           {{command(mode_path("off", 1, "1,2", name))},
                            [&](EdgeDriver& d) { return d.SetEdgeStorageMode(mode_of(false, 1, 1, 2, name)); },
                            LIBD_TIMEOUT}};
  const std::size_t descriptors = open_descriptors();
  for (const ShortRow& row : rows) {
    fails_at_every_allocation(
        [&row](Shortage& shortage) {
          EdgePlay play(row.script, Ends::kAnywhere);
          const ELibDReturnCode result = shortage.run([&] {
            try {
              return row.call(play.driver);
            } catch (const std::bad_alloc&) {
              return row.failed;  // of the call's own arguments
            }
          });
          EXPECT_EQ(result, shortage.failed() ? row.failed : LIBD_OK);
          EXPECT_EQ(play.driver.m_ConnectionInfo.timeout, kPatientTimeout);
        },
        4);
    EXPECT_EQ(open_descriptors(), descriptors);
  }
}

TEST(EdgeStorage, FreeSpaceIsMinusOneWhenAnyOneAllocationFails) {
  const Script script = {inquiry("a-slot", "ASlot=Free space : " + std::string(40, '9') + "Kbyte")};
  fails_at_every_allocation(
      [&script](Shortage& shortage) {
        EdgePlay play(script, Ends::kAnywhere);
        const int space = shortage.run([&] { return play.driver.CheckEdgeStorageFreeSize(); });
        EXPECT_EQ(space, shortage.failed() ? -1 : 2147483647);
      },
      4);
}

TEST(MakeGmTime, CountsSecondsSince1970) {
  EdgeDriver driver;
  std::tm time{};
  time.tm_year = 124;
  time.tm_mon = 0;
  time.tm_mday = 31;
  time.tm_hour = 23;
  time.tm_min = 59;
  time.tm_sec = 59;
  EXPECT_EQ(driver._ld_mkgmtime(&time), 1706745599);
  time = {};
  time.tm_year = 70;
  time.tm_mday = 1;
  EXPECT_EQ(driver._ld_mkgmtime(&time), 0);
  time.tm_year = 138;
  time.tm_mday = 19;
  time.tm_hour = 3;
  time.tm_min = 14;
  time.tm_sec = 8;
  EXPECT_EQ(driver._ld_mkgmtime(&time), 2147483648);
}

// A time_t of 32 bits ends in 2038; the days beyond follow from the one before.
TEST(MakeGmTime, EqualsTheCLibrarysOnEveryDayOfTheYears1To9999) {
  EdgeDriver driver;
  const int days[] = {31, 28, 31, 30, 31, 30, 31, 31, 30, 31, 30, 31};
  std::int64_t before = -62135596800 - 86400;  // the day before 0001-01-01
  int wrong = 0;
  for (int year = 1; year <= 9999; ++year) {
    for (int month = 0; month < 12; ++month) {
      const int last = days[month] + (month == 1 && driver._ld_is_leap_year(year) ? 1 : 0);
      for (int day = 1; day <= last; ++day, before += 86400) {
        std::tm time{};
        time.tm_year = year - 1900;
        time.tm_mon = month;
        time.tm_mday = day;
        const std::int64_t seconds = driver._ld_mkgmtime(&time);
        if (seconds != before + 86400) ++wrong;
        if (sizeof(std::time_t) == 8 || (year > 1901 && year < 2038)) wrong += timegm(&time) != seconds ? 1 : 0;
      }
    }
  }
  EXPECT_EQ(wrong, 0);
}

TEST(IsLeapYear, FollowsTheGregorianRule) {
  EdgeDriver driver;
  const struct {
    int year;
    bool leap;
  } cases[] = {{2023, false}, {2024, true}, {1900, false}, {2000, true},
               {2100, false}, {4, true},    {0, true},     {-4, true}};
  for (const auto& c : cases) EXPECT_EQ(driver._ld_is_leap_year(c.year), c.leap) << c.year;
}

}  // namespace
}  // namespace vexa_test
