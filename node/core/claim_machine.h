// SPDX-License-Identifier: Apache-2.0
// Which cameras a node records, and for which it alone may act.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "node/core/lease.h"
#include "node/core/rate_limit.h"
#include "node/core/site_view.h"
#include "node/core/suspicion.h"

namespace vexa::node {

/// How the nodes of a site share its cameras. All nodes of a site have the same.
struct ClaimRules {
  LeaseTerms lease;
  BootTime look{1000};       ///< a camera is left unclaimed for so long before another node takes it over
  BootTime step{2000};       ///< and for so long more for each node that should rather have it
  BootTime settle{15000};    ///< a node is there for so long before cameras move to it
  BootTime patience{60000};  ///< a camera that nobody else took is offered again after so long
  BootTime overlap{5000};    ///< a camera that another node has claimed is recorded for so long more
  std::uint32_t take_overs_per_second = 20;
  std::uint32_t hand_overs_per_second = 2;
  std::size_t requests_at_once = 16;  ///< to etcd
};

/// What a node asks of etcd. All writes are transactions.
struct ClaimRequest {
  enum class Kind {
    kGrant,     ///< a lease of the site's TTL
    kRenew,     ///< the lease
    kRegister,  ///< put the node's key with the lease, if its create revision is 0; done as well if it has this lease
    kClaim,     ///< put the camera's claim with the lease, if its create revision is 0
    kRelease    ///< delete the camera's claim, if its create revision is the token
  };

  Kind kind = Kind::kGrant;
  std::uint64_t number = 0;  ///< of the request; the answer has the same
  std::string camera = {};
  std::uint64_t lease = 0;
  std::uint64_t token = 0;
};

struct ClaimAnswer {
  enum class Outcome {
    kDone,
    kRefused,  ///< the condition does not hold, or the lease is not known any more
    kFailed    ///< no answer: it may have been done
  };

  std::uint64_t number = 0;
  Outcome outcome = Outcome::kDone;
  std::uint64_t value = 0;  ///< of a grant the lease, of a claim the token
};

/// The claims of one node, and what leads from one to the other. Holds no socket, thread or clock: whoever has them
/// sends what next() returns, reports answers and what the watch brings, and asks again at deadline(). A request
/// without an answer is given up by itself. Not thread-safe.
///
/// Two kinds of work are told apart. Recording may be done twice: a node goes on with it without etcd, and until some
/// time after another node has claimed the camera. What one node alone may do needs a token, a lease that is valid by
/// the node's own clock, and the time of one lease since the claim: the former owner's lease is over by then by any
/// clock, even when etcd ended it early.
class ClaimMachine {
 public:
  ClaimMachine(std::string name, std::uint32_t capacity, ClaimRules rules);

  /// What is to be sent now.
  [[nodiscard]] std::vector<ClaimRequest> next(BootTime now);
  void answer(const ClaimAnswer& answer, BootTime now);
  /// When the passing of time alone changes something.
  [[nodiscard]] BootTime deadline() const;

  /// The site was listed, and is watched from that revision on.
  void list(const SiteList& list, BootTime now);
  /// The watch has brought a change.
  void change(const SiteEntry& entry, BootTime now);
  /// The watch is broken: no camera is claimed or released until the next list.
  void lose_sight() { in_sight_ = false; }
  /// Gives all cameras to other nodes and claims none. What is not claimed by another is recorded on.
  void drain(BootTime now);

  [[nodiscard]] const std::set<std::string>& recorded() const { return recorded_; }
  /// Changes with recorded().
  [[nodiscard]] std::uint64_t recorded_version() const { return recorded_version_; }
  /// The token that permits what one node alone may do for the camera, now. To be asked right before each such act, as
  /// the clock may have passed the lease's end meanwhile; what the camera receives later it cannot tell from an act in
  /// time.
  [[nodiscard]] std::optional<std::uint64_t> exclusive_token(const std::string& camera, BootTime now) const;
  /// The cameras claimed under the present lease.
  [[nodiscard]] std::vector<std::string> claimed() const;
  [[nodiscard]] const Lease& lease() const { return lease_; }
  [[nodiscard]] const SiteView& site() const { return view_; }

 private:
  using Kind = ClaimRequest::Kind;

  struct Held {
    std::uint64_t token = 0;
    BootTime exclusive_from{0};
  };
  /// A camera that is given to another node.
  struct Offer {
    std::uint64_t token = 0;  ///< of the claim that is to be deleted; 0: it is
    BootTime again{0};        ///< when it may be offered again, where nobody took it
    bool open = true;         ///< until somebody has claimed it
  };
  struct Sent {
    ClaimRequest request;
    BootTime at{0};
  };

  ClaimRequest& send(std::vector<ClaimRequest>& out, Kind kind, BootTime now);
  [[nodiscard]] bool is_sent(Kind kind, const std::string& camera) const;
  void give_up_unanswered(BootTime now);
  void keep_lease(std::vector<ClaimRequest>& out, BootTime now);
  void claim_cameras(std::vector<ClaimRequest>& out, BootTime now);
  [[nodiscard]] bool is_turn(const std::string& camera, const SiteView::Unclaimed& row, BootTime now);
  void release_offered(std::vector<ClaimRequest>& out, BootTime now);
  void balance(BootTime now);
  [[nodiscard]] bool offer(const std::string& camera, BootTime now);

  void apply(const SiteEntry& entry, BootTime now);
  void released(const std::string& camera);
  void done(const Sent& sent, std::uint64_t value, BootTime now);
  void refused(const ClaimRequest& request, BootTime now);
  void lose_lease();
  void see_claim(const SiteEntry& entry, BootTime now);
  void hold(const std::string& camera, std::uint64_t token, BootTime now);
  void record(const std::string& camera);
  void stop_recording(const std::string& camera);

  const std::string name_;
  const std::uint32_t capacity_;
  const ClaimRules rules_;
  Lease lease_;
  Suspicion suspicion_;
  RateLimit take_overs_;
  RateLimit hand_overs_;
  SiteView view_;
  bool in_sight_ = false;
  bool registered_ = false;
  bool draining_ = false;
  BootTime retry_at_{0};  // of grant and registration
  BootTime looked_{0};    // the latest next()
  BootTime balance_at_ = kNever;
  std::uint64_t last_number_ = 0;
  std::uint64_t seen_ = 0;  // the revision up to which lists and watch have shown everything
  std::map<std::uint64_t, Sent> sent_;
  std::map<std::string, Held> held_;
  std::map<std::string, Offer> offers_;
  std::set<std::string> recorded_;
  std::map<std::string, BootTime> leaving_;  // of recorded_: another node has claimed it
  std::uint64_t recorded_version_ = 0;
};

}  // namespace vexa::node
