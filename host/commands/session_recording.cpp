// SPDX-License-Identifier: Apache-2.0
#include "host/commands/session_recording.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <deque>
#include <memory>
#include <nlohmann/json.hpp>
#include <set>

#include "host/base/printable.h"
#include "host/camera/session_news.h"
#include "host/camera/session_options.h"
#include "host/cgi_log/cgi_log.h"
#include "host/console/interrupt.h"
#include "host/console/progress.h"
#include "host/recording/gap_recording.h"
#include "host/recording/recording_target.h"
#include "host/words/stored_recordings.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;
using Clock = CameraRecording::Clock;

constexpr std::string_view kCameraPlace = "{camera}";
constexpr int kTurn = 100;  // milliseconds between two looks at limits and Ctrl-C

RecordingFiles::Open opener(const SessionRecordingOptions& options, int standard_output) {
  return [standard_output, format = options.format](const std::string& path) {
    return RecordingTarget(path, standard_output, format).open();
  };
}

double seconds_of(const Gap& gap) { return static_cast<double>(gap.end - gap.begin) / 1e6; }

std::string gap_line(const std::string& camera, const Gap& gap) {
  std::string line = fmt::format("{}: outage of {:.1f} s on its card: {}, {} frames", camera, seconds_of(gap),
                                 word_of(gap.state), gap.pictures);
  if (!gap.text.empty()) line += ", " + printable(gap.text);
  return line;
}

Json row_of(const Gap& gap) {
  Json missing = Json::array();
  for (const GapStretch& stretch : gap.missing) {
    missing.push_back({{"firstMicroseconds", stretch.begin}, {"lastMicroseconds", stretch.end}});
  }
  return {{"state", word_of(gap.state)}, {"firstMicroseconds", gap.begin}, {"lastMicroseconds", gap.end},
          {"frames", gap.pictures},      {"missing", std::move(missing)},  {"text", gap.text}};
}

// One camera's part of the command.
class CameraAtWork {
 public:
  CameraAtWork(const ChosenCamera& camera, const SessionRecordingOptions& options, int standard_output)
      : recording_(camera.name, files_of(camera, options, standard_output), options.limits) {}

  // A journal's file, beside the recording's own.
  void make_good_outages(const std::string& out, const RecordingFiles::Open& open, const SessionOptions& session) {
    gaps_ = std::make_unique<GapRecording>(out, open);
    BackfillOptions options;
    options.journal = name_of_gaps(out) + ".journal";
    backfill_ = std::make_unique<Backfill>(session, options, gaps_->callbacks());
  }
  [[nodiscard]] const GapRecording* gaps() const { return gaps_.get(); }
  // One line for each gap that has ended meanwhile.
  void report_gaps(Terminal& terminal) {
    if (!gaps_) return;
    for (const Gap& gap : gaps_->take_ended()) terminal.say(gap_line(recording_.name(), gap));
  }
  // When the group has been destroyed.
  void end_backfill() {
    backfill_.reset();
    if (gaps_) gaps_->close();
  }

  [[nodiscard]] bool begin(SessionGroup& group, const SessionOptions& session,
                           const std::function<void(const CameraRecording&)>& news) {
    SessionCallbacks callbacks;
    callbacks.state = [this, news](Session&, const SessionStatus& status) {
      recording_.take_state(status, Clock::now());
      news(recording_);
    };
    callbacks.frame = [this](Session& own, const SessionFrame& frame) {
      recording_.take_picture(frame, counted(own), Clock::now());
    };
    session_ = group.Open(session, backfill_ ? backfill_->Watch(callbacks) : callbacks);
    return session_ != nullptr;
  }

  // Ends what is to be ended; true when the recording is over.
  bool look(bool interrupted) {
    if (recording_.is_over()) return true;
    recording_.look(Clock::now());
    if (!interrupted && !recording_.wanted_end()) return false;
    if (!interrupted && recording_.how() == RecordingEnd::kComplete && is_fetching()) return false;
    recording_.end(RecordingEnd::kInterrupted, counted(*session_), Clock::now());
    session_->Stop();
    return true;
  }

  [[nodiscard]] const CameraRecording& recording() const { return recording_; }

 private:
  // While the camera is there.
  [[nodiscard]] bool is_fetching() const {
    if (!backfill_ || !recording_.is_live()) return false;
    const std::vector<Gap> gaps = backfill_->Gaps();
    return std::any_of(gaps.begin(), gaps.end(), [](const Gap& gap) { return gap.state == GapState::kDue; });
  }
  static RecordingFiles files_of(const ChosenCamera& camera, const SessionRecordingOptions& options,
                                 int standard_output) {
    std::optional<std::chrono::microseconds> segment;
    if (options.segment) segment = std::chrono::microseconds(std::llround(*options.segment * 1e6));
    return RecordingFiles(with_camera_name(options.out, camera.name), segment, opener(options, standard_output));
  }
  static StreamStatistics counted(const Session& session) {
    StreamStatistics statistics;
    session.Statistics(statistics);
    return statistics;
  }

  CameraRecording recording_;
  std::unique_ptr<GapRecording> gaps_;
  std::unique_ptr<Backfill> backfill_;  // calls the gaps' recording
  std::shared_ptr<Session> session_;
};

std::string progress_line(const std::deque<CameraAtWork>& cameras, Clock::time_point now) {
  std::size_t live = 0;
  std::uint64_t frames = 0;
  double rate = 0;
  for (const CameraAtWork& camera : cameras) {
    live += camera.recording().is_live() && !camera.recording().is_over() ? 1U : 0U;
    frames += camera.recording().meter().frames();
    if (!camera.recording().is_over()) rate += camera.recording().meter().recent_bit_rate(now);
  }
  return fmt::format("{} of {} cameras live  {:7} frames  {:7.2f} Mbit/s", live, cameras.size(), frames, rate / 1e6);
}

std::string line_of(const CameraRecording& recording) {
  const RecordingMeter& meter = recording.meter();
  std::string line = fmt::format("{}: ", recording.name());
  if (meter.frames() == 0) return line + "no picture\n";
  line += recording.files().path();
  if (recording.files().count() > 1) line += fmt::format(" and {} files before it", recording.files().count() - 1);
  line += fmt::format(": {} frames in {:.2f} s, {} key frames, {} bytes, {:.2f} Mbit/s", meter.frames(),
                      meter.elapsed(recording.ended()).count(), meter.key_frames(), meter.bytes(),
                      meter.mean_bit_rate() / 1e6);
  if (recording.outages() > 0) {
    line += fmt::format(", {} outage{} of {:.1f} s", recording.outages(), recording.outages() == 1 ? "" : "s",
                        recording.outage_time().count());
  }
  if (recording.lost().any()) line += ", " + recording.lost().text();
  return line + "\n";
}

Json row_of(const CameraRecording& recording) {
  const RecordingMeter& meter = recording.meter();
  const auto& stream = meter.stream();
  return {{"camera", recording.name()},
          {"file", meter.frames() > 0 ? Json(recording.files().path()) : Json(nullptr)},
          {"files", recording.files().count()},
          {"codec", recording.codec() ? Json(name_of(*recording.codec())) : Json(nullptr)},
          {"end", name_of(recording.how())},
          {"seconds", meter.elapsed(recording.ended()).count()},
          {"frames", meter.frames()},
          {"keyFrames", meter.key_frames()},
          {"bytes", meter.bytes()},
          {"bitsPerSecond", static_cast<std::uint64_t>(meter.mean_bit_rate())},
          {"width", stream ? Json(stream->width) : Json(nullptr)},
          {"height", stream ? Json(stream->height) : Json(nullptr)},
          {"outages", recording.outages()},
          {"outageSeconds", recording.outage_time().count()},
          {"lost", json_of(recording.lost())}};
}

ExitCode summarise(const std::deque<CameraAtWork>& cameras, const SessionRecordingOptions& options,
                   Terminal& terminal) {
  std::string text;
  Json list = Json::array();
  for (const CameraAtWork& camera : cameras) {
    text += line_of(camera.recording());
    list.push_back(row_of(camera.recording()));
    if (camera.gaps() == nullptr) continue;
    Json& gaps = list.back()["gaps"] = Json::array();
    for (const Gap& gap : camera.gaps()->ended()) gaps.push_back(row_of(gap));
  }
  if (options.camera.json) text = to_text(list);
  if (options.out != "-") return write_result(terminal, text);
  text.pop_back();
  terminal.say(text);
  return ExitCode::kOk;
}

// The first camera's that failed; then whether pictures were lost.
ExitCode judge(const std::deque<CameraAtWork>& cameras, bool strict, Terminal& terminal) {
  ExitCode code = ExitCode::kOk;
  bool whole = true;
  for (const CameraAtWork& camera : cameras) {
    const CameraRecording& recording = camera.recording();
    whole = whole && !recording.lost().any() && recording.outages() == 0;
    const auto of_gaps = camera.gaps() != nullptr ? camera.gaps()->problem() : std::nullopt;
    for (const std::optional<Problem>& problem : {recording.problem(), of_gaps}) {
      if (!problem) continue;
      const ExitCode reported = terminal.report(*problem);
      if (code == ExitCode::kOk) code = reported;
    }
  }
  return code == ExitCode::kOk && strict && !whole ? ExitCode::kIncomplete : code;
}

}  // namespace

std::string with_camera_name(std::string text, const std::string& camera) {
  const std::string name = file_name_of(camera, "");
  for (std::size_t at = 0; (at = text.find(kCameraPlace, at)) != std::string::npos; at += name.size()) {
    text.replace(at, kCameraPlace.size(), name);
  }
  return text;
}

std::optional<Problem> check(const SessionRecordingOptions& options, const Terminal& terminal) {
  if (options.camera.trace) {
    return usage("--trace shows one driver's requests, without --forever, --segment and other cameras",
                 "--cgi-log keeps the requests over HTTP of each camera.");
  }
  if (options.segment && !(*options.segment >= 1 && *options.segment <= 86400.0 * 366)) {
    return usage("--segment is not a number of seconds from 1 on", "For instance: --segment 600.");
  }
  if (options.out == "-" && (options.segment || options.cameras.size() > 1)) {
    return usage("standard output takes one recording of one camera", "Give --out a file's name.");
  }
  if (options.cameras.size() > 1 && options.out.find(kCameraPlace) == std::string::npos) {
    return usage("--out names one file for several cameras", "For instance: --out {camera}.mp4.");
  }
  if (options.out == "-" && options.backfill) {
    return usage("--backfill writes files of its own, beside --out", "Give --out a file's name.");
  }
  std::set<std::string> names;
  for (const ChosenCamera& camera : options.cameras) {
    const std::string out = with_camera_name(options.out, camera.name);
    if (auto problem = RecordingTarget(out, terminal.results(), options.format).check()) return problem;
    if (!names.insert(out).second) return usage("--out gives two cameras the same file", "Give them other names.");
    if (!options.camera.cgi_log) continue;
    if (auto problem = check_cgi_log_target(with_camera_name(*options.camera.cgi_log, camera.name))) return problem;
  }
  return std::nullopt;
}

ExitCode record_by_sessions(const SessionRecordingOptions& options, Terminal& terminal) {
  Interrupt::finish_orderly();
  std::deque<CameraAtWork> cameras;
  SessionNews news(terminal);
  // Without threads of its own, so that all of it happens here; destroyed first, as it calls the others.
  std::optional<SessionGroup> group(std::in_place, without_threads());
  for (const ChosenCamera& camera : options.cameras) {
    SessionOptions session = session_options(camera, options.camera, options.stream);
    session.cgiLog = with_camera_name(session.cgiLog, camera.name);
    CameraAtWork& work = cameras.emplace_back(camera, options, terminal.results());
    if (options.backfill) {
      work.make_good_outages(with_camera_name(options.out, camera.name), opener(options, terminal.results()), session);
    }
    if (!work.begin(*group, session, [&news](const CameraRecording& own) { news.show(own.name(), own.status()); })) {
      return terminal.report(no_session());
    }
  }
  Progress progress(terminal);
  for (;;) {
    const bool interrupted = Interrupt::requested();
    const auto over =
        std::count_if(cameras.begin(), cameras.end(), [&](CameraAtWork& c) { return c.look(interrupted); });
    if (static_cast<std::size_t>(over) == cameras.size()) break;
    group->Process(kTurn);
    for (CameraAtWork& camera : cameras) camera.report_gaps(terminal);
    progress.show([&] { return progress_line(cameras, Clock::now()); });
  }
  terminal.progress("closing the sessions");
  group.reset();
  for (CameraAtWork& camera : cameras) {
    camera.end_backfill();
    camera.report_gaps(terminal);
  }
  const ExitCode written = summarise(cameras, options, terminal);
  const ExitCode code = judge(cameras, options.strict, terminal);
  if (Interrupt::requested()) {
    terminal.say("vexactl: interrupted; what was recorded is complete up to here");
    return ExitCode::kInterrupted;
  }
  return code == ExitCode::kOk ? written : code;
}

}  // namespace vexa::host
