// SPDX-License-Identifier: Apache-2.0
// Refused credentials, and a camera that locks an account.
#include "session/core/credential_breaker.h"

#include <gtest/gtest.h>

#include <chrono>
#include <vector>

namespace vexa {
namespace {

using std::chrono::minutes;
using Answer = CredentialBreaker::Answer;

TEST(CredentialBreaker, UnknownCredentialsAreTriedByOneHolderAtATime) {
  CredentialBreaker breaker;
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kWait);
  breaker.abandoned();
  EXPECT_EQ(breaker.ask(Moment(1)), Answer::kTry);
  breaker.accepted();
  EXPECT_EQ(breaker.ask(Moment(2)), Answer::kGo);
  EXPECT_EQ(breaker.ask(Moment(2)), Answer::kGo);
}

TEST(CredentialBreaker, CredentialsThatNeverWorkedStopAfterOneRefusal) {
  CredentialBreaker breaker;
  ASSERT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  breaker.refused(Moment(0));
  EXPECT_TRUE(breaker.is_refused());
  EXPECT_EQ(breaker.retry_at(), kNever);
  EXPECT_EQ(breaker.ask(std::chrono::hours(100)), Answer::kRefused);
}

TEST(CredentialBreaker, ANewPasswordIsUnknownAgainAndTheSameOneIsNot) {
  CredentialBreaker breaker;
  breaker.set_password("first");
  ASSERT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  breaker.refused(Moment(0));
  breaker.set_password("first");
  EXPECT_EQ(breaker.ask(Moment(1)), Answer::kRefused);
  breaker.set_password("second");
  EXPECT_EQ(breaker.ask(Moment(1)), Answer::kTry);
}

TEST(CredentialBreaker, TheHostCanAskForOneMoreTry) {
  CredentialBreaker breaker;
  ASSERT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  breaker.refused(Moment(0));
  breaker.retry();
  EXPECT_EQ(breaker.ask(Moment(1)), Answer::kTry);
  EXPECT_EQ(breaker.ask(Moment(1)), Answer::kWait);
}

TEST(CredentialBreaker, CredentialsThatWorkedAreTriedAgainAtGrowingDistances) {
  CredentialBreaker breaker;
  ASSERT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  breaker.accepted();
  Moment now(0);
  breaker.refused(now);
  for (const int wait : {1, 5, 15, 30, 60, 60, 60}) {
    EXPECT_EQ(breaker.retry_at(), now + minutes(wait));
    EXPECT_EQ(breaker.ask(breaker.retry_at() - Moment(1)), Answer::kWait);
    now = breaker.retry_at();
    EXPECT_EQ(breaker.ask(now), Answer::kTry);
    EXPECT_EQ(breaker.ask(now), Answer::kWait);
    breaker.refused(now);
  }
  now = breaker.retry_at();
  ASSERT_EQ(breaker.ask(now), Answer::kTry);
  breaker.accepted();
  breaker.refused(now);
  EXPECT_EQ(breaker.retry_at(), now + minutes(1)) << "from the beginning";
}

TEST(CredentialBreaker, RefusalsOfRequestsThatWereOnTheirWayCountOnce) {
  CredentialBreaker breaker;
  ASSERT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  breaker.accepted();
  for (int i = 0; i < 10; ++i) breaker.refused(Moment(i));
  EXPECT_EQ(breaker.retry_at(), Moment(0) + minutes(1));
}

TEST(CredentialBreaker, CredentialsOfAnEndedConnectionAreTriedByOneHolder) {
  CredentialBreaker breaker;
  breaker.set_password("right");
  breaker.accepted();
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kGo);
  breaker.doubt();
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kWait);
  breaker.refused(Moment(0));
  EXPECT_EQ(breaker.retry_at(), Moment(minutes(1)));
  breaker.retry();
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kTry);
  breaker.accepted();
  EXPECT_EQ(breaker.ask(Moment(0)), Answer::kGo);
}

// Locks the account for half an hour after five refusals within as long a time.
class LockingCamera {
 public:
  bool takes(bool right_password, Moment now) {
    if (now < locked_until_) return false;
    if (right_password) {
      failures_.clear();
      return true;
    }
    failures_.push_back(now);
    while (now - failures_.front() > minutes(30)) failures_.erase(failures_.begin());
    if (failures_.size() < 5) return false;
    locked_until_ = now + minutes(30);
    was_locked_ = true;
    return false;
  }
  [[nodiscard]] bool was_locked() const { return was_locked_; }

 private:
  std::vector<Moment> failures_;
  Moment locked_until_{-1};
  bool was_locked_ = false;
};

TEST(CredentialBreaker, TwentyHoldersNeverLockACameraThatLocksAfterFiveRefusals) {
  LockingCamera camera;
  CredentialBreaker breaker;
  Moment live_again = kNever;
  for (Moment now(0); now < std::chrono::hours(24); now += std::chrono::seconds(10)) {
    const bool right = now < minutes(10) || now > std::chrono::hours(20);  // changed on the camera, and changed back
    for (int holder = 0; holder < 20; ++holder) {
      const Answer answer = breaker.ask(now);
      if (answer != Answer::kGo && answer != Answer::kTry) continue;
      if (camera.takes(right, now)) {
        breaker.accepted();
        if (now > std::chrono::hours(20) && live_again == kNever) live_again = now;
      } else {
        breaker.refused(now);
      }
    }
  }
  EXPECT_FALSE(camera.was_locked());
  EXPECT_LE(live_again, std::chrono::hours(21));
}

}  // namespace
}  // namespace vexa
