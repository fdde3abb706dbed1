// SPDX-License-Identifier: Apache-2.0
// vexactl snapshot: one picture of live video into a file.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <nlohmann/json.hpp>

#include "host/base/printable.h"
#include "host/camera/camera_options.h"
#include "host/camera/live_pictures.h"
#include "host/camera/one_session.h"
#include "host/camera/video_options.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"
#include "host/picture/picture_decoder.h"
#include "host/picture/picture_file.h"
#include "host/recording/frame_file.h"

namespace vexa::host {
namespace {

class SnapshotCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command = program.add_subcommand("snapshot", "Save one picture of live video");
    add_camera_options(*command, camera_, environment);
    command->add_option("--out", out_, "file to write: .jpg, .jpeg or .png; - is standard output")
        ->required()
        ->type_name("FILE");
    command->add_option("--format", format_, "jpg or png, whatever --out ends in; jpg for standard output")
        ->type_name("WORD")
        ->check(CLI::IsMember({"jpg", "png"}));
    command->add_flag("--forever", forever_, "wait for a camera that is not there, however long");
    add_video_options(*command, video_);
    command->footer(
        "A .jpg of a JPEG stream is the picture as the camera sent it. Everything else is decoded first, for which\n"
        "vexactl must have been built with FFmpeg's libraries.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const auto format = format_of_picture();
    if (!format) return terminal.report(usage("--out names no picture", "For instance: --out live.jpg, or live.png."));
    if (const auto problem = check_video_options(video_)) return terminal.report(*problem);
    if (const auto problem = target(terminal).check()) return terminal.report(*problem);
    camera_.transport = transport_of(video_);
    if (forever_) return take_by_session(*format, terminal);
    Result<OpenCamera> opened = open_camera(camera_, terminal);
    if (!opened) return terminal.report(opened.error());
    return take(*opened, *format, terminal);
  }

 private:
  [[nodiscard]] bool to_standard_output() const { return out_ == "-"; }

  [[nodiscard]] std::optional<PictureFormat> format_of_picture() const {
    if (out_.empty()) return std::nullopt;
    if (format_.empty()) return to_standard_output() ? PictureFormat::kJpeg : picture_format_of(out_);
    return format_ == "png" ? PictureFormat::kPng : PictureFormat::kJpeg;
  }

  [[nodiscard]] FrameFile target(const Terminal& terminal) const {
    return to_standard_output() ? FrameFile("standard output", terminal.results()) : FrameFile(out_);
  }

  ExitCode take(OpenCamera& camera, PictureFormat format, Terminal& terminal) {
    terminal.progress("connecting");
    const Result<LiveCamera::Identity> identity = camera.driver->identify(video_.stream);
    if (!identity) return terminal.report(identity.error());
    const std::string& codec = identity->video.codecName;
    const bool jpeg_as_sent = format == PictureFormat::kJpeg && codec_named(codec) == Codec::kJpeg;
    const bool possible = has_ffmpeg() || jpeg_as_sent;
    if (!possible) return terminal.report(without_ffmpeg(fmt::format("a picture of {} video", printable(codec))));
    terminal.progress("waiting for a key picture");
    const Result<FrameBytes> bytes = newest_picture(*camera.driver, format);
    if (!bytes) return terminal.report(bytes.error());
    if (const auto problem = write_whole_file(target(terminal), *bytes)) return terminal.report(*problem);
    return summarise(to_string(camera.address), identity->system.modelName, codec, bytes->size(), terminal);
  }

  // As the bytes of a file.
  static Result<FrameBytes> newest_picture(LiveCamera& camera, PictureFormat format) {
    LivePictures pictures(camera);
    if (auto problem = await_key_frame(camera, pictures)) return fail(*std::move(problem));
    return as_file(pictures.newest(), format);
  }

  static Result<FrameBytes> as_file(const PictureGroup& group, PictureFormat format) {
    if (format == PictureFormat::kJpeg) return jpeg_of(group.codec, group.frames);
    const Result<Picture> decoded = decode_picture(group.codec, group.frames);
    if (!decoded) return fail(decoded.error());
    return encode_picture(*decoded, format);
  }

  // The first key picture that comes.
  ExitCode take_by_session(PictureFormat format, Terminal& terminal) {
    const Result<SessionOptions> session = session_of(camera_, std::nullopt, video_.stream, kVideoStream);
    if (!session) return terminal.report(session.error());
    PictureGroup group;
    SessionWork work;
    work.callbacks.frame = [&group](Session&, const SessionFrame& frame) {
      const std::optional<Codec> codec = codec_of_frame(frame.frameType);
      if (!group.frames.empty() || !frame.isKey || !codec) return;
      group = {*codec, {FrameBytes(frame.data, frame.data + frame.length)}};
    };
    work.is_done = [&group] { return !group.frames.empty(); };
    const std::optional<Problem> ended = work_by_session(*session, work, terminal);
    if (ended && ended->code == ExitCode::kInterrupted) return ended->code;
    if (ended) return terminal.report(*ended);
    const Result<FrameBytes> bytes = as_file(group, format);
    if (!bytes) return terminal.report(bytes.error());
    if (const auto problem = write_whole_file(target(terminal), *bytes)) return terminal.report(*problem);
    return summarise(session->name, "", name_of(group.codec), bytes->size(), terminal);
  }

  ExitCode summarise(const std::string& camera, const std::string& model, const std::string& codec, std::size_t size,
                     Terminal& terminal) const {
    std::string text = fmt::format("{}: {} bytes, from {} video\n", out_, size, printable(codec));
    if (camera_.json) {
      text = to_text({{"camera", camera},
                      {"modelName", model.empty() ? nlohmann::ordered_json(nullptr) : nlohmann::ordered_json(model)},
                      {"file", out_},
                      {"codec", codec},
                      {"bytes", size}});
    }
    if (!to_standard_output()) return write_result(terminal, text);
    text.pop_back();
    terminal.say(text);
    return ExitCode::kOk;
  }

  CameraOptions camera_;
  VideoOptions video_;
  std::string out_;
  std::string format_;
  bool forever_ = false;
};

}  // namespace

std::unique_ptr<Command> make_snapshot_command() { return std::make_unique<SnapshotCommand>(); }

}  // namespace vexa::host
