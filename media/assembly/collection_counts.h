// Where the packets and pictures of a stream have gone.
#pragma once

#include <cstdint>

namespace vexa {

/// Totals and what is held now. At any time each packet that was given to the collector stands in exactly one of the
/// packets' numbers, and each picture begun in exactly one of the pictures'.
struct CollectionCounts {
  // Packets
  std::uint64_t used = 0;        ///< left the list with their picture, whatever became of it
  std::uint64_t duplicated = 0;  ///< had come before
  std::uint64_t late = 0;        ///< came when their picture's turn was over
  std::uint64_t given_up = 0;    ///< listed, and their picture was given up before it was complete
  std::uint64_t overwritten = 0;
  std::uint64_t stopped = 0;  ///< listed when the stream ended
  std::uint64_t held = 0;     ///< listed now
  // Pictures
  std::uint64_t pictures_begun = 0;
  std::uint64_t pictures_assembled = 0;
  std::uint64_t pictures_incomplete = 0;
  std::uint64_t pictures_damaged = 0;
  std::uint64_t pictures_without_key = 0;  ///< complete, but nothing to refer to
  std::uint64_t pictures_too_large = 0;
  std::uint64_t pictures_stopped = 0;
  std::uint64_t pictures_held = 0;
  std::uint64_t restarts = 0;  ///< of the sequence, as the collector followed them
};

}  // namespace vexa
