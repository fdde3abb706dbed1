// SPDX-License-Identifier: Apache-2.0
#include "vexa/session.h"

#include <exception>
#include <utility>

#include "session/session_core.h"

namespace vexa {

Session::Session(std::shared_ptr<SessionCore> core) : core_(std::move(core)) {}

Session::~Session() = default;

SessionStatus Session::Status() const { return core_->status(); }

void Session::Stop() { core_->stop(); }

bool Session::WaitStopped(std::int32_t milliseconds) { return core_->wait_stopped(milliseconds); }

void Session::Retry() { core_->retry(); }

void Session::SetCredentials(const std::string& userName, const std::string& password) {
  try {
    core_->set_credentials(userName, password);
  } catch (const std::exception&) {
    // Memory is short: the former ones stay.
  }
}

bool Session::Statistics(StreamStatistics& statistics) const { return core_->statistics(statistics); }

const std::string& Session::Name() const { return core_->name(); }

}  // namespace vexa
