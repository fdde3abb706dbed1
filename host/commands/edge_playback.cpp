// SPDX-License-Identifier: Apache-2.0
// vexactl edge play, get and backfill: recordings played by the camera, counted or kept in files.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <chrono>
#include <filesystem>
#include <nlohmann/json.hpp>

#include "host/base/printable.h"
#include "host/commands/edge_actions.h"
#include "host/console/interrupt.h"
#include "host/console/progress.h"
#include "host/console/terminal.h"
#include "host/picture/picture_decoder.h"
#include "host/recording/playback_taker.h"
#include "host/recording/recording_target.h"
#include "host/words/utc_time.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

// The result of playing a recording.
struct TakenRecording {
  std::string name;
  std::string file;  // empty: only counted
  RecordingEnd end;
  PlaybackProgress progress;
  std::optional<Problem> problem;
};

std::string line_of(const TakenRecording& taken) {
  const PlaybackProgress& progress = taken.progress;
  return fmt::format("{}: {} frames, {:.3f} s from {}, {} bytes\n",
                     printable(taken.file.empty() ? taken.name : taken.file), progress.frames, progress.taken().count(),
                     utc_text(std::chrono::duration_cast<std::chrono::seconds>(progress.first)), progress.bytes);
}

Json object_of(const TakenRecording& taken) {
  const PlaybackProgress& progress = taken.progress;
  return {{"name", taken.name},
          {"file", taken.file.empty() ? Json(nullptr) : Json(taken.file)},
          {"end", name_of(taken.end)},
          {"frames", progress.frames},
          {"bytes", progress.bytes},
          {"firstMicroseconds", progress.first.count()},
          {"lastMicroseconds", progress.last.count()}};
}

std::optional<Problem> problem_of(RecordingEnd end) {
  switch (end) {
    case RecordingEnd::kComplete:
    case RecordingEnd::kCannotWrite:  // has its own
      return std::nullopt;
    case RecordingEnd::kInterrupted:
      return Problem{ExitCode::kInterrupted, "interrupted; what was taken is complete up to here", ""};
    case RecordingEnd::kNoKeyPicture:
      return Problem{ExitCode::kNoVideo, "the camera has sent no picture of the recording",
                     "vexactl edge CAMERA list shows whether it is still there."};
    case RecordingEnd::kSilent:
      return Problem{ExitCode::kNoVideo, "the camera has stopped sending before the end of the recording",
                     "What came is kept. vexactl edge CAMERA list shows whether the recording is still there."};
  }
  return std::nullopt;
}

class PlaybackAction : public CameraAction {
 protected:
  void declare_scale(CLI::App& action) {
    action.add_option("--scale", scale_, "speed of the playback, as the camera offers it; -1 is backward")
        ->type_name("N");
  }
  void declare_name(CLI::App& action) {
    action.add_option("name", name_, "of the recording")->required()->type_name("");
  }
  [[nodiscard]] std::optional<Problem> check_scale() const {
    if (scale_ != 0) return std::nullopt;
    return usage("--scale is 0", "For instance: --scale 2.");
  }

  [[nodiscard]] const std::string& name() const { return name_; }

  // Plays the recording to its end, or as far as it comes.
  TakenRecording take(const ModelCamera& camera, const SLibDEdgeStorageRecord& record, PictureTarget* target,
                      Terminal& terminal) const {
    TakenRecording taken{record.streamName, target != nullptr ? target->path() : "", RecordingEnd::kSilent, {}, {}};
    const std::optional<Codec> codec = codec_listed_as(record.imageCodec);
    if (!codec) {
      taken.problem = Problem{ExitCode::kNoVideo,
                              fmt::format("the recording's codec cannot be played: {}", printable(record.imageCodec)),
                              "JPEG, MPEG-4 and H.264 can."};
      return taken;
    }
    Interrupt::finish_orderly();
    const ELibDReturnCode started =
        camera.device().StartEdgeStorageVideoStreaming({record.streamName, name_of(*codec), scale_});
    if (started != LIBD_OK) {
      taken.problem = camera.explain(started);
      return taken;
    }
    PlaybackTaker taker(camera.device(), target, limits(camera, record));
    taken.end = taker.run(progress_on(terminal, record));
    terminal.clear_progress();
    camera.device().StopVideoStreaming();
    taken.progress = taker.progress();
    taken.problem = taker.problem() ? taker.problem() : problem_of(taken.end);
    if (target == nullptr) return taken;
    if (const auto at_close = target->close(); at_close && !taken.problem) taken.problem = at_close;
    return taken;
  }

  ExitCode report(const TakenRecording& taken, Terminal& terminal) const {
    const ExitCode written = write_result(terminal, json() ? to_text(object_of(taken)) : line_of(taken));
    return taken.problem ? terminal.report(*taken.problem) : written;
  }

 private:
  [[nodiscard]] PlaybackLimits limits(const ModelCamera& camera, const SLibDEdgeStorageRecord& record) const {
    // A recording with a picture a second is not silent.
    const std::chrono::milliseconds two_pictures(2000 / std::clamp(record.frameRate, 1, 1000));
    return {end_of(record), scale_, std::max(two_pictures, std::chrono::milliseconds(camera.timeout_ms()))};
  }

  static PlaybackTaker::Report progress_on(Terminal& terminal, const SLibDEdgeStorageRecord& record) {
    return [&record, line = Progress(terminal)](const PlaybackProgress& progress) mutable {
      line.show([&] {
        return fmt::format("{:8.1f} of {} s  {:7} frames", progress.taken().count(), record.end - record.start,
                           progress.frames);
      });
    };
  }

  std::string name_;
  int scale_ = 1;
};

class PlayRecordingAction final : public PlaybackAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("play", "Play a recording, and count its pictures");
    declare_name(*action);
    declare_scale(*action);
    return action;
  }
  std::optional<Problem> check() override { return check_scale(); }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const Result<SLibDEdgeStorageRecord> found = find_recording(camera, name());
    if (!found) return terminal.report(found.error());
    return report(take(camera, *found, nullptr, terminal), terminal);
  }
};

class GetRecordingAction final : public PlaybackAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("get", "Fetch a recording into a file");
    declare_name(*action);
    action->add_option("--out", out_, "file to write: .mkv or .mp4, or the pictures alone: .h264, .m4v, .mjpeg")
        ->required()
        ->type_name("FILE");
    declare_scale(*action);
    return action;
  }

  std::optional<Problem> check() override {
    if (out_.empty()) return usage("--out names no file", "For instance: --out gap.mkv.");
    if (auto problem = target().check()) return problem;
    return check_scale();
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const Result<SLibDEdgeStorageRecord> record = find_recording(camera, name());
    if (!record) return terminal.report(record.error());
    const std::optional<Codec> codec = codec_listed_as(record->imageCodec);
    if (const auto promised = target().codec(); codec && promised && promised != codec) {
      return terminal.report({ExitCode::kNoVideo, fmt::format("the recording is of {}", printable(record->imageCodec)),
                              fmt::format("End --out in {} or .mkv.", usual_extension(*codec))});
    }
    const std::unique_ptr<PictureTarget> file = target().open();
    return report(take(camera, *record, file.get(), terminal), terminal);
  }

 private:
  // Always a file: "./-" for one that is named "-".
  [[nodiscard]] RecordingTarget target() const { return RecordingTarget(out_ == "-" ? "./-" : out_, -1); }

  std::string out_;
};

class BackfillAction final : public PlaybackAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("backfill", "Fetch everything recorded since a given time");
    action->add_option("--since", since_, "such as 2024-01-31T23:59:59, in UTC")->required()->type_name("TIME");
    action->add_option("--out", out_, "folder for the files, .mkv where FFmpeg's libraries are there")
        ->required()
        ->type_name("DIR");
    declare_scale(*action);
    return action;
  }

  std::optional<Problem> check() override {
    if (!utc_moment(since_)) return usage("--since is not a time", "For instance: --since 2024-01-31T23:59:59.");
    if (out_.empty()) return usage("--out names no folder", "For instance: --out gap.");
    return check_scale();
  }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    const Result<StoredRecordings> listed = list_recordings(camera);
    if (!listed) return terminal.report(listed.error());
    if (const auto problem = make_folder()) return terminal.report(*problem);
    const std::chrono::seconds since = *utc_moment(since_);
    ExitCode code = ExitCode::kOk;
    Json list = Json::array();
    for (const SLibDEdgeStorageRecord& record : *listed) {
      if (end_of(record) < since) continue;
      const TakenRecording taken = fetch(camera, record, terminal);
      if (taken.problem) code = terminal.report(*taken.problem);
      list.push_back(object_of(taken));
      if (!json()) {
        if (const ExitCode written = write_result(terminal, line_of(taken)); written != ExitCode::kOk) return written;
      }
      if (taken.end == RecordingEnd::kInterrupted || code == ExitCode::kCannotWrite) break;
    }
    const ExitCode written = json() ? write_result(terminal, to_text(list)) : ExitCode::kOk;
    return code == ExitCode::kOk ? written : code;
  }

 private:
  [[nodiscard]] std::optional<Problem> make_folder() const {
    std::error_code error;
    std::filesystem::create_directories(out_, error);
    if (!error) return std::nullopt;
    return Problem{ExitCode::kCannotWrite, fmt::format("cannot make the folder {}: {}", out_, error.message()),
                   "Give --out a folder that is there, or a name in one that you may write to."};
  }

  TakenRecording fetch(const ModelCamera& camera, const SLibDEdgeStorageRecord& record, Terminal& terminal) const {
    const std::optional<Codec> codec = codec_listed_as(record.imageCodec);
    const std::string extension = has_ffmpeg() || !codec ? ".mkv" : usual_extension(*codec);
    const std::string name = file_name_of(record.streamName, extension);
    const auto file = RecordingTarget(std::filesystem::path(out_) / name, -1).open();
    return take(camera, record, file.get(), terminal);
  }

  std::string since_;
  std::string out_;
};

}  // namespace

std::unique_ptr<CameraAction> make_play_recording_action() { return std::make_unique<PlayRecordingAction>(); }

std::unique_ptr<CameraAction> make_get_recording_action() { return std::make_unique<GetRecordingAction>(); }

std::unique_ptr<CameraAction> make_backfill_action() { return std::make_unique<BackfillAction>(); }

}  // namespace vexa::host
