// How many requests were made of the camera, and how they ended.
#pragma once

#include <cstdint>

#include "runtime/base/published.h"
#include "runtime/base/result.h"
#include "runtime/base/sync.h"

namespace vexa {

struct RequestCounts {
  std::uint64_t requests = 0;
  std::uint64_t failed = 0;
  std::uint64_t timed_out = 0;
  std::uint64_t unauthorized = 0;
};

struct ExchangeCounts {
  RequestCounts rtsp;
  RequestCounts http;
  std::uint64_t keep_alives = 0;
  std::uint64_t keep_alives_unheard = 0;
};

/// Any thread. Writers take turns; a reader waits for none of them.
class ExchangeLedger {
 public:
  /// `failure` is null for an exchange that succeeded; `requests` were sent in it.
  void http(std::uint64_t requests, const Failure* failure);
  void rtsp(std::uint64_t requests, const Failure* failure);
  void keep_alive(const Failure* failure);

  ExchangeCounts read() const { return published_.read(); }

 private:
  static void count(RequestCounts& counts, std::uint64_t requests, const Failure* failure);

  CSimpleLock lock_;
  ExchangeCounts counts_ VEXA_GUARDED_BY(lock_);
  Published<ExchangeCounts> published_;
};

}  // namespace vexa
