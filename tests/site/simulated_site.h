// SPDX-License-Identifier: Apache-2.0
// Nodes that share cameras through etcd, on a simulated network and simulated clocks.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <queue>
#include <random>
#include <set>
#include <string>
#include <vector>

#include "node/core/claim_machine.h"
#include "tests/site/simulated_etcd.h"

namespace vexa_test {

struct SiteSetup {
  std::size_t nodes = 20;
  std::size_t cameras = 100;
  std::uint32_t capacity = 50;  ///< of each node
  std::uint64_t seed = 1;
  vexa::node::ClaimRules rules;
  int clock_error_permille = 4;  ///< of each clock, either way
};

/// What became of a run. Times in milliseconds.
struct SiteReport {
  std::uint64_t double_tokens = 0;  ///< found: two nodes that held a valid token of one camera
  std::int64_t longest_gap = 0;     ///< a camera recorded by nobody, without the time of etcd's own trouble
  std::uint64_t gaps = 0;
  std::uint64_t moves = 0;  ///< claims by another node than the one before
  std::uint64_t least = 0;  ///< those that had to be: cameras of lost nodes, cameras that a settled node should have
  std::uint64_t requests = 0;
  std::uint64_t unrecorded = 0;  ///< now
  std::uint64_t misplaced = 0;   ///< now: cameras claimed by another node than the one that should have them
};

/// Everything happens in run(), in the order of simulated time; the same setup gives the same run. Messages are late
/// and get lost, clocks run at different speeds. A node that is stopped or suspended counts as one that believes in its
/// tokens for as long as its clock lets it.
class SimulatedSite {
 public:
  explicit SimulatedSite(const SiteSetup& setup);

  void run(std::int64_t until);
  void at(std::int64_t time, std::function<void()> what);
  [[nodiscard]] std::int64_t now() const { return now_; }

  void crash(std::size_t node);
  void start(std::size_t node);
  /// As SIGSTOP does: messages wait.
  void stop(std::size_t node, std::int64_t duration);
  /// The whole machine: messages are lost.
  void suspend(std::size_t node, std::int64_t duration);
  void cut(std::size_t node, std::int64_t duration);
  void etcd_away(std::int64_t duration);
  void revoke_all();
  void revoke_lease_of(std::size_t node);
  void slow_network(std::int64_t duration) { slow_until_ = now_ + duration; }
  void drain(std::size_t node);

  [[nodiscard]] bool runs(std::size_t node) const { return nodes_[node].machine != nullptr; }
  [[nodiscard]] const vexa::node::ClaimMachine& machine(std::size_t node) const { return *nodes_[node].machine; }
  [[nodiscard]] SiteReport report() const;

 private:
  struct Node {
    std::string name;
    std::unique_ptr<vexa::node::ClaimMachine> machine;  // null: crashed
    std::uint64_t life = 0;                             // of the process, counted
    std::int64_t clock_ppm = 0;
    std::int64_t clock_start = 0;
    std::int64_t asleep_until = 0;
    std::int64_t cut_until = 0;
    std::int64_t wake_at = 0;
    bool watches = false;
    std::size_t position = 0;  // in etcd's log
    bool draining = false;
    std::set<std::string> records;  // while it is awake
    std::uint64_t records_version = 0;
    std::map<std::string, std::uint64_t> tokens;  // whose begin is watched
  };
  struct Event {
    std::int64_t time;
    std::uint64_t number;
    std::function<void()> what;
    bool operator<(const Event& other) const { return time != other.time ? time > other.time : number > other.number; }
  };
  enum class End { kReleased, kExpired, kRevoked };

  [[nodiscard]] vexa::node::BootTime clock_of(const Node& node) const;
  [[nodiscard]] std::int64_t etcd_clock() const { return now_ + now_ * etcd_ppm_ / 1000000; }
  [[nodiscard]] bool is_reached(const Node& node) const { return node.cut_until <= now_ && etcd_until_ <= now_; }
  std::int64_t delay();
  std::uint64_t draw(std::uint64_t below) { return random_() % below; }

  void in_life(std::size_t node, std::int64_t time, std::function<void()> what);
  void step(std::size_t node);
  void wake_later(std::size_t node);
  void carry(std::size_t node, const vexa::node::ClaimRequest& request);
  void publish();
  void read_log(End end);
  void watch(std::size_t node);
  void lose_sight(std::size_t node);
  void list_later(std::size_t node);
  void observe(std::size_t node);
  void observe_tokens(std::size_t node);
  void set_records(std::size_t node, const std::set<std::string>& records);
  void judge_settled(const std::string& node, std::uint64_t revision);
  [[nodiscard]] bool holds(std::size_t node, const std::string& camera) const;
  void expire();

  SiteSetup setup_;
  std::mt19937_64 random_;
  SimulatedEtcd etcd_;
  std::int64_t etcd_ppm_ = 0;
  std::int64_t etcd_until_ = 0;
  std::int64_t slow_until_ = 0;
  std::int64_t now_ = 0;
  std::uint64_t last_number_ = 0;
  std::priority_queue<Event> events_;
  std::vector<Node> nodes_;
  vexa::node::SiteView truth_;
  std::size_t read_ = 0;  // of etcd's log
  std::map<std::string, std::pair<std::string, End>> last_owner_;
  std::map<std::string, std::size_t> recorders_;  // how many, by camera
  std::map<std::string, std::int64_t> gap_since_;
  std::map<std::string, std::size_t> acts_;                      // who was last seen with a valid token
  std::vector<std::pair<std::int64_t, std::int64_t>> troubles_;  // of etcd
  SiteReport report_;
};

}  // namespace vexa_test
