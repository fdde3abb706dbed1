// SPDX-License-Identifier: Apache-2.0
// Credentials that are replaced while requests with the former ones are under way.
#include "session/credential_guard.h"

#include <gtest/gtest.h>

#include <chrono>

namespace vexa {
namespace {

using std::chrono::minutes;
using Answer = CredentialBreaker::Answer;

class Waiter final : public CredentialWaiter {
 public:
  void credentials_changed() override { ++calls; }
  int calls = 0;
};

TEST(CredentialGuard, WhileTheDueTryIsMadeTheOthersWaitForItsEndAndNotForAMoment) {
  CredentialGuard guard;
  guard.set_password("right");
  guard.accepted(guard.ask(Moment(0)).generation);
  guard.refused(guard.ask(Moment(0)).generation, Moment(0));
  CredentialTicket early = guard.ask(Moment(1));
  EXPECT_EQ(early.answer, Answer::kWait);
  EXPECT_TRUE(early.is_refused);
  EXPECT_EQ(early.next, Moment(minutes(1)));
  EXPECT_EQ(guard.ask(minutes(1)).answer, Answer::kTry);
  const CredentialTicket other = guard.ask(minutes(1));
  EXPECT_EQ(other.answer, Answer::kWait);
  EXPECT_FALSE(other.is_refused);
  EXPECT_EQ(other.next, kNever);
}

TEST(CredentialGuard, ARefusalOfTheFormerPasswordDoesNotRefuseTheNewOne) {
  CredentialGuard guard;
  guard.set_password("wrong");
  const CredentialTicket former = guard.ask(Moment(0));
  EXPECT_EQ(former.password, "wrong");
  guard.set_password("right");
  guard.refused(former.generation, Moment(1));
  EXPECT_FALSE(guard.is_refused());
  EXPECT_FALSE(guard.is_current(former.generation));
  EXPECT_EQ(guard.next_try(former.generation, Moment(1)), Moment(1));
  const CredentialTicket next = guard.ask(Moment(2));
  EXPECT_EQ(next.answer, Answer::kTry);
  EXPECT_EQ(next.password, "right");
}

TEST(CredentialGuard, WhatCameOfTheFormerPasswordLeavesATryOfTheNewOneAlone) {
  CredentialGuard guard;
  guard.set_password("former");
  const CredentialTicket former = guard.ask(Moment(0));
  guard.set_password("new");
  ASSERT_EQ(guard.ask(Moment(1)).answer, Answer::kTry);
  guard.abandoned(former.generation);
  guard.accepted(former.generation);
  EXPECT_EQ(guard.ask(Moment(2)).answer, Answer::kWait);
}

TEST(CredentialGuard, RefusedCredentialsAreTriedWhenTheyAreDue) {
  CredentialGuard guard;
  guard.set_password("never right");
  const CredentialTicket ticket = guard.ask(Moment(0));
  guard.refused(ticket.generation, Moment(5));
  EXPECT_EQ(guard.next_try(ticket.generation, Moment(6)), kNever);
  guard.retry();
  EXPECT_EQ(guard.next_try(ticket.generation, Moment(6)), Moment(6));
}

TEST(CredentialGuard, AWaiterIsCalledOnceForEachChangeHoweverOftenItIsAdded) {
  CredentialGuard guard;
  const auto waiter = std::make_shared<Waiter>();
  for (int i = 0; i < 3; ++i) guard.add_waiter(std::weak_ptr<CredentialWaiter>(waiter));
  guard.set_password("one");
  EXPECT_EQ(waiter->calls, 1);
  guard.set_password("one");
  EXPECT_EQ(waiter->calls, 1) << "nothing has changed";
}

}  // namespace
}  // namespace vexa
