// SPDX-License-Identifier: Apache-2.0
// vexactl record: live video into a file.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <chrono>
#include <nlohmann/json.hpp>
#include <vector>

#include "host/base/printable.h"
#include "host/camera/camera_options.h"
#include "host/camera/video_options.h"
#include "host/commands/command.h"
#include "host/commands/session_recording.h"
#include "host/console/interrupt.h"
#include "host/console/progress.h"
#include "host/console/terminal.h"
#include "host/recording/lost_pictures.h"
#include "host/recording/recorder.h"
#include "host/recording/recording_target.h"
#include "vexa/statistics.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;
using Clock = RecordingMeter::Clock;

constexpr double kLongestRecording = 366.0 * 24 * 3600;
constexpr std::chrono::milliseconds kShortestSilence{2000};

struct RecordOptions {
  CameraOptions camera;
  std::vector<std::string> cameras;
  std::optional<double> seconds;
  std::optional<std::int64_t> frames;
  std::string out;
  std::optional<std::string> format;
  std::optional<double> segment;
  VideoOptions video;
  bool forever = false;
  bool strict = false;
  bool backfill = false;
  bool quiet = false;
};

// The summary's content, as text and as JSON.
struct Recording {
  std::string camera;
  std::string model;
  std::string file;
  std::string codec;
  RecordingEnd end;
  RecordingMeter meter;
  LostPictures lost;
  Clock::time_point ended;

  [[nodiscard]] double seconds() const { return meter.elapsed(ended).count(); }
};

std::optional<Problem> check(const RecordOptions& options) {
  if (options.seconds && !(*options.seconds > 0 && *options.seconds <= kLongestRecording)) {
    return Problem{ExitCode::kUsage, "--seconds is not a number above 0", "For instance: --seconds 10."};
  }
  if (options.frames && *options.frames < 1) {
    return Problem{ExitCode::kUsage, "--frames is not a number above 0", "For instance: --frames 250."};
  }
  if (auto problem = check_video_options(options.video)) return problem;
  if (options.out.empty()) return Problem{ExitCode::kUsage, "--out names no file", "For instance: --out live.h264."};
  return std::nullopt;
}

std::string missing_text(const RecordingMeter& meter, Clock::time_point now) {
  const auto missing = meter.missing_frames(now);
  if (!missing) return "drops unknown";
  return fmt::format("drops ~{}", *missing);
}

std::string progress_line(const RecordingMeter& meter, Clock::time_point now) {
  if (meter.frames() == 0) return "waiting for a key picture";
  return fmt::format("{:8.1f} s  {:7} frames  {:7.2f} Mbit/s  {}", meter.elapsed(now).count(), meter.frames(),
                     meter.recent_bit_rate(now) / 1e6, missing_text(meter, now));
}

std::string summary_line(const Recording& recording) {
  const RecordingMeter& meter = recording.meter;
  std::string line =
      fmt::format("{}: {} frames in {:.2f} s, {} key frames, {} bytes, {:.2f} Mbit/s", recording.file, meter.frames(),
                  recording.seconds(), meter.key_frames(), meter.bytes(), meter.mean_bit_rate() / 1e6);
  if (meter.stream()) line += fmt::format(", {}x{}", meter.stream()->width, meter.stream()->height);
  if (const auto expected = meter.expected_frames(recording.ended)) {
    line += fmt::format(", about {} of {} frames missing at {:.4g} fps", *meter.missing_frames(recording.ended),
                        *expected, meter.stated_rate());
  }
  return line + "\n";
}

template <typename Value>
Json or_null(const std::optional<Value>& value) {
  return value ? Json(*value) : Json(nullptr);
}

Json to_json(const Recording& recording) {
  const RecordingMeter& meter = recording.meter;
  Json json = {{"camera", recording.camera},    {"modelName", recording.model},
               {"file", recording.file},        {"codec", recording.codec},
               {"end", name_of(recording.end)}, {"seconds", recording.seconds()},
               {"frames", meter.frames()},      {"keyFrames", meter.key_frames()},
               {"bytes", meter.bytes()},        {"bitsPerSecond", static_cast<std::uint64_t>(meter.mean_bit_rate())}};
  const auto& stream = meter.stream();
  json["width"] = stream ? Json(stream->width) : Json(nullptr);
  json["height"] = stream ? Json(stream->height) : Json(nullptr);
  json["statedFramesPerSecond"] = meter.stated_rate() > 0 ? Json(meter.stated_rate()) : Json(nullptr);
  json["expectedFrames"] = or_null(meter.expected_frames(recording.ended));
  json["missingFramesEstimate"] = or_null(meter.missing_frames(recording.ended));
  json["lost"] = json_of(recording.lost);
  return json;
}

class RecordCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("record", "Record live video into files");
    add_options_of_cameras(*command, options_.camera, options_.cameras, environment);
    command
        ->add_option("--out", options_.out,
                     "file to write: .mkv or .mp4, or the pictures alone: .h264, .m4v, .mjpeg; - is standard output;\n"
                     "{camera} stands for the camera's name")
        ->required()
        ->type_name("FILE");
    command->add_option("--format", options_.format, "mkv, mp4, h264, m4v or mjpeg, whatever --out ends in")
        ->type_name("WORD");
    command->add_option("--seconds", options_.seconds, "end after this many seconds of video")->type_name("N");
    command->add_option("--frames", options_.frames, "end after this many frames")->type_name("N");
    command->add_flag("--forever", options_.forever, "go on through outages, and wait for a camera that is not there");
    command
        ->add_option("--segment", options_.segment,
                     "a file of its own for every so many seconds, with the time in its name; each begins with a key\n"
                     "picture")
        ->type_name("SECONDS");
    command->add_flag("--backfill", options_.backfill,
                      "fetch what the camera's card recorded during outages, into a file for each beside --out, named\n"
                      "-gap with its time; what is not fetched yet is in a .journal and fetched by the next recording");
    command->add_flag("--strict", options_.strict, "end with exit code 6 when pictures were lost");
    add_video_options(*command, options_.video);
    command->add_flag("--quiet", options_.quiet, "show no progress");
    command->footer(
        "A recording begins with the first key frame and, without --seconds and --frames, ends with Ctrl-C.\n"
        "Every second of it is written at once: what is killed plays up to its last second.\n"
        "With --forever, --segment, --backfill or several cameras it lives through outages, and reports them on "
        "standard error.\n"
        "With --backfill a recording ends when the outages before its end have been fetched, too.\n"
        "Drops are an estimate: frames expected at the rate that stream or camera state, less those received.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (const auto problem = check(options_)) return terminal.report(*problem);
    if (options_.quiet) terminal.silence_progress();
    options_.camera.transport = transport_of(options_.video);
    if (options_.forever || options_.segment || options_.backfill || options_.cameras.size() != 1)
      return record_many(terminal);
    const RecordingTarget target(out_of_one(), terminal.results(), options_.format);
    if (const auto problem = target.check()) return terminal.report(*problem);
    options_.camera.address = options_.cameras.front();
    Result<OpenCamera> opened = open_camera(options_.camera, terminal);
    if (!opened) return terminal.report(opened.error());
    return record(*opened, target, terminal);
  }

 private:
  // A camera that sends a picture a second is not silent.
  [[nodiscard]] std::chrono::milliseconds silence() const {
    return std::max(kShortestSilence, std::chrono::milliseconds(options_.camera.timeout_ms));
  }
  [[nodiscard]] bool to_standard_output() const { return options_.out == "-"; }

  // As for many, so that a script need not count its cameras.
  [[nodiscard]] std::string out_of_one() const { return with_camera_name(options_.out, options_.cameras.front()); }

  ExitCode record_many(Terminal& terminal) {
    if (const auto problem = check_camera_options(options_.camera)) return terminal.report(*problem);
    Result<std::vector<ChosenCamera>> chosen = choose_cameras(options_.camera, options_.cameras);
    if (!chosen) return terminal.report(chosen.error());
    CameraRecording::Limits limits;
    limits.seconds = options_.seconds;
    if (options_.frames) limits.frames = static_cast<std::uint64_t>(*options_.frames);
    limits.forever = options_.forever;
    const SessionRecordingOptions recording{options_.camera, *std::move(chosen), options_.video.stream,
                                            options_.out,    options_.format,    options_.segment,
                                            limits,          options_.strict,    options_.backfill};
    if (const auto problem = check(recording, terminal)) return terminal.report(*problem);
    return record_by_sessions(recording, terminal);
  }

  static LostPictures counted(OpenCamera& camera, std::uint64_t pictures_of_the_recording = 0) {
    StreamStatistics statistics;
    GetStreamStatistics(*camera.driver, statistics);
    statistics.framesBegun -= std::min(statistics.framesBegun, pictures_of_the_recording);
    return LostPictures(statistics);
  }

  ExitCode record(OpenCamera& camera, const RecordingTarget& target, Terminal& terminal) {
    terminal.progress("connecting");
    // Asked first: it finds a wrong address or password within the time-out, which opening a stream may exceed.
    const Result<LiveCamera::Identity> identity = camera.driver->identify(options_.video.stream);
    if (!identity) return terminal.report(identity.error());
    if (const auto problem = other_codec(target, identity->video)) return terminal.report(*problem);
    const std::unique_ptr<PictureTarget> file = target.open();
    Interrupt::finish_orderly();
    const ELibDReturnCode result = camera.driver->StartVideoStreaming();
    if (result != LIBD_OK) return terminal.report(camera.driver->explain(result));
    Recorder recorder(*camera.driver, *file,
                      {.seconds = options_.seconds,
                       .frames = options_.frames,
                       .camera_rate = static_cast<double>(identity->video.frameRate),
                       .silence = silence()});
    std::optional<LostPictures> before;
    const RecordingEnd end = recorder.run([&, progress = progress_on(terminal)](const RecordingMeter& meter, auto now) {
      if (!before && meter.frames() > 0) before = counted(camera, 1);
      progress(meter, now);
    });
    const LostPictures lost = before ? counted(camera).since(*before) : LostPictures();
    const Clock::time_point ended = Clock::now();
    terminal.progress("closing the session");
    camera.driver->StopVideoStreaming();
    std::optional<Problem> problem = recorder.problem();
    if (const auto at_close = file->close(); at_close && !problem) problem = at_close;
    const ExitCode written = summarise({to_string(camera.address), identity->system.modelName, file->path(),
                                        identity->video.codecName, end, recorder.meter(), lost, ended},
                                       terminal);
    if (problem) return terminal.report(*problem);
    if (lost.any()) terminal.say("vexactl: " + lost.text());
    const ExitCode code = judge(end, terminal);
    if (code == ExitCode::kOk && written == ExitCode::kOk && options_.strict && lost.any())
      return ExitCode::kIncomplete;
    return code == ExitCode::kOk ? written : code;
  }

  // When the file's name promises another codec than the camera sends.
  [[nodiscard]] std::optional<Problem> other_codec(const RecordingTarget& target, const SLibDCameraInfo& video) const {
    const auto promised = target.codec();
    const auto sent = codec_named(video.codecName);
    if (!promised || sent == promised) return std::nullopt;
    return Problem{
        ExitCode::kNoVideo,
        fmt::format("video stream {} of the camera is set to {}", options_.video.stream, printable(video.codecName)),
        sent ? fmt::format("Set it to {} on the camera, choose another with --stream, or end --out in {} or .mkv.",
                           name_of(*promised), usual_extension(*sent))
             : fmt::format("Set it to {} on the camera, or choose another with --stream.", name_of(*promised))};
  }

  static Recorder::Progress progress_on(Terminal& terminal) {
    return [progress = Progress(terminal)](const RecordingMeter& meter, Clock::time_point now) mutable {
      progress.show([&] { return progress_line(meter, now); });
    };
  }

  // Where the pictures themselves went to standard output, the summary goes to standard error.
  ExitCode summarise(const Recording& recording, Terminal& terminal) const {
    std::string text = options_.camera.json ? to_text(to_json(recording)) : summary_line(recording);
    if (!to_standard_output()) return write_result(terminal, text);
    text.pop_back();
    terminal.say(text);
    return ExitCode::kOk;
  }

  [[nodiscard]] ExitCode judge(RecordingEnd end, Terminal& terminal) const {
    switch (end) {
      case RecordingEnd::kComplete:
        return ExitCode::kOk;
      case RecordingEnd::kInterrupted:
        terminal.say("vexactl: interrupted; what was recorded is complete up to here");
        return ExitCode::kInterrupted;
      case RecordingEnd::kSilent:
        return terminal.report({ExitCode::kNoVideo,
                                fmt::format("the camera has sent no picture for {} ms", silence().count()),
                                "Check its network and encoder settings; --timeout makes the wait longer."});
      case RecordingEnd::kNoKeyPicture:
        return terminal.report({ExitCode::kNoVideo, "the camera has sent no key picture to begin with",
                                "Shorten the key-frame interval of the stream."});
      case RecordingEnd::kCannotWrite:
        break;
    }
    return ExitCode::kCannotWrite;
  }

  RecordOptions options_;
};

}  // namespace

std::unique_ptr<Command> make_record_command() { return std::make_unique<RecordCommand>(); }

}  // namespace vexa::host
