// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/storage_text.h"

#include <gtest/gtest.h>

#include <climits>
#include <functional>
#include <string>
#include <vector>

#include "tests/support/fenced_bytes.h"

namespace vexa {
namespace {

using Records = std::vector<SLibDEdgeStorageRecord>;
using Items = std::vector<std::string>;

Items items_of_one() {
  return {"StreamName=20240131_rec1",
          "Start=20240131T235959",
          "End=20240201T000100",
          "ImageCodec=h264",
          "ImageSize=1920,1080",
          "FrameRate=25",
          "BitRate=8000",
          "AudioCodec=g711",
          "Size=123456",
          "Status=normal"};
}

std::string joined(const Items& items) {
  std::string text;
  for (const std::string& item : items) text += (text.empty() ? "" : ",") + item;
  return text;
}

std::string with(std::size_t place, const std::string& item) {
  Items items = items_of_one();
  items.at(place) = item;
  return joined(items);
}

std::string named(const std::string& name) { return with(0, "StreamName=" + name); }

Records read_fenced(const std::string& text) {
  const vexa_test::FencedBytes bytes({reinterpret_cast<const unsigned char*>(text.data()), text.size()});
  return read_recordings({reinterpret_cast<const char*>(bytes.data()), text.size()});
}

TEST(Recordings, AreReadItemByItem) {
  const Records records = read_fenced(joined(items_of_one()) + "\r\n");
  ASSERT_EQ(records.size(), 1u);
  EXPECT_EQ(records[0].streamName, "20240131_rec1");
  EXPECT_EQ(records[0].start, 1706745599);
  EXPECT_EQ(records[0].end, 1706745660);
  EXPECT_EQ(records[0].imageCodec, "h264");
  EXPECT_EQ(records[0].imageSize, "1920,1080");
  EXPECT_EQ(records[0].frameRate, 25);
  EXPECT_EQ(records[0].bitRate, 8000);
  EXPECT_EQ(records[0].quality, 0);
  EXPECT_EQ(records[0].audioCodec, "g711");
  EXPECT_EQ(records[0].size, 123456);
  EXPECT_EQ(records[0].status, "normal");
}

TEST(Recordings, WithAQualityHaveNoBitRate) {
  const Records records = read_fenced(with(6, "Quality=7"));
  ASSERT_EQ(records.size(), 1u);
  EXPECT_EQ(records[0].bitRate, 0);
  EXPECT_EQ(records[0].quality, 7);
}

TEST(Recordings, KeepTheCamerasOrderWhateverIsBetweenThem) {
  for (const std::string between : {"\r\n", ",", ",Extra=1,", "\x01 junk StreamNam", "\n\n"}) {
    const Records records = read_fenced("OK\r\n" + named("b") + between + named("a") + between + named("c"));
    ASSERT_EQ(records.size(), 3u) << between;
    EXPECT_EQ(records[0].streamName + records[1].streamName + records[2].streamName, "bac") << between;
  }
}

TEST(Recordings, HaveAStatusThatRunsToACommaOrAControlCharacter) {
  const Records records = read_fenced(named("a") + "&More=1 " + named("swallowed") + "\n" + named("c"));
  ASSERT_EQ(records.size(), 2u);
  EXPECT_EQ(records[0].status, "normal&More=1 StreamName=swallowed");
  EXPECT_EQ(records[1].streamName, "c");
}

TEST(Recordings, WithoutARecordAreNone) {
  for (const char* text : {"", "OK", "StreamName", "Start=20240131T235959,End=", "streamname=a,Start="}) {
    EXPECT_TRUE(read_fenced(text).empty()) << text;
  }
}

TEST(Recordings, CutAnywhereGiveTheWholeOnesBeforeTheCut) {
  const std::string first = named("a") + "\r\n";
  const std::string whole = first + named("b");
  const std::size_t counted = whole.rfind("Status=") + 7;
  for (std::size_t length = 0; length <= whole.size(); ++length) {
    const Records records = read_fenced(whole.substr(0, length));
    const std::size_t first_counted = first.rfind("Status=") + 7;
    ASSERT_EQ(records.size(), (length >= first_counted ? 1u : 0u) + (length >= counted ? 1u : 0u)) << length;
  }
}

TEST(Recordings, CutRightAfterStatusCount) {
  const Records records = read_fenced(with(9, "Status="));
  ASSERT_EQ(records.size(), 1u);
  EXPECT_EQ(records[0].status, "");
}

TEST(Recordings, EndAtAnItemThatIsMissingDoubledOrOutOfOrder) {
  const std::string good = named("good") + "\n";
  for (std::size_t place = 0; place < items_of_one().size(); ++place) {
    Items missing = items_of_one();
    missing.erase(missing.begin() + static_cast<std::ptrdiff_t>(place));
    Items doubled = items_of_one();
    doubled.insert(doubled.begin() + static_cast<std::ptrdiff_t>(place), doubled.at(place));
    Items swapped = items_of_one();
    std::swap(swapped.at(place), swapped.at((place + 1) % swapped.size()));
    // A record without its name is not even looked at; a name or status too many stands between records.
    const bool outside = place == 0 || place + 1 == items_of_one().size();
    const std::size_t first_swapped = place + 1 == items_of_one().size() ? 0 : place;
    EXPECT_EQ(read_fenced(good + joined(missing) + "\n" + good).size(), place == 0 ? 2u : 1u) << place;
    EXPECT_EQ(read_fenced(good + joined(doubled) + "\n" + good).size(), outside && place != 0 ? 3u : 1u) << place;
    EXPECT_EQ(read_fenced(good + joined(swapped) + "\n").size(), 1u) << first_swapped;
  }
}

TEST(Recordings, EndAtAControlCharacterInsideARecord) {
  const std::string good = named("good") + "\n";
  for (std::size_t place = 0; place + 1 < items_of_one().size(); ++place) {
    for (const char control : {'\0', '\n', '\r', '\t', '\x1f'}) {
      const std::string damaged = with(place, items_of_one().at(place) + control);
      EXPECT_EQ(read_fenced(good + damaged + "\n" + good).size(), 1u) << place;
    }
  }
}

TEST(Recordings, TakeEveryOtherByteIntoAName) {
  std::string name;
  for (int byte = 32; byte < 256; ++byte) {
    if (byte != ',') name.push_back(static_cast<char>(byte));
  }
  for (const std::string& given : {name, std::string(4096, 'n'), std::string("a=b&c Start="), std::string()}) {
    const Records records = read_fenced(named(given));
    ASSERT_EQ(records.size(), 1u);
    EXPECT_EQ(records[0].streamName, given);
  }
}

struct SizeRow {
  const char* text;
  const char* size;  ///< null: the walk ends
};

TEST(Recordings, HaveASizeOfTwoItems) {
  const SizeRow rows[] = {{"1920,1080", "1920,1080"}, {",", ","},       {"640,", "640,"},   {",480", ",480"},
                          {"a b,c", "a b,c"},         {"640", nullptr}, {"1,2,3", nullptr}, {"640\n,480", nullptr}};
  for (const SizeRow& row : rows) {
    const Records records = read_fenced(with(4, std::string("ImageSize=") + row.text));
    ASSERT_EQ(records.size(), row.size == nullptr ? 0u : 1u) << row.text;
    if (row.size != nullptr) {
      EXPECT_EQ(records[0].imageSize, row.size) << row.text;
    }
  }
}

TEST(Recordings, ReadNumbersAsFarAsTheyGoAndHoldThemToAnInt) {
  const struct {
    const char* text;
    int value;
  } rows[] = {{"25", 25},
              {"", 0},
              {"x", 0},
              {" +7fps", 7},
              {"-3", -3},
              {"2147483648", INT_MAX},
              {"99999999999999999999999", INT_MAX},
              {"-99999999999999999999999", INT_MIN}};
  for (const auto& row : rows) {
    const std::string text = row.text;
    const Records rate = read_fenced(with(5, "FrameRate=" + text));
    const Records bits = read_fenced(with(6, "BitRate=" + text));
    const Records quality = read_fenced(with(6, "Quality=" + text));
    const Records size = read_fenced(with(8, "Size=" + text));
    ASSERT_EQ(rate.size() + bits.size() + quality.size() + size.size(), 4u) << text;
    EXPECT_EQ(rate[0].frameRate, row.value) << text;
    EXPECT_EQ(bits[0].bitRate, row.value) << text;
    EXPECT_EQ(quality[0].quality, row.value) << text;
    EXPECT_EQ(size[0].size, row.value) << text;
  }
}

TEST(Recordings, ReadTimesAsUtc) {
  const struct {
    const char* text;
    std::int64_t seconds;
  } rows[] = {{"20240131T235959", 1706745599},
              {"19700101T000000", 0},
              {"20380119T031408", 2147483648},
              {"99991231T235959", 253402300799},
              {"20240131T23595999", 1706745599},  // what follows is passed over
              {"20240131T235959Z", 1706745599},
              {" 20240131T 235959", 1706745599},
              {"20240131T7", 1706659207},
              // Days that do not exist run over; months that do not exist count as January, or as a whole year.
              {"20240230T000000", 1709251200},
              {"20240100T000000", 1703980800},
              {"20240001T000000", 1704067200},
              {"20249901T000000", 1735689600},
              {"2024013T235959", -55760054401},  // month 40 of the year 202
              {"20240131T999999", 1707021639},
              // No such text at all.
              {"", 0},
              {"T", 0},
              {"20240131", 0},
              {"20240131T", 0},
              {"20240131 235959", 0},
              {"202401311T235959", 0},
              {"x0240131T235959", 0},
              {"20240131Tx", 0},
              {"20240131T-", 0}};
  for (const auto& row : rows) {
    const Records records = read_fenced(with(1, std::string("Start=") + row.text));
    ASSERT_EQ(records.size(), 1u) << row.text;
    EXPECT_EQ(records[0].start, row.seconds) << row.text;
    EXPECT_EQ(records[0].end, 1706745660) << row.text;
    const Records ends = read_fenced(with(2, std::string("End=") + row.text));
    ASSERT_EQ(ends.size(), 1u) << row.text;
    EXPECT_EQ(ends[0].end, row.seconds) << row.text;
  }
}

TEST(FreeKilobytes, AreTheNumberInFrontOfTheUnit) {
  const struct {
    const char* answer;
    int kilobytes;
  } rows[] = {{"ASlot=Free space : 1024Kbyte&BSlot=none", 1024},
              {"Slots=1&ASlot=Free space : 7Kbyte", 7},
              {"ASlot=Free space : 1024Mbyte", 1024},
              {"ASlot=Free space : 1024", 1024},
              {"ASlot=Free space :  12Kbyte", 12},
              {"ASlot=Free space : +3Kbyte", 3},
              {"ASlot=Free space : 99999999999Kbyte", INT_MAX},
              {"ASlot=Free space : 0Kbyte", 0},
              {"ASlot=Free space : -5Kbyte", 0},
              {"ASlot=Free space : Kbyte", 0},
              {"ASlot=Free space : ", 0},
              {"ASlot=Free space : &12Kbyte", 0},
              {"ASlot=Free space:12Kbyte", 0},
              {"ASlot=none", 0},
              {"", 0}};
  for (const auto& row : rows) EXPECT_EQ(free_kilobytes(row.answer), row.kilobytes) << row.answer;
}

}  // namespace
}  // namespace vexa
