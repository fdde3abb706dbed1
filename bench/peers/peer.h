// SPDX-License-Identifier: Apache-2.0
// A reader of the media server's streams.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <vector>

#include "bench/peers/options.h"

namespace vexa_peers {

/// What one thread of a peer has received.
struct Received {
  std::uint64_t frames = 0;  ///< whole ones
  std::uint64_t bytes = 0;
  std::vector<double>
      delays;  ///< milliseconds from a frame's last datagram leaving the server; the first frame's first
  void take(const unsigned char* data, std::size_t length);
  void add(const Received& other);
};

class Peer {
 public:
  virtual ~Peer() = default;
  /// Opens all streams; false when one does not open.
  virtual bool start() = 0;
  /// Receives until all pictures have come, or none does for some time.
  virtual Received run() = 0;
  /// Ends the streams one after the other.
  virtual void stop() {}
};

std::unique_ptr<Peer> make_driver_peer(const Options& options);
enum class BareLoop { kWaking, kNapping, kDraining };
std::unique_ptr<Peer> make_bare_peer(const Options& options, BareLoop loop);
/// Null where the program was built without libavformat.
std::unique_ptr<Peer> make_libavformat_peer(const Options& options);

/// How long no frame comes after the last.
inline constexpr int kSilence = 1500;  // milliseconds

}  // namespace vexa_peers
