// SPDX-License-Identifier: Apache-2.0
#include "host/camera/session_options.h"

#include <algorithm>

namespace vexa::host {
namespace {

// How long a camera may be silent that answers within its time-out: 12 s with the usual one of 5 s.
constexpr int kSilence = 2000;

}  // namespace

SessionOptions session_options(const ChosenCamera& camera, const CameraOptions& options, int stream) {
  SessionOptions session;
  session.name = camera.name;
  session.connection.host = camera.address.host;
  session.connection.port = camera.address.port;
  session.connection.userName = camera.credentials.user;
  session.connection.password = camera.credentials.password;
  session.connection.timeout = options.timeout_ms;
  session.connection.streamTransport = options.transport == VideoTransport::kHttp ? 0 : 1;
  session.giveUpMilliseconds = 2 * options.timeout_ms + kSilence;
  session.stallMilliseconds = session.giveUpMilliseconds / 3;
  session.firstPictureMilliseconds = std::max(session.firstPictureMilliseconds, session.giveUpMilliseconds);
  session.profile = camera.profile.value_or("");
  session.stream = stream;
  session.cgiLog = options.cgi_log.value_or("");
  return session;
}

SessionGroupOptions without_threads() {
  SessionGroupOptions options;
  options.threads = 0;
  return options;
}

Problem no_session() { return {ExitCode::kUsage, "there is not enough memory for a session", "Free some."}; }

}  // namespace vexa::host
