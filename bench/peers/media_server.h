// A media server that belongs to none of the peers: RTSP and RTP over UDP, paced by the clock.
#pragma once

#include "bench/peers/options.h"

namespace vexa_peers {

/// Serves options.streams sessions at kAddress in this process; begins to send when all of them play. Writes one byte
/// to `ready` once it listens. Does not return.
[[noreturn]] void serve(const Options& options, int ready);

}  // namespace vexa_peers
