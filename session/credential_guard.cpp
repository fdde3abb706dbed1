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
  const auto is_same = [&waiter](const auto& w) { return !w.owner_before(waiter) && !waiter.owner_before(w); };
  if (std::any_of(waiters_.begin(), waiters_.end(), is_same)) return;
  // The others keep their places, for a change that is calling them.
  const auto gone = std::find_if(waiters_.begin(), waiters_.end(), [](const auto& w) { return w.expired(); });
  if (gone != waiters_.end()) {
    *gone = waiter;
  } else {
    waiters_.push_back(waiter);
  }
}

template <typename Change>
void CredentialGuard::change(const Change& change) {
  {
    const std::lock_guard<std::mutex> lock(mutex_);
    if (!change()) return;
  }
  for (std::size_t i = 0;; ++i) {
    std::shared_ptr<CredentialWaiter> waiter;
    {
      const std::lock_guard<std::mutex> lock(mutex_);
      if (i >= waiters_.size()) return;
      waiter = waiters_[i].lock();
    }
    if (waiter) waiter->credentials_changed();
  }
}

void CredentialGuard::set_password(const std::string& password) {
  change([&] {
    if (password_ == password) return false;
    password_ = password;
    breaker_.set_password(password);
    ++generation_;
    return true;
  });
}

CredentialTicket CredentialGuard::ask(Moment now) {
  const std::lock_guard<std::mutex> lock(mutex_);
  CredentialTicket ticket;
  ticket.password = password_;
  ticket.generation = generation_;
  ticket.answer = breaker_.ask(now);
  // Once the next try is due its moment is past, and whoever makes it reports the end.
  ticket.is_refused = breaker_.is_refused() && breaker_.retry_at() > now;
  if (ticket.is_refused) ticket.next = breaker_.retry_at();
  return ticket;
}

template <typename Verdict>
void CredentialGuard::judge(std::uint64_t generation, const Verdict& verdict) {
  change([&] {
    if (generation != generation_) return false;
    verdict();
    return true;
  });
}

void CredentialGuard::accepted(std::uint64_t generation) {
  judge(generation, [this] { breaker_.accepted(); });
}

void CredentialGuard::refused(std::uint64_t generation, Moment now) {
  judge(generation, [&] { breaker_.refused(now); });
}

void CredentialGuard::doubt() {
  const std::lock_guard<std::mutex> lock(mutex_);
  breaker_.doubt();
}

void CredentialGuard::abandoned(std::uint64_t generation) {
  judge(generation, [this] { breaker_.abandoned(); });
}

void CredentialGuard::retry() {
  change([this] {
    breaker_.retry();
    return true;
  });
}

Moment CredentialGuard::next_try(std::uint64_t generation, Moment now) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return generation == generation_ && breaker_.is_refused() ? breaker_.retry_at() : now;
}

bool CredentialGuard::is_current(std::uint64_t generation) const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return generation == generation_;
}

bool CredentialGuard::is_refused() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return breaker_.is_refused();
}

}  // namespace vexa
