// SPDX-License-Identifier: Apache-2.0
#include "node/program/standalone.h"

#include <fmt/format.h>

#include <cstdio>
#include <deque>
#include <memory>
#include <utility>

#include "host/access/camera_file.h"
#include "host/base/printable.h"
#include "host/console/interrupt.h"
#include "node/program/segment_store.h"

namespace vexa::node {
namespace {

using host::Problem;
using Clock = std::chrono::steady_clock;

constexpr int kTurn = 200;  // milliseconds between two looks at signals
constexpr std::chrono::seconds kBetweenRetentions{10};

void say(const std::string& text) { std::fputs(("vexa-node: " + text + "\n").c_str(), stderr); }

void say_problem(const Problem& problem) { say(problem.text + ". " + problem.advice); }

std::chrono::milliseconds wall_time() {
  return std::chrono::floor<std::chrono::milliseconds>(std::chrono::system_clock::now().time_since_epoch());
}

// A camera, its session and its segments.
class RecordedCamera {
 public:
  RecordedCamera(const host::FileCamera& camera, SegmentFolder folder, SegmentTimes times)
      : segments_(camera.name, std::move(folder), times, say_problem) {}

  [[nodiscard]] bool begin(SessionGroup& group, const SessionOptions& options) {
    SessionCallbacks callbacks;
    callbacks.state = [this](Session&, const SessionStatus& status) {
      segments_.take_state(status);
      if (status.state != state_)
        say(fmt::format("{}: {}", host::printable(segments_.camera()), host::printable(status.why)));
      state_ = status.state;
    };
    callbacks.frame = [this](Session&, const SessionFrame& frame) { segments_.take_picture(frame); };
    session_ = group.Open(options, callbacks);
    return session_ != nullptr;
  }

  void end() {
    session_->Stop();
    segments_.close();
  }

  [[nodiscard]] const CameraSegments& segments() const { return segments_; }

 private:
  CameraSegments segments_;
  SessionState state_ = SessionState::kIdle;
  std::shared_ptr<Session> session_;
};

SessionOptions session_of(const host::FileCamera& camera, const host::Credentials& credentials) {
  SessionOptions options;
  options.name = camera.name;
  options.connection.host = camera.address.host;
  options.connection.port = camera.address.port;
  options.connection.userName = credentials.user;
  options.connection.password = credentials.password;
  options.profile = camera.profile.value_or("");
  return options;
}

std::optional<Problem> recover(const std::string& camera, SegmentFolder& folder) {
  const auto recovery = folder.recover();
  if (!recovery) return recovery.error();
  if (recovery->recovered + recovery->empty > 0) {
    say(fmt::format("{}: {} segments recovered, {} without a whole fragment removed, {} bytes cut",
                    host::printable(camera), recovery->recovered, recovery->empty, recovery->cut_bytes));
  }
  return std::nullopt;
}

// All cameras of the file, none when one of them cannot be used.
std::optional<Problem> open_cameras(const host::CameraFile& file, const SegmentStore& store,
                                    const StandaloneOptions& options, const char* const* environment,
                                    SessionGroup& group, std::deque<RecordedCamera>& cameras) {
  host::CredentialSources otherwise;
  host::read_environment(otherwise, environment);
  for (const host::FileCamera& camera : file.cameras()) {
    const auto credentials = file.credentials_of(camera, otherwise, environment);
    if (!credentials) return credentials.error();
    auto folder = store.folder_of(camera.name);
    if (!folder) return folder.error();
    if (auto failed = recover(camera.name, *folder)) return failed;
    RecordedCamera& recorded = cameras.emplace_back(camera, std::move(*folder), options.times);
    if (!recorded.begin(group, session_of(camera, *credentials))) {
      return Problem{host::ExitCode::kUsage, "there is not enough memory for a session", "Free some."};
    }
  }
  return std::nullopt;
}

}  // namespace

std::optional<Problem> run_standalone(const StandaloneOptions& options, const char* const* environment) {
  DiskCalls calls;
  const auto file = host::CameraFile::read(options.cameras_file);
  if (!file) return file.error();
  const auto store = SegmentStore::open(options.folder, options.create, calls);
  if (!store) return store.error();
  host::Interrupt::finish_orderly();
  std::deque<RecordedCamera> cameras;
  SessionGroupOptions in_this_thread;
  in_this_thread.threads = 0;
  SessionGroup group(in_this_thread);  // destroyed first, as it calls the cameras
  if (auto failed = open_cameras(*file, *store, options, environment, group, cameras)) return failed;
  Clock::time_point retention = Clock::now();
  while (!host::Interrupt::requested()) {
    group.Process(kTurn);
    if (Clock::now() < retention) continue;
    retention = Clock::now() + kBetweenRetentions;
    if (const auto removed = store->retain(options.retention, wall_time()); !removed) say_problem(removed.error());
  }
  for (RecordedCamera& camera : cameras) {
    camera.end();
    const SegmentCounts& counts = camera.segments().counts();
    say(fmt::format("{}: {} pictures in {} segments, {} failures of the disk",
                    host::printable(camera.segments().camera()), counts.pictures, counts.segments, counts.failures));
  }
  return std::nullopt;
}

}  // namespace vexa::node
