// SPDX-License-Identifier: Apache-2.0
// One call of a host's, while it lasts.
#pragma once

#include <optional>

#include "device/cancellation.h"
#include "vexa/return_codes.h"

namespace vexa {

class ErrorRecord;
class FlightRecorder;
struct DriverState;

/// The name of the operations of the thread that reads a stream.
inline constexpr const char* kStreamingThread = "StreamingThread";

/// Made at the beginning of a member that may fail or wait, by the thread that calls it: knows what ends its waits, and
/// at its end enters its failure, if there was one, in the driver's record. A member that another one calls belongs to
/// the call of the first.
class Operation {
 public:
  /// `name` is static text.
  Operation(DriverState& state, const char* name);
  ~Operation();
  Operation(const Operation&) = delete;
  Operation& operator=(const Operation&) = delete;

  /// The calling thread's operation on the driver whose record this is; null when there is none.
  static Operation* of(const ErrorRecord& errors);
  /// What ends the calling thread's waits for this driver; nothing outside an operation.
  static Cancels cancels_of(const ErrorRecord& errors);

  /// Before a request: the recorder is given the name of the calling thread's operation, once.
  static void announce(FlightRecorder& recorder);

  /// Notes a failure; the last one stands. An empty text leaves the one before.
  void note(ELibDReturnCode code, const char* text = "");
  /// Notes the code that is about to be returned, unless it is none of a failure.
  ELibDReturnCode returns(ELibDReturnCode code);

 private:
  static constexpr std::size_t kTextRoom = 1024;

  Cancels cancels();
  bool is_cancelled();

  DriverState& state_;
  const char* const name_;
  Operation* const before_;  // of this thread
  Operation* const root_;    // this one, or the outermost on the same driver
  const unsigned cancels_before_;
  std::optional<CallEnds> ends_;
  bool announced_ = false;
  bool failed_ = false;
  bool cancelled_ = false;
  ELibDReturnCode code_ = LIBD_OK;
  char text_[kTextRoom];
};

}  // namespace vexa
