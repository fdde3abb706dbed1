#include "device/exchange_ledger.h"

namespace vexa {

void ExchangeLedger::http(std::uint64_t requests, const Failure* failure) {
  const Guard guard(lock_);
  count(counts_.http, requests, failure);
  published_.publish(counts_);
}

void ExchangeLedger::rtsp(std::uint64_t requests, const Failure* failure) {
  const Guard guard(lock_);
  count(counts_.rtsp, requests, failure);
  published_.publish(counts_);
}

void ExchangeLedger::keep_alive(const Failure* failure) {
  const Guard guard(lock_);
  count(counts_.rtsp, 1, failure);
  ++counts_.keep_alives;
  if (failure != nullptr) ++counts_.keep_alives_unheard;
  published_.publish(counts_);
}

void ExchangeLedger::count(RequestCounts& counts, std::uint64_t requests, const Failure* failure) {
  counts.requests += requests;
  if (failure == nullptr) return;
  switch (failure->code) {
    case LIBD_TIMEOUT:
      ++counts.timed_out;
      return;
    case LIBD_UNAUTHORIZED:
      ++counts.unauthorized;
      return;
    case LIBD_OK:
    case LIBD_FAILED:
    case LIBD_NOT_SUPPORTED:
    case LIBD_INVALID_ARGUMENT:
    case LIBD_INVALID_MODE:
    case LIBD_STREAM_OPEN_FAILED:
    case LIBD_NO_FRAME:
    case LIBD_FRAME_DAMAGED:
    case LIBD_BUFFER_TOO_SMALL:
      ++counts.failed;
      return;
  }
}

}  // namespace vexa
