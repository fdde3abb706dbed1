// SPDX-License-Identifier: Apache-2.0
// Which request meets which fault, and what a fault does to the sending of an answer.
#ifndef VIRTUAL_CAMERA_SERVER_REQUEST_FAULTS_H_
#define VIRTUAL_CAMERA_SERVER_REQUEST_FAULTS_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "virtual_camera/values/faults.h"

namespace vexa::camera {

// Owned by the camera's state; thread-safe. Each rule counts its own matches; the first rule in force wins.
class RequestFaultList {
 public:
  // False when it holds as many rules as it can.
  bool add(RequestFault fault);
  void clear();
  [[nodiscard]] std::size_t size() const;
  [[nodiscard]] std::optional<RequestFault> take(std::string_view request);

 private:
  struct Rule {
    RequestFault fault;
    std::uint32_t matches = 0;
  };
  mutable std::mutex mutex_;
  std::vector<Rule> rules_;
};

enum class DeliveryEnd { kAsUsual, kClose, kReset, kHold };

// How an answer leaves.
struct Delivery {
  std::string bytes;
  std::chrono::milliseconds delay{0};     // before the first byte
  std::chrono::milliseconds interval{0};  // between single bytes; 0: all in one write
  DeliveryEnd end = DeliveryEnd::kAsUsual;
};

// True when the request must not be carried out, because the fault answers in its place.
[[nodiscard]] bool replaces_request(FaultAction action);

[[nodiscard]] Delivery plan_delivery(const std::optional<RequestFault>& fault, std::string answer);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_SERVER_REQUEST_FAULTS_H_
