// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/values/faults.h"

#include <utility>

namespace vexa::camera {
namespace {

RequestFault fault_of(std::string match, FaultAction action) {
  RequestFault fault;
  fault.match = std::move(match);
  fault.action = action;
  return fault;
}

RequestFault timed_fault(std::string match, FaultAction action, std::chrono::milliseconds time) {
  RequestFault fault = fault_of(std::move(match), action);
  fault.time = time;
  return fault;
}

RequestFault text_fault(std::string match, FaultAction action, std::string text) {
  RequestFault fault = fault_of(std::move(match), action);
  fault.text = std::move(text);
  return fault;
}

}  // namespace

RequestFault RequestFault::no_answer(std::string match) { return fault_of(std::move(match), FaultAction::kNoAnswer); }

RequestFault RequestFault::slow(std::string match, std::chrono::milliseconds time) {
  return timed_fault(std::move(match), FaultAction::kSlowAnswer, time);
}

RequestFault RequestFault::byte_at_a_time(std::string match, std::chrono::milliseconds interval) {
  return timed_fault(std::move(match), FaultAction::kByteAtATime, interval);
}

RequestFault RequestFault::cut_after(std::string match, std::size_t bytes) {
  RequestFault fault = fault_of(std::move(match), FaultAction::kCutAfter);
  fault.bytes = bytes;
  return fault;
}

RequestFault RequestFault::stall_after(std::string match, std::size_t bytes) {
  RequestFault fault = cut_after(std::move(match), bytes);
  fault.hold = true;
  return fault;
}

RequestFault RequestFault::reset(std::string match) { return fault_of(std::move(match), FaultAction::kReset); }

RequestFault RequestFault::status(std::string match, std::string status) {
  return text_fault(std::move(match), FaultAction::kStatus, std::move(status));
}

RequestFault RequestFault::raw(std::string match, std::string bytes) {
  return text_fault(std::move(match), FaultAction::kRaw, std::move(bytes));
}

RequestFault RequestFault::wrong_credentials(std::string match) {
  return fault_of(std::move(match), FaultAction::kWrongCredentials);
}

RequestFault RequestFault::reboot(std::string match, std::chrono::milliseconds away) {
  return timed_fault(std::move(match), FaultAction::kReboot, away);
}

RequestFault RequestFault::nth(std::uint32_t n) const {
  RequestFault fault = *this;
  fault.occurrence = n;
  return fault;
}

}  // namespace vexa::camera
