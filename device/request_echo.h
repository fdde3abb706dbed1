// Where a driver's RTSP trace goes.
#pragma once

#include <functional>
#include <memory>

#include "runtime/base/sync.h"
#include "transport/rtsp_session.h"

namespace vexa {

/// Writes the trace to standard output, or hands it to the receiver that a host has given. Any thread.
class RequestEcho final : public RequestTrace {
 public:
  using Receiver = std::function<void(const char* line)>;

  void write(const std::string& line, const char* credentials) override;
  /// Null: standard output.
  void use(std::shared_ptr<const Receiver> receiver);

 private:
  CSimpleLock lock_;
  std::shared_ptr<const Receiver> receiver_ VEXA_GUARDED_BY(lock_);
};

}  // namespace vexa
