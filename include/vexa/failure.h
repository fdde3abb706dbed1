// Why an operation failed, as one record, and codes by name.
#pragma once

#include <cstdint>
#include <string>
#include <utility>

#include "vexa/export.h"
#include "vexa/return_codes.h"

class CVexaCommon;

namespace vexa {

/// A failed operation of one driver. `size` is set by the constructor; fields are only ever added at the end.
struct FailureReport {
  std::uint32_t size = sizeof(FailureReport);  ///< bytes of the record that its owner knows
  ELibDReturnCode code = LIBD_OK;              ///< LIBD_OK: nothing has failed yet
  bool cancelled = false;                      ///< ended by Cancel or a CancelToken, not by the camera
  std::string text;       ///< why, for people: as GetLatestErrorText; empty where there is no more to say than the code
  std::string operation;  ///< "StartVideoStreaming"; "StreamingThread" for what the stream met; empty: not known
  std::string camera;     ///< "HOST:PORT" as the connection was set then; empty: not known
};

/// Fills `report`, up to its `size`, with the latest failed operation: all fields of one and the same, whatever other
/// threads do. An operation that succeeds leaves it; one that returns LIBD_OK although a step of it failed (a stop
/// whose TEARDOWN was not answered) enters that step. LIBD_NO_FRAME is no failure, unless a cancel ended the poll. When
/// memory is short the texts are empty. Any thread; does not block.
VEXA_API void GetLastFailure(CVexaCommon& driver, FailureReport& report) noexcept;

/// The same as a value.
inline FailureReport LastFailure(CVexaCommon& driver) {
  FailureReport report;
  GetLastFailure(driver, report);
  return report;
}

/// The enumerator's name, "LIBD_TIMEOUT"; "unknown" for any other number. Static text, never null. Any thread.
VEXA_API const char* CodeName(ELibDReturnCode code) noexcept;

}  // namespace vexa
