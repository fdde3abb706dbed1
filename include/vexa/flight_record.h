// SPDX-License-Identifier: Apache-2.0
// The latest requests, answers and stream events of a driver, for reports of faults.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "vexa/export.h"

class CVexaCommon;

namespace vexa {

/// The most lines that a flight record holds; the oldest makes room for the next.
constexpr std::uint32_t kFlightRecordLines = 1000;

/// Begins to keep the latest events of `driver`, a line each:
///
///     2026-01-31T23:59:59.123456Z 1 192.168.0.100:80 http > /command/inquiry.cgi?inq=system
///
/// That is: the time (UTC, microseconds), the driver's number in this process, the camera, the kind, the event. The
/// kinds are "http" and "rtsp" (">" a request, "<" an answer, "!" none came or it was refused), "video" (starts, stops,
/// losses, silences, new sources) and "call" (an operation
/// that sends requests, before the first of them; one that failed, with its code and text). The password stands in
/// no line, neither plain nor encoded; "***" stands in its place. Bytes that are not printable ASCII are shown as "?",
/// and line breaks as " | ". A line is cut after 240 characters.
///
/// A record takes about 270 KB until it is ended or the driver is destroyed, and about a microsecond an event; what it
/// does while none is kept is to test a flag. One that is kept already goes on.
///
/// Any thread, at any time of the driver's life; never blocks for the network. False when memory is short; then no
/// record is kept.
///
/// The environment variable VEXA_TRACE, if it is set when a driver is made, names a file to which the driver appends
/// all of its events, whether or not a record is kept; there a line is cut after 4000 characters. The file is made if
/// it is not there, readable by its owner alone; drivers and processes may share it, and it grows without a limit. A
/// file that cannot be opened is named on standard error, and the driver goes on without it; so it does when the disk
/// is full. Programs with more rights than their user (set-user-ID) ignore the variable.
VEXA_API bool BeginFlightRecord(CVexaCommon& driver) noexcept;

/// Ends the record and frees its memory. Any thread. Nothing happens when none is kept.
VEXA_API void EndFlightRecord(CVexaCommon& driver) noexcept;

/// Copies the record to `lines`, the oldest first, without line breaks; empty when none is kept. Any thread. False when
/// memory is short; `lines` then stays as it was.
VEXA_API bool ReadFlightRecord(CVexaCommon& driver, std::vector<std::string>& lines) noexcept;

/// Writes the records of all drivers of this process to an open descriptor, a line an event, those of one driver
/// together. For crash reports: takes no lock, allocates nothing and leaves errno as it was, so a signal handler may
/// call it. A line that another thread is just writing is left out. Ends early when the descriptor takes no more;
/// blocks for as long as writing to it blocks, and a thread that ends a record or destroys its driver waits meanwhile.
VEXA_API void WriteFlightRecords(int descriptor) noexcept;

}  // namespace vexa
