// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/request_faults.h"

#include <algorithm>
#include <utility>

namespace vexa::camera {

bool RequestFaultList::add(RequestFault fault) {
  constexpr std::size_t kMostRules = 1000;
  const std::lock_guard<std::mutex> lock(mutex_);
  if (rules_.size() >= kMostRules) return false;
  rules_.push_back({std::move(fault), 0});
  return true;
}

std::size_t RequestFaultList::size() const {
  const std::lock_guard<std::mutex> lock(mutex_);
  return rules_.size();
}

void RequestFaultList::clear() {
  const std::lock_guard<std::mutex> lock(mutex_);
  rules_.clear();
}

std::optional<RequestFault> RequestFaultList::take(std::string_view request) {
  const std::lock_guard<std::mutex> lock(mutex_);
  std::optional<RequestFault> taken;
  for (Rule& rule : rules_) {
    if (request.find(rule.fault.match) == std::string_view::npos) continue;
    ++rule.matches;
    const bool in_force = rule.fault.occurrence == 0 || rule.fault.occurrence == rule.matches;
    if (in_force && !taken) taken = rule.fault;
  }
  return taken;
}

bool replaces_request(FaultAction action) {
  switch (action) {
    case FaultAction::kSlowAnswer:
    case FaultAction::kByteAtATime:
    case FaultAction::kCutAfter:
      return false;
    case FaultAction::kNoAnswer:
    case FaultAction::kReset:
    case FaultAction::kStatus:
    case FaultAction::kRaw:
    case FaultAction::kWrongCredentials:
    case FaultAction::kReboot:
      break;
  }
  return true;
}

Delivery plan_delivery(const std::optional<RequestFault>& fault, std::string answer) {
  Delivery delivery;
  delivery.bytes = std::move(answer);
  if (!fault) return delivery;
  if (fault->hold) delivery.end = DeliveryEnd::kHold;
  switch (fault->action) {
    case FaultAction::kNoAnswer:
      delivery.bytes.clear();
      delivery.end = DeliveryEnd::kHold;
      break;
    case FaultAction::kSlowAnswer:
      delivery.delay = fault->time;
      break;
    case FaultAction::kByteAtATime:
      delivery.interval = std::max(fault->time, std::chrono::milliseconds(1));
      break;
    case FaultAction::kCutAfter:
      delivery.bytes.resize(std::min(delivery.bytes.size(), fault->bytes));
      if (!fault->hold) delivery.end = DeliveryEnd::kClose;
      break;
    case FaultAction::kReset:
    case FaultAction::kReboot:
      delivery.bytes.clear();
      delivery.end = DeliveryEnd::kReset;
      break;
    case FaultAction::kStatus:
    case FaultAction::kRaw:
    case FaultAction::kWrongCredentials:
      break;
  }
  return delivery;
}

}  // namespace vexa::camera
