// SPDX-License-Identifier: Apache-2.0
#include "session/credential_guard.h"

#include <algorithm>
#include <iterator>
#include <map>

namespace vexa {
namespace {

// Kept at most though nobody holds them: hosts may try any number of users.
constexpr std::size_t kMostUnheld = 1024;

struct Registry {
  std::mutex mutex;
  std::map<std::string, std::shared_ptr<CredentialGuard>> guards;
};

void drop_unheld(Registry& all) {
  std::size_t kept = 0;
  for (auto entry = all.guards.begin(); entry != all.guards.end();) {
    const bool is_held = entry->second.use_count() > 1;
    const bool stays = is_held || (entry->second->is_refused() && ++kept <= kMostUnheld);
    entry = stays ? std::next(entry) : all.guards.erase(entry);
  }
}

// Never destroyed: sessions may outlive the objects of main's end.
Registry& registry() {
  static Registry& all = *new Registry;
  return all;
}

}  // namespace

std::shared_ptr<CredentialGuard> CredentialGuard::of(const SLibDConnectionInfo& connection) {
  const std::string key = connection.host + ':' + std::to_string(connection.port) + '\n' + connection.userName;
  Registry& all = registry();
  const std::lock_guard<std::mutex> lock(all.mutex);
  drop_unheld(all);
  std::shared_ptr<CredentialGuard>& guard = all.guards[key];
  if (!guard) guard = std::make_shared<CredentialGuard>();
  return guard;
}

void CredentialGuard::add_waiter(const std::weak_ptr<CredentialWaiter>& waiter) {
  const std::lock_guard<std::mutex> lock(mutex_);
  waiters_.erase(std::remove_if(waiters_.begin(), waiters_.end(), [](const auto& w) { return w.expired(); }),
                 waiters_.end());
  waiters_.push_back(waiter);
}

template <typename Change>
void CredentialGuard::change(const Change& change) {
  std::vector<std::weak_ptr<CredentialWaiter>> waiters;
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    change();
    waiters = waiters_;
  }
  for (const auto& waiting : waiters) {
    if (const auto waiter = waiting.lock()) waiter->credentials_changed();
  }
}

void CredentialGuard::set_password(const std::string& password) {
  if (this->password() == password) return;
  change([&] {
    password_ = password;
    breaker_.set_password(password);
  });
}

std::string CredentialGuard::password() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return password_;
}

CredentialBreaker::Answer CredentialGuard::ask(Moment now) {
  const std::lock_guard<std::mutex> lock(mutex_);
  return breaker_.ask(now);
}

void CredentialGuard::accepted() {
  change([this] { breaker_.accepted(); });
}

void CredentialGuard::refused(Moment now) {
  change([&] { breaker_.refused(now); });
}

void CredentialGuard::doubt() {
  const std::lock_guard<std::mutex> lock(mutex_);
  breaker_.doubt();
}

void CredentialGuard::abandoned() {
  change([this] { breaker_.abandoned(); });
}

void CredentialGuard::retry() {
  change([this] { breaker_.retry(); });
}

Moment CredentialGuard::retry_at() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return breaker_.retry_at();
}

bool CredentialGuard::is_refused() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return breaker_.is_refused();
}

}  // namespace vexa
