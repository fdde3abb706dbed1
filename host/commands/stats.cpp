// SPDX-License-Identifier: Apache-2.0
// vexactl stats: what cameras are doing, and what became of their pictures.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <deque>
#include <memory>
#include <nlohmann/json.hpp>

#include "host/base/printable.h"
#include "host/camera/camera_options.h"
#include "host/camera/session_options.h"
#include "host/camera/video_options.h"
#include "host/commands/command.h"
#include "host/console/interrupt.h"
#include "host/console/terminal.h"
#include "host/recording/lost_pictures.h"
#include "host/words/session_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;
using Clock = std::chrono::steady_clock;

constexpr double kLongest = 366.0 * 24 * 3600;
constexpr int kTurn = 100;  // milliseconds between two looks at the clock and at Ctrl-C
constexpr char kRow[] = "{:<20} {:<10} {:>7} {:>6} {:>7} {:>8} {:>6} {:>7} {:>6}  {}\n";
constexpr std::string_view kClear = "\x1b[H\x1b[J";  // a terminal's screen

// A camera, and what its driver has counted now and at the table before.
struct WatchedCamera {
  std::string name;
  std::shared_ptr<Session> session = nullptr;
  SessionStatus status = {};
  StreamStatistics now = {};
  StreamStatistics before = {};
  double seconds = 0;  // between both

  void look(double passed) {
    before = now;
    seconds = passed;
    status = session->Status();
    session->Statistics(now);
  }
  [[nodiscard]] double a_second(std::uint64_t StreamStatistics::*total) const {
    return seconds > 0 ? static_cast<double>(rise(before.*total, now.*total)) / seconds : 0;
  }
  // In this state, in seconds.
  [[nodiscard]] double since() const {
    const auto at = std::chrono::duration_cast<std::chrono::milliseconds>(Clock::now().time_since_epoch()).count();
    return status.event == 0 ? 0 : static_cast<double>(at - status.since) / 1000;
  }
};

std::string row_of(const WatchedCamera& camera) {
  const LostPictures lost(camera.now);
  return fmt::format(
      kRow, printable(camera.name), word_of(camera.status.state), fmt::format("{:.0f} s", camera.since()),
      fmt::format("{:.1f}", camera.a_second(&StreamStatistics::framesHandedOut)),
      fmt::format("{:.2f}", camera.a_second(&StreamStatistics::bytesReceived) * 8 / 1e6), camera.now.framesHandedOut,
      lost.lost(), lost.packets(), fmt::format("{:.1f}", static_cast<double>(camera.now.jitter) / 1000),
      printable(camera.status.why));
}

std::string heading() {
  return fmt::format(kRow, "camera", "state", "since", "fps", "Mbit/s", "pictures", "lost", "packets", "jitter", "why");
}

Json object_of(const WatchedCamera& camera) {
  const SessionStatus& status = camera.status;
  return {{"camera", camera.name},
          {"state", word_of(status.state)},
          {"cause", word_of(status.cause)},
          {"code", static_cast<int>(status.code)},
          {"seconds", camera.since()},
          {"attempt", status.attempt},
          {"why", status.why},
          {"framesPerSecond", camera.a_second(&StreamStatistics::framesHandedOut)},
          {"bitsPerSecond", static_cast<std::uint64_t>(camera.a_second(&StreamStatistics::bytesReceived) * 8)},
          {"frames", camera.now.framesHandedOut},
          {"packets", camera.now.packetsReceived},
          {"packetsLate", camera.now.packetsLate},
          {"jitterMicroseconds", camera.now.jitter},
          {"lost", json_of(LostPictures(camera.now))}};
}

class StatsCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const* environment) override {
    CLI::App* command =
        program.add_subcommand("stats", "Show what cameras are doing, and what became of their pictures");
    add_options_of_cameras(*command, camera_, names_, environment);
    command->add_flag("--watch", watch_, "a table every so many seconds, until Ctrl-C");
    command->add_option("--seconds", seconds_, "how long one table is counted")->type_name("N")->capture_default_str();
    command->add_option("--count", count_, "end after this many tables")->check(CLI::PositiveNumber)->type_name("N");
    add_video_options(*command, video_);
    command->footer(
        "It takes each camera's video for that, and lives through outages. Rates are those of the table's seconds;\n"
        "pictures, lost and packets that never came are counted since the beginning, jitter is in milliseconds.\n"
        "With --json it prints an array a table, each on a line of its own.");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (!(seconds_ > 0 && seconds_ <= kLongest)) {
      return terminal.report(usage("--seconds is not a number above 0", "For instance: --seconds 5."));
    }
    if (camera_.trace) return terminal.report(usage("--trace is for commands with one driver", "See --cgi-log."));
    if (const auto problem = check_video_options(video_)) return terminal.report(*problem);
    if (const auto problem = check_camera_options(camera_)) return terminal.report(*problem);
    camera_.transport = transport_of(video_);
    const Result<std::vector<ChosenCamera>> chosen = choose_cameras(camera_, names_);
    if (!chosen) return terminal.report(chosen.error());
    return follow(*chosen, terminal);
  }

 private:
  ExitCode follow(const std::vector<ChosenCamera>& chosen, Terminal& terminal) {
    Interrupt::finish_orderly();
    SessionGroup group(without_threads());
    std::deque<WatchedCamera> cameras;
    for (const ChosenCamera& camera : chosen) {
      WatchedCamera& watched = cameras.emplace_back(WatchedCamera{camera.name});
      watched.session = group.Open(session_options(camera, camera_, video_.stream), {});
      if (!watched.session) return terminal.report(no_session());
    }
    const std::uint64_t tables = count_ > 0 ? count_ : (watch_ ? UINT64_MAX : 1);
    auto latest = Clock::now();
    for (std::uint64_t table = 0; table < tables; ++table) {
      if (!let_pass(group, terminal)) break;
      const auto now = Clock::now();
      for (WatchedCamera& camera : cameras) camera.look(std::chrono::duration<double>(now - latest).count());
      latest = now;
      if (const ExitCode written = show(cameras, terminal); written != ExitCode::kOk) return written;
    }
    return Interrupt::requested() ? ExitCode::kInterrupted : verdict(cameras);
  }

  // The time of one table; false when it is cut short.
  [[nodiscard]] bool let_pass(SessionGroup& group, const Terminal& terminal) const {
    const auto end =
        Clock::now() + std::chrono::duration_cast<Clock::duration>(std::chrono::duration<double>(seconds_));
    while (Clock::now() < end) {
      if (Interrupt::requested() || terminal.reader_gone()) return false;
      const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(end - Clock::now()).count() + 1;
      group.Process(static_cast<std::int32_t>(std::min<std::int64_t>(kTurn, left)));
    }
    return true;
  }

  [[nodiscard]] ExitCode show(const std::deque<WatchedCamera>& cameras, Terminal& terminal) const {
    std::string rows;
    Json list = Json::array();
    for (const WatchedCamera& camera : cameras) {
      rows += row_of(camera);
      list.push_back(object_of(camera));
    }
    if (camera_.json) return write_result(terminal, list.dump(-1, ' ', false, Json::error_handler_t::replace) + "\n");
    const bool refresh = watch_ && terminal.results_on_terminal();
    return write_result(terminal, (refresh ? std::string(kClear) : "") + heading() + rows);
  }

  // As for one camera: whether video comes.
  static ExitCode verdict(const std::deque<WatchedCamera>& cameras) {
    ExitCode code = ExitCode::kOk;
    for (const WatchedCamera& camera : cameras) {
      if (camera.status.state == SessionState::kLive) continue;
      const bool refused = camera.status.cause == SessionCause::kCredentials;
      if (code == ExitCode::kOk) code = refused ? ExitCode::kUnauthorized : ExitCode::kNoVideo;
    }
    return code;
  }

  CameraOptions camera_;
  std::vector<std::string> names_;
  VideoOptions video_;
  double seconds_ = 3;
  std::uint64_t count_ = 0;  // 0: one, or with --watch without end
  bool watch_ = false;
};

}  // namespace

std::unique_ptr<Command> make_stats_command() { return std::make_unique<StatsCommand>(); }

}  // namespace vexa::host
