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
  EXPECT_EQ(stream.latest(), BurstGather::kLongest);
  stream.run(20, {1, 1000}, {10, 6554});  // 65540 bytes
  EXPECT_EQ(stream.latest(), BurstGather::kShortest);
  stream.run(20, {1, 1000}, {10, 1638});  // 16380 bytes
  EXPECT_EQ(stream.latest(), BurstGather::kLongest);
}

TEST(BurstGather, KeepsItsNapForWhatIsNeitherMuchNorLittle) {
  for (const std::size_t bytes : {16384u, 65536u}) {
    Stream stream;
    stream.run(1, {1, 1000}, {2, 40000});
    stream.run(1, {1, 1000}, {4, bytes / 4});  // halved once
    EXPECT_EQ(stream.latest(), BurstGather::kLongest / 2);
    stream.run(10, {1, 1000}, {4, bytes / 4});
    EXPECT_EQ(stream.latest(), BurstGather::kLongest / 2) << bytes;
  }
}

}  // namespace
}  // namespace vexa
