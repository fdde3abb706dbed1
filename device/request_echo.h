// SPDX-License-Identifier: Apache-2.0
// Where a driver's RTSP trace goes.
#pragma once

#include <functional>
#include <memory>

#include "device/flight_recorder.h"
#include "runtime/base/sync.h"
#include "transport/rtsp_session.h"

namespace vexa {

/// Writes the trace to standard output, or hands it to the receiver that a host has given; the flight recorder gets the
/// answers too. Any thread.
class RequestEcho final : public RequestTrace {
 public:
  using Receiver = std::function<void(const char* line)>;

  explicit RequestEcho(FlightRecorder& recorder) : recorder_(recorder) {}

  void write(const std::string& line, const char* credentials) override;
  void answered(const std::string& answer, const char* credentials) override;
  void unanswered(const Failure& failure) override { recorder_.note("rtsp !", failure.text); }
  /// Null: standard output.
  void use(std::shared_ptr<const Receiver> receiver);

 private:
  FlightRecorder& recorder_;
  CSimpleLock lock_;
  std::shared_ptr<const Receiver> receiver_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa
