// SPDX-License-Identifier: Apache-2.0
// Causes from codes and texts, and sentences for people.
#include "session/core/failure_cause.h"

#include <gtest/gtest.h>

#include "session/core/why_not_live.h"

namespace vexa {
namespace {

TEST(FailureCause, GoesByTheCodeAndThePhraseOfTheCamera) {
  const struct {
    ELibDReturnCode code;
    const char* text;
    SessionCause cause;
  } cases[] = {{LIBD_UNAUTHORIZED, "", SessionCause::kCredentials},
               {LIBD_STREAM_OPEN_FAILED, "Unauthorized", SessionCause::kCredentials},
               {LIBD_FAILED, "403 FORBIDDEN", SessionCause::kUnsupported},
               {LIBD_FAILED, "401 UNAUTHORIZED", SessionCause::kCredentials},
               {LIBD_FAILED, "AUTHORIZED", SessionCause::kFailed},
               {LIBD_STREAM_OPEN_FAILED, "Not Enough Bandwidth", SessionCause::kBusy},
               {LIBD_FAILED, "Service Unavailable", SessionCause::kBusy},
               {LIBD_STREAM_OPEN_FAILED, "Stream Not Found", SessionCause::kNotFound},
               {LIBD_STREAM_OPEN_FAILED, "Unsupported Media Type", SessionCause::kUnsupported},
               {LIBD_NOT_SUPPORTED, "", SessionCause::kUnsupported},
               {LIBD_NOT_SUPPORTED, "the camera has no such stream", SessionCause::kNotFound},
               {LIBD_INVALID_ARGUMENT, "", SessionCause::kUnsupported},
               {LIBD_FAILED, "Connection reset by peer", SessionCause::kClosed},
               {LIBD_FAILED, "Connection refused", SessionCause::kNoAnswer},
               {LIBD_TIMEOUT, "Receive timed out", SessionCause::kNoAnswer},
               {LIBD_TIMEOUT, "", SessionCause::kNoAnswer},
               {LIBD_FAILED, "", SessionCause::kNoAnswer},
               {LIBD_FAILED, "URL too long", SessionCause::kFailed}};
  for (const auto& c : cases) EXPECT_EQ(cause_of(c.code, c.text), c.cause) << c.code << " " << c.text;
}

TEST(FailureCause, ARefusalIsAnAnswerOfTheCamera) {
  for (const SessionCause cause : {SessionCause::kCredentials, SessionCause::kBusy, SessionCause::kNotFound,
                                   SessionCause::kUnsupported, SessionCause::kProfile}) {
    EXPECT_TRUE(is_refusal(cause));
  }
  for (const SessionCause cause : {SessionCause::kNoAnswer, SessionCause::kClosed, SessionCause::kNoBytes,
                                   SessionCause::kFailed, SessionCause::kTurn}) {
    EXPECT_FALSE(is_refusal(cause));
  }
}

TEST(WhyNotLive, NamesCauseReasonAndWhatComesNext) {
  SessionStatus status;
  EXPECT_EQ(why_not_live(status, Moment(0)), "The session has not been started.");
  status.state = SessionState::kWaiting;
  status.cause = SessionCause::kNoAnswer;
  status.text = "Connection refused";
  status.nextAttempt = 13001;
  EXPECT_EQ(why_not_live(status, Moment(10000)),
            "No answer from the camera (Connection refused); the next attempt is in 4 s.");
  status.nextAttempt = 13000;
  EXPECT_EQ(why_not_live(status, Moment(10000)),
            "No answer from the camera (Connection refused); the next attempt is in 3 s.");
  status.state = SessionState::kRefused;
  status.cause = SessionCause::kCredentials;
  status.text = "Unauthorized\r\nX: y";
  status.nextAttempt = 0;
  EXPECT_EQ(why_not_live(status, Moment(10000)),
            "The camera refuses user name and password (Unauthorized); no attempt is planned until they change or the "
            "host asks for one.");
  status.state = SessionState::kStalled;
  status.cause = SessionCause::kNoWholePicture;
  status.text = "";
  status.since = 4000;
  EXPECT_EQ(why_not_live(status, Moment(10500)), "Picture data comes, but no whole picture, for 6 s.");
  status.state = SessionState::kLive;
  EXPECT_EQ(why_not_live(status, Moment(10500)), "Live.");
}

TEST(WhyNotLive, ACamerasTextStaysOnOneLine) {
  SessionStatus status;
  status.state = SessionState::kWaiting;
  status.cause = SessionCause::kFailed;
  status.text = "a\x1b[2J" + std::string(500, 'x');
  const std::string why = why_not_live(status, Moment(0));
  EXPECT_EQ(why.find('\x1b'), std::string::npos);
  EXPECT_LT(why.size(), 280U);
}

TEST(WhyNotLive, DeletesAreReplacedAsOtherControlsAre) {
  SessionStatus status;
  status.state = SessionState::kRefused;
  status.cause = SessionCause::kProfile;
  status.text = "no\x7fname";
  EXPECT_EQ(why_not_live(status, Moment(0)), "The camera's profile cannot be used (no?name).");
}

TEST(WhyNotLive, ANumberThatIsNoStateOrCauseIsNoTrouble) {
  SessionStatus status;
  status.state = SessionState::kWaiting;
  status.cause = static_cast<SessionCause>(1000);
  EXPECT_EQ(why_not_live(status, Moment(0)), "The cause is not known.");
  status.state = static_cast<SessionState>(1000);
  EXPECT_EQ(why_not_live(status, Moment(0)), "");
}

}  // namespace
}  // namespace vexa
