// SPDX-License-Identifier: Apache-2.0
#include "vexa/backfill.h"

#include <algorithm>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <exception>
#include <mutex>
#include <optional>
#include <thread>
#include <utility>

#include "session/blocked_signals.h"
#include "session/camera_line.h"
#include "session/clock.h"
#include "session/core/failure_cause.h"
#include "session/core/gap_journal.h"
#include "session/core/gap_plan.h"
#include "session/credential_guard.h"
#include "session/gap_file.h"
#include "session/recording_player.h"

namespace vexa {
namespace {

using std::chrono::milliseconds;

constexpr milliseconds kAfterGap{2000};  // gathers the pictures that the end of a recording is compared with
constexpr milliseconds kAgain{1000};     // until a camera that failed, or still records, is asked again
constexpr milliseconds kMark{1000};      // between two marks that pictures come
constexpr int kMostAsked = 60;           // times for a recording that does not end
constexpr int kMostBroken = 3;           // playbacks after each other that delivered none

std::int64_t wall_now() {
  return std::chrono::duration_cast<std::chrono::microseconds>(std::chrono::system_clock::now().time_since_epoch())
      .count();
}

template <typename Call>
void call(const Call& host) {
  try {
    host();
  } catch (...) {
  }
}

SessionOptions without_streams(SessionOptions options) {
  options.streams = 0;
  return options;
}

}  // namespace

class Backfill::Impl final : private CameraLine::Watcher {
 public:
  Impl(const SessionOptions& camera, const BackfillOptions& options, const BackfillCallbacks& callbacks)
      : connection_(camera.connection),
        options_(options),
        callbacks_(callbacks),
        line_(without_streams(camera)),
        guard_(CredentialGuard::of(camera.connection)),
        file_(options.journal),
        journal_(GapJournal::read(file_.read())) {
    guard_->set_password(camera.connection.password);
    file_.begin(GapJournal::live_line(0, 0), journal_.text());
  }

  // An orderly end leaves no gap but those that are there.
  void finish() {
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      over_ = true;
      file_.mark(GapJournal::live_line(0, 0));
    }
    line_.cancel();
    news_.notify_all();
    if (thread_.joinable()) thread_.join();
  }

  // The session's thread.
  void take_state(const SessionStatus& status) {
    std::optional<Gap> opened;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (over_) return;
      live_ = status.state == SessionState::kLive;
      // A session that is stopped is not an outage.
      const bool is_outage = !live_ && status.state != SessionState::kStopped;
      if (!live_) shows_ = false;
      if (is_outage && latest_ != 0 && journal_.open() == 0) {
        file_.append(journal_.open_gap(latest_, camera_latest_));
        file_.mark(GapJournal::live_line(0, 0));
        const Gap& gap = journal_.gaps().at(journal_.open());
        before_[gap.number] = live_pictures_;
        opened = gap;
      }
    }
    news_.notify_all();
    if (opened) report(*opened);
  }

  void take_frame(const SessionFrame& frame) {
    const std::int64_t time = wall_now() - (monotonic_now().count() - frame.arrival) * 1000;
    // Content is compared only where the camera's clock is not known.
    const SeenPicture picture{frame.cameraTime == 0 ? hash_of(frame.data, frame.length) : 0, time};
    std::optional<Gap> closed;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (over_) return;
      latest_ = time;
      camera_latest_ = frame.cameraTime;
      if (frame.cameraTime == 0) live_pictures_.add(picture);
      shows_ = live_;
      if (const std::uint64_t open = journal_.open(); open != 0) {
        file_.append(journal_.close_gap(time, frame.cameraTime));
        closed = journal_.gaps().at(open);
        closed_at_ = monotonic_now();
        after_.clear();
        after_gap_ = open;
      }
      learn_of_end_locked(picture, frame.cameraTime);
      mark_locked();
      start_locked();
    }
    if (!closed) return;
    news_.notify_all();
    report(*closed);
  }

  [[nodiscard]] std::vector<Gap> gaps() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    std::vector<Gap> list;
    for (const auto& [number, gap] : journal_.gaps()) list.push_back(gap);
    return list;
  }
  [[nodiscard]] bool is_kept() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return file_.is_kept();
  }

 private:
  enum class Fetched { kDone, kAgain };

  [[nodiscard]] bool is_cancelled() const override { return over_; }

  void report(const Gap& gap) {
    if (callbacks_.gap) call([&] { callbacks_.gap(gap); });
  }

  // The first pictures after a gap, and the camera's clock if it is known later than the first of them.
  void learn_of_end_locked(const SeenPicture& picture, std::int64_t camera_time) {
    if (after_gap_ == 0) return;
    SeenPictures& after = after_[after_gap_];
    if (camera_time == 0 && after.all().size() < SeenPictures::kMost / 4) after.add(picture);
    if (knows_clock_locked() || camera_time == 0) return;
    const Gap& gap = journal_.gaps().at(after_gap_);
    file_.append(journal_.know_end(after_gap_, camera_time - (picture.time - gap.end)));
    news_.notify_all();
  }
  // Of the end of the latest gap.
  [[nodiscard]] bool knows_clock_locked() const {
    const auto gap = journal_.gaps().find(after_gap_);
    return gap != journal_.gaps().end() && gap->second.cameraEnd != 0;
  }

  void mark_locked() {
    const Moment now = monotonic_now();
    if (now - marked_at_ < kMark) return;
    marked_at_ = now;
    file_.mark(GapJournal::live_line(latest_, camera_latest_));
  }

  [[nodiscard]] bool has_work_locked() const { return journal_.due() != 0 || !is_listed_; }

  // The thread lives while there is something to do.
  void start_locked() {
    if (running_ || over_ || !shows_ || !has_work_locked()) return;
    if (thread_.joinable()) thread_.join();  // it has ended
    const BlockedSignals none;
    try {
      running_ = true;
      thread_ = std::thread([this] { work(); });
    } catch (const std::exception&) {
      running_ = false;  // tried again with the next picture
    }
  }

  void work() {
    std::unique_lock<std::mutex> lock(mutex_);
    while (!over_ && has_work_locked()) {
      // Live goes first: not before its pictures come again.
      const Moment left = knows_clock_locked() ? Moment(0) : closed_at_ + kAfterGap - monotonic_now();
      if (!shows_ || left > Moment(0)) {
        news_.wait_for(lock, shows_ ? left : kAgain);
        continue;
      }
      const std::uint64_t gap = journal_.due();
      lock.unlock();
      Fetched fetched = Fetched::kAgain;
      try {
        fetched = fetch(gap);
      } catch (const std::exception&) {
        // Memory is short: later.
      }
      lock.lock();
      if (fetched == Fetched::kAgain && !over_) news_.wait_for(lock, kAgain);
    }
    running_ = false;
  }

  [[nodiscard]] bool goes_on() const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return live_ && !over_;
  }

  // The worker's thread, from here on.

  // With the credentials that all of the process share.
  [[nodiscard]] bool connect() {
    const CredentialTicket ticket = guard_->ask(monotonic_now());
    const bool may =
        ticket.answer == CredentialBreaker::Answer::kGo || ticket.answer == CredentialBreaker::Answer::kTry;
    if (!may) return false;
    const std::optional<LineFailure> failure = line_.open(connection_.userName, ticket.password, *this);
    if (!failure) {
      guard_->accepted(ticket.generation);
    } else if (cause_of(failure->code, failure->text) == SessionCause::kCredentials) {
      guard_->refused(ticket.generation, monotonic_now());
    } else {
      guard_->abandoned(ticket.generation);
    }
    return !failure;
  }

  Fetched fetch(std::uint64_t number) {
    if (!connect()) return Fetched::kAgain;
    SLibDEdgeStorageRecordList list;
    const ELibDReturnCode listed = line_.driver()->GetEdgeStorageRecordList(list);
    if (listed != LIBD_OK) {
      const std::string text = line_.latest_text();
      const SessionCause cause = cause_of(listed, text);
      const bool refused = cause == SessionCause::kNotFound || cause == SessionCause::kUnsupported;
      if (!goes_on() || (!refused && ++work_[number].unlisted <= kMostBroken)) return Fetched::kAgain;
      note_list({}, 0);
      if (number != 0) end_gap(number, GapState::kRefused, text.empty() ? "the camera lists no recordings" : text);
      return Fetched::kDone;
    }
    note_list(list.records, number);
    return number == 0 ? Fetched::kDone : fetch_from(number, list.records);
  }

  void note_list(const std::vector<SLibDEdgeStorageRecord>& records, std::uint64_t gap) {
    const std::lock_guard<std::mutex> lock(mutex_);
    std::vector<std::string> names;
    names.reserve(records.size());
    for (const SLibDEdgeStorageRecord& record : records) names.push_back(record.streamName);
    is_listed_ = true;
    file_.append(journal_.see(names, gap, wall_now()));
  }

  Fetched fetch_from(std::uint64_t number, const std::vector<SLibDEdgeStorageRecord>& records) {
    Gap gap;
    CardView card{records, {}, 0};
    std::vector<Gap> others;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      for (const auto& [other, row] : journal_.gaps()) (other == number ? gap : others.emplace_back()) = row;
      card.fresh = journal_.fresh(number);
      card.listed = journal_.listed_before(number);
    }
    Work& work = work_[number];
    const std::vector<PlannedRecording> planned = plan_recordings(gap, card, others, options_);
    for (const PlannedRecording& recording : planned) {
      work.listed.insert(recording.record.streamName);
      if (recording.record.status == "recording" && ++work.asked <= kMostAsked) return Fetched::kAgain;
    }
    for (const PlannedRecording& recording : planned) {
      if (work.done.count(recording.record.streamName) != 0) continue;
      const PlaybackEnd end = play_on(gap, recording);
      if (!goes_on()) return Fetched::kAgain;
      work.broken = end == PlaybackEnd::kBroken ? work.broken + 1 : 0;
      if (end == PlaybackEnd::kBroken && work.broken <= kMostBroken) return Fetched::kAgain;
      if (end == PlaybackEnd::kRefused && work.refusal.empty()) work.refusal = refusal_text();
      work.is_gone = work.is_gone || end == PlaybackEnd::kGone;
      work.done.insert(recording.record.streamName);
    }
    judge(gap, records);
    return Fetched::kDone;
  }

  [[nodiscard]] std::string refusal_text() const {
    const std::string text = line_.latest_text();
    return text.empty() ? "the camera does not play its recordings" : text;
  }

  [[nodiscard]] std::uint64_t delivered(std::uint64_t number) const {
    const std::lock_guard<std::mutex> lock(mutex_);
    return journal_.gaps().at(number).pictures;
  }

  // Again and again, so long as each playback delivers some.
  PlaybackEnd play_on(const Gap& gap, const PlannedRecording& recording) {
    for (;;) {
      const std::uint64_t before = delivered(gap.number);
      const PlaybackEnd end = play(gap, recording, work_[gap.number].broken >= kMostBroken);
      if (end != PlaybackEnd::kBroken || delivered(gap.number) == before || !goes_on()) return end;
    }
  }

  PlaybackEnd play(const Gap& gap, const PlannedRecording& recording, bool takes_losses) {
    const std::string& name = recording.record.streamName;
    CutPlan plan = recording.plan;
    std::vector<SeenPicture> before;
    std::vector<SeenPicture> after;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      const std::map<std::string, std::int64_t> progress = journal_.progress(gap.number);
      if (const auto far = progress.find(name); far != progress.end()) plan.resume_after = far->second;
      if (recording.by_content) {
        before = listed_of(before_[gap.number]);
        after = listed_of(after_[gap.number]);
      }
    }
    GapCut cut(plan, std::move(before), std::move(after));
    const Moment began = monotonic_now();
    RecordingPlayer player(*line_.driver(), options_,
                           {[this] { return goes_on(); },
                            [&](const BackfillFrame& frame) { deliver(gap.number, name, frame); }, takes_losses});
    const PlaybackEnd end = player.play(recording.record, cut);
    rest(player.bytes(), began);
    return end;
  }

  static std::vector<SeenPicture> listed_of(const SeenPictures& pictures) {
    return {pictures.all().begin(), pictures.all().end()};
  }

  // So long as the average is above what is allowed.
  void rest(std::uint64_t bytes, Moment began) {
    if (options_.bytesPerSecond == 0) return;
    const Moment due = began + Moment(static_cast<Moment::rep>(bytes * 1000 / options_.bytesPerSecond));
    std::unique_lock<std::mutex> lock(mutex_);
    while (!over_ && monotonic_now() < due) news_.wait_for(lock, due - monotonic_now());
  }

  void deliver(std::uint64_t gap, const std::string& recording, BackfillFrame frame) {
    frame.gap = gap;
    if (callbacks_.frame) call([&] { callbacks_.frame(frame); });
    if (frame.leadsIn) return;
    const std::lock_guard<std::mutex> lock(mutex_);
    file_.append(journal_.deliver(gap, recording, frame.cameraTime, frame.time));
  }

  void judge(const Gap& gap, const std::vector<SLibDEdgeStorageRecord>& records) {
    std::vector<GapStretch> runs;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      runs = journal_.runs(gap.number);
    }
    const auto is_held = [&](const std::string& name) {
      return std::any_of(records.begin(), records.end(), [&](const auto& record) { return record.streamName == name; });
    };
    const Work& work = work_[gap.number];
    const bool is_lost = work.is_gone || !std::all_of(work.listed.begin(), work.listed.end(), is_held);
    if (!runs.empty()) {
      const std::vector<GapStretch> missing = missing_of(gap, runs);
      return end_gap(gap.number, missing.empty() ? GapState::kRecovered : GapState::kPartial, "", missing);
    }
    if (!work.refusal.empty()) return end_gap(gap.number, GapState::kRefused, std::string(work.refusal));
    end_gap(gap.number, is_lost ? GapState::kOverwritten : GapState::kAbsent, "");
  }

  void end_gap(std::uint64_t number, GapState state, const std::string& text,
               const std::vector<GapStretch>& missing = {}) {
    Gap ended;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      file_.append(journal_.finish(number, state, missing, text));
      file_.begin(GapJournal::live_line(shows_ ? latest_ : 0, camera_latest_), journal_.text());
      ended = journal_.gaps().at(number);
      before_.erase(number);
      after_.erase(number);
    }
    work_.erase(number);
    report(ended);
  }

  // What has been done for a gap since the host was started.
  struct Work {
    int asked = 0;   // because a recording had not ended
    int broken = 0;  // playbacks after each other that delivered none
    std::set<std::string> done;
    std::set<std::string> listed;
    std::string refusal;
    bool is_gone = false;
    int unlisted = 0;  // lists that failed
  };

  const SLibDConnectionInfo connection_;
  const BackfillOptions options_;
  const BackfillCallbacks callbacks_;
  CameraLine line_;  ///< of the worker; any thread cancels
  const std::shared_ptr<CredentialGuard> guard_;
  std::atomic<bool> over_{false};

  mutable std::mutex mutex_;  ///< of what follows
  std::condition_variable news_;
  GapFile file_;
  GapJournal journal_;
  SeenPictures live_pictures_;
  std::map<std::uint64_t, SeenPictures> before_;
  std::map<std::uint64_t, SeenPictures> after_;
  std::uint64_t after_gap_ = 0;  ///< the latest that has ended
  std::int64_t latest_ = 0;      ///< host's time of the latest live picture; 0: none has come
  std::int64_t camera_latest_ = 0;
  Moment closed_at_{Moment::min() / 2};
  Moment marked_at_{Moment::min() / 2};
  bool live_ = false;
  bool shows_ = false;  ///< live, and a picture has come since
  bool running_ = false;
  bool is_listed_ = false;
  std::thread thread_;

  // Of the worker.
  std::map<std::uint64_t, Work> work_;
};

Backfill::Backfill(const SessionOptions& camera, const BackfillOptions& options, const BackfillCallbacks& callbacks)
    : impl_(std::make_shared<Impl>(camera, options, callbacks)) {}

Backfill::~Backfill() { impl_->finish(); }

SessionCallbacks Backfill::Watch(const SessionCallbacks& host) {
  SessionCallbacks callbacks = host;
  callbacks.state = [impl = impl_, state = host.state](Session& session, const SessionStatus& status) {
    impl->take_state(status);
    if (state) state(session, status);
  };
  callbacks.frame = [impl = impl_, frame = host.frame](Session& session, const SessionFrame& shown) {
    impl->take_frame(shown);
    if (frame) frame(session, shown);
  };
  return callbacks;
}

std::vector<Gap> Backfill::Gaps() const { return impl_->gaps(); }

bool Backfill::JournalIsKept() const { return impl_->is_kept(); }

}  // namespace vexa
