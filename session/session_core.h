// SPDX-License-Identifier: Apache-2.0
// One session at work.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <random>
#include <string>
#include <vector>

#include "session/camera_line.h"
#include "session/core/session_machine.h"
#include "session/credential_guard.h"
#include "session/group_parts.h"
#include "vexa/frame_facts.h"
#include "vexa/session.h"

namespace vexa {

/// Joins the state machine, the driver and the host. Its keeper, one thread at a time, gives it turns; jobs of the
/// group's pools connect and close; any thread asks and stops. The driver belongs to the job under way, or else to the
/// keeper.
class SessionCore final : public std::enable_shared_from_this<SessionCore>,
                          private CredentialWaiter,
                          private CameraLine::Watcher {
 public:
  using Wake = std::function<void(std::uint64_t)>;

  static std::shared_ptr<SessionCore> make(std::uint64_t number, const SessionOptions& options,
                                           const SessionCallbacks& callbacks, GroupParts& parts, Wake wake);
  SessionCore(std::uint64_t number, const SessionOptions& options, const SessionCallbacks& callbacks, GroupParts& parts,
              Wake wake);

  // Any thread.
  [[nodiscard]] std::uint64_t number() const { return number_; }
  [[nodiscard]] const std::string& name() const { return name_; }
  [[nodiscard]] SessionStatus status() const;
  [[nodiscard]] bool statistics(StreamStatistics& statistics) const { return line_.statistics(statistics); }
  void stop();
  void retry();
  void set_credentials(const std::string& user, const std::string& password);
  [[nodiscard]] bool wait_stopped(std::int32_t milliseconds);
  [[nodiscard]] bool is_over() const { return over_; }
  /// Link or route is back.
  void note_link();

  // The keeper. Each returns how many callbacks it has made.
  int turn(Moment now);
  int take(std::uint32_t streams, Moment now);
  [[nodiscard]] Moment deadline() const;
  /// The driver whose streams are to be waited for; null while none run.
  [[nodiscard]] CVexaCommon* running() const { return running_ && !close_due_ ? line_.driver() : nullptr; }
  /// Those of them that run: what is lost would be ready again and again.
  [[nodiscard]] std::uint32_t streams() const { return options_.streams & ~lost_; }
  /// What the host knows the session by.
  [[nodiscard]] std::shared_ptr<Session> handle();

 private:
  struct Opened {
    std::optional<LineFailure> failure;
    CredentialTrial trial;
  };
  struct Sink;

  [[nodiscard]] std::shared_ptr<CredentialGuard> guard() const;

  // Jobs.
  static void report(const CredentialTrial& trial, const std::optional<LineFailure>& failure);
  void run_open(const CredentialTrial& trial, const std::string& user, const std::string& password);
  void run_side(std::uint32_t stream, const CredentialTrial& trial);
  void run_probe(const CredentialTrial& trial);
  void run_close();
  /// Wakes the keeper, which outlives the session's end and not the session.
  void wake();

  // Steps of a turn.
  void obey(Moment now);
  void take_results(Moment now);
  void after_open(const Opened& opened, Moment now);
  void begin_attempt(Moment now);
  [[nodiscard]] bool waits_for_turn() const;
  void end_line();
  void begin_close();
  template <typename Job>
  void begin_side_job(const CredentialTrial& trial, const Job& job);
  void begin_side(Moment now);
  void begin_probe(Moment now);
  void read_evidence(Moment now);
  int watch_silence(Moment now);
  void judge_silence(Moment now);
  int publish();

  int take_video();
  int take_alarms(Moment now);
  int take_metadata(Moment now);
  int take_audio(Moment now);
  void lose(std::uint32_t stream, ELibDReturnCode code, Moment now);
  int show(const SLibDVideoFrameInfo& frame, const FrameFacts& facts, Moment now);

  template <typename Call>
  int call(const Call& host);
  [[nodiscard]] double chance() { return std::uniform_real_distribution<double>(0, 1)(random_); }

  // CredentialWaiter and CameraLine::Watcher.
  void credentials_changed() override;
  [[nodiscard]] bool is_cancelled() const override { return stop_wanted_; }

  const std::uint64_t number_;
  const SessionOptions options_;
  const SessionCallbacks callbacks_;
  const std::string name_;
  GroupParts& parts_;
  const Wake wake_;
  const bool has_threads_;

  // Of any thread.
  std::atomic<bool> stop_wanted_{false};
  std::atomic<bool> retry_wanted_{false};
  std::atomic<bool> link_back_{false};
  std::atomic<bool> guard_changed_{false};
  std::atomic<bool> over_{false};
  mutable std::mutex mutex_;  ///< of what follows
  std::condition_variable ended_;
  SessionStatus status_;
  std::string user_;
  std::shared_ptr<CredentialGuard> guard_;
  std::optional<Opened> opened_;                          ///< what a job has left
  std::optional<std::pair<std::uint32_t, Opened>> side_;  ///< the same, of one stream
  bool closed_ = false;                                   ///< the same, of a close
  std::optional<Moment> probed_;                          ///< the same, of a probe: when the camera answered it
  std::weak_ptr<Session> handle_;

  // Of the job under way, or else the keeper.
  CameraLine line_;

  // Of the keeper.
  SessionMachine machine_;
  std::minstd_rand random_;
  bool job_ = false;       ///< one that opens or closes is under way
  bool side_job_ = false;  ///< one that starts a stream or asks for an answer, beside those that run
  std::shared_ptr<std::atomic<bool>> side_begun_;  ///< set by who comes first: its thread, or the keeper to drop it
  CredentialTrial trial_;                          ///< credentials of what is open or being opened
  bool running_ = false;                           ///< streams are open
  bool close_due_ = false;
  bool first_ = true;  ///< the next picture is the first of its connection
  std::int32_t codec_ = -1;
  std::uint32_t lost_ = 0;  ///< StreamBits that run no more, while video does
  BackOff side_back_off_;
  Moment side_since_{0};  ///< none was lost or started again since
  Moment side_due_ = kNever;
  MediaEvidence evidence_;
  bool asked_ = false;          ///< for an answer, since the latest picture
  std::uint64_t pictures_ = 0;  ///< taken
  std::uint64_t unshown_ = 0;   ///< events that the host did not get since it asked for the end
  std::vector<unsigned char> picture_;
  std::vector<unsigned char> sound_;
};

}  // namespace vexa
