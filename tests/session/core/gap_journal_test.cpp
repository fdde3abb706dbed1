// SPDX-License-Identifier: Apache-2.0
#include "session/core/gap_journal.h"

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <vector>

namespace vexa {
namespace {

constexpr std::int64_t kSecond = 1000000;

using Runs = std::vector<std::pair<std::int64_t, std::int64_t>>;

Runs pairs(const std::vector<GapStretch>& stretches) {
  Runs list;
  for (const GapStretch& stretch : stretches) list.emplace_back(stretch.begin, stretch.end);
  return list;
}

TEST(GapJournal, AGapIsOpenThenDueThenOver) {
  GapJournal journal;
  EXPECT_EQ(journal.open_gap(5 * kSecond, 7), "gap 1 5000000 0 7 0 .\n");
  EXPECT_EQ(journal.open(), 1U);
  EXPECT_EQ(journal.due(), 0U);
  EXPECT_EQ(journal.open_gap(6 * kSecond, 7), "") << "there is one";
  EXPECT_EQ(journal.close_gap(9 * kSecond, 8), "gap 1 5000000 9000000 7 8 .\n");
  EXPECT_EQ(journal.open(), 0U);
  EXPECT_EQ(journal.due(), 1U);
  EXPECT_EQ(journal.close_gap(10 * kSecond, 8), "") << "there is none";
  EXPECT_EQ(journal.finish(1, GapState::kAbsent, {}, ""), "over 1 .\n");
  EXPECT_EQ(journal.due(), 0U);
  EXPECT_EQ(journal.gaps().at(1).state, GapState::kAbsent);
}

TEST(GapJournal, TheOldestGapIsDueFirst) {
  GapJournal journal;
  for (int i = 0; i < 3; ++i) {
    (void)journal.open_gap(i * 10, 0);
    (void)journal.close_gap(i * 10 + 5, 0);
  }
  EXPECT_EQ(journal.due(), 1U);
  (void)journal.finish(1, GapState::kRecovered, {}, "");
  EXPECT_EQ(journal.due(), 2U);
}

/// A gap of which some has been fetched, as its lines and as it is.
struct Begun {
  Begun() {
    text += journal.see({"old"}, 0, 77);
    text += journal.open_gap(10 * kSecond, 0);
    text += journal.close_gap(20 * kSecond, 0);
    text += journal.know_end(1, 3 * kSecond);
    text += journal.see({"old", "a name, with 100%"}, 1, 88);
    text += journal.deliver(1, "a name, with 100%", 1, 11 * kSecond);
    text += journal.deliver(1, "a name, with 100%", 2, 11 * kSecond + 40000);
    text += journal.deliver(1, "b", 5, 15 * kSecond);
  }
  GapJournal journal;
  std::string text;
};

void expect_begun(const GapJournal& journal) {
  ASSERT_EQ(journal.due(), 1U);
  const Gap& gap = journal.gaps().at(1);
  EXPECT_EQ(gap.begin, 10 * kSecond);
  EXPECT_EQ(gap.end, 20 * kSecond);
  EXPECT_EQ(gap.cameraBegin, 0);
  EXPECT_EQ(gap.cameraEnd, 3 * kSecond);
  EXPECT_EQ(gap.pictures, 3U);
  const std::map<std::string, std::int64_t> far = {{"a name, with 100%", 2}, {"b", 5}};
  EXPECT_EQ(journal.progress(1), far);
  EXPECT_EQ(pairs(journal.runs(1)), (Runs{{11 * kSecond, 11 * kSecond + 40000}, {15 * kSecond, 15 * kSecond}}));
  EXPECT_EQ(journal.fresh(1), std::set<std::string>{"a name, with 100%"});
  EXPECT_EQ(journal.listed_before(1), 77);
}

TEST(GapJournal, ReadFromItsLinesItIsAsItWas) {
  const Begun begun;
  expect_begun(begun.journal);
  expect_begun(GapJournal::read(begun.text));
}

TEST(GapJournal, WrittenAnewItIsAsItWas) {
  const Begun begun;
  const GapJournal again = GapJournal::read(begun.journal.text());
  expect_begun(again);
  EXPECT_EQ(again.text(), begun.journal.text());
}

TEST(GapJournal, CutAnywhereItsWholeLinesCount) {
  const Begun begun;
  for (std::size_t length = 0; length < begun.text.size(); ++length) {
    const GapJournal journal = GapJournal::read(begun.text.substr(0, length));
    const std::size_t whole = begun.text.rfind(".\n", length);
    const std::string lines = whole == std::string::npos ? "" : begun.text.substr(0, length);
    for (const auto& [number, gap] : journal.gaps()) {
      EXPECT_EQ(number, 1U) << length;
      EXPECT_EQ(gap.begin, 10 * kSecond) << length;
      EXPECT_TRUE(gap.end == 0 || gap.end == 20 * kSecond) << length;
    }
    for (const auto& [name, far] : journal.progress(1)) EXPECT_LE(far, 5) << lines;
  }
}

TEST(GapJournal, DamagedLinesAreAsIfNeverWritten) {
  const GapJournal journal = GapJournal::read(
      "gap 0 1 2 0 0 .\ngap x 1 2 0 0 .\ngap 1 2 .\nhave 7 name 1 2 .\nrun 7 1 2 3 .\nfar 7 n 1 .\nnew 7 n .\n"
      "over .\nlive x y .\nnonsense 1 2 3 .\n\n.\ngap 99999999999999999999999 1 2 0 0 .\n");
  EXPECT_TRUE(journal.gaps().empty());
  EXPECT_EQ(journal.text(), "");
}

TEST(GapJournal, AGapsNumberIsNeverGivenAgain) {
  GapJournal journal;
  (void)journal.open_gap(1, 0);
  (void)journal.close_gap(2, 0);
  (void)journal.finish(1, GapState::kRecovered, {}, "");
  GapJournal again = GapJournal::read(journal.text());
  EXPECT_TRUE(again.gaps().empty());
  EXPECT_EQ(again.open_gap(3, 0), "gap 2 3 0 0 0 .\n");
}

TEST(GapJournal, AHostThatDiedWhilePicturesCameHasAGapFromTheLastOne) {
  const std::string line = GapJournal::live_line(42 * kSecond, 7 * kSecond);
  const GapJournal journal = GapJournal::read(line);
  ASSERT_EQ(journal.open(), 1U);
  EXPECT_EQ(journal.gaps().at(1).begin, 42 * kSecond);
  EXPECT_EQ(journal.gaps().at(1).cameraBegin, 7 * kSecond);
  EXPECT_EQ(GapJournal::read(GapJournal::live_line(0, 0)).open(), 0U);
  EXPECT_EQ(GapJournal::read(line + "gap 4 1000000 0 0 0 .\n").open(), 4U) << "one was open already";
}

TEST(GapJournal, TheFirstLineIsAlwaysAsLong) {
  const std::size_t length = GapJournal::live_line(0, 0).size();
  EXPECT_EQ(GapJournal::live_line(INT64_MAX, INT64_MAX).size(), length);
  EXPECT_EQ(GapJournal::live_line(1706745599000000, -5).size(), length);
}

TEST(GapJournal, OfACardNeverListedBeforeNoRecordingIsNew) {
  GapJournal journal;
  (void)journal.open_gap(1, 0);
  (void)journal.close_gap(2, 0);
  EXPECT_EQ(journal.see({"a", "b"}, 1, 5), "card 5 .\nseen a .\nseen b .\n");
  EXPECT_TRUE(journal.fresh(1).empty());
  EXPECT_EQ(journal.listed_before(1), 0);
  EXPECT_EQ(journal.see({"b", "c"}, 1, 6), "since 1 5 .\ncard 6 .\nseen c .\nnew 1 c .\n");
  EXPECT_EQ(journal.see({"b", "c"}, 1, 7), "card 7 .\n");
  EXPECT_EQ(journal.listed_before(1), 5) << "before it was fetched";
  EXPECT_EQ(journal.fresh(1), std::set<std::string>{"c"});
}

TEST(GapJournal, GapsThatAreOverAreForgottenAtLast) {
  GapJournal journal;
  for (int i = 0; i < 1200; ++i) {
    (void)journal.open_gap(i * 10 + 1, 0);
    (void)journal.close_gap(i * 10 + 5, 0);
    (void)journal.finish(static_cast<std::uint64_t>(i) + 1, GapState::kRecovered, {}, "");
  }
  EXPECT_EQ(journal.gaps().size(), 1000U);
  EXPECT_EQ(journal.gaps().begin()->first, 201U);
}

TEST(MissingOf, StretchesThatNoRunCovers) {
  Gap gap;
  gap.begin = 0;
  gap.end = 20 * kSecond;
  const struct {
    std::vector<GapStretch> runs;
    Runs missing;
  } cases[] = {{{}, {{0, 20 * kSecond}}},
               {{{0, 20 * kSecond}}, {}},
               {{{kSecond, 19 * kSecond}}, {}},  // pauses of a second
               {{{kSecond + 1, 19 * kSecond - 1}}, {{0, kSecond + 1}, {19 * kSecond - 1, 20 * kSecond}}},
               {{{10 * kSecond, 20 * kSecond}, {0, 5 * kSecond}}, {{5 * kSecond, 10 * kSecond}}},
               {{{0, 15 * kSecond}, {3 * kSecond, 4 * kSecond}}, {{15 * kSecond, 20 * kSecond}}}};
  for (const auto& row : cases) EXPECT_EQ(pairs(missing_of(gap, row.runs)), row.missing);
}

}  // namespace
}  // namespace vexa
