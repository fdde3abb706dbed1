#include "transport/wire/keep_alive_schedule.h"

namespace vexa {
namespace {

constexpr int kLongestInterval = 30;
constexpr int kLongestHalvedTimeout = 60;
constexpr int kShortestHalvedTimeout = 3;

}  // namespace

int keep_alive_interval(int session_timeout) {
  if (session_timeout > kLongestHalvedTimeout) return kLongestInterval;
  return session_timeout < kShortestHalvedTimeout ? 1 : session_timeout / 2;
}

bool keep_alive_due(std::time_t now, std::time_t last, int interval) {
  return last == 0 || last > now || now - last >= interval;
}

}  // namespace vexa
