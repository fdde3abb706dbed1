// SPDX-License-Identifier: Apache-2.0
#include "host/camera/one_session.h"

#include "host/camera/session_news.h"
#include "host/camera/session_options.h"
#include "host/cgi_log/cgi_log.h"
#include "host/console/interrupt.h"
#include "host/words/session_words.h"

namespace vexa::host {
namespace {

constexpr std::int32_t kTurn = 100;  // milliseconds between two looks at Ctrl-C and at who reads

}  // namespace

std::optional<Problem> work_by_session(const SessionOptions& session, const SessionWork& work, Terminal& terminal) {
  Interrupt::finish_orderly();
  SessionNews news(terminal);
  SessionCallbacks callbacks = work.callbacks;
  callbacks.state = [&](Session& own, const SessionStatus& status) { news.show(own.Name(), status); };
  SessionGroup group(without_threads());
  const std::shared_ptr<Session> opened = group.Open(session, callbacks);
  if (!opened) return no_session();
  while (!work.is_done()) {
    if (Interrupt::requested()) return Problem{ExitCode::kInterrupted, "interrupted", ""};
    if (auto problem = hopeless(opened->Name(), opened->Status())) return problem;
    group.Process(kTurn);
  }
  return std::nullopt;
}

Result<SessionOptions> session_of(const CameraOptions& options, const std::optional<std::string>& profile, int stream,
                                  std::uint32_t streams) {
  if (options.trace) {
    return fail(usage("--trace shows one driver's requests, without --forever", "--cgi-log keeps those over HTTP."));
  }
  if (auto problem = check_camera_options(options)) return fail(*std::move(problem));
  const Result<std::vector<ChosenCamera>> chosen = choose_cameras(options, {options.address});
  if (!chosen) return fail(chosen.error());
  if (options.cgi_log) {
    if (auto problem = check_cgi_log_target(*options.cgi_log)) return fail(*std::move(problem));
  }
  SessionOptions session = session_options(chosen->front(), options, stream);
  if (profile) session.profile = *profile;
  session.streams = streams;
  return session;
}

}  // namespace vexa::host
