// SPDX-License-Identifier: Apache-2.0
// The faults that a virtual camera can show, as plain values.
#ifndef VIRTUAL_CAMERA_VALUES_FAULTS_H_
#define VIRTUAL_CAMERA_VALUES_FAULTS_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <vector>

namespace vexa::camera {

// A restart of the RTP sequence numbers before the named picture (counted from 0 in each session).
struct SequenceRestart {
  std::uint64_t picture = 0;
  std::optional<std::uint16_t> value;  // the picture's first sequence number; drawn from the seed when absent
};

// The same for timestamps.
struct TimestampRestart {
  std::uint64_t picture = 0;
  std::optional<std::uint32_t> value;
};

// What happens to RTP packets before they leave. Probabilities are 0 to 1, drawn for each packet from the camera's
// seed, so that the same seed, clip and settings give the same faults. Distances count later packets of the same
// session, also those that are lost or held back themselves.
struct PacketFaults {
  double loss = 0;
  double burst_loss = 0;  // probability that a burst begins with this packet
  std::size_t burst_length = 8;
  double reorder = 0;
  std::size_t reorder_distance = 20;  // a packet is held back until 1 to this many later packets have left
  double duplicate = 0;
  std::size_t duplicate_distance = 0;  // 0: the duplicate follows at once; n: after 0 to n later packets
  double delay = 0;
  std::chrono::milliseconds delay_time{100};
  double corrupt_payload = 0;
  std::size_t corrupt_bits = 3;  // bits flipped in a corrupted payload
  double corrupt_header = 0;     // one bit flipped in the 12 header bytes
  double missing_marker = 0;     // drawn for the last packet of each picture
  std::vector<SequenceRestart> sequence_restarts;
  std::vector<TimestampRestart> timestamp_restarts;
  // Random faults affect only pictures from first_picture to last_picture, so that a stream can start and end clean.
  std::uint64_t first_picture = 0;
  std::uint64_t last_picture = std::numeric_limits<std::uint64_t>::max();
};

enum class FaultAction {
  kNoAnswer,          // the request is taken and never answered
  kSlowAnswer,        // the answer comes after `time`
  kByteAtATime,       // a byte, then `time`, then the next
  kCutAfter,          // only the first `bytes` bytes, then the connection is closed
  kReset,             // the connection is reset instead of an answer
  kStatus,            // `text` is the status ("503 Service Unavailable"); the request has no effect
  kRaw,               // `text` is sent as it is; the request has no effect
  kWrongCredentials,  // refused as if the credentials were wrong
  kReboot,            // the camera vanishes without an answer and comes back after `time`
};

// One rule for requests, HTTP and RTSP alike. The named constructors below read best in tests.
struct RequestFault {
  std::string match;             // a part of the request's text; empty matches every request
  std::uint32_t occurrence = 0;  // 0: every match; n: only the nth match, counted from 1
  FaultAction action = FaultAction::kNoAnswer;
  std::chrono::milliseconds time{0};
  std::size_t bytes = 0;
  std::string text;
  bool hold = false;  // leave the connection open where the camera would close it after this answer

  static RequestFault no_answer(std::string match);
  static RequestFault slow(std::string match, std::chrono::milliseconds time);
  static RequestFault byte_at_a_time(std::string match, std::chrono::milliseconds interval);
  static RequestFault cut_after(std::string match, std::size_t bytes);
  static RequestFault stall_after(std::string match, std::size_t bytes);  // cut, but the connection stays open
  static RequestFault reset(std::string match);
  static RequestFault status(std::string match, std::string status);
  static RequestFault raw(std::string match, std::string bytes);
  static RequestFault wrong_credentials(std::string match);
  static RequestFault reboot(std::string match, std::chrono::milliseconds away);

  // The same rule for the nth match only.
  [[nodiscard]] RequestFault nth(std::uint32_t n) const;
};

// What goes wrong at one picture or piece of sound, counted from 0 in each stream.
struct HttpStreamFault {
  enum class Action {
    kDataLength,    // "DataLen: " is followed by `text`
    kNoDataLength,  // the part does not announce its length
    kBefore,        // `text` comes before it
    kCut,           // only the first `bytes` bytes of it are sent; the stream goes on with the next
    kClose,         // the connection closes after `bytes` bytes of it
    kSilence,       // the stream falls silent after `bytes` bytes of it
    kPause,         // it comes later by `time`, and so does all that follows
    kOtherClip,     // from here on the stream sends the clip of the file `text`, from its beginning
  };

  std::uint64_t index = 0;
  Action action = Action::kSilence;
  std::string text;
  std::size_t bytes = 0;
  std::chrono::milliseconds time{0};
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_FAULTS_H_
