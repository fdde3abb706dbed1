// SPDX-License-Identifier: Apache-2.0
// The states of a session.
#include "session/core/session_machine.h"

#include <gtest/gtest.h>

namespace vexa {
namespace {

using State = SessionState;
using Cause = SessionCause;

constexpr Patience kPatience;

class Machine : public testing::Test {
 protected:
  void connect(Moment now) {
    machine_.start(now);
    machine_.connecting(now);
    machine_.opened(now);
  }
  void go_live(Moment now) {
    connect(now);
    machine_.picture(now);
  }
  void expect(State state, Cause cause) const {
    EXPECT_EQ(machine_.status().state, state);
    EXPECT_EQ(machine_.status().cause, cause);
  }

  SessionMachine machine_{true, kPatience};
};

TEST_F(Machine, IsIdleUntilItIsStarted) {
  expect(State::kIdle, Cause::kNone);
  EXPECT_FALSE(machine_.is_due(Moment(1000)));
  EXPECT_EQ(machine_.deadline(), kNever);
  machine_.start(Moment(1000));
  EXPECT_TRUE(machine_.is_due(Moment(1000)));
}

TEST_F(Machine, AConnectionIsNotLiveBeforeItsFirstWholePicture) {
  connect(Moment(1000));
  expect(State::kConnecting, Cause::kAsked);
  machine_.picture(Moment(1200));
  expect(State::kLive, Cause::kAsked);
  EXPECT_EQ(machine_.status().since, 1200);
  EXPECT_EQ(machine_.status().event, 2U);
}

TEST_F(Machine, WithoutVideoTheConnectionIsEnough) {
  SessionMachine alarms(false, kPatience);
  alarms.start(Moment(0));
  alarms.connecting(Moment(0));
  alarms.opened(Moment(5));
  EXPECT_EQ(alarms.status().state, State::kLive);
  EXPECT_FALSE(alarms.is_hopeless(0, Moment(1000000)));
}

TEST_F(Machine, AFailedAttemptWaitsAndCounts) {
  machine_.start(Moment(0));
  Moment now(0);
  for (std::uint32_t attempt = 1; attempt <= 5; ++attempt) {
    ASSERT_TRUE(machine_.is_due(now));
    machine_.connecting(now);
    EXPECT_FALSE(machine_.is_due(now)) << "one is under way";
    machine_.failed(LIBD_FAILED, "Connection refused", 1.0, now);
    expect(State::kWaiting, Cause::kNoAnswer);
    EXPECT_EQ(machine_.status().attempt, attempt);
    EXPECT_EQ(machine_.status().code, LIBD_FAILED);
    EXPECT_EQ(machine_.status().nextAttempt, (now + Moment(1000 << (attempt - 1))).count());
    EXPECT_FALSE(machine_.is_due(machine_.deadline() - Moment(1)));
    now = machine_.deadline();
  }
}

TEST_F(Machine, EachKindOfSilenceHasItsCause) {
  const struct {
    MediaEvidence latest;
    Cause cause;
  } cases[] = {{{}, Cause::kNoBytes},
               {{Moment(100), Moment(1999), Moment(1999)}, Cause::kNoBytes},
               {{Moment(1999), Moment(1999), Moment(2000)}, Cause::kControlOnly},
               {{Moment(1999), Moment(2000), Moment(2000)}, Cause::kOneTrack},
               {{Moment(2000), Moment(3000), Moment(3000)}, Cause::kNoWholePicture}};
  for (const auto& c : cases) {
    SessionMachine machine(true, kPatience);
    machine.start(Moment(0));
    machine.connecting(Moment(0));
    machine.opened(Moment(0));
    machine.picture(Moment(0));
    machine.evidence(c.latest);
    EXPECT_FALSE(machine.is_hopeless(0, kPatience.stall - Moment(1)));
    EXPECT_EQ(machine.status().state, State::kLive);
    EXPECT_EQ(machine.deadline(), kPatience.stall);
    EXPECT_FALSE(machine.is_hopeless(0, kPatience.stall));
    EXPECT_EQ(machine.status().state, State::kStalled);
    EXPECT_EQ(machine.status().cause, c.cause);
    EXPECT_EQ(machine.deadline(), kPatience.give_up);
  }
}

TEST_F(Machine, AStallEndsWithAPictureOrIsGivenUp) {
  go_live(Moment(0));
  EXPECT_FALSE(machine_.is_hopeless(0, Moment(5000)));
  expect(State::kStalled, Cause::kNoBytes);
  machine_.picture(Moment(6000));
  expect(State::kLive, Cause::kAsked);
  EXPECT_FALSE(machine_.is_hopeless(0, Moment(17999)));
  EXPECT_TRUE(machine_.is_hopeless(0.5, Moment(18000)));
  expect(State::kWaiting, Cause::kNoBytes);
  machine_.closed(Moment(18010));
  EXPECT_TRUE(machine_.is_due(machine_.deadline()));
}

TEST_F(Machine, TheFirstPictureHasLonger) {
  connect(Moment(0));
  EXPECT_FALSE(machine_.is_hopeless(0, kPatience.first_picture - Moment(1)));
  expect(State::kStalled, Cause::kNoBytes);
  EXPECT_TRUE(machine_.is_hopeless(0, kPatience.first_picture));
}

// How long the machine waits after a failure at `now`, when the draw is the longest.
Moment wait_after_failure(SessionMachine& machine, Moment now) {
  machine.failed(LIBD_FAILED, "Connection reset by peer", 1.0, now);
  machine.closed(now);
  return machine.deadline() - now;
}

TEST_F(Machine, ACameraThatFlapsWaitsLongerEachTime) {
  machine_.start(Moment(0));
  Moment now(0);
  for (const int wait : {1000, 2000, 4000, 8000, 16000, 30000, 30000}) {
    machine_.connecting(now);
    machine_.opened(now);
    machine_.picture(now);
    machine_.picture(now + Moment(9999));
    now += Moment(9999);
    EXPECT_EQ(wait_after_failure(machine_, now), Moment(wait));
    now = machine_.deadline();
  }
  machine_.connecting(now);
  machine_.opened(now);
  machine_.picture(now);
  machine_.picture(now + Moment(10000));
  EXPECT_EQ(wait_after_failure(machine_, now + Moment(10000)), Moment(1000)) << "ten seconds of pictures prove it";
}

TEST_F(Machine, AnAttemptAfterAFailureIsMadeForItsCause) {
  go_live(Moment(0));
  EXPECT_EQ(machine_.status().attempt, 0U);
  machine_.failed(LIBD_FAILED, "Connection reset by peer", 0, Moment(100));
  EXPECT_FALSE(machine_.is_due(Moment(1000000))) << "what is open is closed first";
  machine_.closed(Moment(150));
  EXPECT_TRUE(machine_.is_due(Moment(200)));
  machine_.connecting(Moment(200));
  expect(State::kConnecting, Cause::kClosed);
  EXPECT_EQ(machine_.status().attempt, 1U);
  machine_.opened(Moment(250));
  machine_.picture(Moment(300));
  expect(State::kLive, Cause::kClosed);
}

TEST_F(Machine, RefusalsSayWhatIsRefused) {
  const struct {
    const char* text;
    Cause cause;
  } cases[] = {{"Not Enough Bandwidth", Cause::kBusy},
               {"Not Found", Cause::kNotFound},
               {"Unsupported Media Type", Cause::kUnsupported}};
  machine_.start(Moment(0));
  for (const auto& c : cases) {
    machine_.connecting(Moment(0));
    machine_.failed(LIBD_STREAM_OPEN_FAILED, c.text, 0, Moment(0));
    expect(State::kRefused, c.cause);
    EXPECT_NE(machine_.status().nextAttempt, 0);
  }
}

TEST_F(Machine, RefusedCredentialsWaitForTheirBreaker) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.refused_credentials(LIBD_UNAUTHORIZED, "Unauthorized", kNever, Moment(10));
  expect(State::kRefused, Cause::kCredentials);
  EXPECT_EQ(machine_.status().nextAttempt, 0);
  EXPECT_EQ(machine_.deadline(), kNever);
  machine_.retry(Moment(20));
  EXPECT_TRUE(machine_.is_due(Moment(20)));
}

TEST_F(Machine, WaitingForATurnIsOneEventHoweverOftenItIsAskedFor) {
  machine_.start(Moment(0));
  machine_.hold(Cause::kTurn, kNever, Moment(0));
  machine_.hold(Cause::kTurn, kNever, Moment(5));
  expect(State::kWaiting, Cause::kTurn);
  EXPECT_EQ(machine_.status().event, 1U);
  EXPECT_EQ(machine_.status().since, 0);
}

TEST_F(Machine, ALinkThatIsBackIsTriedAtOnce) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.failed(LIBD_FAILED, "No route to host", 1.0, Moment(0));
  EXPECT_FALSE(machine_.is_due(Moment(10)));
  EXPECT_FALSE(machine_.link_back(Moment(10)));
  EXPECT_TRUE(machine_.is_due(Moment(10)));
}

TEST_F(Machine, ALinkThatIsBackSoonAfterAnotherIsTriedASecondAfterThatOne) {
  SessionMachine machine(true, kPatience);
  machine.start(Moment(0));
  Moment now(0);
  for (int i = 0; i < 4; ++i) {  // so that the plan is long
    machine.connecting(now);
    machine.failed(LIBD_FAILED, "No route to host", 1.0, now);
    now = machine.deadline();
  }
  now -= Moment(7000);
  EXPECT_FALSE(machine.link_back(now));
  machine.connecting(now);
  machine.failed(LIBD_FAILED, "No route to host", 1.0, now);
  EXPECT_FALSE(machine.link_back(now + Moment(400)));
  EXPECT_EQ(machine.deadline(), now + Moment(1000));
}

TEST_F(Machine, ALinkThatIsBackDuringAnAttemptIsTriedRightAfterIt) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  EXPECT_FALSE(machine_.link_back(Moment(10)));
  machine_.failed(LIBD_TIMEOUT, "", 1.0, Moment(5000));
  EXPECT_EQ(machine_.deadline(), Moment(5100));
  machine_.connecting(Moment(5100));
  machine_.failed(LIBD_TIMEOUT, "", 1.0, Moment(5200));
  EXPECT_EQ(machine_.deadline(), Moment(5200 + 2000)) << "once";
}

TEST_F(Machine, ALinkThatIsBackWhileClosingIsTriedWhenClosed) {
  go_live(Moment(0));
  machine_.failed(LIBD_FAILED, "Connection reset by peer", 1.0, Moment(2000));
  EXPECT_FALSE(machine_.link_back(Moment(2010)));
  EXPECT_FALSE(machine_.is_due(Moment(2020)));
  machine_.closed(Moment(2030));
  EXPECT_TRUE(machine_.is_due(Moment(2030)));
}

TEST_F(Machine, ALinkThatIsBackEndsAStallAndLeavesALiveSessionAlone) {
  go_live(Moment(0));
  EXPECT_FALSE(machine_.link_back(Moment(100)));
  expect(State::kLive, Cause::kAsked);
  EXPECT_FALSE(machine_.is_hopeless(0, Moment(5000)));
  EXPECT_TRUE(machine_.link_back(Moment(5500)));
  expect(State::kWaiting, Cause::kNoBytes);
  EXPECT_FALSE(machine_.is_due(Moment(5500))) << "what is open is closed first";
  machine_.closed(Moment(5600));
  EXPECT_TRUE(machine_.is_due(Moment(5600)));
}

TEST_F(Machine, AStallIsReportedAsLongAsTheSilence) {
  go_live(Moment(1000));
  EXPECT_FALSE(machine_.is_hopeless(0, Moment(6000)));
  EXPECT_EQ(machine_.status().why, "The camera has stopped sending, for 5 s.");
  EXPECT_EQ(machine_.status().since, 6000);
}

TEST_F(Machine, WithoutVideoTenSecondsOfConnectionBeginTheWaitsAnew) {
  SessionMachine alarms(false, kPatience);
  alarms.start(Moment(0));
  Moment now(0);
  for (const int wait : {1000, 2000, 4000}) {
    alarms.connecting(now);
    alarms.opened(now);
    EXPECT_EQ(wait_after_failure(alarms, now + Moment(9999)), Moment(wait));
    now = alarms.deadline();
  }
  alarms.connecting(now);
  alarms.opened(now);
  EXPECT_EQ(wait_after_failure(alarms, now + Moment(10000)), Moment(1000));
}

TEST_F(Machine, AFloodOfLinksIsFollowedOnceASecond) {
  machine_.start(Moment(5000));
  int attempts = 0;
  for (Moment now(5000); now < Moment(8000); now += Moment(10)) {
    EXPECT_FALSE(machine_.link_back(now));
    if (!machine_.is_due(now)) continue;
    ++attempts;
    machine_.connecting(now);
    machine_.failed(LIBD_FAILED, "No route to host", 1.0, now);
  }
  EXPECT_GE(attempts, 3);
  EXPECT_LE(attempts, 1 + 3 + 2) << "the first, one for each second, and the plan's own";
}

TEST_F(Machine, ALinkThatIsBackDoesNotTryRefusedCredentials) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.refused_credentials(LIBD_UNAUTHORIZED, "", Moment(60000), Moment(0));
  EXPECT_FALSE(machine_.link_back(Moment(10)));
  EXPECT_FALSE(machine_.is_due(Moment(59999)));
}

TEST_F(Machine, AChangedStreamIsAnEventOfALiveSession) {
  go_live(Moment(0));
  machine_.stream_changed(Moment(50));
  expect(State::kLive, Cause::kStreamChanged);
}

TEST_F(Machine, StoppingWaitsUntilTheConnectionIsClosed) {
  go_live(Moment(0));
  machine_.stop(Moment(10));
  expect(State::kLive, Cause::kAsked);
  EXPECT_TRUE(machine_.is_stopping());
  EXPECT_EQ(machine_.deadline(), kNever);
  machine_.closed(Moment(20));
  expect(State::kStopped, Cause::kAsked);
  EXPECT_TRUE(machine_.is_over());
}

TEST_F(Machine, StoppingWhileWaitingIsOverAtOnce) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.failed(LIBD_TIMEOUT, "", 0.5, Moment(10));
  machine_.stop(Moment(20));
  EXPECT_TRUE(machine_.is_over());
  EXPECT_FALSE(machine_.is_due(Moment(1000000)));
}

TEST_F(Machine, StoppingAfterAFailureWaitsForTheClose) {
  go_live(Moment(0));
  machine_.failed(LIBD_FAILED, "", 0, Moment(5));
  machine_.stop(Moment(10));
  EXPECT_FALSE(machine_.is_over());
  machine_.closed(Moment(20));
  EXPECT_TRUE(machine_.is_over());
}

TEST_F(Machine, CredentialsThatChangeAreLookedAtAgain) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.refused_credentials(LIBD_UNAUTHORIZED, "", kNever, Moment(0));
  machine_.credentials_changed(Moment(10));
  EXPECT_TRUE(machine_.is_due(Moment(10)));
  machine_.hold(Cause::kCredentials, kNever, Moment(10));
  EXPECT_EQ(machine_.status().event, 2U) << "the same state is no event";
  EXPECT_FALSE(machine_.is_due(Moment(1000000)));
}

TEST_F(Machine, CredentialsThatChangeShortenNoOtherWait) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.failed(LIBD_FAILED, "Connection refused", 1.0, Moment(0));
  machine_.credentials_changed(Moment(10));
  EXPECT_FALSE(machine_.is_due(Moment(10)));
  EXPECT_TRUE(machine_.is_due(Moment(1000)));
}

TEST_F(Machine, ARetryDuringAnAttemptLeavesTheWaitsAsTheyWere) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.failed(LIBD_FAILED, "", 1.0, Moment(0));
  machine_.connecting(Moment(1000));
  machine_.retry(Moment(1100));
  machine_.failed(LIBD_FAILED, "", 1.0, Moment(1200));
  EXPECT_EQ(machine_.status().nextAttempt, 3200);
}

TEST_F(Machine, AStallIsOneEventHoweverOftenItIsLookedAt) {
  go_live(Moment(0));
  EXPECT_FALSE(machine_.is_hopeless(0, kPatience.stall));
  const std::uint64_t stalled = machine_.status().event;
  EXPECT_FALSE(machine_.is_hopeless(0, kPatience.stall + Moment(1)));
  EXPECT_EQ(machine_.status().event, stalled);
}

TEST_F(Machine, AFailureWhileStoppingWaitsForTheClose) {
  go_live(Moment(0));
  machine_.stop(Moment(5));
  machine_.failed(LIBD_FAILED, "", 0, Moment(10));
  EXPECT_FALSE(machine_.is_over());
  machine_.closed(Moment(20));
  EXPECT_TRUE(machine_.is_over());
}

TEST_F(Machine, AnAttemptThatFailsWhileStoppingStops) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.stop(Moment(10));
  EXPECT_FALSE(machine_.is_over());
  machine_.failed(LIBD_TIMEOUT, "", 0.5, Moment(20));
  EXPECT_TRUE(machine_.is_over());
  EXPECT_EQ(machine_.status().since, 20);
}

TEST_F(Machine, NothingComesAfterStopped) {
  machine_.stop(Moment(0));
  const std::uint64_t last = machine_.status().event;
  machine_.retry(Moment(1));
  EXPECT_FALSE(machine_.link_back(Moment(1)));
  machine_.picture(Moment(1));
  machine_.stream_changed(Moment(1));
  machine_.stop(Moment(1));
  EXPECT_FALSE(machine_.is_due(Moment(2)));
  EXPECT_FALSE(machine_.is_hopeless(0, Moment(1000000)));
  EXPECT_EQ(machine_.status().event, last);
}

TEST_F(Machine, IsStartedOnce) {
  machine_.start(Moment(1000));
  machine_.start(Moment(5000));
  EXPECT_TRUE(machine_.is_due(Moment(1000)));
}

TEST_F(Machine, ARetryAfterAStopChangesNothing) {
  go_live(Moment(0));
  machine_.failed(LIBD_TIMEOUT, "", 1, Moment(100));
  machine_.stop(Moment(200));
  machine_.retry(Moment(300));
  machine_.closed(Moment(400));
  EXPECT_FALSE(machine_.is_due(Moment(400)));
  EXPECT_EQ(machine_.deadline(), kNever);
}

TEST_F(Machine, AWaitThatIsPutOffIsAnEvent) {
  machine_.start(Moment(0));
  machine_.hold(Cause::kTurn, Moment(100), Moment(0));
  const std::uint64_t event = machine_.status().event;
  machine_.hold(Cause::kTurn, Moment(200), Moment(0));
  EXPECT_EQ(machine_.status().event, event + 1);
  EXPECT_EQ(machine_.status().nextAttempt, 200);
}

TEST_F(Machine, ALinkThatIsBackDuringAnAttemptDoesNotHurryARefusedOne) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  EXPECT_FALSE(machine_.link_back(Moment(10)));
  machine_.refused(Cause::kUnsupported, LIBD_NOT_SUPPORTED, "", 1, Moment(20));
  expect(State::kRefused, Cause::kUnsupported);
  EXPECT_EQ(machine_.deadline(), Moment(20) + BackOff().next(1));
}

TEST_F(Machine, CredentialsThatAreRefusedWhileStoppingStop) {
  machine_.start(Moment(0));
  machine_.connecting(Moment(0));
  machine_.stop(Moment(10));
  machine_.refused_credentials(LIBD_FAILED, "Unauthorized", kNever, Moment(20));
  expect(State::kStopped, Cause::kAsked);
}

TEST_F(Machine, ALinkThatIsBackGivesNoTurn) {
  machine_.start(Moment(0));
  for (const Cause cause : {Cause::kTurn, Cause::kOtherTrial}) {
    machine_.hold(cause, Moment(90000), Moment(0));
    EXPECT_FALSE(machine_.link_back(Moment(2000)));
    EXPECT_EQ(machine_.deadline(), Moment(90000));
  }
}

TEST_F(Machine, IsNotHopelessOnceItIsToStop) {
  go_live(Moment(0));
  machine_.stop(Moment(10));
  EXPECT_FALSE(machine_.is_hopeless(1, Moment(1000000)));
  EXPECT_EQ(machine_.deadline(), kNever);
}

TEST_F(Machine, WithoutVideoAnOpenConnectionHasNoDeadline) {
  SessionMachine alarms(false, kPatience);
  alarms.start(Moment(0));
  alarms.connecting(Moment(0));
  alarms.opened(Moment(5));
  EXPECT_EQ(alarms.deadline(), kNever);
}

}  // namespace
}  // namespace vexa
