// SPDX-License-Identifier: Apache-2.0
// vexactl serve: a page of all cameras of a file, and the same for programs.
#include <fmt/format.h>
#include <time.h>

#include <CLI/CLI.hpp>
#include <fstream>
#include <string>
#include <vector>

#include "host/access/camera_file.h"
#include "host/base/codec.h"
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

SessionCallbacks callbacks_of(WallCamera& camera) {
  SessionCallbacks callbacks;
  callbacks.state = [&camera](Session&, const SessionStatus& status) { camera.take_status(status); };
  callbacks.frame = [&camera](Session&, const SessionFrame& frame) {
    camera.take_frame(frame, codec_of_frame(frame.frameType) == Codec::kJpeg, wall_clock());
  };
  return callbacks;
}

class ServeCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    environment_ = environment;
    read_environment(credentials_, environment);
    CLI::App* command =
        program.add_subcommand("serve", "Show all cameras of a file on a page, and serve them to programs");
    command->add_option("--cameras", cameras_, "file of cameras")->required()->type_name("FILE");
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
    command->footer(
        "Prints the address of the page, with the token that lets browsers in. Programs send it too:\n"
        "  curl -H 'Authorization: Bearer TOKEN' http://127.0.0.1:8080/api/cameras\n"
        "Paths for programs: /api/cameras, /cameras/NAME/picture.jpg, /cameras/NAME/stream.mjpg, /metrics, /healthz,\n"
        "/readyz; /openapi.json describes them. Tiles show streams of JPEG: \"stream\" in the file of cameras names "
        "one.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    const Result<CameraFile> file = CameraFile::read(cameras_);
    if (!file) return terminal.report(file.error());
    Result<std::string> token = choose_token();
    if (!token) return terminal.report(token.error());
    options_.token = *token;
    options_.version = VEXA_VERSION;
    Wall wall;
    std::vector<SessionOptions> sessions;
    for (const FileCamera& camera : file->cameras()) {
      const Result<Credentials> credentials = file->credentials_of(camera, credentials_, environment_);
      if (!credentials) return terminal.report(credentials.error());
      sessions.push_back(session_of(camera, *credentials));
    }
    Interrupt::finish_orderly();
    Server server(options_, wall);
    const Result<std::uint16_t> port = server.open();
    if (!port) return terminal.report(port.error());
    SessionGroupOptions group_options;
    group_options.threads = 0;
    SessionGroup group(group_options);
    for (const SessionOptions& session : sessions) {
      if (!group.Open(session, callbacks_of(wall.add(session.name)))) {
        return terminal.report(
            {ExitCode::kCannotWrite, "there are not enough memory or descriptors", "Serve fewer cameras."});
      }
    }
    server.watch(group.Descriptor(), [&group] { group.Process(0); });
    const ExitCode shown =
        write_result(terminal, fmt::format("http://{}:{}/#token={}\n", options_.address, *port, options_.token));
    if (shown != ExitCode::kOk) return shown;
    server.run([] { return Interrupt::requested(); });
    return ExitCode::kOk;
  }

 private:
  static SessionOptions session_of(const FileCamera& camera, const Credentials& credentials) {
    SessionOptions session;
    session.name = camera.name;
    session.connection.host = camera.address.host;
    session.connection.port = camera.address.port;
    session.connection.userName = credentials.user;
    session.connection.password = credentials.password;
    session.profile = camera.profile.value_or("");
    session.stream = camera.stream.value_or(1);
    return session;
  }

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

  const char* const* environment_ = nullptr;
  CredentialSources credentials_;
  std::string cameras_;
  std::optional<std::string> token_file_;
  ServerOptions options_{.port = 8080};
};

}  // namespace

std::unique_ptr<Command> make_serve_command() { return std::make_unique<ServeCommand>(); }

}  // namespace vexa::host
