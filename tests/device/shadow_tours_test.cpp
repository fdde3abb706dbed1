// Shadow tours on the wire.
#include <gtest/gtest.h>

#include <climits>
#include <map>
#include <string>
#include <vector>

#include "tests/device/ptz_reach.h"

namespace vexa_test {
namespace {

auto with_shadow_tours(int count) {
  return [count](PtzDriver& driver) { driver.m_FixedPTZControlInfo.shadowTourCount = count; };
}

SentRow row_of(std::function<ELibDReturnCode(PtzDriver&)> call, const std::string& rest) {
  return {std::move(call), "/command/presetposition.cgi?" + rest};
}

/// A record with the switches of its tours, numbered from 1.
SLibDShadowTourInfo shadow_info(bool on, int resume, const std::vector<bool>& tours) {
  SLibDShadowTourInfo info;
  info.enabled = on;
  info.resumeTime = resume;
  info.maxRecordTime = 99;
  for (const bool enabled : tours) {
    SLibDShadowTourEachSetting tour;
    tour.enabled = enabled;
    tour.reserved2 = 88;
    tour.recordedTime = 77;
    info.tours.emplace(static_cast<int>(info.tours.size()) + 1, tour);
  }
  return info;
}

SentRow setting(const SLibDShadowTourInfo& info, const std::string& rest) {
  return row_of(
      [info](PtzDriver& driver) {
        SLibDShadowTourInfo copy = info;
        return driver.SetShadowTourInfo(copy);
      },
      rest);
}

const SentRow kStops[] = {
    row_of([](PtzDriver& d) { return d.StopShadowTour(); }, "STour=off&STourA=off&STourB=off&STourC=off&STourD=off"),
    row_of([](PtzDriver& d) { return d.StopRecordShadowTour(); }, "STourRecord=stop"),
    row_of([](PtzDriver& d) { return d.StopPreviewShadowTour(); }, "STourPreview=stop")};

TEST(ShadowTours, AreStartedByLetterWithAllOthersOff) {
  expect_sent(
      {row_of([](PtzDriver& d) { return d.StartShadowTour(2); }, "STour=on&STourA=off&STourB=on&STourC=off&STourD=off"),
       row_of([](PtzDriver& d) { return d.StartShadowTour(1); }, "STour=on&STourA=on&STourB=off&STourC=off&STourD=off"),
       row_of([](PtzDriver& d) { return d.StartShadowTour(4); },
              "STour=on&STourA=off&STourB=off&STourC=off&STourD=on")},
      with_shadow_tours(4));
  expect_sent({row_of([](PtzDriver& d) { return d.StartShadowTour(1); }, "STour=on&STourA=on")}, with_shadow_tours(1));
  for (const int count : {5, 6, INT_MAX}) {
    expect_sent({row_of([](PtzDriver& d) { return d.StartShadowTour(5); },
                        "STour=on&STourA=off&STourB=off&STourC=off&STourD=off&STourE=on")},
                with_shadow_tours(count));
  }
}

TEST(ShadowTours, AreRecordedAndPreviewedByLetter) {
  std::vector<SentRow> rows;
  for (int number = 1; number <= 5; ++number) {
    const std::string letter(1, "ABCDE"[number - 1]);
    rows.push_back(row_of([number](PtzDriver& d) { return d.StartRecordShadowTour(number); }, "STourRecord=" + letter));
    rows.push_back(
        row_of([number](PtzDriver& d) { return d.StartPreviewShadowTour(number); }, "STourPreview=" + letter));
  }
  expect_sent(rows, with_shadow_tours(5));
}

TEST(ShadowTours, AreStoppedWithFourNamedWhateverTheirNumber) {
  for (const int count : {-1, 0, 2, 4, 5}) {
    expect_sent({kStops[0], kStops[1], kStops[2]}, with_shadow_tours(count));
  }
}

TEST(ShadowTours, TellTheLatestErrorWhenTheyAreRefused) {
  const auto prepare = with_shadow_tours(1);
  for (const SentRow& row : kStops) expect_refusal_told(row, prepare);
  expect_refusal_told(row_of([](PtzDriver& d) { return d.StartShadowTour(1); }, "STour=on&STourA=on"), prepare);
  expect_refusal_told(row_of([](PtzDriver& d) { return d.StartRecordShadowTour(1); }, "STourRecord=A"), prepare);
  expect_refusal_told(row_of([](PtzDriver& d) { return d.StartPreviewShadowTour(1); }, "STourPreview=A"), prepare);
  expect_refusal_told(
      setting(shadow_info(false, 0, {false}), "STour=off&STourResume=off&STourA=off&STourAPeriod=always"), prepare);
}

using ShadowToursUnsent = PtzUnsent;

TEST_F(ShadowToursUnsent, BecauseTheNumberIsNone) {
  const struct {
    int count;
    std::vector<int> refused;
  } rows[] = {{4, {0, 5, -1, INT_MIN, INT_MAX}}, {0, {0, 1, -1}}, {-1, {-1, 0, 1}}, {9, {0, 6, 9}}};
  for (const auto& row : rows) {
    with_shadow_tours(row.count)(driver_);
    for (const int number : row.refused) {
      EXPECT_EQ(driver_.StartShadowTour(number), LIBD_INVALID_ARGUMENT) << number;
      EXPECT_EQ(driver_.StartRecordShadowTour(number), LIBD_INVALID_ARGUMENT) << number;
      EXPECT_EQ(driver_.StartPreviewShadowTour(number), LIBD_INVALID_ARGUMENT) << number;
    }
  }
}

TEST_F(ShadowToursUnsent, BecauseTheCameraHasNone) {
  for (const int count : {0, -1}) {
    with_shadow_tours(count)(driver_);
    SLibDShadowTourInfo info = shadow_info(true, 5, {});
    EXPECT_EQ(driver_.GetShadowTourInfo(info), LIBD_NOT_SUPPORTED);
    EXPECT_EQ(driver_.SetShadowTourInfo(info), LIBD_NOT_SUPPORTED);
    EXPECT_EQ(info.resumeTime, 5);
  }
}

TEST(SetShadowTourInfo, SendsAllShadowToursAtOnce) {
  expect_sent({setting(shadow_info(true, 30, {false, true}),
                       "STour=on&STourResume=on&STourRsmTime=30&STourA=off&STourAPeriod=always"
                       "&STourB=on&STourBPeriod=always"),
               setting(shadow_info(false, 0, {true, false}),
                       "STour=off&STourResume=off&STourA=on&STourAPeriod=always&STourB=off&STourBPeriod=always"),
               setting(shadow_info(false, INT_MIN, {false, false}),
                       "STour=off&STourResume=on&STourRsmTime=-2147483648&STourA=off&STourAPeriod=always"
                       "&STourB=off&STourBPeriod=always")},
              with_shadow_tours(2));
}

TEST(SetShadowTourInfo, TakesMoreThanFiveForFive) {
  expect_sent({setting(shadow_info(true, 0, {false, false, false, false, true}),
                       "STour=on&STourResume=off&STourA=off&STourAPeriod=always&STourB=off&STourBPeriod=always"
                       "&STourC=off&STourCPeriod=always&STourD=off&STourDPeriod=always&STourE=on&STourEPeriod=always")},
              with_shadow_tours(6));
}

TEST(SetShadowTourInfo, GivesLettersByTheOrderOfTheEntries) {
  SLibDShadowTourInfo info = shadow_info(true, 0, {});
  info.tours[-7].enabled = false;
  info.tours[40].enabled = true;
  expect_sent({setting(info, "STour=on&STourResume=off&STourA=off&STourAPeriod=always&STourB=on&STourBPeriod=always")},
              with_shadow_tours(2));
}

TEST_F(ShadowToursUnsent, BecauseTwoAreOnOrTheRecordIsNotForAll) {
  with_shadow_tours(3)(driver_);
  const std::vector<bool> refused[] = {{true, false, true}, {true, true, true},          {}, {false},
                                       {false, true},       {false, false, false, false}};
  for (const std::vector<bool>& tours : refused) {
    SLibDShadowTourInfo info = shadow_info(true, 0, tours);
    EXPECT_EQ(driver_.SetShadowTourInfo(info), LIBD_INVALID_ARGUMENT) << tours.size();
  }
}

SLibDShadowTourInfo asked(const std::string& answer, int count) {
  PtzPlay play({inquiry("presetposition", answer)});
  with_shadow_tours(count)(play.driver);
  SLibDShadowTourInfo info = shadow_info(true, 55, std::vector<bool>(7, true));
  EXPECT_EQ(play.driver.GetShadowTourInfo(info), LIBD_OK);
  return info;
}

TEST(GetShadowTourInfo, ReadsEveryShadowTour) {
  const SLibDShadowTourInfo info = asked(
      "PresetName=&Tour=off&TourA=off&STour=on&STourResume=on&STourRsmTime=30&STourMaxRecordTime=120"
      "&STourA=off&STourARecordedTime=12&STourB=on&STourBRecordedTime=0&STourC=on",
      3);
  EXPECT_TRUE(info.enabled);
  EXPECT_EQ(info.resumeTime, 30);
  EXPECT_EQ(info.maxRecordTime, 120);
  ASSERT_EQ(info.tours.size(), 3U);
  EXPECT_FALSE(info.tours.at(1).enabled);
  EXPECT_EQ(info.tours.at(1).reserved2, 0);
  EXPECT_EQ(info.tours.at(1).recordedTime, 12);
  EXPECT_TRUE(info.tours.at(2).enabled);
  EXPECT_EQ(info.tours.at(2).recordedTime, 0);
  EXPECT_TRUE(info.tours.at(3).enabled);
  EXPECT_EQ(info.tours.at(3).recordedTime, 0);
}

TEST(GetShadowTourInfo, HasZeroForWhatTheAnswerLacks) {
  for (const char* answer : {"", "STour=on", "STourA=on", "A=1&Tour=on&TourA=on", "A=1&STourRsmTime=30",
                             "A=1&STourResume=on&STourMaxRecordTime=", "A=1&STourResume=on&STourRsmTime=x&STour=ON"}) {
    const SLibDShadowTourInfo info = asked(answer, 1);
    EXPECT_FALSE(info.enabled) << answer;
    EXPECT_EQ(info.resumeTime, 0) << answer;
    EXPECT_EQ(info.maxRecordTime, 0) << answer;
    ASSERT_EQ(info.tours.size(), 1U) << answer;
    EXPECT_FALSE(info.tours.at(1).enabled) << answer;
    EXPECT_EQ(info.tours.at(1).recordedTime, 0) << answer;
  }
}

TEST(GetShadowTourInfo, ReadsAsManyAsThereAreLetters) {
  EXPECT_EQ(asked("A=1", 5).tours.size(), 5U);
  EXPECT_EQ(asked("A=1", 6).tours.size(), 5U);
  EXPECT_EQ(asked("A=1", INT_MAX).tours.size(), 5U);
}

TEST(GetShadowTourInfo, LeavesTheRecordWhenTheInquiryFails) {
  PtzPlay play({refusal("/command/inquiry.cgi?inq=presetposition")});
  with_shadow_tours(2)(play.driver);
  SLibDShadowTourInfo info = shadow_info(true, 77, {true});
  EXPECT_EQ(play.driver.GetShadowTourInfo(info), LIBD_UNAUTHORIZED);
  EXPECT_EQ(info.resumeTime, 77);
  EXPECT_EQ(info.tours.size(), 1U);
}

}  // namespace
}  // namespace vexa_test
