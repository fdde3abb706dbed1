// SPDX-License-Identifier: Apache-2.0
// What a virtual camera's card has recorded during outages, fetched.
#include "vexa/backfill.h"

#include <atomic>
#include <optional>

#include "session/core/gap_journal.h"
#include "session/gap_file.h"
#include "tests/session/session_camera.h"
#include "tests/support/process_state.h"
#include "tests/support/recording_camera.h"
#include "tests/support/temporary_folder.h"
#include "virtual_camera/codec/rtp_packetiser.h"

namespace vexa {
namespace {

using camera::RequestFault;
using std::chrono::microseconds;

constexpr std::int64_t kSecond = 1000000;

struct Delivered {
  std::uint64_t gap;
  std::int64_t time;
  std::int64_t camera_time;
  bool leads_in;
  bool is_first;
  bool is_key;
  std::chrono::steady_clock::time_point at;
};

/// What a Backfill has called its host with. Any thread.
class BackfillHost {
 public:
  BackfillCallbacks callbacks() {
    BackfillCallbacks host;
    host.frame = [this](const BackfillFrame& frame) {
      keep([&] {
        frames_.push_back({frame.gap, frame.time, frame.cameraTime, frame.leadsIn, frame.isFirst, frame.isKey,
                           std::chrono::steady_clock::now()});
      });
      if (on_frame) on_frame(frame);
    };
    host.gap = [this](const Gap& gap) { keep([&] { gaps_.push_back(gap); }); };
    return host;
  }

  std::optional<Gap> wait_for(std::uint64_t number, const std::function<bool(const Gap&)>& condition) {
    std::optional<Gap> found;
    std::unique_lock<std::mutex> lock(mutex_);
    news_.wait_for(lock, SessionHost::kLongest, [&] {
      for (const Gap& gap : gaps_) {
        if (gap.number == number && condition(gap)) found = gap;
      }
      return found.has_value();
    });
    return found;
  }
  std::optional<Gap> wait_for_end(std::uint64_t number) {
    return wait_for(number, [](const Gap& gap) { return gap.state != GapState::kOpen && gap.state != GapState::kDue; });
  }
  bool wait_for_frames(std::size_t count) {
    std::unique_lock<std::mutex> lock(mutex_);
    return news_.wait_for(lock, SessionHost::kLongest, [&] { return frames_.size() >= count; });
  }

  std::vector<Delivered> frames() {
    const std::lock_guard<std::mutex> lock(mutex_);
    return frames_;
  }
  /// The camera's times of what was delivered of a gap, in the order of the callbacks.
  std::vector<std::int64_t> times_of(std::uint64_t gap) {
    std::vector<std::int64_t> times;
    for (const Delivered& frame : frames()) {
      if (frame.gap == gap && !frame.leads_in) times.push_back(frame.camera_time);
    }
    return times;
  }

  std::function<void(const BackfillFrame&)> on_frame;  // of the test, set before the session is opened

 private:
  template <typename Change>
  void keep(const Change& change) {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      change();
    }
    news_.notify_all();
  }

  std::mutex mutex_;
  std::condition_variable news_;
  std::vector<Delivered> frames_;
  std::vector<Gap> gaps_;
};

/// A camera with a card; what its session would have seen is made up, so that a test knows each gap to the picture.
class BackfillOfACamera : public SessionWithCamera {
 protected:
  void SetUp() override {
    camera::CameraOptions options = vexa_test::with_card();
    options.playback_scales = {1, 8};
    start_camera(options);
    idle_ = nobody_.Open(this->options(), {});
    begin(quick());
  }
  [[nodiscard]] BackfillOptions quick() const {
    BackfillOptions quick;
    quick.scale = 8;
    quick.journal = folder_ / "gaps";
    return quick;
  }
  void begin(const BackfillOptions& options) {
    backfill_.reset();
    backfill_ = std::make_unique<Backfill>(this->options(), options, fetched_.callbacks());
    seen_ = backfill_->Watch({});
  }

  void state(SessionState state) {
    SessionStatus status;
    status.state = state;
    seen_.state(*idle_, status);
  }
  /// A picture that comes live. Milliseconds after the beginning of all tests' time; 0: the camera's clock is not
  /// known.
  void picture(std::int64_t milliseconds, std::int64_t camera_time) {
    using std::chrono::duration_cast;
    const auto now = std::chrono::system_clock::now().time_since_epoch();
    const auto monotonic = std::chrono::steady_clock::now().time_since_epoch();
    SessionFrame frame;
    const auto bytes = std::to_string(milliseconds);
    frame.data = reinterpret_cast<const unsigned char*>(bytes.data());
    frame.length = bytes.size();
    const std::int64_t ago = duration_cast<std::chrono::milliseconds>(now).count() - (kStart / 1000 + milliseconds);
    frame.arrival = duration_cast<std::chrono::milliseconds>(monotonic).count() - ago;
    frame.cameraTime = camera_time;
    seen_.frame(*idle_, frame);
  }
  /// The session is live, and the card is known.
  void live(std::int64_t milliseconds, std::int64_t camera_time) {
    const std::size_t before = camera().journal().count("/command/search");
    state(SessionState::kLive);
    picture(milliseconds, camera_time);
    ASSERT_TRUE(camera().journal().wait_for_count("/command/search", before + 1, SessionHost::kLongest));
  }
  /// An outage from 0 to `milliseconds`, by a camera whose clock is right.
  void outage(std::int64_t milliseconds) {
    live(0, kStart);
    state(SessionState::kWaiting);
    back(milliseconds, kStart + milliseconds * 1000);
  }
  void back(std::int64_t milliseconds, std::int64_t camera_time) {
    state(SessionState::kLive);
    picture(milliseconds, camera_time);
  }

  /// An outage whose pictures the camera does not give, with a reason.
  void expect_refusal() {
    outage(2000);
    const auto gap = fetched_.wait_for_end(1);
    ASSERT_TRUE(gap);
    EXPECT_EQ(gap->state, GapState::kRefused);
    EXPECT_NE(gap->text, "");
  }

  /// A recording on the card: a picture every 100 ms from `first` on, a key picture each second. Microseconds by the
  /// camera's clock.
  std::string plant(std::int64_t first, std::size_t pictures, bool finished = true) {
    camera::RecordingHead head;
    head.frame_rate = 10;
    head.start = microseconds(first);
    const std::string name = camera().card().begin(head);
    for (std::size_t i = 0; i < pictures; ++i) {
      const bool key = i % 10 == 0;
      std::size_t place = 0;
      while (camera().clip()->is_key(place) != key) ++place;
      EXPECT_TRUE(camera().card().add(
          {std::make_shared<const std::string>(camera().clip()->picture(place)), key, microseconds(i * 100000)}));
    }
    if (finished) camera().card().finish();
    return name;
  }

  static constexpr std::int64_t kStart = 1706745600000000;  // microseconds
  vexa_test::TemporaryFolder folder_;
  BackfillHost fetched_;
  SessionGroup nobody_{without_threads()};
  std::shared_ptr<Session> idle_;
  std::unique_ptr<Backfill> backfill_;
  SessionCallbacks seen_;

 private:
  static SessionGroupOptions without_threads() {
    SessionGroupOptions options;
    options.threads = 0;
    return options;
  }
};

/// Every 100 ms; times on the wire are rounded to RTP's clock.
void expect_times(const std::vector<std::int64_t>& delivered, std::int64_t first, std::int64_t last) {
  std::vector<std::int64_t> rounded;
  for (const std::int64_t time : delivered) rounded.push_back((time + 500) / 1000 * 1000);
  std::vector<std::int64_t> expected;
  for (std::int64_t time = first; time <= last; time += 100000) expected.push_back(time);
  EXPECT_EQ(rounded, expected);
}

TEST_F(BackfillOfACamera, DeliversEachPictureOfAnOutageOnceCutAtBothEdges) {
  plant(kStart - 1500000, 600);
  outage(3000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kRecovered);
  EXPECT_TRUE(gap->missing.empty());
  EXPECT_EQ(gap->cameraBegin, kStart);
  EXPECT_EQ(gap->cameraEnd, kStart + 3000000);
  expect_times(fetched_.times_of(1), kStart + 100000, kStart + 2900000);
  EXPECT_EQ(gap->pictures, 29U);
}

TEST_F(BackfillOfACamera, TheFirstPictureIsLedInByItsKeyPicture) {
  plant(kStart - 1500000, 600);
  outage(1000);
  ASSERT_TRUE(fetched_.wait_for_end(1));
  const auto frames = fetched_.frames();
  ASSERT_GT(frames.size(), 6U);
  EXPECT_TRUE(frames[0].is_first && frames[0].is_key && frames[0].leads_in);
  for (std::size_t i = 0; i < frames.size(); ++i) {
    EXPECT_EQ(frames[i].leads_in, i < 6) << i;
    EXPECT_EQ(frames[i].is_first, i == 0) << i;
    EXPECT_NEAR(static_cast<double>(frames[i].time), static_cast<double>(frames[i].camera_time), 50000) << i;
  }
}

TEST_F(BackfillOfACamera, AClockThatAPowerFailureSetTo1970LosesNoPictureAndRepeatsNone) {
  // An earlier power failure left the same times.
  plant(30 * kSecond, 20);
  live(0, kStart);
  state(SessionState::kWaiting);
  plant(kStart - kSecond, 15);  // until the power failed, 0.4 s after the last live picture
  plant(30 * kSecond, 600);     // after it, 2 s later
  back(5000, 33 * kSecond);     // and after 3 s pictures come
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kPartial);
  const std::vector<std::int64_t> times = fetched_.times_of(1);
  ASSERT_EQ(times.size(), 4U + 30U);
  expect_times({times.begin(), times.begin() + 4}, kStart + 100000, kStart + 400000);
  expect_times({times.begin() + 4, times.end()}, 30 * kSecond, 33 * kSecond - 100000);
  std::int64_t last = gap->begin;
  for (const Delivered& frame : fetched_.frames()) {
    if (frame.leads_in) continue;
    EXPECT_GT(frame.time, last) << "in the host's time they are in order";
    last = frame.time;
  }
  EXPECT_LT(last, gap->end);
}

TEST_F(BackfillOfACamera, AClockSetRightAgainBeforePicturesComeLosesNoPicture) {
  live(0, kStart);
  state(SessionState::kWaiting);
  plant(30 * kSecond, 20);
  back(5000, kStart + 5000000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kPartial);
  expect_times(fetched_.times_of(1), 30 * kSecond, 32 * kSecond - 100000);
}

TEST_F(BackfillOfACamera, APlaybackThatLostPacketsIsMadeGood) {
  fetched_.on_frame = [this](const BackfillFrame&) { camera().set_packet_faults({}); };
  plant(kStart, 600);
  camera::PacketFaults faults;
  faults.loss = 1;
  faults.first_picture = faults.last_picture = 8;
  camera().set_packet_faults(faults);
  outage(2000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kRecovered);
  expect_times(fetched_.times_of(1), kStart + 100000, kStart + 1900000);
}

TEST_F(BackfillOfACamera, AnOutageDuringAPlaybackIsASecondGapAndTheFirstGoesOn) {
  std::atomic<bool> is_first{true};
  fetched_.on_frame = [&](const BackfillFrame&) {
    if (is_first.exchange(false)) state(SessionState::kWaiting);
  };
  plant(kStart, 600);
  outage(2000);
  ASSERT_TRUE(fetched_.wait_for_frames(1));
  ASSERT_TRUE(vexa_test::eventually([this] { return backfill_->Gaps().size() == 2; }));
  back(3000, kStart + 3000000);
  for (const std::uint64_t number : {1U, 2U}) {
    const auto gap = fetched_.wait_for_end(number);
    ASSERT_TRUE(gap);
    EXPECT_EQ(gap->state, GapState::kRecovered);
  }
  expect_times(fetched_.times_of(1), kStart + 100000, kStart + 1900000);
  expect_times(fetched_.times_of(2), kStart + 2100000, kStart + 2900000);
}

TEST_F(BackfillOfACamera, AHostStartedAgainGoesOnAfterTheLastPicture) {
  std::atomic<int> come{0};
  // The session ends within the fifth picture's callback, and the host with it.
  fetched_.on_frame = [&](const BackfillFrame& frame) {
    if (!frame.leadsIn && ++come == 5) state(SessionState::kStopped);
  };
  plant(kStart, 600);
  outage(2000);
  ASSERT_TRUE(vexa_test::eventually([&] { return come == 5; }));
  backfill_.reset();
  EXPECT_EQ(GapJournal::read(GapFile(quick().journal).read()).due(), 1U);
  begin(quick());
  back(4000, kStart + 4000000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kRecovered);
  expect_times(fetched_.times_of(1), kStart + 100000, kStart + 1900000);
  backfill_.reset();
  EXPECT_TRUE(GapJournal::read(GapFile(quick().journal).read()).gaps().empty());
}

TEST_F(BackfillOfACamera, AHostThatWasKilledFetchesFromItsLastPictureOn) {
  plant(kStart, 600);
  backfill_.reset();
  {
    GapFile file(quick().journal);
    ASSERT_NE(file.read(), "");
    file.begin(GapJournal::live_line(kStart, kStart), "");
  }
  begin(quick());
  back(1000, kStart + 1000000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kRecovered);
  expect_times(fetched_.times_of(1), kStart + 100000, kStart + 900000);
}

TEST_F(BackfillOfACamera, ACardWithoutAPictureOfTheGapIsAbsent) {
  plant(kStart - 60 * kSecond, 100);
  outage(2000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kAbsent);
  EXPECT_TRUE(fetched_.frames().empty());
}

TEST_F(BackfillOfACamera, StretchesThatTheCardLacksAreListed) {
  plant(kStart, 10);
  plant(kStart + 4 * kSecond, 600);
  outage(5000);
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kPartial);
  ASSERT_EQ(gap->missing.size(), 1U);
  EXPECT_NEAR(static_cast<double>(gap->missing[0].begin - gap->begin), 900000, 1000);
  EXPECT_NEAR(static_cast<double>(gap->missing[0].end - gap->begin), 4000000, 1000);
  EXPECT_EQ(gap->pictures, 9U + 10U);
}

TEST_F(BackfillOfACamera, ARecordingThatGoesOnIsWaitedForAndOneThatIsGoneIsOverwritten) {
  const std::string name = plant(kStart, 600, false);
  outage(2000);
  ASSERT_TRUE(camera().journal().wait_for_count("/command/search", 2, SessionHost::kLongest));
  EXPECT_TRUE(fetched_.frames().empty());
  ASSERT_TRUE(camera().card().erase(name));
  const auto gap = fetched_.wait_for_end(1);
  ASSERT_TRUE(gap);
  EXPECT_EQ(gap->state, GapState::kOverwritten);
}

TEST_F(BackfillOfACamera, ACameraThatListsNoRecordingsRefuses) {
  camera().add_request_fault(RequestFault::status("/command/search", "404 Not Found"));
  expect_refusal();
}

TEST_F(BackfillOfACamera, ACameraThatPlaysNoRecordingsRefuses) {
  plant(kStart, 60);
  camera().add_request_fault(RequestFault::status("DESCRIBE", "501 Not Implemented"));
  expect_refusal();
}

TEST_F(BackfillOfACamera, BytesASecondAreBounded) {
  BackfillOptions bounded = quick();
  bounded.bytesPerSecond = 100000;
  begin(bounded);
  const std::string first = plant(kStart, 5);
  plant(kStart + kSecond, 600);
  outage(2000);
  ASSERT_TRUE(fetched_.wait_for_end(1));
  const auto bytes = static_cast<double>(camera().card().find(first)->bytes);
  const auto frames = fetched_.frames();
  ASSERT_GT(frames.size(), 5U);
  const std::chrono::duration<double> apart = frames.back().at - frames.front().at;
  EXPECT_GE(apart.count(), bytes / 100000 * 0.5);
}

TEST_F(BackfillOfACamera, WithoutAJournalGapsAreFetchedAllTheSame) {
  BackfillOptions nowhere = quick();
  nowhere.journal = "/proc/no/such/file";
  begin(nowhere);
  EXPECT_FALSE(backfill_->JournalIsKept());
  plant(kStart, 600);
  outage(1000);
  ASSERT_TRUE(fetched_.wait_for_end(1));
  ASSERT_EQ(backfill_->Gaps().size(), 1U);
  EXPECT_EQ(backfill_->Gaps()[0].state, GapState::kRecovered);
}

/// With a session, and what the camera itself records while it is away.
TEST_F(SessionWithCamera, WhatItsCardRecordedDuringAnOutageIsFetched) {
  start_camera(vexa_test::with_card());
  vexa_test::record_while_away(camera().settings());
  BackfillHost fetched;
  Backfill backfill(options(), {}, fetched.callbacks());
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(options(), backfill.Watch(host.callbacks()));
  ASSERT_TRUE(host.wait_for_frames(5));
  camera().unplug();
  // A machine that is slow for a moment makes gaps of its own.
  std::uint64_t number = 0;
  ASSERT_TRUE(vexa_test::eventually([&] {
    const auto recordings = camera().card().recordings();
    for (const Gap& gap : backfill.Gaps()) number = gap.state == GapState::kOpen ? gap.number : number;
    return number != 0 && !recordings->empty() && recordings->front().pictures.size() > 10;
  }));
  camera().plug();
  session->Retry();
  const auto gap = fetched.wait_for_end(number);
  ASSERT_TRUE(gap);
  EXPECT_TRUE(gap->state == GapState::kRecovered || gap->state == GapState::kPartial);
  EXPECT_GT(fetched.times_of(number).size(), 1U);
  session->Stop();
  EXPECT_TRUE(session->WaitStopped(20000));
}

TEST(GapFile, KeepsAFirstLineInPlaceAndWhatIsAppended) {
  const vexa_test::TemporaryFolder folder;
  const std::string path = folder / "gaps";
  {
    GapFile file(path);
    EXPECT_EQ(file.read(), "");
    EXPECT_FALSE(file.is_kept());
    file.begin("first\n", "a\n");
    EXPECT_TRUE(file.is_kept());
    file.append("b\n");
    file.mark("later\n");
    file.append("c\n");
  }
  GapFile again(path);
  EXPECT_EQ(again.read(), "later\na\nb\nc\n");
  again.begin("first\n", "");
  again.append("d\n");
  EXPECT_EQ(GapFile(path).read(), "first\nd\n");
}

TEST(GapFile, WhatCannotBeReadIsNotReplaced) {
  const vexa_test::TemporaryFolder folder;
  GapFile file(folder.path());
  EXPECT_EQ(file.read(), "");
  file.begin("first\n", "");
  EXPECT_FALSE(file.is_kept());
  file.append("a\n");
  file.mark("later\n");
}

}  // namespace
}  // namespace vexa
