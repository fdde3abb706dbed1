// SPDX-License-Identifier: Apache-2.0
#include "node/core/claim_machine.h"

#include <algorithm>
#include <utility>

#include "node/core/rendezvous.h"

namespace vexa::node {
namespace {

constexpr BootTime kRetry{500};
constexpr BootTime kLookAgain{200};  // while cameras are unclaimed
constexpr BootTime kBetweenBalances{500};

}  // namespace

ClaimMachine::ClaimMachine(std::string name, std::uint32_t capacity, ClaimRules rules)
    : name_(std::move(name)),
      capacity_(capacity),
      rules_(rules),
      lease_(rules.lease),
      suspicion_(rules.lease.ttl),
      take_overs_(rules.take_overs_per_second, rules.take_overs_per_second),
      hand_overs_(rules.hand_overs_per_second, rules.hand_overs_per_second) {}

std::vector<ClaimRequest> ClaimMachine::next(BootTime now) {
  looked_ = now;
  std::vector<ClaimRequest> out;
  give_up_unanswered(now);
  while (!leaving_.empty()) {
    const auto over =
        std::find_if(leaving_.begin(), leaving_.end(), [now](const auto& row) { return row.second <= now; });
    if (over == leaving_.end()) break;
    stop_recording(std::string(over->first));
  }
  keep_lease(out, now);
  if (!in_sight_ || !registered_ || !lease_.is_valid(now)) return out;
  if (now >= balance_at_) balance(now);
  release_offered(out, now);
  if (!draining_) claim_cameras(out, now);
  return out;
}

BootTime ClaimMachine::deadline() const {
  BootTime due = lease_.id() == 0 || !registered_ ? std::max(retry_at_, looked_ + kLookAgain) : lease_.renewal_due();
  if (lease_.id() != 0) due = std::min(due, lease_.renewal_due());
  if (!sent_.empty()) due = std::min(due, sent_.begin()->second.at + rules_.lease.renewal());
  for (const auto& [camera, until] : leaving_) due = std::min(due, until);
  if (!in_sight_ || !registered_) return due;
  const bool releases =
      std::any_of(offers_.begin(), offers_.end(), [](const auto& row) { return row.second.token != 0; });
  if (releases || (!view_.unclaimed().empty() && !draining_)) due = std::min(due, looked_ + kLookAgain);
  return std::min(due, balance_at_);
}

// Requests

ClaimRequest& ClaimMachine::send(std::vector<ClaimRequest>& out, Kind kind, BootTime now) {
  ClaimRequest request;
  request.kind = kind;
  request.number = ++last_number_;
  request.lease = lease_.id();
  out.push_back(request);
  sent_[request.number] = {request, now};
  return out.back();
}

bool ClaimMachine::is_sent(Kind kind, const std::string& camera) const {
  return std::any_of(sent_.begin(), sent_.end(), [&](const auto& row) {
    return row.second.request.kind == kind && row.second.request.camera == camera;
  });
}

void ClaimMachine::give_up_unanswered(BootTime now) {
  while (!sent_.empty() && now - sent_.begin()->second.at >= rules_.lease.renewal()) {
    answer({sent_.begin()->first, ClaimAnswer::Outcome::kFailed}, now);
  }
}

void ClaimMachine::keep_lease(std::vector<ClaimRequest>& out, BootTime now) {
  if (lease_.id() == 0) {
    if (now >= retry_at_ && !is_sent(Kind::kGrant, "")) send(out, Kind::kGrant, now);
    return;
  }
  if (now >= lease_.renewal_due() && !is_sent(Kind::kRenew, "")) {
    lease_.renewing(now);
    send(out, Kind::kRenew, now);
  }
  if (!registered_ && now >= retry_at_ && !is_sent(Kind::kRegister, "")) send(out, Kind::kRegister, now);
}

void ClaimMachine::claim_cameras(std::vector<ClaimRequest>& out, BootTime now) {
  std::size_t claims = held_.size();
  for (const auto& [number, sent] : sent_) claims += sent.request.kind == Kind::kClaim ? 1U : 0U;
  for (auto& [camera, row] : view_.unclaimed()) {
    if (claims >= capacity_ || sent_.size() >= rules_.requests_at_once) return;
    if (now < row.not_before || is_sent(Kind::kClaim, camera) || !is_turn(camera, row, now)) continue;
    ClaimRequest& request = send(out, Kind::kClaim, now);
    request.camera = camera;
    sent_[request.number].request.camera = camera;
    ++claims;
  }
}

// What the node records already it claims at once, even while etcd is suspected: nothing moves by that.
bool ClaimMachine::is_turn(const std::string& camera, const SiteView::Unclaimed& row, BootTime now) {
  const auto offer = offers_.find(camera);
  const bool offered = offer != offers_.end() && offer->second.open;
  if (recorded_.count(camera) != 0 && leaving_.count(camera) == 0 && !offered) return true;
  if (suspicion_.suspects(now)) return false;
  const std::size_t better = std::max<std::size_t>(view_.better_nodes(row.hash, name_), offered ? 1 : 0);
  if (now - row.since < rules_.look + rules_.step * static_cast<int>(better)) return false;
  return take_overs_.take(now);
}

void ClaimMachine::release_offered(std::vector<ClaimRequest>& out, BootTime now) {
  for (auto& [camera, offer] : offers_) {
    if (sent_.size() >= rules_.requests_at_once) return;
    if (offer.token == 0 || is_sent(Kind::kRelease, camera)) continue;
    ClaimRequest& request = send(out, Kind::kRelease, now);
    request.camera = camera;
    request.token = offer.token;
    sent_[request.number].request = request;
  }
}

// Moving cameras

void ClaimMachine::balance(BootTime now) {
  balance_at_ = kNever;
  if (suspicion_.suspects(now)) {
    balance_at_ = now + kBetweenBalances;
    return;
  }
  for (const std::string& camera : claimed()) {
    if (offer(camera, now)) continue;
    balance_at_ = std::min(balance_at_, now + kBetweenBalances);
    return;
  }
}

// False: the rate allows no more for now.
bool ClaimMachine::offer(const std::string& camera, BootTime now) {
  if (!draining_) {
    const std::string best = view_.best_node(name_hash(camera));
    const auto node = view_.nodes().find(best);
    if (best == name_ || node == view_.nodes().end() || !view_.has_room(best, node->second)) return true;
    const auto former = offers_.find(camera);
    const BootTime due =
        std::max(node->second.seen + rules_.settle, former != offers_.end() ? former->second.again : BootTime(0));
    if (now < due) {
      balance_at_ = std::min(balance_at_, due);
      return true;
    }
  }
  if (!hand_overs_.take(now)) return false;
  offers_[camera] = {held_.at(camera).token, now + rules_.patience, true};
  held_.erase(camera);  // from here on the node does nothing that one alone may do
  return true;
}

void ClaimMachine::drain(BootTime now) {
  draining_ = true;
  balance_at_ = now;
}

// Answers

void ClaimMachine::answer(const ClaimAnswer& answer, BootTime now) {
  const auto found = sent_.find(answer.number);
  if (found == sent_.end()) return;
  const Sent sent = found->second;
  sent_.erase(found);
  switch (answer.outcome) {
    case ClaimAnswer::Outcome::kDone:
      done(sent, answer.value, now);
      return;
    case ClaimAnswer::Outcome::kRefused:
      refused(sent.request, now);
      return;
    case ClaimAnswer::Outcome::kFailed:
      retry_at_ = now + kRetry;
      return;
  }
}

void ClaimMachine::done(const Sent& sent, std::uint64_t value, BootTime now) {
  const ClaimRequest& request = sent.request;
  const bool of_this_lease = request.lease == lease_.id();
  switch (request.kind) {
    case Kind::kGrant:
      if (lease_.id() == 0) lease_.grant(value, sent.at);
      return;
    case Kind::kRenew:
      if (of_this_lease) lease_.renew(sent.at);
      return;
    case Kind::kRegister:
      registered_ = of_this_lease;
      return;
    case Kind::kClaim:
      // An answer that comes after the watch's word is old: the claim may be over by now.
      if (value > seen_) apply({SiteEntry::Kind::kClaim, request.camera, true, value, 0, name_, request.lease}, now);
      return;
    case Kind::kRelease:
      released(request.camera);
      return;
  }
}

void ClaimMachine::refused(const ClaimRequest& request, BootTime now) {
  const bool of_this_lease = request.lease == lease_.id();
  switch (request.kind) {
    case Kind::kRenew:
      if (of_this_lease) lose_lease();
      return;
    case Kind::kClaim: {
      const auto row = view_.unclaimed().find(request.camera);
      if (row != view_.unclaimed().end()) row->second.not_before = now + kRetry;
      return;
    }
    case Kind::kRelease:
      released(request.camera);
      return;
    case Kind::kGrant:
    case Kind::kRegister:
      retry_at_ = now + kRetry;
      return;
  }
}

// By this request or before it.
void ClaimMachine::released(const std::string& camera) {
  const auto offer = offers_.find(camera);
  if (offer == offers_.end()) return;
  offer->second.token = 0;
  if (!offer->second.open) offers_.erase(offer);
}

// All claims were deleted with it.
void ClaimMachine::lose_lease() {
  lease_.end();
  registered_ = false;
  held_.clear();
}

// The site

void ClaimMachine::list(const SiteList& list, BootTime now) {
  for (const SiteEntry& entry : view_.changes_to(list)) apply(entry, now);
  seen_ = list.revision;
  in_sight_ = true;
}

void ClaimMachine::change(const SiteEntry& entry, BootTime now) {
  apply(entry, now);
  seen_ = std::max(seen_, entry.revision);
}

void ClaimMachine::apply(const SiteEntry& entry, BootTime now) {
  const std::size_t nodes = view_.nodes().size();
  if (!view_.apply(entry, now)) return;
  switch (entry.kind) {
    case SiteEntry::Kind::kCamera:
      if (!entry.present) {
        stop_recording(entry.name);
        const auto held = held_.find(entry.name);
        if (held != held_.end()) offers_[entry.name] = {held->second.token, now, false};
        held_.erase(entry.name);
      }
      return;
    case SiteEntry::Kind::kNode:
      if (!entry.present) suspicion_.vanished(nodes, now);
      if (entry.present) balance_at_ = std::min(balance_at_, now + rules_.settle);
      if (entry.name == name_ && !entry.present) registered_ = false;
      return;
    case SiteEntry::Kind::kClaim:
      see_claim(entry, now);
      return;
  }
}

void ClaimMachine::see_claim(const SiteEntry& entry, BootTime now) {
  const auto offer = offers_.find(entry.name);
  const std::uint64_t offered = offer != offers_.end() ? offer->second.token : 0;
  if (!entry.present) {
    held_.erase(entry.name);
    leaving_.erase(entry.name);
    released(entry.name);
    return;
  }
  if (entry.owner != name_) {
    held_.erase(entry.name);
    if (offer != offers_.end()) offers_.erase(offer);
    if (recorded_.count(entry.name) != 0) leaving_.emplace(entry.name, now + rules_.overlap);
    return;
  }
  if (offer != offers_.end() && entry.revision != offered) offer->second = {0, offer->second.again, false};
  record(entry.name);
  // A claim that is being released may be deleted any moment, and one of a former lease ends with that.
  if (entry.lease == lease_.id() && entry.revision != offered) hold(entry.name, entry.revision, now);
}

void ClaimMachine::hold(const std::string& camera, std::uint64_t token, BootTime now) {
  held_[camera] = {token, now + rules_.lease.ttl + rules_.lease.drift()};
  balance_at_ = std::min(balance_at_, now + rules_.settle);
}

// What the node may do

void ClaimMachine::record(const std::string& camera) {
  leaving_.erase(camera);
  if (recorded_.insert(camera).second) ++recorded_version_;
}

void ClaimMachine::stop_recording(const std::string& camera) {
  leaving_.erase(camera);
  if (recorded_.erase(camera) != 0) ++recorded_version_;
}

std::optional<std::uint64_t> ClaimMachine::exclusive_token(const std::string& camera, BootTime now) const {
  const auto held = held_.find(camera);
  if (held == held_.end() || now < held->second.exclusive_from || !lease_.is_valid(now)) return std::nullopt;
  return held->second.token;
}

std::vector<std::string> ClaimMachine::claimed() const {
  std::vector<std::string> cameras;
  for (const auto& [camera, held] : held_) cameras.push_back(camera);
  return cameras;
}

}  // namespace vexa::node
