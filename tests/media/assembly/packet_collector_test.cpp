#include "media/assembly/packet_collector.h"

#include <gtest/gtest.h>

#include <map>
#include <optional>

#include "media/assembly/rtp_pictures.h"
#include "stream_model.h"

namespace vexa::test {
namespace {

using std::chrono::milliseconds;
using Instant = PacketCollector::Instant;

/// A collector on a clock of its own, and what it handed out.
class Collection {
 public:
  explicit Collection(const PictureRules& rules = kH264Rules, int clock_rate = ModelStream::kClockRate)
      : collector_(packets_, rules), clock_rate_(clock_rate) {}

  void arrive(const SPacketInfo& packet) {
    collector_.add(packet, clock_rate_, now_);
    ++given_;
    expect_counted();
    drain();
    expect_counted();
  }
  void arrive(const ModelPicture& picture) {
    for (const SPacketInfo& packet : picture.packets) arrive(packet);
  }
  void arrive_without(const ModelPicture& picture, std::size_t lost) {
    for (std::size_t i = 0; i < picture.packets.size(); ++i) {
      if (i != lost) arrive(picture.packets[i]);
    }
  }

  /// Lets time pass, looking again whenever the collector asked for it.
  void pass(milliseconds time) {
    const Instant end = now_ + time;
    while (collector_.deadline() && *collector_.deadline() <= end) {
      now_ = std::max(now_, *collector_.deadline());
      const auto before = shown_.size();
      drain();
      if (shown_.size() == before) break;
    }
    now_ = end;
    expect_counted();
  }

  /// Each packet given stands in one of the packets' numbers, each picture begun in one of the pictures'.
  void expect_counted() {
    const CollectionCounts& c = collector_.counts();
    const bool packets = given_ == c.used + c.duplicated + c.late + c.given_up + c.overwritten + c.stopped + c.held;
    const bool held = collector_.is_empty() ? c.held == 0 : c.held >= packets_.size() && c.held <= packets_.size() + 2;
    const bool pictures = c.pictures_begun == c.pictures_assembled + c.pictures_incomplete + c.pictures_damaged +
                                                  c.pictures_without_key + c.pictures_too_large + c.pictures_stopped +
                                                  c.pictures_held;
    std::uint64_t listed = packets_.empty() ? 0 : 1;
    for (std::size_t i = 1; i < packets_.size(); ++i) listed += packets_[i].timestamp != packets_[i - 1].timestamp;
    if (packets && held && pictures && c.pictures_held == listed && c.pictures_assembled == shown_.size()) return;
    ADD_FAILURE() << "after " << given_ << " packets: packets " << packets << ", held " << held << " (" << c.held << "/"
                  << packets_.size() << "), pictures " << pictures << " (" << c.pictures_held << "/" << listed << ")";
  }

  const std::vector<std::uint32_t>& shown() const { return shown_; }
  std::size_t listed() const { return packets_.size(); }
  PacketCollector& collector() { return collector_; }
  std::optional<PacketCollector::Run> next() { return collector_.next_picture(now_); }

 private:
  void drain() {
    while (const auto run = collector_.next_picture(now_)) {
      shown_.push_back(collector_.packets(*run).front().timestamp);
      collector_.use(*run);
    }
  }

  std::vector<SPacketInfo> packets_;
  PacketCollector collector_;
  const int clock_rate_;
  Instant now_{};
  std::uint64_t given_ = 0;
  std::vector<std::uint32_t> shown_;
};

std::uint32_t timestamp_of(const ModelPicture& picture) { return picture.packets.front().timestamp; }

std::vector<std::uint32_t> timestamps_of(std::initializer_list<ModelPicture> pictures) {
  std::vector<std::uint32_t> all;
  for (const ModelPicture& picture : pictures) all.push_back(timestamp_of(picture));
  return all;
}

TEST(PacketCollector, PicturesInOrderAreHandedOutWhenTheirMarkerArrives) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(3);
  const ModelPicture delta = stream.delta_picture(2);
  Collection collection;
  collection.arrive_without(key, key.packets.size() - 1);
  EXPECT_TRUE(collection.shown().empty());
  collection.arrive(key.packets.back());
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
  collection.arrive(delta);
  EXPECT_EQ(collection.shown(), timestamps_of({key, delta}));
  EXPECT_EQ(collection.listed(), 0u);
}

TEST(PacketCollector, PicturesBeforeTheFirstKeyPictureAreDropped) {
  ModelStream stream;
  const ModelPicture early = stream.delta_picture(2);
  const ModelPicture key = stream.key_picture(2);
  Collection collection;
  collection.arrive(early);
  EXPECT_TRUE(collection.shown().empty());
  EXPECT_EQ(collection.listed(), 0u);
  collection.arrive(key);
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
}

TEST(PacketCollector, ALostPacketCostsItsPictureAndThoseUpToTheNextKeyPicture) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture broken = stream.delta_picture(4);
  const ModelPicture follower = stream.delta_picture(2);
  const ModelPicture next_key = stream.key_picture(2);
  const ModelPicture after = stream.delta_picture(2);
  Collection collection;
  collection.arrive(key);
  collection.arrive_without(broken, 1);
  collection.arrive(follower);
  collection.arrive(next_key);
  collection.arrive(after);
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
  collection.pass(milliseconds(200));
  EXPECT_EQ(collection.shown(), timestamps_of({key, next_key, after}));
}

TEST(PacketCollector, AKeyPictureBehindAGapIsHeldBackFor200MillisecondsAndNoLonger) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  stream.delta_picture(2);  // never arrives
  const ModelPicture next_key = stream.key_picture(2);
  Collection collection;
  collection.arrive(key);
  collection.arrive(next_key);
  collection.pass(milliseconds(199));
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
  collection.pass(milliseconds(1));
  EXPECT_EQ(collection.shown(), timestamps_of({key, next_key}));
}

TEST(PacketCollector, WhatArrivesLateWithinThe200MillisecondsCostsNothing) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture late = stream.delta_picture(3);
  const ModelPicture next_key = stream.key_picture(2);
  Collection collection;
  collection.arrive(key);
  collection.arrive_without(late, 0);
  collection.arrive(next_key);
  collection.pass(milliseconds(150));
  collection.arrive(late.packets[0]);
  EXPECT_EQ(collection.shown(), timestamps_of({key, late, next_key}));
}

TEST(PacketCollector, ACompletePictureBehindAGapWaitsForWhatIsMissing) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture late = stream.delta_picture(1);
  const ModelPicture delta = stream.delta_picture(2);
  Collection collection;
  collection.arrive(key);
  collection.arrive(delta);
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
  collection.arrive(late);
  EXPECT_EQ(collection.shown(), timestamps_of({key, late, delta}));
}

TEST(PacketCollector, ExactlyOnePointTwoSecondsOldIsRemovedAndOneTickLessIsNot) {
  for (const std::uint32_t age : {107999u, 108000u}) {
    ModelStream stream;
    const ModelPicture key = stream.key_picture(2);
    const ModelPicture broken = stream.delta_picture(2);
    Collection collection;
    collection.arrive(key);
    collection.arrive(broken.packets[1]);
    ASSERT_EQ(collection.listed(), 1u);
    SPacketInfo newest = broken.packets[1];
    newest.timestamp += age;
    newest.sequence = static_cast<std::uint16_t>(newest.sequence + 90);
    collection.arrive(newest);
    // The newest alone is left once the other is too old; as an unbroken picture of its own it is no key, and goes.
    EXPECT_EQ(collection.listed(), age == 108000u ? 0u : 2u);
  }
}

TEST(PacketCollector, TheAgeLimitEndsTheWaitAndTheNextKeyPictureStartsAfresh) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture broken = stream.delta_picture(3);
  Collection collection;
  collection.arrive(key);
  collection.arrive_without(broken, 0);
  for (int i = 0; i < 30; ++i) collection.arrive(stream.delta_picture(2));
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
  EXPECT_TRUE(collection.collector().waiting_for_key());
  EXPECT_EQ(collection.listed(), 0u);
  const ModelPicture next_key = stream.key_picture(2);
  collection.arrive(next_key);
  EXPECT_EQ(collection.shown(), timestamps_of({key, next_key}));
}

TEST(PacketCollector, AClockWithoutARateSetsNoAge) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  std::vector<SPacketInfo> list;
  for (const int rate : {0, -90000}) {
    PacketCollector collector(list, kH264Rules);
    for (const SPacketInfo& packet : key.packets) collector.add(packet, rate, Instant{});
    EXPECT_TRUE(collector.next_picture(Instant{}).has_value());
    list.clear();
  }
}

TEST(PacketCollector, DuplicatesOfListedAndOfUsedPacketsAreDiscarded) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(3);
  const ModelPicture delta = stream.delta_picture(3);
  Collection collection;
  for (const SPacketInfo& packet : key.packets) {
    collection.arrive(packet);
    collection.arrive(packet);
  }
  collection.arrive(key);  // once more, all of it
  collection.arrive(delta);
  EXPECT_EQ(collection.shown(), timestamps_of({key, delta}));
  EXPECT_EQ(collection.listed(), 0u);
}

TEST(PacketCollector, ALateDuplicateDoesNotBlockAStreamThatWaitsForAKeyPicture) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(3);
  const ModelPicture broken = stream.delta_picture(3);
  Collection collection;
  collection.arrive(key);
  collection.arrive_without(broken, 1);
  for (int i = 0; i < 31; ++i) collection.arrive(stream.delta_picture(2));
  collection.arrive(key.packets[1]);
  const ModelPicture next_key = stream.key_picture(2);
  collection.arrive(next_key);
  EXPECT_EQ(collection.shown(), timestamps_of({key, next_key}));
}

TEST(PacketCollector, AKeyPictureWhoseFirstPacketIsLostIsNeverHandedOut) {
  for (const std::size_t lost : {0u, 1u, 2u}) {
    ModelStream stream;
    const ModelPicture key = stream.key_picture(4);
    const ModelPicture delta = stream.delta_picture(2);
    const ModelPicture damaged = stream.key_picture(4);
    Collection collection;
    collection.arrive(key);
    collection.arrive_without(delta, 1);  // the end of the picture before is lost as well
    collection.arrive_without(damaged, lost);
    collection.pass(milliseconds(500));
    EXPECT_EQ(collection.shown(), timestamps_of({key})) << "without packet " << lost;
  }
}

TEST(PacketCollector, AtTheStartAKeyPictureWithoutItsFirstPacketIsNotTaken) {
  ModelStream stream;
  const ModelPicture damaged = stream.key_picture(4);
  Collection collection;
  collection.arrive_without(damaged, 0);
  collection.pass(milliseconds(500));
  EXPECT_TRUE(collection.shown().empty());
}

/// A stream whose key pictures are known to open with parameter sets, then lost pictures, then a bare key picture,
/// which nothing proves to be whole but the packet before it.
struct BareKeyBehindAGap {
  ModelStream source;
  ModelPicture key = source.key_picture(2);
  ModelPicture lost = source.delta_picture(2);
  ModelPicture late = source.delta_picture(2);
  ModelPicture bare = source.bare_key_picture();
};

TEST(PacketCollector, ALatePacketProvesTheFrontOfAKeyPictureThatStandsBehindIt) {
  BareKeyBehindAGap stream;
  Collection collection;
  collection.arrive(stream.key);
  collection.arrive(stream.bare);
  collection.pass(milliseconds(500));
  EXPECT_EQ(collection.shown(), timestamps_of({stream.key})) << "nothing proves it yet";
  collection.arrive(stream.late.packets[1]);
  collection.pass(milliseconds(199));
  EXPECT_EQ(collection.shown(), timestamps_of({stream.key}));
  collection.pass(milliseconds(1));
  EXPECT_EQ(collection.shown(), timestamps_of({stream.key, stream.bare}));
}

TEST(PacketCollector, AFrontOnceProvenStaysProvenWhenItsProofIsOverwritten) {
  BareKeyBehindAGap stream;
  Collection collection;
  collection.arrive(stream.key);
  collection.arrive(stream.late.packets[1]);
  collection.arrive(stream.bare);
  collection.collector().drop_overwritten({{0, timestamp_of(stream.late), stream.late.packets[1].sequence}});
  collection.pass(milliseconds(200));
  EXPECT_EQ(collection.shown(), timestamps_of({stream.key, stream.bare}));
}

TEST(PacketCollector, AProvenFrontDoesNotSpeakForAPictureWhoseFirstPacketIsOverwritten) {
  BareKeyBehindAGap stream;
  Collection collection;
  collection.arrive(stream.key);
  collection.arrive(stream.late.packets[1]);
  collection.arrive(stream.bare);
  collection.collector().drop_overwritten({{0, timestamp_of(stream.late), stream.late.packets[1].sequence},
                                           {0, timestamp_of(stream.bare), stream.bare.packets[0].sequence}});
  collection.pass(milliseconds(500));
  EXPECT_EQ(collection.shown(), timestamps_of({stream.key}));
}

TEST(PacketCollector, AnAbandonedPictureIsUsedUpAndAKeyPictureMustCome) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  std::vector<SPacketInfo> list;
  PacketCollector collector(list, kH264Rules);
  for (const SPacketInfo& packet : key.packets) collector.add(packet, ModelStream::kClockRate, Instant{});
  collector.abandon(*collector.next_picture(Instant{}));
  EXPECT_TRUE(list.empty());
  EXPECT_TRUE(collector.waiting_for_key());
  for (const SPacketInfo& packet : stream.delta_picture(2).packets) {
    collector.add(packet, ModelStream::kClockRate, Instant{});
  }
  EXPECT_FALSE(collector.next_picture(Instant{}).has_value());
  EXPECT_TRUE(list.empty());
  for (const SPacketInfo& packet : stream.key_picture(2).packets) {
    collector.add(packet, ModelStream::kClockRate, Instant{});
  }
  EXPECT_TRUE(collector.next_picture(Instant{}).has_value());
}

TEST(PacketCollector, OverwrittenPacketsLeaveTheListAndTheSequenceIsForgotten) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture broken = stream.delta_picture(3);
  Collection collection;
  collection.arrive(key);
  collection.arrive_without(broken, 1);
  ASSERT_EQ(collection.listed(), 2u);
  collection.collector().drop_overwritten({{0, timestamp_of(broken), broken.packets[0].sequence}});
  EXPECT_EQ(collection.listed(), 1u);
  EXPECT_TRUE(collection.collector().waiting_for_key());
  const ModelPicture next_key = stream.key_picture(2);
  collection.arrive(next_key);
  collection.pass(milliseconds(200));
  EXPECT_EQ(collection.shown(), timestamps_of({key, next_key}));
}

TEST(PacketCollector, AnOverwrittenKeyPictureIsNotHandedOutWhenItsWaitEnds) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  stream.delta_picture(1);  // never arrives
  const ModelPicture next_key = stream.key_picture(3);
  Collection collection;
  collection.arrive(key);
  collection.arrive(next_key);
  collection.collector().drop_overwritten({{0, timestamp_of(next_key), next_key.packets[0].sequence}});
  collection.pass(milliseconds(300));
  EXPECT_EQ(collection.shown(), timestamps_of({key}));
}

TEST(PacketCollector, OverwrittenSlotsOfUsedPacketsChangeNothing) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  Collection collection;
  collection.arrive(key);
  collection.collector().drop_overwritten({{0, timestamp_of(key), key.packets[0].sequence}});
  EXPECT_FALSE(collection.collector().waiting_for_key());
}

struct Restart {
  const char* what;
  std::uint16_t sequence_step;
  std::uint32_t timestamp_step;
};

class PacketCollectorRestart : public testing::TestWithParam<Restart> {};

TEST_P(PacketCollectorRestart, IsFollowedFromItsNextKeyPictureWithinASecond) {
  ModelStream before({.sequence = 30000, .timestamp = 1'000'000'000});
  Collection collection;
  const ModelPicture key = before.key_picture(3);
  const ModelPicture delta = before.delta_picture(2);
  collection.arrive(key);
  collection.arrive(delta);
  const Restart& restart = GetParam();
  ModelStream after({.sequence = static_cast<std::uint16_t>(delta.packets.back().sequence + restart.sequence_step),
                     .timestamp = timestamp_of(delta) + restart.timestamp_step});
  for (int i = 0; i < 10; ++i) {
    collection.arrive(after.delta_picture(2));
    collection.pass(milliseconds(40));
  }
  const ModelPicture new_key = after.key_picture(3);
  const ModelPicture new_delta = after.delta_picture(2);
  collection.arrive(new_key);
  collection.arrive(new_delta);
  collection.pass(milliseconds(1000));
  ASSERT_GE(collection.shown().size(), 4u);
  EXPECT_EQ(collection.shown()[collection.shown().size() - 2], timestamp_of(new_key));
  EXPECT_EQ(collection.shown().back(), timestamp_of(new_delta));
}

INSTANTIATE_TEST_SUITE_P(
    All, PacketCollectorRestart,
    testing::Values(Restart{"sequence ahead", 1000, 3600}, Restart{"sequence far ahead", 32000, 3600},
                    Restart{"sequence behind", 40000, 3600}, Restart{"sequence just behind", 65530, 3600},
                    Restart{"timestamp ahead", 1, 500'000'000}, Restart{"timestamp behind", 1, 4'000'000'000},
                    Restart{"both ahead", 5000, 700'000'000}, Restart{"both behind", 50000, 3'900'000'000},
                    Restart{"sequence behind, timestamp ahead", 50000, 900'000'000},
                    Restart{"sequence ahead, timestamp behind", 5000, 3'900'000'000}),
    [](const auto& tested) {
      std::string name = tested.param.what;
      std::erase_if(name, [](char c) { return c == ' ' || c == ','; });
      return name;
    });

TEST(PacketCollector, ARestartIsFollowedWhateverClockRateTheCameraNames) {
  for (const int rate : {-2147483647 - 1, 0, 1, 90000, 1'000'000, 100'000'000, 2147483647}) {
    ModelStream before({.sequence = 30000, .timestamp = 2'000'000'000});
    Collection collection(kH264Rules, rate);
    const ModelPicture key = before.key_picture(3);
    collection.arrive(key);
    ModelStream after({.sequence = static_cast<std::uint16_t>(key.packets.back().sequence + 40000),
                       .timestamp = timestamp_of(key) - (1U << 30)});
    const ModelPicture new_key = after.key_picture(3);
    collection.arrive(new_key);
    EXPECT_EQ(collection.shown().back(), timestamp_of(new_key)) << rate;
  }
}

TEST(PacketCollector, ARestartThatBeginsWithAKeyPictureLosesNoPictureOfIt) {
  ModelStream before({.sequence = 30000, .timestamp = 1'000'000'000});
  Collection collection;
  collection.arrive(before.key_picture(3));
  ModelStream after({.sequence = 100, .timestamp = 50'000'000});
  const ModelPicture key = after.key_picture(3);
  collection.arrive(key);
  EXPECT_EQ(collection.shown().back(), timestamp_of(key));
}

TEST(PacketCollector, LatecomersOfAPictureThatWasGivenUpAreNoRestart) {
  ModelStream stream;
  Collection collection;
  collection.arrive(stream.key_picture(2));
  const ModelPicture given_up = stream.delta_picture(6);
  collection.arrive(given_up.packets[0]);
  const ModelPicture key = stream.key_picture(2);
  collection.arrive(key);
  collection.pass(milliseconds(200));
  for (std::size_t late = 1; late < 5; ++late) collection.arrive(given_up.packets[late]);
  const ModelPicture delta = stream.delta_picture(2);
  collection.arrive(delta);
  EXPECT_EQ(collection.shown().back(), timestamp_of(delta));
}

TEST(PacketCollector, CountsWhatBecameOfEachPacketAndPicture) {
  ModelStream stream;
  const ModelPicture early = stream.delta_picture(2);
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture broken = stream.delta_picture(3);
  const ModelPicture next_key = stream.key_picture(2);
  Collection collection;
  collection.arrive(early);
  collection.arrive(key);
  collection.arrive(key.packets[0]);
  collection.arrive_without(broken, 1);
  collection.arrive(next_key);
  const CollectionCounts& counts = collection.collector().counts();
  EXPECT_EQ(counts.pictures_without_key, 1u);
  EXPECT_EQ(counts.duplicated, 1u);
  EXPECT_EQ(counts.pictures_held, 2u);
  EXPECT_EQ(counts.held, 2u + 4u);
  collection.pass(milliseconds(200));
  EXPECT_EQ(counts.pictures_incomplete, 1u);
  EXPECT_EQ(counts.given_up, 2u);
  EXPECT_EQ(counts.pictures_assembled, 2u);
  EXPECT_EQ(counts.used, 2u + 4u + 4u);
  collection.arrive(broken.packets[1]);
  EXPECT_EQ(counts.late, 1u);
}

TEST(PacketCollector, WhatIsHeldWhenTheStreamEndsIsCountedSo) {
  ModelStream stream;
  const ModelPicture key = stream.key_picture(2);
  const ModelPicture delta = stream.delta_picture(3);
  Collection collection;
  collection.arrive(key);
  collection.arrive_without(delta, 0);
  collection.collector().discard_all();
  collection.expect_counted();
  EXPECT_EQ(collection.collector().counts().stopped, 2u);
  EXPECT_EQ(collection.collector().counts().pictures_stopped, 1u);
  EXPECT_TRUE(collection.collector().is_empty());
}

TEST(PacketCollector, APacketThatPartsARunOfEqualPlacesCountsAsTwoPicturesMore) {
  ModelStream stream({1, 10'000'005});
  const ModelPicture picture = stream.delta_picture(3);
  SPacketInfo between = picture.packets[1];
  between.timestamp = 5;  // of the same place in the order as 10000005
  Collection collection;
  collection.arrive(picture.packets[0]);
  collection.arrive(picture.packets[2]);
  EXPECT_EQ(collection.collector().counts().pictures_held, 1u);
  collection.arrive(between);
  EXPECT_EQ(collection.collector().counts().pictures_held, 3u);
}

// The channel between camera and driver, and what it must let through.

struct Channel {
  const char* name;
  double loss = 0;
  double reorder = 0;  // held back behind up to 20 packets
  double duplicate = 0;
};

struct ChannelCase {
  Channel channel;
  StreamStart start;
};

class PacketCollectorModel : public testing::TestWithParam<ChannelCase> {
 protected:
  struct Sent {
    SPacketInfo packet;
    std::size_t picture;
    double place;
  };

  /// The packets as they arrive; `whole[i]` tells whether all of picture i do.
  std::vector<Sent> through(const std::vector<ModelPicture>& pictures, std::vector<bool>& whole) {
    const Channel& channel = GetParam().channel;
    std::uniform_real_distribution<double> chance(0, 1);
    std::vector<Sent> sent;
    double place = 0;
    for (std::size_t i = 0; i < pictures.size(); ++i) {
      for (const SPacketInfo& packet : pictures[i].packets) {
        place += 1;
        if (chance(random_) < channel.loss) {
          whole[i] = false;
          continue;
        }
        const double delay = chance(random_) < channel.reorder ? 1 + 19 * chance(random_) : 0;
        sent.push_back({packet, i, place + delay});
        if (chance(random_) < channel.duplicate) sent.push_back({packet, i, place + 20 * chance(random_)});
      }
    }
    std::stable_sort(sent.begin(), sent.end(), [](const Sent& a, const Sent& b) { return a.place < b.place; });
    return sent;
  }

  static std::vector<std::uint32_t> expected(const std::vector<ModelPicture>& pictures,
                                             const std::vector<bool>& whole) {
    std::vector<std::uint32_t> shown;
    bool chain = false;
    for (std::size_t i = 0; i < pictures.size(); ++i) {
      chain = whole[i] && (chain || pictures[i].key);
      if (chain) shown.push_back(timestamp_of(pictures[i]));
    }
    return shown;
  }

  std::mt19937 random_{20260101};
};

TEST_P(PacketCollectorModel, EveryWholePictureBehindAKeyPictureIsHandedOutOnceAndInOrder) {
  ModelStream stream(GetParam().start);
  const std::vector<ModelPicture> pictures = stream.pictures(5000, 25, random_);
  std::vector<bool> whole(pictures.size(), true);
  const std::vector<Sent> arrivals = through(pictures, whole);
  Collection collection;
  std::size_t picture = 0;
  for (const Sent& arrival : arrivals) {
    if (arrival.picture > picture) {
      collection.pass(milliseconds(40 * (arrival.picture - picture)));
      picture = arrival.picture;
    }
    collection.arrive(arrival.packet);
  }
  collection.pass(milliseconds(1000));
  const std::vector<std::uint32_t> wanted = expected(pictures, whole);
  const auto [got, want] =
      std::mismatch(collection.shown().begin(), collection.shown().end(), wanted.begin(), wanted.end());
  EXPECT_TRUE(got == collection.shown().end() && want == wanted.end())
      << "differs at picture " << want - wanted.begin() << " of " << wanted.size() << ": timestamp "
      << (got == collection.shown().end() ? 0 : *got) << ", expected " << (want == wanted.end() ? 0 : *want);
}

std::vector<ChannelCase> channel_cases() {
  const Channel channels[] = {{.name = "Clean"},
                              {.name = "LossPermille1", .loss = 0.001},
                              {.name = "Loss1", .loss = 0.01},
                              {.name = "Loss5", .loss = 0.05},
                              {.name = "Loss10", .loss = 0.1},
                              {.name = "Reorder5", .reorder = 0.05},
                              {.name = "Duplicate1", .duplicate = 0.01},
                              {.name = "All", .loss = 0.01, .reorder = 0.05, .duplicate = 0.01}};
  // The timestamps of each stream pass 2^32 or 10000000 on their way; the sequence wraps several times.
  const StreamStart starts[] = {{65000, 20'000'000}, {65530, 4'294'000'000}, {1, 9'000'000}};
  std::vector<ChannelCase> cases;
  for (const Channel& channel : channels) {
    for (const StreamStart& start : starts) cases.push_back({channel, start});
  }
  return cases;
}

INSTANTIATE_TEST_SUITE_P(Channels, PacketCollectorModel, testing::ValuesIn(channel_cases()), [](const auto& tested) {
  return tested.param.channel.name + std::string("From") + std::to_string(tested.param.start.timestamp);
});

}  // namespace
}  // namespace vexa::test
