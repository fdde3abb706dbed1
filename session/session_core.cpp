// SPDX-License-Identifier: Apache-2.0
#include "session/session_core.h"

#include <algorithm>
#include <chrono>
#include <iterator>
#include <utility>

#include "session/clock.h"
#include "session/core/failure_cause.h"
#include "session/keeper.h"
#include "vexa/frame_facts.h"
#include "vexa/statistics.h"
#include "vexa/waiting.h"

namespace vexa {
namespace {

// Taken before other cameras have their turn.
constexpr int kMostPictures = 64;
constexpr std::size_t kSoundPiece = 8192;
// Of a connection that goes on; a new one has new ones of all of these.
constexpr std::uint32_t kStreamChanges = FRAME_DISCONTINUITY_SSRC | FRAME_DISCONTINUITY_SEQUENCE_RESTART |
                                         FRAME_DISCONTINUITY_TIME_JUMP | FRAME_DISCONTINUITY_CODEC |
                                         FRAME_DISCONTINUITY_SIZE;

std::string name_of(const SessionOptions& options) {
  if (!options.name.empty()) return options.name;
  return options.connection.host + ":" + std::to_string(options.connection.port);
}

Patience patience_of(const SessionOptions& options) {
  constexpr std::int32_t kLeast = 100;
  return {Moment(std::max(options.stallMilliseconds, kLeast)),
          Moment(std::max(options.firstPictureMilliseconds, kLeast)),
          Moment(std::max(options.giveUpMilliseconds, kLeast))};
}

bool is_key(std::int32_t type) {
  return type == VIDEO_FRAME_JPEG || type == VIDEO_FRAME_MPEG4_KEY || type == VIDEO_FRAME_H264_KEY;
}

// The enumeration has ten for each codec.
std::int32_t codec_of(std::int32_t frame_type) { return frame_type / 10; }

}  // namespace

// Copies and returns, as the driver asks: it holds its queue meanwhile.
struct SessionCore::Sink final : CDataSink {
  explicit Sink(std::vector<unsigned char>& picture) : bytes(picture) {}
  void Write(const unsigned char* data, unsigned int length) override { bytes.assign(data, data + length); }
  std::vector<unsigned char>& bytes;
};

std::shared_ptr<SessionCore> SessionCore::make(std::uint64_t number, const SessionOptions& options,
                                               const SessionCallbacks& callbacks, GroupParts& parts, Wake wake) {
  auto core = std::make_shared<SessionCore>(number, options, callbacks, parts, std::move(wake));
  core->set_credentials(options.connection.userName, options.connection.password);
  return core;
}

SessionCore::SessionCore(std::uint64_t number, const SessionOptions& options, const SessionCallbacks& callbacks,
                         GroupParts& parts, Wake wake)
    : number_(number),
      options_(options),
      callbacks_(callbacks),
      name_(name_of(options)),
      parts_(parts),
      wake_(std::move(wake)),
      line_(options),
      machine_((options.streams & kVideoStream) != 0, patience_of(options)),
      random_(std::random_device()() + static_cast<unsigned>(number)) {
  machine_.start(monotonic_now());
}

SessionStatus SessionCore::status() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return status_;
}

void SessionCore::stop() {
  if (over_) return;
  stop_wanted_ = true;
  line_.cancel();
  wake_(number_);
}

void SessionCore::retry() {
  if (over_) return;
  guard()->retry();
  retry_wanted_ = true;
  wake_(number_);
}

void SessionCore::set_credentials(const std::string& user, const std::string& password) {
  if (over_) return;
  SLibDConnectionInfo connection = options_.connection;
  connection.userName = user;
  const std::shared_ptr<CredentialGuard> guard = CredentialGuard::of(connection);
  guard->add_waiter(std::weak_ptr<CredentialWaiter>(std::shared_ptr<CredentialWaiter>(shared_from_this(), this)));
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    user_ = user;
    guard_ = guard;
  }
  guard->set_password(password);
  credentials_changed();
}

bool SessionCore::wait_stopped(std::int32_t milliseconds) {
  if (over_ || is_keeper_thread() || !parts_.has_threads) return over_;
  std::unique_lock<std::mutex> lock(mutex_);
  const auto is_over = [this] { return over_.load(); };
  if (milliseconds < 0) {
    ended_.wait(lock, is_over);
    return true;
  }
  return ended_.wait_for(lock, std::chrono::milliseconds(milliseconds), is_over);
}

void SessionCore::note_link() {
  if (over_) return;
  link_back_ = true;
  wake_(number_);
}

void SessionCore::credentials_changed() {
  if (over_) return;
  guard_changed_ = true;
  wake_(number_);
}

void SessionCore::credentials_accepted() { guard()->accepted(); }

std::shared_ptr<CredentialGuard> SessionCore::guard() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return guard_;
}

std::shared_ptr<Session> SessionCore::handle() {
  const std::lock_guard<std::mutex> lock(mutex_);
  std::shared_ptr<Session> session = handle_.lock();
  if (!session) handle_ = session = std::shared_ptr<Session>(new Session(shared_from_this()));
  return session;
}

// Jobs

void SessionCore::report(CredentialGuard& judge, const std::optional<LineFailure>& failure) {
  if (!failure) {
    judge.accepted();
  } else if (cause_of(failure->code, failure->text) == SessionCause::kCredentials) {
    judge.refused(monotonic_now());
  } else {
    judge.abandoned();
  }
}

void SessionCore::run_open(const std::shared_ptr<CredentialGuard>& judge, const std::string& user) {
  Opened opened{line_.open(user, judge->password(), *this)};
  if (opened.failure) report(*judge, opened.failure);
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    opened_ = std::move(opened);
  }
  parts_.turns.leave(number_);
  wake_(number_);
}

void SessionCore::run_side(std::uint32_t stream, const std::shared_ptr<CredentialGuard>& judge) {
  Opened opened{line_.start(stream)};
  report(*judge, opened.failure);
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    side_ = std::make_pair(stream, std::move(opened));
  }
  wake_(number_);
}

void SessionCore::run_probe(const std::shared_ptr<CredentialGuard>& judge) {
  const std::optional<LineFailure> failure = line_.ask();
  report(*judge, failure);
  const bool answered = !failure || is_refusal(cause_of(failure->code, failure->text));
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    probed_ = answered ? monotonic_now() : Moment::min();
  }
  wake_(number_);
}

void SessionCore::run_close() {
  line_.close();
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    closed_ = true;
  }
  wake_(number_);
}

// The keeper's turn

int SessionCore::turn(Moment now) {
  if (over_) return 0;
  obey(now);
  take_results(now);
  watch_silence(now);
  if (close_due_ && !job_ && !side_job_) begin_close();
  if (!job_ && !close_due_ && (machine_.is_due(now) || waits_for_turn())) begin_attempt(now);
  if (lost_ != 0 && running_ && !close_due_ && !side_job_ && now >= side_due_) begin_side(now);
  return publish();
}

// Its turn comes at no time that could be planned: each wake-up may be it.
bool SessionCore::waits_for_turn() const {
  const SessionStatus& latest = machine_.status();
  return latest.state == SessionState::kWaiting && latest.cause == SessionCause::kTurn && !machine_.is_stopping();
}

void SessionCore::obey(Moment now) {
  if (link_back_.exchange(false)) machine_.link_back(now);
  if (guard_changed_.exchange(false)) machine_.credentials_changed(now);
  if (retry_wanted_.exchange(false)) machine_.retry(now);
  if (!stop_wanted_ || machine_.is_stopping()) return;
  machine_.stop(now);
  parts_.turns.leave(number_);
  close_due_ = running_;
}

void SessionCore::take_results(Moment now) {
  std::optional<Opened> opened;
  std::optional<std::pair<std::uint32_t, Opened>> side;
  std::optional<Moment> probed;
  bool closed = false;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    opened.swap(opened_);
    side.swap(side_);
    probed.swap(probed_);
    closed = std::exchange(closed_, false);
  }
  if (opened) after_open(*opened, now);
  if (side) {
    side_job_ = false;
    if (side->second.failure) {
      side_due_ = now + side_back_off_.next(chance());
    } else {
      lost_ &= ~side->first;
      side_due_ = lost_ == 0 ? kNever : now;
    }
  }
  if (probed) {
    side_job_ = false;
    evidence_.answer = *probed;
    if (running_ && !close_due_ && machine_.status().state == SessionState::kStalled) judge_silence(now);
  }
  if (closed) {
    job_ = running_ = false;
    lost_ = 0;
    machine_.closed(now);
  }
}

void SessionCore::after_open(const Opened& opened, Moment now) {
  job_ = false;
  if (!opened.failure) {
    running_ = true;
    first_ = true;
    evidence_ = {};
    asked_ = false;
    lost_ = 0;
    side_due_ = kNever;
    machine_.opened(now);
    close_due_ = machine_.is_stopping();
    return;
  }
  const LineFailure& failure = *opened.failure;
  if (failure.wrong_profile) {
    machine_.refused(SessionCause::kProfile, failure.code, failure.text, chance(), now);
    return;
  }
  if (cause_of(failure.code, failure.text) != SessionCause::kCredentials) {
    machine_.failed(failure.code, failure.text, chance(), now);
    return;
  }
  machine_.refused_credentials(failure.code, failure.text, guard()->retry_at(), now);
}

void SessionCore::begin_attempt(Moment now) {
  if (!parts_.turns.enter(number_, parts_.counts)) {
    machine_.hold(SessionCause::kTurn, kNever, now);
    return;
  }
  std::shared_ptr<CredentialGuard> judge;
  std::string user;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    judge = guard_;
    user = user_;
  }
  const CredentialBreaker::Answer answer = judge->ask(now);
  if (answer == CredentialBreaker::Answer::kWait || answer == CredentialBreaker::Answer::kRefused) {
    parts_.turns.leave(number_);
    const bool refused = judge->is_refused();
    machine_.hold(refused ? SessionCause::kCredentials : SessionCause::kOtherTrial,
                  refused ? judge->retry_at() : kNever, now);
    return;
  }
  ++parts_.counts.attempts;
  machine_.connecting(now);
  job_ = true;
  auto self = shared_from_this();
  if (parts_.connectors.post([self, judge, user] { self->run_open(judge, user); })) return;
  job_ = false;
  judge->abandoned();
  parts_.turns.leave(number_);
  machine_.failed(LIBD_FAILED, "no thread could be made", chance(), now);
}

void SessionCore::begin_close() {
  close_due_ = false;
  if (!stop_wanted_) guard()->doubt();
  job_ = true;
  running_ = false;
  auto self = shared_from_this();
  if (!parts_.closers.post([self] { self->run_close(); })) run_close();
}

void SessionCore::begin_side(Moment now) {
  const std::shared_ptr<CredentialGuard> judge = guard();
  const std::uint32_t stream = lost_ & (~lost_ + 1);  // the lowest
  auto self = shared_from_this();
  side_due_ = now + BackOff::kLastLimit;
  const CredentialBreaker::Answer answer = judge->ask(now);
  if (answer == CredentialBreaker::Answer::kWait || answer == CredentialBreaker::Answer::kRefused) return;
  side_job_ = parts_.connectors.post([self, stream, judge] { self->run_side(stream, judge); });
  if (!side_job_) judge->abandoned();
}

// Whether the camera answers while it sends nothing; once a silence. It may have been set up anew meanwhile, so that of
// its sessions one finds out whether it still takes the credentials.
void SessionCore::begin_probe(Moment now) {
  asked_ = true;
  const std::shared_ptr<CredentialGuard> judge = guard();
  judge->doubt();
  if (judge->ask(now) != CredentialBreaker::Answer::kTry) return;
  auto self = shared_from_this();
  side_job_ = parts_.connectors.post([self, judge] { self->run_probe(judge); });
  if (!side_job_) judge->abandoned();
}

void SessionCore::read_evidence(Moment now) {
  StreamStatistics statistics;
  GetStreamStatistics(*line_.driver(), statistics);
  if (statistics.timeSinceLastPacket == UINT64_MAX) return;
  const auto since = std::chrono::microseconds(statistics.timeSinceLastPacket);
  evidence_.video = now - std::chrono::duration_cast<Moment>(since);
}

void SessionCore::watch_silence(Moment now) {
  if (running_ && now >= machine_.deadline()) judge_silence(now);
}

void SessionCore::judge_silence(Moment now) {
  read_evidence(now);
  machine_.evidence(evidence_);
  if (machine_.is_hopeless(chance(), now)) {
    close_due_ = true;
  } else if (machine_.status().cause == SessionCause::kNoBytes && !asked_ && !side_job_) {
    begin_probe(now);
  }
}

Moment SessionCore::deadline() const {
  if (over_) return kNever;
  const Moment machine = job_ ? kNever : machine_.deadline();
  const bool waits_for_side = lost_ != 0 && running_ && !side_job_;
  return waits_for_side ? std::min(machine, side_due_) : machine;
}

int SessionCore::publish() {
  int made = 0;
  while (auto event = machine_.events().take()) {
    parts_.counts.events_missed += event->missed;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      status_ = *event;
    }
    const bool last = event->state == SessionState::kStopped;
    if (callbacks_.state && (last || !stop_wanted_)) made += call([&] { callbacks_.state(*handle(), *event); });
    if (!last) continue;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      over_ = true;
    }
    ended_.notify_all();
  }
  return made;
}

// What the camera sends

int SessionCore::take(std::uint32_t streams, Moment now) {
  if (!running_) return 0;
  int made = 0;
  if ((streams & kVideoStream) != 0) made += take_video(now);
  if ((streams & ~lost_ & kAlarmStream) != 0) made += take_alarms(now);
  if ((streams & ~lost_ & kMetadataStream) != 0) made += take_metadata(now);
  if ((streams & ~lost_ & kAudioStream) != 0) made += take_audio(now);
  return made + turn(monotonic_now());
}

int SessionCore::take_video(Moment now) {
  int made = 0;
  for (int taken = 0; taken < kMostPictures && !stop_wanted_; ++taken) {
    Sink sink(picture_);
    SLibDVideoFrameInfo frame;
    frame.sink = &sink;
    FrameFacts facts;
    const ELibDReturnCode result = GetCurrentVideoFrame(*line_.driver(), frame, facts);
    // Silence is the machine's to judge.
    if (result == LIBD_NO_FRAME || result == LIBD_TIMEOUT) break;
    if (result != LIBD_OK) {
      lose(kVideoStream, result, now);
      break;
    }
    made += show(frame, facts.discontinuity, now);
  }
  return made;
}

int SessionCore::show(const SLibDVideoFrameInfo& frame, std::uint32_t discontinuity, Moment now) {
  machine_.picture(now);
  asked_ = false;
  int made = publish();
  const std::int32_t codec = codec_of(frame.frameType);
  if ((codec_ >= 0 && codec_ != codec) || (discontinuity & kStreamChanges) != 0) {
    machine_.stream_changed(now);
    made += publish();
  }
  codec_ = codec;
  SessionFrame shown;
  shown.frameType = frame.frameType;
  shown.data = picture_.data();
  shown.length = picture_.size();
  shown.seconds = static_cast<std::int32_t>(frame.seconds);
  shown.microseconds = static_cast<std::int32_t>(frame.microseconds);
  shown.arrival = now.count();
  shown.isFirst = std::exchange(first_, false);
  shown.isKey = is_key(frame.frameType);
  if (callbacks_.frame && !stop_wanted_) made += call([&] { callbacks_.frame(*handle(), shown); });
  return made;
}

int SessionCore::take_alarms(Moment now) {
  std::vector<SLibDPinInfo> pins;
  const ELibDReturnCode result = line_.driver()->GetCurrentIoStatus(pins);
  if (result == LIBD_NO_FRAME) return 0;
  if (result != LIBD_OK) {
    lose(kAlarmStream, result, now);
    return 0;
  }
  evidence_.other = now;
  if (!callbacks_.alarms || stop_wanted_) return 0;
  return call([&] { callbacks_.alarms(*handle(), pins); });
}

int SessionCore::take_metadata(Moment now) {
  SLibDRawMDFrameInfo frame;
  const ELibDReturnCode result = line_.driver()->GetCurrentPosition(frame);
  if (result == LIBD_NO_FRAME) return 0;
  if (result != LIBD_OK) {
    lose(kMetadataStream, result, now);
    return 0;
  }
  evidence_.other = now;
  if (!callbacks_.metadata || stop_wanted_) return 0;
  return call([&] { callbacks_.metadata(*handle(), frame); });
}

int SessionCore::take_audio(Moment now) {
  sound_.resize(kSoundPiece);
  SLibDAudioFrameInfo frame;
  frame.data = sound_.data();
  frame.capacity = static_cast<std::int32_t>(sound_.size());
  const ELibDReturnCode result = line_.driver()->GetCurrentAudioFrame(frame);
  if (result == LIBD_NO_FRAME) return 0;
  if (result != LIBD_OK) {
    lose(kAudioStream, result, now);
    return 0;
  }
  evidence_.other = now;
  if (!callbacks_.audio || stop_wanted_ || frame.length <= 0) return 0;
  return call(
      [&] { callbacks_.audio(*handle(), sound_.data(), static_cast<std::size_t>(frame.length), frame.codecType); });
}

// Video that runs goes on without the other streams, which are started again by themselves.
void SessionCore::lose(std::uint32_t stream, ELibDReturnCode code, Moment now) {
  const bool video = (options_.streams & kVideoStream) != 0;
  if (stream != kVideoStream && video) {
    if (side_due_ == kNever) side_due_ = now + side_back_off_.next(chance());
    lost_ |= stream;
    return;
  }
  const std::string text = line_.latest_text();
  machine_.failed(code, text, chance(), now);
  close_due_ = true;
}

template <typename Call>
int SessionCore::call(const Call& host) {
  const auto before = std::chrono::steady_clock::now();
  try {
    host();
  } catch (...) {
    ++parts_.counts.exceptions;
  }
  const auto spent = std::chrono::steady_clock::now() - before;
  raise_to(parts_.counts.longest_callback,
           static_cast<std::uint64_t>(std::chrono::duration_cast<std::chrono::microseconds>(spent).count()));
  return 1;
}

}  // namespace vexa
