// SPDX-License-Identifier: Apache-2.0
#include "tests/site/simulated_site.h"

#include <algorithm>
#include <utility>

#include "node/core/rendezvous.h"

namespace vexa_test {

using vexa::node::BootTime;
using vexa::node::ClaimAnswer;
using vexa::node::ClaimMachine;
using vexa::node::ClaimRequest;
using vexa::node::SiteEntry;

namespace {

constexpr std::int64_t kBetweenExpiries = 500;  // etcd looks for leases that are over so often
constexpr std::int64_t kSightLost = 1000;       // a broken watch is noticed after so long

}  // namespace

SimulatedSite::SimulatedSite(const SiteSetup& setup)
    : setup_(setup), random_(setup.seed), etcd_(setup.rules.lease.ttl.count()) {
  const auto error = [&] {
    const std::int64_t most = std::int64_t{setup_.clock_error_permille} * 1000;
    return most == 0 ? 0 : static_cast<std::int64_t>(draw(static_cast<std::uint64_t>(2 * most + 1))) - most;
  };
  etcd_ppm_ = error();
  for (std::size_t i = 0; i < setup.cameras; ++i) {
    const std::string camera = "camera-" + std::to_string(i);
    etcd_.add_camera(camera);
    recorders_[camera] = 0;
    gap_since_[camera] = 0;
  }
  publish();
  nodes_.resize(setup.nodes);
  for (std::size_t i = 0; i < setup.nodes; ++i) {
    nodes_[i].name = "node-" + std::to_string(i);
    nodes_[i].clock_ppm = error();
    nodes_[i].clock_start = static_cast<std::int64_t>(draw(1000000));
    at(static_cast<std::int64_t>(draw(2000)), [this, i] { start(i); });
  }
  expire();
}

void SimulatedSite::run(std::int64_t until) {
  while (!events_.empty() && events_.top().time <= until) {
    const Event event = events_.top();
    events_.pop();
    now_ = event.time;
    event.what();
  }
  now_ = until;
}

void SimulatedSite::at(std::int64_t time, std::function<void()> what) {
  events_.push({std::max(time, now_), ++last_number_, std::move(what)});
}

// What happens to a process waits while it sleeps, and does not happen when it is over.
void SimulatedSite::in_life(std::size_t node, std::int64_t time, std::function<void()> what) {
  const std::uint64_t life = nodes_[node].life;
  at(time, [this, node, life, what = std::move(what)] {
    if (nodes_[node].life != life || !nodes_[node].machine) return;
    if (nodes_[node].asleep_until > now_) return in_life(node, nodes_[node].asleep_until, what);
    what();
  });
}

BootTime SimulatedSite::clock_of(const Node& node) const {
  return BootTime(node.clock_start + now_ + now_ * node.clock_ppm / 1000000);
}

std::int64_t SimulatedSite::delay() {
  if (now_ < slow_until_) return static_cast<std::int64_t>(draw(4000));
  return static_cast<std::int64_t>(draw(50) == 0 ? draw(1500) : 1 + draw(20));
}

// The processes

void SimulatedSite::start(std::size_t node) {
  Node& own = nodes_[node];
  if (own.machine) return;
  ++own.life;
  own.machine = std::make_unique<ClaimMachine>(own.name, setup_.capacity, setup_.rules);
  own.records_version = 0;
  own.wake_at = 0;
  own.tokens.clear();
  list_later(node);
  step(node);
}

void SimulatedSite::crash(std::size_t node) {
  Node& own = nodes_[node];
  ++own.life;
  own.asleep_until = now_;
  own.machine.reset();
  own.watches = false;
  set_records(node, {});
}

void SimulatedSite::stop(std::size_t node, std::int64_t duration) {
  Node& own = nodes_[node];
  if (!own.machine || own.asleep_until > now_) return;
  own.asleep_until = now_ + duration;
  set_records(node, {});
  in_life(node, own.asleep_until, [this, node] {
    set_records(node, nodes_[node].machine->recorded());
    step(node);
  });
}

void SimulatedSite::suspend(std::size_t node, std::int64_t duration) {
  cut(node, duration);
  stop(node, duration);
}

void SimulatedSite::cut(std::size_t node, std::int64_t duration) {
  Node& own = nodes_[node];
  own.cut_until = std::max(own.cut_until, now_ + duration);
  lose_sight(node);
}

void SimulatedSite::etcd_away(std::int64_t duration) {
  etcd_until_ = std::max(etcd_until_, now_ + duration);
  // Until all leases that had begun anew are over, and the grace after that.
  troubles_.emplace_back(now_, etcd_until_ + 3 * setup_.rules.lease.ttl.count());
  for (std::size_t i = 0; i < nodes_.size(); ++i) lose_sight(i);
  at(etcd_until_, [this] {
    if (etcd_until_ <= now_) etcd_.restart_leases(etcd_clock());
  });
}

void SimulatedSite::revoke_all() {
  troubles_.emplace_back(now_, now_ + 2 * setup_.rules.lease.ttl.count());
  etcd_.revoke_all();
  read_log(End::kRevoked);
  publish();
}

void SimulatedSite::revoke_lease_of(std::size_t node) {
  etcd_.end_lease(nodes_[node].machine->lease().id());
  read_log(End::kRevoked);
  publish();
}

void SimulatedSite::drain(std::size_t node) {
  nodes_[node].machine->drain(clock_of(nodes_[node]));
  step(node);
}

void SimulatedSite::lose_sight(std::size_t node) {
  nodes_[node].watches = false;
  in_life(node, now_ + kSightLost, [this, node] {
    if (!nodes_[node].watches) nodes_[node].machine->lose_sight();
  });
  list_later(node);
}

void SimulatedSite::list_later(std::size_t node) {
  const std::int64_t whole = std::max({now_ + kSightLost, nodes_[node].cut_until, etcd_until_});
  in_life(node, whole + delay(), [this, node] {
    Node& own = nodes_[node];
    if (own.watches) return;
    if (!is_reached(own)) return list_later(node);
    own.watches = true;
    own.position = etcd_.log().size();
    own.machine->list(etcd_.list(), clock_of(own));
    step(node);
  });
}

// What they do

void SimulatedSite::step(std::size_t node) {
  Node& own = nodes_[node];
  for (const ClaimRequest& request : own.machine->next(clock_of(own))) carry(node, request);
  observe(node);
  wake_later(node);
}

void SimulatedSite::wake_later(std::size_t node) {
  Node& own = nodes_[node];
  const std::int64_t wait = (own.machine->deadline() - clock_of(own)).count();
  const std::int64_t wake = now_ + std::max<std::int64_t>(1, wait + wait * setup_.clock_error_permille / 1000);
  if (own.wake_at > now_ && own.wake_at <= wake) return;
  own.wake_at = wake;
  in_life(node, wake, [this, node, wake] {
    if (nodes_[node].wake_at == wake) step(node);
  });
}

void SimulatedSite::carry(std::size_t node, const ClaimRequest& request) {
  const std::uint64_t life = nodes_[node].life;
  at(now_ + delay(), [this, node, life, request] {
    if (!is_reached(nodes_[node])) return;
    // A request arrives also when who sent it is gone.
    const ClaimAnswer answer = etcd_.execute(request, nodes_[node].name, setup_.capacity, etcd_clock());
    publish();
    if (nodes_[node].life != life) return;
    in_life(node, now_ + delay(), [this, node, answer] {
      if (!is_reached(nodes_[node])) return;
      nodes_[node].machine->answer(answer, clock_of(nodes_[node]));
      step(node);
    });
  });
}

void SimulatedSite::expire() {
  if (etcd_until_ <= now_) {
    publish();
    etcd_.expire(etcd_clock());
    read_log(End::kExpired);
    publish();
  }
  at(now_ + kBetweenExpiries, [this] { expire(); });
}

// Etcd's log has grown: to the watches.
void SimulatedSite::publish() {
  read_log(End::kReleased);
  for (std::size_t i = 0; i < nodes_.size(); ++i) {
    if (!nodes_[i].watches || nodes_[i].position == etcd_.log().size()) continue;
    in_life(i, now_ + delay(), [this, i] { watch(i); });
  }
}

void SimulatedSite::watch(std::size_t node) {
  Node& own = nodes_[node];
  if (!own.watches || !is_reached(own) || own.position == etcd_.log().size()) return;
  while (own.position < etcd_.log().size()) own.machine->change(etcd_.log()[own.position++], clock_of(own));
  step(node);
}

// What is seen of it

void SimulatedSite::read_log(End end) {
  for (; read_ < etcd_.log().size(); ++read_) {
    const SiteEntry& entry = etcd_.log()[read_];
    truth_.apply(entry, BootTime(now_));
    if (entry.kind == SiteEntry::Kind::kNode && entry.present) {
      at(now_ + setup_.rules.settle.count() * 19 / 20,
         [this, name = entry.name, revision = entry.revision] { judge_settled(name, revision); });
    }
    if (entry.kind != SiteEntry::Kind::kClaim) continue;
    if (!entry.present) {
      last_owner_[entry.name] = {entry.owner, end};
      continue;
    }
    const auto last = last_owner_.find(entry.name);
    if (last == last_owner_.end() || last->second.first == entry.owner) continue;
    ++report_.moves;
    if (last->second.second == End::kExpired) ++report_.least;
  }
}

void SimulatedSite::judge_settled(const std::string& node, std::uint64_t revision) {
  const auto own = truth_.nodes().find(node);
  if (own == truth_.nodes().end() || own->second.revision != revision) return;
  for (const auto& [camera, count] : recorders_) {
    const auto* claim = truth_.claim_of(camera);
    if (claim != nullptr && claim->owner != node && truth_.best_node(vexa::node::name_hash(camera)) == node) {
      ++report_.least;
    }
  }
}

void SimulatedSite::observe(std::size_t node) {
  Node& own = nodes_[node];
  if (own.records_version != own.machine->recorded_version()) {
    own.records_version = own.machine->recorded_version();
    set_records(node, own.machine->recorded());
  }
  observe_tokens(node);
}

void SimulatedSite::observe_tokens(std::size_t node) {
  Node& own = nodes_[node];
  for (const std::string& camera : own.machine->claimed()) {
    const std::uint64_t token = truth_.claim_of(camera) != nullptr ? truth_.claim_of(camera)->token : 0;
    if (own.tokens[camera] != token) {
      // Its begin is looked at as well: nothing else may happen then.
      own.tokens[camera] = token;
      const BootTime wait = setup_.rules.lease.ttl + setup_.rules.lease.drift();
      in_life(node, now_ + wait.count() * (1000 + setup_.clock_error_permille) / 1000 + 1,
              [this, node] { observe_tokens(node); });
    }
    if (!holds(node, camera)) continue;
    const auto other = acts_.find(camera);
    if (other != acts_.end() && other->second != node && holds(other->second, camera)) ++report_.double_tokens;
    acts_[camera] = node;
  }
}

bool SimulatedSite::holds(std::size_t node, const std::string& camera) const {
  const Node& own = nodes_[node];
  return own.machine && own.machine->exclusive_token(camera, clock_of(own)).has_value();
}

void SimulatedSite::set_records(std::size_t node, const std::set<std::string>& records) {
  Node& own = nodes_[node];
  const std::set<std::string> before = std::exchange(own.records, records);
  for (const std::string& camera : records) {
    if (before.count(camera) != 0 || ++recorders_[camera] != 1) continue;
    const std::int64_t since = gap_since_.at(camera);
    std::int64_t gap = now_ - since;
    for (const auto& [from, to] : troubles_)
      gap -= std::max<std::int64_t>(0, std::min(now_, to) - std::max(since, from));
    if (since > 0) ++report_.gaps;
    report_.longest_gap = std::max(report_.longest_gap, gap);
  }
  for (const std::string& camera : before) {
    if (records.count(camera) == 0 && --recorders_[camera] == 0) gap_since_[camera] = now_;
  }
}

SiteReport SimulatedSite::report() const {
  SiteReport report = report_;
  report.requests = etcd_.requests();
  for (const auto& [camera, count] : recorders_) {
    if (count == 0) ++report.unrecorded;
    const auto* claim = truth_.claim_of(camera);
    if (claim == nullptr || claim->owner != truth_.best_node(vexa::node::name_hash(camera))) ++report.misplaced;
  }
  return report;
}

}  // namespace vexa_test
