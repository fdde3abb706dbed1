// Camera tours on the wire.
#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

#include "tests/device/ptz_reach.h"

namespace vexa_test {
namespace {

using Sequence = std::vector<int>;

SLibDCameraTourEachSetting tour_of(bool on, Sequence sequence, int stay = 10, int speed = 24) {
  SLibDCameraTourEachSetting tour;
  tour.enabled = on;
  tour.sequence = std::move(sequence);
  tour.stayTime = stay;
  tour.speed = speed;
  return tour;
}

SLibDCameraTourInfo tours_of(bool on, int resume, std::vector<SLibDCameraTourEachSetting> tours) {
  SLibDCameraTourInfo info;
  info.enabled = on;
  info.resumeTime = resume;
  int number = 0;
  for (auto& tour : tours) info.tours.emplace(++number, std::move(tour));
  return info;
}

auto with_tours(int count) {
  return [count](PtzDriver& driver) {
    driver.m_FixedPTZControlInfo.tourCount = count;
    driver.m_FixedPTZControlInfo.presetCount = 16;
  };
}

std::string path_of(const std::string& rest) { return "/command/presetposition.cgi?" + rest; }

void expect_tours_sent(const SLibDCameraTourInfo& info, const std::string& rest, int count = -1) {
  const int tours = count < 0 ? static_cast<int>(info.tours.size()) : count;
  const auto set = [info](PtzDriver& driver) {
    SLibDCameraTourInfo copy = info;
    return driver.SetCameraTourInfo(copy);
  };
  expect_sent({{set, path_of(rest)}}, with_tours(tours));
}

TEST(TourSelector, HoldsTheLettersInOrder) {
  std::string letters;
  for (const char* letter : g_TourSelector) letters += std::string(letter) + "|";
  EXPECT_EQ(letters, "A|B|C|D|E|");
}

TEST(SetCameraTourInfo, SendsAllToursAtOnce) {
  expect_tours_sent(tours_of(true, 30, {tour_of(true, {1, 2, 3}), tour_of(false, {4, 5}, 5, 12)}),
                    "Tour=on&TourResume=on&TourRsmTime=30"
                    "&TourA=on&TourASequence=1,2,3&TourAStaytime=10&TourAPeriod=always&TourASpeed=24"
                    "&TourB=off&TourBSequence=4,5&TourBStaytime=5&TourBPeriod=always&TourBSpeed=12");
}

TEST(SetCameraTourInfo, SendsNoResumeTimeOfZero) {
  expect_tours_sent(
      tours_of(false, 0, {tour_of(false, {1})}),
      "Tour=off&TourResume=off&TourA=off&TourASequence=1&TourAStaytime=10&TourAPeriod=always&TourASpeed=24");
}

TEST(SetCameraTourInfo, CutsNumbersToSevenCharacters) {
  expect_tours_sent(tours_of(true, 123456789, {tour_of(true, {12345678, 1234567, -12345678}, INT_MIN, INT_MAX)}),
                    "Tour=on&TourResume=on&TourRsmTime=1234567&TourA=on&TourASequence=1234567,1234567,-123456"
                    "&TourAStaytime=-214748&TourAPeriod=always&TourASpeed=2147483");
}

TEST(SetCameraTourInfo, TakesMoreThanFiveToursForFive) {
  const SLibDCameraTourInfo info = tours_of(true, 0, std::vector(5, tour_of(false, {1, 2}, 1, 2)));
  std::string rest = "Tour=on&TourResume=off";
  for (const std::string letter : {"A", "B", "C", "D", "E"}) {
    rest += "&Tour" + letter + "=off&Tour" + letter + "Sequence=1,2&Tour" + letter + "Staytime=1&Tour" + letter +
            "Period=always&Tour" + letter + "Speed=2";
  }
  expect_tours_sent(info, rest, 5);
  expect_tours_sent(info, rest, 6);
  expect_tours_sent(info, rest, INT_MAX);
}

TEST(SetCameraTourInfo, TellsTheLatestErrorWhenItsRequestIsRefused) {
  const auto set = [](PtzDriver& driver) {
    SLibDCameraTourInfo info = tours_of(false, 0, {tour_of(false, {1})});
    return driver.SetCameraTourInfo(info);
  };
  expect_refusal_told({set, path_of("Tour=off&TourResume=off&TourA=off&TourASequence=1&TourAStaytime=10"
                                    "&TourAPeriod=always&TourASpeed=24")},
                      with_tours(1));
}

TEST(SetCameraTourInfo, OfSequencesTooLongForARequestIsNotSent) {
  PtzPlay play({});
  with_tours(1)(play.driver);
  SLibDCameraTourInfo info = tours_of(false, 0, {tour_of(false, Sequence(1000, 16))});
  EXPECT_EQ(play.driver.SetCameraTourInfo(info), LIBD_FAILED);
  EXPECT_EQ(text_of_latest_error(play.driver), "URL too long");
}

using CameraToursUnsent = PtzUnsent;

TEST_F(CameraToursUnsent, BecauseTheRecordIsNotForAllTours) {
  for (const int count : {-1, 0, 1, 2, 3, 5, 6}) {
    with_tours(count)(driver_);
    for (const int given : {0, 1, 2, 4, 6}) {
      if (given == count) continue;
      SLibDCameraTourInfo info = tours_of(true, 0, std::vector(static_cast<std::size_t>(given), tour_of(false, {1})));
      EXPECT_EQ(driver_.SetCameraTourInfo(info), LIBD_INVALID_ARGUMENT) << given << " of " << count;
    }
  }
}

TEST_F(CameraToursUnsent, BecauseATourNumberIsMissing) {
  with_tours(2)(driver_);
  for (const int other : {0, 3, -1, INT_MAX}) {
    SLibDCameraTourInfo info = tours_of(true, 0, {tour_of(false, {1})});
    info.tours.emplace(other, tour_of(false, {1}));
    EXPECT_EQ(driver_.SetCameraTourInfo(info), LIBD_INVALID_ARGUMENT) << other;
  }
}

TEST_F(CameraToursUnsent, BecauseTwoAreOn) {
  with_tours(3)(driver_);
  SLibDCameraTourInfo info = tours_of(true, 0, {tour_of(true, {1}), tour_of(false, {1}), tour_of(true, {1})});
  EXPECT_EQ(driver_.SetCameraTourInfo(info), LIBD_INVALID_ARGUMENT);
}

TEST_F(CameraToursUnsent, BecauseASequenceIsEmpty) {
  with_tours(2)(driver_);
  SLibDCameraTourInfo info = tours_of(true, 0, {tour_of(false, {1}), tour_of(false, {})});
  EXPECT_EQ(driver_.SetCameraTourInfo(info), LIBD_INVALID_ARGUMENT);
}

TEST_F(CameraToursUnsent, BecauseANegativePresetIsAboveANegativeCount) {
  with_tours(1)(driver_);
  driver_.m_FixedPTZControlInfo.presetCount = -5;
  SLibDCameraTourInfo info = tours_of(true, 0, {tour_of(false, {1, -4})});
  EXPECT_EQ(driver_.SetCameraTourInfo(info), LIBD_INVALID_ARGUMENT);
}

SLibDCameraTourInfo asked(const std::string& answer, int count, int result = 1) {
  PtzPlay play({inquiry("presetposition", answer)});
  with_tours(count)(play.driver);
  SLibDCameraTourInfo info = tours_of(true, 77, std::vector(7, tour_of(true, {9})));
  EXPECT_EQ(play.driver.GetCameraTourInfo(info), result);
  return info;
}

TEST(GetCameraTourInfo, ReadsEveryTour) {
  const SLibDCameraTourInfo info = asked(
      "PresetName=&Tour=on&TourResume=on&TourRsmTime=30"
      "&TourA=on&TourASequence=1,2,3&TourAStaytime=5&TourAPeriod=always&TourASpeed=12"
      "&TourB=off&TourBSequence=4,5&TourBStaytime=6&TourBSpeed=13",
      2);
  EXPECT_TRUE(info.enabled);
  EXPECT_EQ(info.resumeTime, 30);
  ASSERT_EQ(info.tours.size(), 2U);
  const SLibDCameraTourEachSetting& first = info.tours.at(1);
  EXPECT_TRUE(first.enabled);
  EXPECT_EQ(first.sequence, (Sequence{1, 2, 3}));
  EXPECT_EQ(first.stayTime, 5);
  EXPECT_EQ(first.reserved4, 0);
  EXPECT_EQ(first.speed, 12);
  const SLibDCameraTourEachSetting& second = info.tours.at(2);
  EXPECT_FALSE(second.enabled);
  EXPECT_EQ(second.sequence, (Sequence{4, 5}));
  EXPECT_EQ(second.stayTime, 6);
  EXPECT_EQ(second.speed, 13);
}

TEST(GetCameraTourInfo, HasDefaultsForWhatTheAnswerLacks) {
  for (const char* answer : {"", "Tour=on", "TourA=on", "A=1&STour=on&STourA=on&STourResume=on", "A=1&Tour=On&TourA=ON",
                             "A=1&TourASequence=&TourAStaytime=&TourASpeed=", "A=1&TourRsmTime=30&TourResume=off"}) {
    const SLibDCameraTourInfo info = asked(answer, 1);
    EXPECT_FALSE(info.enabled) << answer;
    EXPECT_EQ(info.resumeTime, 0) << answer;
    ASSERT_EQ(info.tours.size(), 1U);
    EXPECT_FALSE(info.tours.at(1).enabled) << answer;
    EXPECT_TRUE(info.tours.at(1).sequence.empty()) << answer;
    EXPECT_GE(info.tours.at(1).sequence.capacity(), 256U);
    EXPECT_EQ(info.tours.at(1).stayTime, 10) << answer;
    EXPECT_EQ(info.tours.at(1).speed, 24) << answer;
  }
}

TEST(GetCameraTourInfo, HasAResumeTimeOfZeroWhereItIsMissing) {
  EXPECT_EQ(asked("A=1&TourResume=on", 1).resumeTime, 0);
  EXPECT_EQ(asked("A=1&TourResume=on&TourRsmTime=", 1).resumeTime, 0);
  EXPECT_EQ(asked("A=1&TourResume=on&TourRsmTime=x", 1).resumeTime, 0);
  EXPECT_EQ(asked("A=1&TourResume=on&TourRsmTime=-3x", 1).resumeTime, -3);
}

TEST(GetCameraTourInfo, ReadsASequenceOfOnePresetAsEmpty) {
  EXPECT_TRUE(asked("A=1&TourASequence=5", 1).tours.at(1).sequence.empty());
}

TEST(GetCameraTourInfo, ReadsAsManyToursAsThereAreLetters) {
  EXPECT_EQ(asked("A=1&TourE=on", 5).tours.size(), 5U);
  EXPECT_TRUE(asked("A=1&TourE=on", 5).tours.at(5).enabled);
  EXPECT_EQ(asked("A=1&TourF=on", 6).tours.size(), 5U);
  EXPECT_EQ(asked("A=1&TourF=on", INT_MAX).tours.size(), 5U);
  EXPECT_TRUE(asked("A=1&TourA=on", 0).tours.empty());
  EXPECT_TRUE(asked("A=1&TourA=on", -1).tours.empty());
}

TEST(GetCameraTourInfo, LeavesTheRecordWhenTheInquiryFails) {
  PtzPlay play({refusal("/command/inquiry.cgi?inq=presetposition")});
  with_tours(2)(play.driver);
  SLibDCameraTourInfo info = tours_of(true, 77, {tour_of(true, {9})});
  EXPECT_EQ(play.driver.GetCameraTourInfo(info), LIBD_UNAUTHORIZED);
  EXPECT_EQ(info.resumeTime, 77);
  EXPECT_EQ(info.tours.size(), 1U);
}

TEST(TourSequence, IsReadFromItsText) {
  const struct {
    const char* text;
    bool read;
    Sequence sequence;
  } rows[] = {{"", true, {}},
              {"5", false, {}},
              {"x", false, {}},
              {"1,2", true, {1, 2}},
              {",", true, {0, 0}},
              {"1,", true, {1, 0}},
              {",7", true, {0, 7}},
              {"1,,3", true, {1, 0, 3}},
              {"a,2b", true, {0, 2}},
              {" 3, 4", true, {3, 4}},
              {"-1,+2", true, {-1, 2}},
              {"1;2", false, {}},
              {"99999999999,1", true, {INT_MAX, 1}}};
  PtzDriver driver;
  for (const auto& row : rows) {
    Sequence sequence;
    EXPECT_EQ(driver.GetTourSequenceListByText(row.text, sequence), row.read) << row.text;
    EXPECT_EQ(sequence, row.sequence) << row.text;
  }
}

TEST(TourSequence, IsAppendedToWhatTheListHolds) {
  PtzDriver driver;
  Sequence sequence = {9};
  EXPECT_TRUE(driver.GetTourSequenceListByText("1,2", sequence));
  EXPECT_EQ(sequence, (Sequence{9, 1, 2}));
}

TEST(TourSequence, IsWrittenWithCommas) {
  PtzDriver driver;
  driver.m_FixedPTZControlInfo.presetCount = 3;
  std::string text = "from before";
  EXPECT_TRUE(driver.GetTextByTourSequenceList({}, text));
  EXPECT_EQ(text, "");
  EXPECT_TRUE(driver.GetTextByTourSequenceList({7}, text));
  EXPECT_EQ(text, "7");
  EXPECT_TRUE(driver.GetTextByTourSequenceList({1, 0, -2, 400}, text));
  EXPECT_EQ(text, "1,0,-2,400");
}

TEST(TourSequence, IsRefusedOnlyForANegativeNumberAboveTheCount) {
  PtzDriver driver;
  driver.m_FixedPTZControlInfo.presetCount = -3;
  std::string text;
  EXPECT_FALSE(driver.GetTextByTourSequenceList({-2}, text));
  EXPECT_TRUE(driver.GetTextByTourSequenceList({-3}, text));
  EXPECT_TRUE(driver.GetTextByTourSequenceList({-4, 0, 1}, text));
  EXPECT_EQ(text, "-4,0,1");
}

}  // namespace
}  // namespace vexa_test
