// SPDX-License-Identifier: Apache-2.0
// Sessions against a virtual camera.
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <arpa/inet.h>
#include <algorithm>
#include <atomic>
#include <csignal>
#include <stdexcept>

#include "tests/session/session_camera.h"
#include "vexa/video_info.h"

namespace vexa {
namespace {

using camera::CameraOptions;
using camera::RequestFault;

TEST_F(SessionWithCamera, GoesLiveWithTheFirstWholePicture) {
  start_camera();
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(patient_options(), host.callbacks());
  ASSERT_TRUE(session);
  ASSERT_TRUE(host.wait_for_frames(25));
  const auto states = host.states();
  ASSERT_GE(states.size(), 2U);
  EXPECT_EQ(states[0].state, SessionState::kConnecting);
  EXPECT_EQ(states[0].cause, SessionCause::kAsked);
  EXPECT_EQ(states[0].event, 1U);
  EXPECT_EQ(states[0].attempt, 1U);
  EXPECT_EQ(states[1].state, SessionState::kLive);
  EXPECT_EQ(states[1].why, "Live.");
  const auto frames = host.frames();
  EXPECT_TRUE(frames[0].isFirst);
  EXPECT_TRUE(frames[0].isKey);
  EXPECT_GT(frames[0].length, 0U);
  for (std::size_t i = 1; i < frames.size(); ++i) EXPECT_FALSE(frames[i].isFirst);
  EXPECT_EQ(session->Name(), options().connection.host + ":" + std::to_string(options().connection.port));
}

TEST_F(SessionWithCamera, IsLiveAgainWhenTheCameraIsPulledOutAndPutBack) {
  start_camera();
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_live());
  for (int time = 0; time < 2; ++time) {
    const std::uint64_t before = host.latest_event();
    camera().unplug();
    ASSERT_TRUE(host.wait_for([&](const auto& states, const auto&) {
      return states.back().event > before && states.back().state == SessionState::kWaiting;
    }));
    EXPECT_NE(session->Status().why, "Live.");
    const std::uint64_t away = host.latest_event();
    const std::size_t frames = host.frames().size();
    camera().plug();
    session->Retry();
    ASSERT_TRUE(host.wait_for_live(away));
    ASSERT_TRUE(host.wait_for_frames(frames + 2));
    EXPECT_TRUE(host.frames()[frames].isFirst);
  }
  EXPECT_FALSE(host.overlapped());
}

TEST_F(SessionWithCamera, StatisticsGoOnThroughAnOutage) {
  start_camera();
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_frames(5));
  StreamStatistics before;
  ASSERT_TRUE(session->Statistics(before));
  EXPECT_GE(before.framesHandedOut, 5U);
  camera().unplug();
  ASSERT_TRUE(
      host.wait_for([](const auto& states, const auto&) { return states.back().state == SessionState::kWaiting; }));
  const std::size_t frames = host.frames().size();
  camera().plug();
  session->Retry();
  ASSERT_TRUE(host.wait_for_frames(frames + 2));
  StreamStatistics after;
  ASSERT_TRUE(session->Statistics(after));
  EXPECT_GE(after.framesHandedOut, frames + 2);
  EXPECT_EQ(after.since, before.since);
  EXPECT_EQ(group.Metrics().mostTurnsWaited, 0U);
}

TEST_F(SessionWithCamera, TheStateAskedForIsTheLastEvent) {
  start_camera();
  SessionHost host;
  std::atomic<int> different{0};
  host.on_state = [&different](Session& session, const SessionStatus& status) {
    if (session.Status().event != status.event) ++different;
  };
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_live());
  session->Stop();
  ASSERT_TRUE(session->WaitStopped(30000));
  EXPECT_EQ(session->Status().event, host.latest_event());
  EXPECT_EQ(session->Status().state, SessionState::kStopped);
  EXPECT_EQ(different, 0);
}

TEST_F(SessionWithCamera, RefusedCredentialsAreSentOnceByAllSessionsTogether) {
  start_camera();
  SessionOptions wrong = options();
  wrong.connection.password = "wrong";
  SessionHost hosts[3];
  SessionGroup group;
  for (SessionHost& host : hosts) ASSERT_TRUE(group.Open(wrong, host.callbacks()));
  for (SessionHost& host : hosts) {
    ASSERT_TRUE(host.wait_for_state(SessionState::kRefused, SessionCause::kCredentials));
    EXPECT_EQ(host.states().back().nextAttempt, 0);
  }
  EXPECT_EQ(camera().journal().snapshot().size(), 1U);
}

TEST_F(SessionWithCamera, RefusedCredentialsAreNotSentAgainByAGroupThatIsMadeAnew) {
  start_camera();
  SessionOptions wrong = options();
  wrong.connection.password = "wrong once";
  for (int time = 0; time < 3; ++time) {
    SessionHost host;
    SessionGroup group;
    ASSERT_TRUE(group.Open(wrong, host.callbacks()));
    ASSERT_TRUE(host.wait_for_state(SessionState::kRefused, SessionCause::kCredentials));
  }
  EXPECT_EQ(camera().journal().snapshot().size(), 1U);
}

// Six sessions, and a camera that would lock the account after five refusals.
TEST_F(SessionWithCamera, APasswordThatIsChangedAndChangedBackLocksNobodyOut) {
  start_camera();
  SessionHost hosts[6];
  std::vector<std::shared_ptr<Session>> sessions;
  SessionGroup group;
  for (SessionHost& host : hosts) sessions.push_back(group.Open(options(), host.callbacks()));
  for (SessionHost& host : hosts) ASSERT_TRUE(host.wait_for_live());
  camera().unplug();
  camera().add_request_fault(RequestFault::wrong_credentials(""));
  camera().plug();
  for (SessionHost& host : hosts) {
    ASSERT_TRUE(host.wait_for([](const auto& states, const auto&) {
      return states.back().cause == SessionCause::kCredentials && states.back().nextAttempt != 0;
    }));
  }
  camera().clear_request_faults();
  sessions[0]->Retry();
  for (SessionHost& host : hosts) {
    EXPECT_TRUE(
        host.wait_for([](const auto& states, const auto&) { return states.back().state == SessionState::kLive; }));
  }
  const std::vector<camera::Request> requests = camera().journal().snapshot();
  std::vector<std::string> refused;
  for (const camera::Request& request : requests) {
    if (request.status == 401) refused.push_back(request.bytes);
  }
  EXPECT_LT(refused.size(), 5U) << testing::PrintToString(refused);
}

// A wrong password by mistake, in six sessions, and the right one again.
TEST_F(SessionWithCamera, ACameraThatLocksAfterFiveRefusalsIsNeverLocked) {
  CameraOptions locking;
  locking.lock_after = 5;
  start_camera(locking);
  SessionHost hosts[6];
  std::vector<std::shared_ptr<Session>> sessions;
  SessionGroup group;
  for (SessionHost& host : hosts) sessions.push_back(group.Open(options(), host.callbacks()));
  for (SessionHost& host : hosts) ASSERT_TRUE(host.wait_for_live());
  for (const auto& session : sessions) session->SetCredentials("operator", "a mistake");
  camera().unplug();
  camera().plug();
  for (SessionHost& host : hosts) {
    ASSERT_TRUE(host.wait_for([](const auto& states, const auto&) {
      return states.back().cause == SessionCause::kCredentials && states.back().state == SessionState::kRefused;
    }));
  }
  EXPECT_FALSE(camera().locked());
  for (const auto& session : sessions) session->SetCredentials("operator", "tr0ub4dor");
  for (SessionHost& host : hosts) {
    EXPECT_TRUE(
        host.wait_for([](const auto& states, const auto&) { return states.back().state == SessionState::kLive; }));
  }
  EXPECT_FALSE(camera().locked());
}

TEST_F(SessionWithCamera, TheRightPasswordMakesRefusedSessionsLive) {
  start_camera();
  SessionOptions wrong = options();
  wrong.connection.password = "wrong";
  SessionHost hosts[2];
  SessionGroup group;
  const auto first = group.Open(wrong, hosts[0].callbacks());
  const auto second = group.Open(wrong, hosts[1].callbacks());
  for (SessionHost& host : hosts) {
    ASSERT_TRUE(host.wait_for_state(SessionState::kRefused, SessionCause::kCredentials));
  }
  first->SetCredentials("operator", "tr0ub4dor");
  for (SessionHost& host : hosts) EXPECT_TRUE(host.wait_for_live());
}

TEST_F(SessionWithCamera, ARetryOfTheHostsSendsRefusedCredentialsOnceMore) {
  start_camera();
  camera().add_request_fault(RequestFault::status("inq=system", "401 Unauthorized"));
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_state(SessionState::kRefused, SessionCause::kCredentials));
  camera().clear_request_faults();
  session->Retry();
  EXPECT_TRUE(host.wait_for_live());
}

// It takes the credentials for its settings, and refuses them for its streams.
TEST_F(SessionWithCamera, CredentialsThatOnlyStreamsRefuseStopWithTheFirstRefusal) {
  start_camera();
  camera().add_request_fault(RequestFault::status("DESCRIBE", "401 Unauthorized"));
  SessionHost host;
  SessionGroup group;
  ASSERT_TRUE(group.Open(options(), host.callbacks()));
  ASSERT_TRUE(host.wait_for_state(SessionState::kRefused, SessionCause::kCredentials));
  EXPECT_EQ(host.states().back().nextAttempt, 0);
}

// The camera holds back its refusal of the former credentials until the right ones have been set.
class SessionWithASlowRefusal : public SessionWithCamera {
 protected:
  void SetUp() override {
    start_camera();
    camera().add_request_fault(RequestFault::slow("inq=system", std::chrono::milliseconds(300)));
  }

  static void expect_live_after_other_credentials(const SessionOptions& wrong) {
    SessionHost host;
    host.on_state = [](Session& session, const SessionStatus& status) {
      if (status.state == SessionState::kConnecting) session.SetCredentials("operator", "tr0ub4dor");
    };
    SessionGroup group;
    ASSERT_TRUE(group.Open(wrong, host.callbacks()));
    EXPECT_TRUE(host.wait_for_live());
  }
};

TEST_F(SessionWithASlowRefusal, APasswordThatIsSetDuringAnAttemptIsTriedAfterIt) {
  SessionOptions wrong = options();
  wrong.connection.password = "wrong";
  expect_live_after_other_credentials(wrong);
}

TEST_F(SessionWithASlowRefusal, AnotherUserThatIsSetDuringAnAttemptIsTriedAfterIt) {
  SessionOptions wrong = options();
  wrong.connection.userName = "nobody";
  expect_live_after_other_credentials(wrong);
}

TEST_F(SessionWithCamera, WhatTheCameraRefusesIsNamed) {
  const struct {
    const char* status;
    SessionCause cause;
  } cases[] = {{"453 Not Enough Bandwidth", SessionCause::kBusy},
               {"404 Not Found", SessionCause::kNotFound},
               {"415 Unsupported Media Type", SessionCause::kUnsupported}};
  for (const auto& row : cases) {
    SCOPED_TRACE(row.status);
    start_camera();
    camera().add_request_fault(RequestFault::status("SETUP", row.status));
    SessionHost host;
    SessionGroup group;
    ASSERT_TRUE(group.Open(options(), host.callbacks()));
    ASSERT_TRUE(host.wait_for_state(SessionState::kRefused, row.cause));
    const auto states = host.states();
    const auto refused =
        std::find_if(states.begin(), states.end(), [](const auto& s) { return s.state == SessionState::kRefused; });
    EXPECT_NE(refused->nextAttempt, 0);
  }
}

TEST_F(SessionWithCamera, AnotherCodecAfterAnOutageIsFollowedAndReported) {
  CameraOptions camera_options;
  camera_options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-C100.json";
  start_camera(camera_options);
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_live());
  camera().unplug();
  ASSERT_TRUE(
      host.wait_for([](const auto& states, const auto&) { return states.back().state == SessionState::kWaiting; }));
  camera().settings().set("camera", "ImageCodec1", "jpeg");
  camera().plug();
  session->Retry();
  ASSERT_TRUE(host.wait_for_state(SessionState::kLive, SessionCause::kStreamChanged));
  ASSERT_TRUE(
      host.wait_for([](const auto&, const auto& frames) { return frames.back().frameType == VIDEO_FRAME_JPEG; }));
}

TEST_F(SessionWithCamera, AStreamThatBeginsAnewWithinAConnectionIsReported) {
  CameraOptions camera_options;
  camera_options.packet_faults.sequence_restarts = {{.picture = 10, .value = 40000}};
  start_camera(camera_options);
  SessionHost host;
  SessionGroup group;
  ASSERT_TRUE(group.Open(patient_options(), host.callbacks()));
  ASSERT_TRUE(host.wait_for_state(SessionState::kLive, SessionCause::kStreamChanged));
  EXPECT_EQ(host.states().size(), 3U);
}

TEST_F(SessionWithCamera, ACameraThatAnswersAndSendsNoPictureIsStalledForThat) {
  CameraOptions camera_options;
  camera_options.packet_faults.loss = 1;
  camera_options.packet_faults.first_picture = 10;
  start_camera(camera_options);
  SessionHost host;
  SessionGroup group;
  ASSERT_TRUE(group.Open(options(), host.callbacks()));
  ASSERT_TRUE(host.wait_for_state(SessionState::kStalled, SessionCause::kControlOnly));
  ASSERT_TRUE(host.wait_for_state(SessionState::kWaiting, SessionCause::kControlOnly));
}

TEST_F(SessionWithCamera, ACameraThatSendsAndAnswersNothingIsStalledForThat) {
  CameraOptions camera_options;
  camera_options.packet_faults.loss = 1;
  camera_options.packet_faults.first_picture = 10;
  camera_options.request_faults = {RequestFault::no_answer("inq=system").nth(2)};
  start_camera(camera_options);
  SessionOptions impatient = options();
  impatient.connection.timeout = 1000;
  SessionHost host;
  SessionGroup group;
  ASSERT_TRUE(group.Open(impatient, host.callbacks()));
  ASSERT_TRUE(host.wait_for_state(SessionState::kWaiting, SessionCause::kNoBytes));
  EXPECT_TRUE(host.wait_for_state(SessionState::kStalled, SessionCause::kNoBytes));
}

TEST_F(SessionWithCamera, PacketsThatMakeNoPictureAreNamed) {
  CameraOptions camera_options;
  camera_options.clip_path = VEXA_CLIPS "/small.h264";
  camera_options.packet_faults.corrupt_header = 1;
  camera_options.packet_faults.first_picture = 10;
  start_camera(camera_options);
  SessionHost host;
  SessionGroup group;
  ASSERT_TRUE(group.Open(options(), host.callbacks()));
  ASSERT_TRUE(host.wait_for_state(SessionState::kStalled, SessionCause::kNoWholePicture));
}

TEST_F(SessionWithCamera, AStopFromWithinACallbackReturnsAndOneCallMoreFollows) {
  start_camera();
  SessionHost host;
  std::atomic<bool> waited_in_vain{false};
  std::atomic<std::size_t> at_stop{0};
  host.on_frame = [&](Session& session, const SessionFrame&) {
    session.Stop();
    waited_in_vain = session.WaitStopped(-1);
    ++at_stop;
  };
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_state(SessionState::kStopped, SessionCause::kAsked));
  ASSERT_TRUE(session->WaitStopped(30000));
  EXPECT_FALSE(waited_in_vain);
  EXPECT_EQ(at_stop, 1U);
  EXPECT_EQ(host.frames().size(), 1U);
  EXPECT_TRUE(camera().journal().wait_for_count("TEARDOWN", 1, std::chrono::seconds(30)));
}

// Live again with another codec: the stop in the first of the two events withholds the second.
TEST_F(SessionWithCamera, EventsThatAStopHasWithheldAreCountedByTheLastOne) {
  CameraOptions camera_options;
  camera_options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-C100.json";
  start_camera(camera_options);
  SessionHost host;
  host.on_state = [](Session& session, const SessionStatus& status) {
    if (status.state == SessionState::kLive && status.cause != SessionCause::kAsked) session.Stop();
  };
  SessionGroup group;
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_live());
  camera().unplug();
  ASSERT_TRUE(
      host.wait_for([](const auto& states, const auto&) { return states.back().state == SessionState::kWaiting; }));
  camera().settings().set("camera", "ImageCodec1", "jpeg");
  camera().plug();
  session->Retry();
  ASSERT_TRUE(session->WaitStopped(30000));
  const auto states = host.states();
  ASSERT_EQ(states.back().state, SessionState::kStopped);
  EXPECT_EQ(states.back().missed, 1U);
  EXPECT_EQ(states.back().event, states[states.size() - 2].event + 2);
}

TEST(SessionsWithoutACamera, ACallbackCannotOpenASessionWhileItsGroupIsBeingDestroyed) {
  SessionOptions nowhere;
  nowhere.connection.host = vexa_test::own_loopback(1);
  nowhere.connection.port = 9;
  for (const int threads : {1, 2, 0}) {
    SessionHost host;
    SessionHost late;
    std::atomic<int> refused{0};
    SessionGroupOptions group_options;
    group_options.threads = threads;
    auto* const group = new SessionGroup(group_options);
    host.on_state = [&](Session&, const SessionStatus& status) {
      if (status.state == SessionState::kStopped && !group->Open(nowhere, late.callbacks())) ++refused;
    };
    ASSERT_TRUE(group->Open(nowhere, host.callbacks()));
    delete group;
    EXPECT_EQ(refused, 1) << threads;
    EXPECT_TRUE(late.states().empty());
  }
}

TEST(SessionsWithoutACamera, ThreadsOfTheLibraryTakeNoSignals) {
  SessionOptions nowhere;
  nowhere.connection.host = vexa_test::own_loopback(1);
  nowhere.connection.port = 9;
  SessionHost host;
  std::atomic<int> blocked{-1};
  host.on_state = [&blocked](Session&, const SessionStatus&) {
    sigset_t mask;
    pthread_sigmask(SIG_SETMASK, nullptr, &mask);
    blocked = sigismember(&mask, SIGTERM) + sigismember(&mask, SIGCHLD);
  };
  SessionGroup group;
  ASSERT_TRUE(group.Open(nowhere, host.callbacks()));
  ASSERT_TRUE(host.wait_for([](const auto& states, const auto&) { return states.size() >= 2; }));
  EXPECT_EQ(blocked, 2);
}

TEST_F(SessionWithCamera, EveryCallIsAllowedInACallbackAndReturnsAtOnce) {
  start_camera();
  SessionHost host;
  SessionHost other;
  std::atomic<int> wrong{0};
  std::atomic<bool> done{false};
  const SessionOptions more = patient_options();
  SessionGroup group;
  host.on_frame = [&](Session& session, const SessionFrame&) {
    if (done.exchange(true)) return;
    if (session.Status().state != SessionState::kLive) ++wrong;
    if (session.Name().empty()) ++wrong;
    session.Retry();
    session.SetCredentials("operator", "tr0ub4dor");
    if (session.WaitStopped(-1)) ++wrong;
    if (group.Metrics().sessions != 1) ++wrong;
    if (group.Process(-1) != 0) ++wrong;
    if (!group.Open(more, other.callbacks())) ++wrong;
  };
  const auto session = group.Open(patient_options(), host.callbacks());
  EXPECT_TRUE(other.wait_for_live());
  EXPECT_TRUE(host.wait_for_frames(5));
  EXPECT_EQ(wrong, 0);
}

TEST_F(SessionWithCamera, AnExceptionOfACallbackEndsThereAndIsCounted) {
  start_camera();
  SessionHost host;
  std::atomic<int> thrown{0};
  host.on_frame = [&thrown](Session&, const SessionFrame&) {
    if (thrown++ < 2) throw std::runtime_error("the host's own");
  };
  SessionGroup group;
  const auto session = group.Open(patient_options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_frames(5));
  EXPECT_EQ(group.Metrics().exceptions, 2U);
  EXPECT_EQ(session->Status().state, SessionState::kLive);
}

TEST_F(SessionWithCamera, WithoutThreadsTheHostWaitsOnTheDescriptorAndIsCalledByProcess) {
  start_camera();
  SessionHost host;
  SessionGroupOptions without;
  without.threads = 0;
  SessionGroup group(without);
  ASSERT_GE(group.Descriptor(), 0);
  const auto session = group.Open(options(), host.callbacks());
  ASSERT_TRUE(session);
  const auto until = std::chrono::steady_clock::now() + SessionHost::kLongest;
  while (host.frames().size() < 25 && std::chrono::steady_clock::now() < until) {
    pollfd ready{group.Descriptor(), POLLIN, 0};
    if (poll(&ready, 1, 1000) == 1) group.Process(0);
  }
  EXPECT_GE(host.frames().size(), 25U);
  session->Stop();
  while (!session->WaitStopped(-1) && std::chrono::steady_clock::now() < until) group.Process(100);
  EXPECT_EQ(host.states().back().state, SessionState::kStopped);
}

TEST_F(SessionWithCamera, AlarmsComeBesideVideo) {
  CameraOptions camera_options;
  camera_options.profile_path = VEXA_SOURCE_DIR "/models/profiles/LMX-M300.json";
  start_camera(camera_options);
  ASSERT_TRUE(camera().alarms().happen({camera::AlarmEvent::Kind::kContact, 2, 1}));
  SessionOptions both = options();
  both.streams = kVideoStream | kAlarmStream;
  SessionHost host;
  SessionGroup group;
  ASSERT_TRUE(group.Open(both, host.callbacks()));
  ASSERT_TRUE(host.wait_for_live());
  const auto until = std::chrono::steady_clock::now() + SessionHost::kLongest;
  while (host.pins().empty() && std::chrono::steady_clock::now() < until) poll(nullptr, 0, 5);
  ASSERT_GE(host.pins().size(), 2U);
  EXPECT_EQ(host.pins()[1].state, 1);
}

TEST_F(SessionWithCamera, AttemptsAtOnceAreBounded) {
  start_camera();
  SessionGroupOptions narrow;
  narrow.attempts = 2;
  SessionHost hosts[8];
  SessionGroup group(narrow);
  for (SessionHost& host : hosts) ASSERT_TRUE(group.Open(options(), host.callbacks()));
  for (SessionHost& host : hosts) ASSERT_TRUE(host.wait_for_live());
  EXPECT_LE(group.Metrics().mostAttemptsAtOnce, 2U);
  EXPECT_EQ(group.Metrics().attempts, 8U);
}

TEST_F(SessionWithCamera, ManyThreadsNeverRunCallbacksOfOneSessionAtOnce) {
  start_camera();
  SessionGroupOptions wide;
  wide.threads = 3;
  SessionHost hosts[6];
  SessionGroup group(wide);
  for (SessionHost& host : hosts) ASSERT_TRUE(group.Open(options(), host.callbacks()));
  for (SessionHost& host : hosts) ASSERT_TRUE(host.wait_for_frames(25));
  for (SessionHost& host : hosts) EXPECT_FALSE(host.overlapped());
  EXPECT_GE(group.Metrics().threads, 3U);
}

// An address where connections are made and nothing ever answers.
class SilentAddress {
 public:
  SilentAddress() : socket_(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
    sockaddr_in address{};
    address.sin_family = AF_INET;
    inet_pton(AF_INET, vexa_test::own_loopback(2).c_str(), &address.sin_addr);
    socklen_t length = sizeof address;
    bind(socket_, reinterpret_cast<const sockaddr*>(&address), length);
    listen(socket_, 64);
    getsockname(socket_, reinterpret_cast<sockaddr*>(&address), &length);
    port_ = ntohs(address.sin_port);
  }
  ~SilentAddress() { close(socket_); }
  SilentAddress(const SilentAddress&) = delete;
  SilentAddress& operator=(const SilentAddress&) = delete;
  [[nodiscard]] SessionOptions options() const {
    SessionOptions options;
    options.connection.host = vexa_test::own_loopback(2);
    options.connection.port = port_;
    options.connection.timeout = 600000;
    return options;
  }

 private:
  int socket_;
  int port_ = 0;
};

TEST_F(SessionWithCamera, AStopEndsASessionInEveryState) {
  const struct {
    const char* what;
    SessionState state;
    void (*arrange)(CameraOptions&);
    void (*spoil)(SessionOptions&);
  } cases[] = {
      {"live", SessionState::kLive, [](CameraOptions&) {}, [](SessionOptions&) {}},
      {"stalled", SessionState::kStalled,
       [](CameraOptions& camera) {
         camera.packet_faults.loss = 1;
         camera.packet_faults.first_picture = 10;
       },
       [](SessionOptions& session) { session.giveUpMilliseconds = 600000; }},
      {"waiting", SessionState::kWaiting,
       [](CameraOptions& camera) { camera.request_faults = {RequestFault::reset("")}; }, [](SessionOptions&) {}},
      {"refused", SessionState::kRefused, [](CameraOptions&) {},
       [](SessionOptions& session) { session.connection.password = "wrong until stopped"; }}};
  for (const auto& row : cases) {
    SCOPED_TRACE(row.what);
    CameraOptions camera_options;
    row.arrange(camera_options);
    start_camera(camera_options);
    SessionOptions spoilt = options();
    row.spoil(spoilt);
    SessionHost host;
    SessionGroup group;
    const auto session = group.Open(spoilt, host.callbacks());
    ASSERT_TRUE(host.wait_for([&](const auto& states, const auto&) {
      return std::any_of(states.begin(), states.end(), [&](const auto& s) { return s.state == row.state; });
    }));
    session->Stop();
    EXPECT_TRUE(session->WaitStopped(30000));
    EXPECT_EQ(host.states().back().state, SessionState::kStopped);
    const std::uint64_t last = host.latest_event();
    session->Retry();
    session->SetCredentials("operator", "another");
    EXPECT_TRUE(session->WaitStopped(-1));
    EXPECT_EQ(session->Status().event, last);
  }
}

TEST(SilentCamera, AStopEndsAnAttemptThatWouldLastTenMinutes) {
  const SilentAddress nowhere;
  SessionHost host;
  SessionGroup group;
  const auto session = group.Open(nowhere.options(), host.callbacks());
  ASSERT_TRUE(host.wait_for_state(SessionState::kConnecting, SessionCause::kAsked));
  session->Stop();
  EXPECT_TRUE(session->WaitStopped(30000));
  EXPECT_EQ(host.states().back().state, SessionState::kStopped);
}

TEST(SilentCamera, AGroupEndsThoughNoneOfItsCamerasAnswers) {
  const SilentAddress nowhere;
  SessionHost hosts[20];
  {
    SessionGroup group;
    for (SessionHost& host : hosts) ASSERT_TRUE(group.Open(nowhere.options(), host.callbacks()));
    ASSERT_TRUE(hosts[0].wait_for_state(SessionState::kConnecting, SessionCause::kAsked));
  }
  for (SessionHost& host : hosts) EXPECT_EQ(host.states().back().state, SessionState::kStopped);
}

}  // namespace
}  // namespace vexa
