// The card, its recordings, and what hosts ask of it, without a camera around.
#include "virtual_camera/card/card.h"

#include <gtest/gtest.h>

#include <chrono>
#include <memory>
#include <string>
#include <vector>

#include "virtual_camera/card/card_source.h"
#include "virtual_camera/server/card_recorder.h"

namespace vexa::camera {
namespace {

using namespace std::chrono_literals;
using std::chrono::microseconds;

constexpr microseconds kStart = 1706745599s + 250ms;  // 2024-01-31 23:59:59.25

RecordingHead jpeg_head() {
  RecordingHead head;
  head.codec = Codec::kJpeg;
  head.size = "640,480";
  head.frame_rate = 5;
  head.quality = 7;
  head.start = kStart;
  return head;
}

StoredPicture stored(std::size_t bytes, microseconds at, bool key = true) {
  return {std::make_shared<const std::string>(bytes, 'p'), key, at};
}

// `count` pictures a second apart, every third one a key picture.
std::string record(Card& card, std::size_t count, const RecordingHead& head = jpeg_head()) {
  const std::string name = card.begin(head);
  for (std::size_t i = 0; i < count; ++i) {
    EXPECT_TRUE(card.add(stored(10, std::chrono::seconds(i), i % 3 == 0)));
  }
  card.finish();
  return name;
}

TEST(Card, ListsARecordingInOneLine) {
  Card card(1 << 20);
  const std::string name = card.begin(jpeg_head());
  EXPECT_EQ(name, "rec1_20240131T235959");
  ASSERT_TRUE(card.add(stored(1000, 0s)));
  ASSERT_TRUE(card.add(stored(25, 1750ms)));
  const std::string line =
      "StreamName=rec1_20240131T235959,Start=20240131T235959,End=20240201T000001,ImageCodec=jpeg,ImageSize=640,480,"
      "FrameRate=5,Quality=7,AudioCodec=none,Size=2,Status=";
  EXPECT_EQ(card.search(Card::Order::kOldest), line + "recording\r\n");
  card.finish();
  EXPECT_EQ(card.search(Card::Order::kOldest), line + "normal\r\n");
  EXPECT_EQ(clock_range(*card.find(name)), "20240131T235959.2500Z-20240201T000001.0000Z");
}

TEST(Card, ListsABitRateForCodecsWithoutAQuality) {
  RecordingHead head;
  head.bit_rate = 8000;
  Card card(100);
  for (const Codec codec : {Codec::kH264, Codec::kMpeg4}) {
    head.codec = codec;
    record(card, 0, head);
  }
  const std::string rest = ",ImageSize=640,480,FrameRate=25,BitRate=8000,AudioCodec=none,Size=0,Status=normal\r\n";
  const std::string times = ",Start=19700101T000000,End=19700101T000000,ImageCodec=";
  EXPECT_EQ(card.search(Card::Order::kNewest), "StreamName=rec2_19700101T000000" + times + "mpeg4" + rest +
                                                   "StreamName=rec1_19700101T000000" + times + "h264" + rest);
}

TEST(Card, TakesNothingThatDoesNotFit) {
  Card card(2048 + 100);
  ASSERT_FALSE(card.begin(jpeg_head()).empty());
  EXPECT_EQ(card.space_text(), "Free space : 2Kbyte");
  EXPECT_TRUE(card.add(stored(2048, 0s)));
  EXPECT_FALSE(card.add(stored(101, 1s)));
  EXPECT_TRUE(card.add(stored(100, 1s)));
  EXPECT_EQ(card.free_bytes(), 0U);
  EXPECT_EQ(card.space_text(), "Free space : 0Kbyte");
  EXPECT_EQ(card.begin(jpeg_head()), "");
  EXPECT_TRUE(card.erase_all());
  EXPECT_EQ(card.free_bytes(), 2148U);
  EXPECT_EQ(card.begin(jpeg_head()), "rec2_20240131T235959");
}

TEST(Card, EndsARecordingThatIsDeletedOrFollowedByAnother) {
  Card card(1000);
  const std::string first = card.begin(jpeg_head());
  EXPECT_TRUE(card.erase(first));
  EXPECT_FALSE(card.add(stored(1, 0s)));
  const std::string second = card.begin(jpeg_head());
  const std::string third = card.begin(jpeg_head());
  EXPECT_TRUE(card.find(second)->finished);
  EXPECT_TRUE(card.erase(third));
  EXPECT_FALSE(card.add(stored(1, 0s)));
  EXPECT_FALSE(card.erase(third));
  EXPECT_TRUE(card.holds(second));
}

TEST(Card, ThatIsMissingShowsAndTakesNothing) {
  Card card(0);
  EXPECT_EQ(card.health(), CardHealth::kMissing);
  EXPECT_EQ(card.begin(jpeg_head()), "");
  EXPECT_EQ(card.search(Card::Order::kOldest), std::nullopt);
  EXPECT_FALSE(card.recordings());
  EXPECT_FALSE(card.erase_all());
  EXPECT_EQ(card.space_text(), "none");
}

TEST(Card, ThatFailsShowsWhatItHoldsAndNeitherWritesNorDeletes) {
  Card card(1000);
  const std::string name = record(card, 2);
  card.set_health(CardHealth::kFailing);
  EXPECT_EQ(card.begin(jpeg_head()), "");
  EXPECT_EQ(card.recordings()->size(), 1U);
  EXPECT_FALSE(card.erase(name));
  EXPECT_FALSE(card.erase_all());
  EXPECT_EQ(card.free_bytes(), 0U);
  EXPECT_EQ(card.space_text(), "error");
  card.set_health(CardHealth::kGood);
  EXPECT_EQ(card.free_bytes(), 980U);
}

TEST(Card, MomentsAreWholeTenthsOfAMillisecond) {
  EXPECT_EQ(in_tenths_of_milliseconds(49999ns), 0us);
  EXPECT_EQ(in_tenths_of_milliseconds(50000ns), 100us);
  EXPECT_EQ(in_tenths_of_milliseconds(33333333ns), 33300us);
}

Answer ask(Card& card, const std::string& path, const std::string& query) {
  RequestHead head;
  head.method = "GET";
  head.path = path;
  head.query = query;
  return answer_card(head, card).value_or(Answer{0, ""});
}

TEST(CardCommands, AreAnsweredByWhatTheCardHolds) {
  Card card(1000);
  record(card, 1);
  record(card, 1);
  const std::string storage = "/command/edgestorage.cgi";
  const struct {
    std::string path;
    std::string query;
    int status;  // 0: none of the card's commands
  } rows[] = {{"/command/search", "Order=oldest", 200},
              {"/command/search", "Order=newest", 200},
              {"/command/search", "", 400},
              {"/command/search", "Order=largest", 400},
              {"/command/searching", "Order=oldest", 0},
              {storage, "DeletebyName=rec9", 400},
              {storage, "DeletebyName=", 400},
              {storage, "DeletebyName=rec1_20240131T235959", 204},
              {storage, "DeletebyName=rec1_20240131T235959", 400},
              {storage, "DeletebyName=rec2_2024%301%331T235959", 204},
              {storage, "delete=all", 204},
              {storage, "delete=some", 0},
              {storage, "Edgestorage=on", 0}};
  for (const auto& row : rows) EXPECT_EQ(ask(card, row.path, row.query).status, row.status) << row.path << row.query;
  EXPECT_TRUE(card.recordings()->empty());
  card.set_health(CardHealth::kMissing);
  EXPECT_EQ(ask(card, "/command/search", "Order=oldest").status, 503);
  EXPECT_EQ(ask(card, storage, "delete=all").status, 400);
}

TEST(CardCommands, ReadOnlyWholeEncodedBytes) {
  Card card(1000);
  record(card, 0);
  for (const char* name : {"rec1_20240131T23595%", "rec1_20240131T23595%3", "rec1_20240131T23595%3x", "%", "%%%"}) {
    EXPECT_EQ(ask(card, "/command/edgestorage.cgi", std::string("DeletebyName=") + name).status, 400) << name;
  }
}

struct Played {
  std::vector<int> places;      // of the stored pictures, which are a second apart
  std::vector<double> due;      // seconds
  std::vector<double> stamped;  // seconds
};

Played play(std::size_t pictures, int scale) {
  Card card(1000);
  const std::string name = card.begin(jpeg_head());
  for (std::size_t i = 0; i < pictures; ++i) {
    EXPECT_TRUE(card.add(stored(10 + i, std::chrono::seconds(i), i % 3 == 0)));
  }
  CardSource source(card, *card.find(name), scale);
  EXPECT_FALSE(source.format().takes_user_data);
  Played played;
  while (const auto picture = source.next()) {
    played.places.push_back(static_cast<int>(picture->bytes->size()) - 10);
    played.due.push_back(std::chrono::duration<double>(picture->due).count());
    played.stamped.push_back(std::chrono::duration<double>(picture->stamp).count());
  }
  EXPECT_TRUE(source.ended());
  return played;
}

TEST(CardSource, PlaysForwardWithTheStoredTimesAtThePaceOfTheScale) {
  for (const int scale : {1, 2, 4}) {
    const Played played = play(4, scale);
    EXPECT_EQ(played.places, (std::vector<int>{0, 1, 2, 3}));
    EXPECT_EQ(played.stamped, (std::vector<double>{0, 1, 2, 3}));
    EXPECT_EQ(played.due, (std::vector<double>{0, 1.0 / scale, 2.0 / scale, 3.0 / scale}));
  }
}

TEST(CardSource, PlaysKeyPicturesBackwardWithTimesThatGoForward) {
  const Played played = play(8, -2);
  EXPECT_EQ(played.places, (std::vector<int>{6, 3, 0}));
  EXPECT_EQ(played.stamped, (std::vector<double>{0, 3, 6}));
  EXPECT_EQ(played.due, (std::vector<double>{0, 1.5, 3}));
}

TEST(CardSource, EndsWhenItsRecordingIsDeletedOrTheCardPulled) {
  Card card(1000);
  const std::string names[] = {record(card, 3), record(card, 3)};
  CardSource first(card, *card.find(names[0]), 1);
  CardSource second(card, *card.find(names[1]), 1);
  EXPECT_TRUE(first.next());
  card.erase(names[0]);
  EXPECT_FALSE(first.next());
  EXPECT_TRUE(first.ended());
  EXPECT_TRUE(second.next());
  card.set_health(CardHealth::kMissing);
  EXPECT_FALSE(second.next());
}

TEST(CardSource, ScalesAreTakenToTheNearestOffered) {
  const struct {
    int asked;
    int offered;
  } rows[] = {{1, 1}, {2, 2}, {4, 4}, {-1, -1}, {-4, -1}, {5, 4}, {2147483647, 4}, {-2147483647 - 1, -1}};
  for (const auto& row : rows) EXPECT_EQ(offered_scale({1, 2, 4, -1}, row.asked), row.offered) << row.asked;
  EXPECT_EQ(offered_scale({1}, -1), 1);
  EXPECT_EQ(offered_scale({}, 4), 1);
}

TEST(RecorderSettings, NameAStreamWhenStorageIsOnAndWatchesAnAddress) {
  const struct {
    const char* query;
    int image;
    int after;
  } rows[] = {{"Edgestorage=on&EsRec1=image2,off&EsAlmRec1Time=5,7&EsAlmRec1WatchAddress=10.0.0.1", 2, 7},
              {"Edgestorage=on&EsRec1=image1,off&EsAlmRec1Time=5&EsAlmRec1WatchAddress=a", 1, 0},
              {"Edgestorage=on&EsRec1=image,off&EsAlmRec1Time=x,x&EsAlmRec1WatchAddress=a", 0, 0},
              {"Edgestorage=on&EsRec1=2&EsAlmRec1WatchAddress=a", 0, 0},
              {"Edgestorage=on&EsRec1=image1,off&EsAlmRec1WatchAddress=", 0, 0},
              {"Edgestorage=off&EsRec1=image1,off&EsAlmRec1WatchAddress=a", 0, 0}};
  for (const auto& row : rows) {
    SettingsStore settings;
    ASSERT_TRUE(settings.apply("edgestorage", row.query));
    EXPECT_EQ(recorder_settings(settings).image, row.image) << row.query;
    EXPECT_EQ(recorder_settings(settings).after, std::chrono::seconds(row.after)) << row.query;
  }
  EXPECT_EQ(recorder_settings(SettingsStore()).image, 0);
}

}  // namespace
}  // namespace vexa::camera
