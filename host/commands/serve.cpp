// SPDX-License-Identifier: Apache-2.0
// vexactl serve: a page of all cameras of a file, and the same for programs.
#include <fmt/format.h>
#include <time.h>

#include <CLI/CLI.hpp>
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include "host/base/codec.h"
#include "host/camera/session_options.h"
#include "host/commands/command.h"
#include "host/console/interrupt.h"
#include "host/console/terminal.h"
#include "host/serve/gate.h"
#include "host/serve/server.h"
#include "vexa/session.h"

namespace vexa::host {
namespace {

constexpr std::size_t kShortestToken = 16;

std::int64_t wall_clock() {
  timespec now{};
  clock_gettime(CLOCK_REALTIME, &now);
  return std::int64_t{now.tv_sec} * 1000 + now.tv_nsec / 1000000;
}

// The sessions of one command: one a camera for the wall, and one more while somebody views it large. On the thread of
// the event loop.
class Cameras {
 public:
  Cameras(const std::vector<ChosenCamera>& cameras, const CameraOptions& options, Wall& wall)
      : cameras_(cameras), options_(options), wall_(wall), video_(cameras.size()), group_(without_threads()) {}

  [[nodiscard]] bool open() {
    for (std::size_t i = 0; i < cameras_.size(); ++i) {
      wall_.add(cameras_[i].name);
      if (!group_.Open(session_options(cameras_[i], options_, tile_stream(i)), callbacks_of_tile(i))) return false;
    }
    return true;
  }
  [[nodiscard]] SessionGroup& group() { return group_; }

  // The first viewer of its H.264 has come, or the last has gone.
  void want_video(std::size_t index, bool wanted) {
    Video& video = video_[index];
    ++video.round;
    video.wanted = wanted;
    wall_.camera(index).video().clear();
    if (video.session) video.session->Stop();
    video.session = nullptr;
    if (!wanted || tile_stream(index) == kLargeStream) return;
    SessionCallbacks callbacks;
    // What a session that was stopped still delivers is not for the next one's viewers.
    callbacks.frame = [this, index, round = video.round](Session&, const SessionFrame& frame) {
      if (video_[index].round == round) take_video(index, frame);
    };
    callbacks.state = [this, index, round = video.round](Session&, const SessionStatus& status) {
      const bool ended = status.state != SessionState::kLive && status.state != SessionState::kStalled;
      if (ended && video_[index].round == round) wall_.camera(index).video().interrupt();
    };
    video.session = group_.Open(session_options(cameras_[index], options_, kLargeStream), callbacks);
  }

 private:
  static constexpr int kLargeStream = 1;
  struct Video {
    std::shared_ptr<Session> session;  // null where the tile's serves
    std::uint64_t round = 0;
    bool wanted = false;
  };

  [[nodiscard]] int tile_stream(std::size_t index) const { return cameras_[index].tile_stream.value_or(kLargeStream); }

  void take_video(std::size_t index, const SessionFrame& frame) {
    if (codec_of_frame(frame.frameType) == Codec::kH264) wall_.camera(index).video().take(frame);
  }

  SessionCallbacks callbacks_of_tile(std::size_t index) {
    SessionCallbacks callbacks;
    callbacks.state = [this, index](Session&, const SessionStatus& status) { wall_.camera(index).take_status(status); };
    callbacks.frame = [this, index](Session&, const SessionFrame& frame) {
      wall_.camera(index).take_frame(frame, codec_of_frame(frame.frameType) == Codec::kJpeg, wall_clock());
      if (video_[index].wanted && tile_stream(index) == kLargeStream) take_video(index, frame);
    };
    return callbacks;
  }

  const std::vector<ChosenCamera>& cameras_;
  const CameraOptions& options_;
  Wall& wall_;
  std::vector<Video> video_;
  SessionGroup group_;  // goes first: its callbacks use the rest
};

class ServeCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    cameras_.environment = environment;
    read_environment(cameras_.credentials, environment);
    CLI::App* command =
        program.add_subcommand("serve", "Show all cameras of a file on a page, and serve them to programs");
    command->add_option("--cameras", cameras_.cameras_file, "file of cameras")->required()->type_name("FILE");
    command
        ->add_option("--address", options_.address,
                     "where to listen; others than this machine reach no loopback address")
        ->capture_default_str();
    command->add_option("--port", options_.port, "0 takes any free one")->capture_default_str();
    command->add_option("--host", options_.names, "a name under which browsers reach it, as NAME or NAME:PORT")
        ->type_name("NAME")
        ->allow_extra_args(false);
    command->add_option("--token-file", token_file_, "file whose first line is the token [a new one each time]")
        ->type_name("FILE");
    command->add_option("--timeout", cameras_.timeout_ms, "longest wait for a camera's answer, in milliseconds")
        ->type_name("MS")
        ->capture_default_str();
    command->footer(
        "Prints the address of the page, with the token that lets browsers in. Programs send it too:\n"
        "  curl -H 'Authorization: Bearer TOKEN' http://127.0.0.1:8080/api/cameras\n"
        "Paths for programs: /api/cameras, /cameras/NAME/picture.jpg, /cameras/NAME/stream.mjpg, "
        "/cameras/NAME/video.mp4,\n"
        "/metrics, /healthz, /readyz; /openapi.json describes them. Tiles show streams of JPEG: \"tileStream\" in the "
        "file of cameras "
        "names one.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (const auto problem = check_camera_options(cameras_)) return terminal.report(*problem);
    const Result<std::vector<ChosenCamera>> cameras = choose_cameras(cameras_, {});
    if (!cameras) return terminal.report(cameras.error());
    Result<std::string> token = choose_token();
    if (!token) return terminal.report(token.error());
    options_.token = *token;
    options_.version = VEXA_VERSION;
    Wall wall;
    Interrupt::finish_orderly();
    Cameras at_work(*cameras, cameras_, wall);
    options_.want_video = [&at_work](std::size_t camera, bool wanted) { at_work.want_video(camera, wanted); };
    Server server(options_, wall);
    const Result<std::uint16_t> port = server.open();
    if (!port) return terminal.report(port.error());
    if (!at_work.open()) return terminal.report(no_session());
    server.watch(at_work.group().Descriptor(), [&at_work] { at_work.group().Process(0); });
    const ExitCode shown =
        write_result(terminal, fmt::format("http://{}:{}/#token={}\n", options_.address, *port, options_.token));
    if (shown != ExitCode::kOk) return shown;
    server.run([] { return Interrupt::requested(); });
    return ExitCode::kOk;
  }

 private:
  Result<std::string> choose_token() const {
    if (!token_file_) {
      std::string token = random_token();
      if (!token.empty()) return token;
      return fail({ExitCode::kCannotWrite, "the system gives no random numbers", "Give a --token-file."});
    }
    std::ifstream file(*token_file_);
    std::string token;
    if (!std::getline(file, token)) return fail(unreadable(*token_file_, ENOENT));
    const bool plain = token.find_first_not_of("0123456789abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ-_") ==
                       std::string::npos;
    if (plain && token.size() >= kShortestToken && token.size() <= 256) return token;
    return fail(usage(fmt::format("the first line of {} is no token", *token_file_),
                      "A token has 16 to 256 of a-z, A-Z, 0-9, \"-\" and \"_\"."));
  }

  CameraOptions cameras_;
  std::optional<std::string> token_file_;
  ServerOptions options_{.port = 8080};
};

}  // namespace

std::unique_ptr<Command> make_serve_command() { return std::make_unique<ServeCommand>(); }

}  // namespace vexa::host
