#include "transport/burst_gather.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

using std::chrono::microseconds;

struct Burst {
  std::size_t datagrams;
  std::size_t bytes;  // of each
};

/// Wakes the reader for `wakes` bursts, which hold `after_nap` when it napped and `at_once` when not.
class Stream {
 public:
  void run(int wakes, Burst at_once, Burst after_nap) {
    naps_ = 0;
    for (int i = 0; i < wakes; ++i) {
      nap_ = gather_.woken();
      if (nap_.count() != 0) ++naps_;
      const Burst& burst = nap_.count() != 0 ? after_nap : at_once;
      for (std::size_t d = 0; d < burst.datagrams; ++d) gather_.received(burst.bytes);
    }
  }
  /// Of the run's wake-ups, those with a nap.
  int naps() const { return naps_; }
  microseconds latest() const { return nap_; }
  microseconds goes_on() { return gather_.goes_on(); }
  void limit(microseconds longest) { gather_.limit(longest); }

 private:
  BurstGather gather_;
  int naps_ = 0;
  microseconds nap_{0};
};

TEST(BurstGather, NapsOnAStreamThatTricklesButTriesWithoutNowAndThen) {
  Stream stream;
  stream.run(320, {1, 1400}, {4, 1400});
  EXPECT_EQ(stream.naps(), 310);
}

TEST(BurstGather, DoesNotNapOnAStreamOfBurstsButTriesNowAndThen) {
  Stream stream;
  stream.run(640, {10, 1400}, {10, 1400});
  stream.run(320, {10, 1400}, {10, 1400});
  EXPECT_EQ(stream.naps(), 10);
}

TEST(BurstGather, FollowsAStreamThatChangesItsWays) {
  Stream stream;
  stream.run(320, {10, 1400}, {10, 1400});
  stream.run(1000, {1, 1400}, {4, 1400});
  stream.run(320, {1, 1400}, {4, 1400});
  EXPECT_EQ(stream.naps(), 310);
}

TEST(BurstGather, NapsShorterTheMoreComesMeanwhileAndLongerAgainWhenLittleDoes) {
  Stream stream;
  stream.run(1, {1, 1000}, {1, 1000});
  EXPECT_EQ(stream.latest(), BurstGather::kFirst);
  stream.run(1, {1, 1000}, {10, 13108});  // 131080 bytes, twice what a burst may be
  stream.run(1, {1, 1000}, {10, 1638});
  EXPECT_EQ(stream.latest(), microseconds(280));  // half of what one small burst had made of the first nap
  stream.run(20, {1, 1000}, {100, 6554});
  EXPECT_EQ(stream.latest(), BurstGather::kShortest);
  stream.run(2, {1, 1000}, {10, 1638});  // 16380 bytes
  EXPECT_EQ(stream.latest(), BurstGather::kShortest * 9 / 8);
  stream.run(38, {1, 1000}, {10, 1638});
  EXPECT_EQ(stream.latest(), BurstGather::kLongest);
}

TEST(BurstGather, KeepsItsNapForWhatIsNeitherMuchNorLittle) {
  for (const std::size_t bytes : {16384u, 65536u}) {
    Stream stream;
    stream.run(1, {1, 1000}, {2, 40000});
    stream.run(1, {1, 1000}, {4, bytes / 4});
    EXPECT_EQ(stream.latest(), microseconds(409));
    stream.run(10, {1, 1000}, {4, bytes / 4});
    EXPECT_EQ(stream.latest(), microseconds(409)) << bytes;
  }
}

TEST(BurstGather, NapsAgainInTheMiddleOfAPictureWhileTheLastNapBroughtSomething) {
  BurstGather gather;
  ASSERT_EQ(gather.woken(), BurstGather::kFirst);
  EXPECT_EQ(gather.goes_on(), microseconds(0));
  gather.received(20000);
  EXPECT_EQ(gather.goes_on(), BurstGather::kFirst);
  gather.received(131072);
  EXPECT_EQ(gather.goes_on(), BurstGather::kFirst / 2);
  EXPECT_EQ(gather.goes_on(), microseconds(0));
}

TEST(BurstGather, DoesNotNapInTheMiddleOfAPictureWhereItDidNotAtItsBeginning) {
  Stream stream;
  stream.run(641, {10, 1400}, {10, 1400});
  ASSERT_EQ(stream.latest(), microseconds(0));
  EXPECT_EQ(stream.goes_on(), microseconds(0));
}

TEST(BurstGather, NapsNoLongerThanItsLimitFromTheNextBurstOn) {
  Stream stream;
  stream.run(319, {1, 1400}, {4, 1400});
  ASSERT_EQ(stream.latest(), BurstGather::kLongest);
  stream.limit(BurstGather::kPrompt);
  stream.run(320, {1, 1400}, {4, 1400});
  EXPECT_EQ(stream.latest(), BurstGather::kPrompt);
  stream.limit(BurstGather::kLongest);
  stream.run(320, {1, 1400}, {4, 1400});
  EXPECT_EQ(stream.latest(), BurstGather::kLongest);
}

}  // namespace
}  // namespace vexa
