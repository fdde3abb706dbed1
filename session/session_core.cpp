// SPDX-License-Identifier: Apache-2.0
#include "session/session_core.h"

#include <algorithm>
#include <chrono>
#include <exception>
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

// Whether the call has done it, which it has not when memory is short.
template <typename Call>
bool within_memory(const Call& call) {
  try {
    return call();
  } catch (const std::exception&) {
    return false;
  }
}

// An operation on the line; it has failed when memory is short.
template <typename Call>
std::optional<LineFailure> attempt(const Call& call) {
  try {
    return call();
  } catch (const std::exception&) {
    return LineFailure{LIBD_FAILED, "out of memory", false};
  }
}

bool may_send(const CredentialTicket& ticket) {
  return ticket.answer == CredentialBreaker::Answer::kGo || ticket.answer == CredentialBreaker::Answer::kTry;
}

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
      has_threads_(parts.has_threads),
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
  wake();
}

void SessionCore::retry() {
  if (over_) return;
  guard()->retry();
  retry_wanted_ = true;
  wake();
}

// The last callback sets over_ under the same lock, and the keeper is there until then.
void SessionCore::wake() {
  const std::lock_guard<std::mutex> lock(mutex_);
  if (!over_) wake_(number_);
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
  if (over_ || is_keeper_thread() || !has_threads_) return over_;
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
  wake();
}

void SessionCore::credentials_changed() {
  if (over_) return;
  guard_changed_ = true;
  wake();
}

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

void SessionCore::report(const CredentialTrial& trial, const std::optional<LineFailure>& failure) {
  if (!failure) {
    trial.judge->accepted(trial.generation);
  } else if (cause_of(failure->code, failure->text) == SessionCause::kCredentials) {
    trial.judge->refused(trial.generation, monotonic_now());
  } else {
    trial.judge->abandoned(trial.generation);
  }
}

// A camera may take the credentials for its settings and refuse them for its streams: all of it counts as one.
void SessionCore::run_open(const CredentialTrial& trial, const std::string& user, const std::string& password) {
  Opened opened{attempt([&] { return line_.open(user, password, *this); }), trial};
  report(trial, opened.failure);
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    opened_ = std::move(opened);
  }
  parts_.turns.leave(number_);
  wake();
}

void SessionCore::run_side(std::uint32_t stream, const CredentialTrial& trial) {
  Opened opened{attempt([&] { return line_.start(stream); }), trial};
  report(trial, opened.failure);
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    side_ = std::make_pair(stream, std::move(opened));
  }
  wake();
}

void SessionCore::run_probe(const CredentialTrial& trial) {
  const std::optional<LineFailure> failure = attempt([&] { return line_.ask(); });
  report(trial, failure);
  const bool answered = !failure || is_refusal(cause_of(failure->code, failure->text));
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    probed_ = answered ? monotonic_now() : Moment::min();
  }
  wake();
}

void SessionCore::run_close() {
  line_.close();
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    closed_ = true;
  }
  wake();
}

// The keeper's turn

int SessionCore::turn(Moment now) {
  if (over_) return 0;
  obey(now);
  take_results(now);
  const int made = watch_silence(now);
  now = monotonic_now();
  if (close_due_ && !job_ && !side_job_) begin_close();
  if (!job_ && !close_due_ && (machine_.is_due(now) || waits_for_turn())) begin_attempt(now);
  if (lost_ != 0 && running_ && !close_due_ && !side_job_ && now >= side_due_) begin_side(now);
  return made + publish();
}

// Its turn comes at no time that could be planned: each wake-up may be it.
bool SessionCore::waits_for_turn() const {
  const SessionStatus& latest = machine_.status();
  return latest.state == SessionState::kWaiting && latest.cause == SessionCause::kTurn && !machine_.is_stopping();
}

void SessionCore::obey(Moment now) {
  if (link_back_.exchange(false) && machine_.link_back(now)) end_line();
  if (guard_changed_.exchange(false)) machine_.credentials_changed(now);
  if (retry_wanted_.exchange(false)) machine_.retry(now);
  if (!stop_wanted_ || machine_.is_stopping()) return;
  machine_.stop(now);
  parts_.turns.leave(number_);
  if (running_) end_line();
}

// A job beside the streams would keep them from being closed: it ends, or does not begin.
void SessionCore::end_line() {
  close_due_ = true;
  if (!side_job_) return;
  line_.cancel();
  if (side_begun_->exchange(true)) return;
  side_job_ = false;
  trial_.judge->abandoned(trial_.generation);
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
      side_since_ = now;
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
    side_since_ = now;
    machine_.opened(now);
    if (machine_.is_stopping()) end_line();
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
  // Others that the host has set meanwhile are tried at once.
  const bool is_current = opened.trial.judge == guard();
  const Moment next = is_current ? opened.trial.judge->next_try(opened.trial.generation, now) : now;
  machine_.refused_credentials(failure.code, failure.text, next, now);
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
  const CredentialTicket ticket = judge->ask(now);
  if (!may_send(ticket)) {
    parts_.turns.leave(number_);
    machine_.hold(ticket.is_refused ? SessionCause::kCredentials : SessionCause::kOtherTrial, ticket.next, now);
    return;
  }
  ++parts_.counts.attempts;
  machine_.connecting(now);
  job_ = true;
  trial_ = {judge, ticket.generation};
  auto self = shared_from_this();
  const bool posted = within_memory([&] {
    return parts_.connectors.post(
        [self, trial = trial_, user, password = ticket.password] { self->run_open(trial, user, password); });
  });
  if (posted) return;
  job_ = false;
  judge->abandoned(ticket.generation);
  parts_.turns.leave(number_);
  machine_.failed(LIBD_FAILED, "no thread could be made", chance(), now);
}

void SessionCore::begin_close() {
  close_due_ = false;
  if (!stop_wanted_) trial_.judge->doubt();
  job_ = true;
  running_ = false;
  auto self = shared_from_this();
  if (!within_memory([&] { return parts_.closers.post([self] { self->run_close(); }); })) run_close();
}

// Whichever of its thread and the keeper marks it first decides whether the job is done.
template <typename Job>
void SessionCore::begin_side_job(const CredentialTrial& trial, const Job& job) {
  side_job_ = within_memory([&] {
    side_begun_ = std::make_shared<std::atomic<bool>>(false);
    return parts_.sides.post([begun = side_begun_, job] {
      if (!begun->exchange(true)) job();
    });
  });
  if (!side_job_) trial.judge->abandoned(trial.generation);
}

// The driver sends the credentials that it was opened with: what has been replaced since is not sent again.
void SessionCore::begin_side(Moment now) {
  const std::uint32_t stream = lost_ & (~lost_ + 1);  // the lowest
  auto self = shared_from_this();
  side_due_ = now + BackOff::kLastLimit;
  if (!trial_.judge->is_current(trial_.generation)) return;
  const CredentialTicket ticket = trial_.judge->ask(now);
  if (!may_send(ticket)) return;
  const CredentialTrial trial{trial_.judge, ticket.generation};
  begin_side_job(trial, [self, stream, trial] { self->run_side(stream, trial); });
}

// Whether the camera answers while it sends nothing; once a silence. It may have been set up anew meanwhile, so that of
// its sessions one finds out whether it still takes the credentials.
void SessionCore::begin_probe(Moment now) {
  asked_ = true;
  if (!trial_.judge->is_current(trial_.generation)) return;
  trial_.judge->doubt();
  const CredentialTicket ticket = trial_.judge->ask(now);
  if (ticket.answer != CredentialBreaker::Answer::kTry) return;
  auto self = shared_from_this();
  const CredentialTrial trial{trial_.judge, ticket.generation};
  begin_side_job(trial, [self, trial] { self->run_probe(trial); });
}

void SessionCore::read_evidence(Moment now) {
  StreamStatistics statistics;
  GetStreamStatistics(*line_.driver(), statistics);
  if (statistics.timeSinceLastPacket == UINT64_MAX) return;
  const auto since = std::chrono::microseconds(statistics.timeSinceLastPacket);
  evidence_.video = now - std::chrono::duration_cast<Moment>(since);
}

// The keeper may be late, for callbacks of this host: what has come meanwhile is taken first.
int SessionCore::watch_silence(Moment now) {
  if (!running_ || close_due_ || now < machine_.deadline()) return 0;
  const std::uint64_t before = pictures_;
  const int made = take_video();
  now = monotonic_now();
  if (pictures_ == before && !close_due_ && now >= machine_.deadline()) judge_silence(now);
  return made;
}

void SessionCore::judge_silence(Moment now) {
  read_evidence(now);
  machine_.evidence(evidence_);
  if (machine_.is_hopeless(chance(), now)) {
    end_line();
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
    const bool last = event->state == SessionState::kStopped;
    const bool shown = last || !stop_wanted_;
    parts_.counts.events_missed += event->missed + (shown ? 0 : 1);
    if (shown) {
      event->missed += std::exchange(unshown_, 0);
    } else {
      unshown_ += event->missed + 1;
    }
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (!within_memory([&] { return status_ = *event, true; })) {
        event->text.clear();
        event->why.clear();
        status_ = *event;
      }
    }
    if (callbacks_.state && shown) made += call([&] { callbacks_.state(*handle(), *event); });
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
  if (!running_ || close_due_) return turn(now);
  int made = 0;
  if ((streams & kVideoStream) != 0) made += take_video();
  if ((streams & ~lost_ & kAlarmStream) != 0) made += take_alarms(now);
  if ((streams & ~lost_ & kMetadataStream) != 0) made += take_metadata(now);
  if ((streams & ~lost_ & kAudioStream) != 0) made += take_audio(now);
  return made + turn(monotonic_now());
}

int SessionCore::take_video() {
  int made = 0;
  for (int taken = 0; taken < kMostPictures && !stop_wanted_; ++taken) {
    Sink sink(picture_);
    SLibDVideoFrameInfo frame;
    frame.sink = &sink;
    FrameFacts facts;
    picture_.clear();
    const ELibDReturnCode result = GetCurrentVideoFrame(*line_.driver(), frame, facts);
    // Silence is the machine's to judge.
    if (result == LIBD_NO_FRAME || result == LIBD_TIMEOUT) break;
    const Moment now = monotonic_now();  // callbacks may have taken long
    if (result != LIBD_OK) {
      lose(kVideoStream, result, now);
      break;
    }
    if (picture_.empty()) continue;  // one that was damaged
    ++pictures_;
    made += show(frame, facts, now);
  }
  return made;
}

int SessionCore::show(const SLibDVideoFrameInfo& frame, const FrameFacts& facts, Moment now) {
  machine_.picture(now);
  asked_ = false;
  int made = publish();
  const std::int32_t codec = codec_of(frame.frameType);
  if ((codec_ >= 0 && codec_ != codec) || (facts.discontinuity & kStreamChanges) != 0) {
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
  if ((facts.valid & FRAME_FACTS_SENDER_TIME) != 0) shown.cameraTime = facts.senderTime / 1000;
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
      [&] { callbacks_.audio(*handle(), sound_.data(), static_cast<std::size_t>(frame.length), line_.sound_codec()); });
}

// Video that runs goes on without the other streams, which are started again by themselves.
void SessionCore::lose(std::uint32_t stream, ELibDReturnCode code, Moment now) {
  if (close_due_) return;
  const bool video = (options_.streams & kVideoStream) != 0;
  if (stream != kVideoStream && video) {
    side_back_off_.prove(side_since_, now);
    if (side_due_ == kNever) side_due_ = now + side_back_off_.next(chance());
    lost_ |= stream;
    return;
  }
  const std::string text = line_.latest_text();
  machine_.failed(code, text, chance(), now);
  end_line();
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
