// What a driver traces of its RTSP sessions.
#pragma once

#include <functional>

#include "vexa/export.h"

class CVexaCommon;

namespace vexa {

/// Gives `driver` a receiver for its trace: each RTSP request, as "send <REQUEST>", and how each keep-alive went. An
/// empty `trace` brings the default back.
///
/// WARNING: THE DEFAULT WRITES EACH REQUEST TO STANDARD OUTPUT, AND A REQUEST CARRIES THE USER NAME AND PASSWORD OF THE
/// CAMERA (Basic, in Base64, which everybody can read back). A host whose output is seen or kept by others sets a
/// trace;
/// `[](const char*) {}` keeps silent.
///
/// With a trace nothing is written to standard output, and the credentials in `line` are replaced by "***". `line` has
/// no line break at its end; a request has those of the protocol inside. It is the driver's and valid during the call.
///
/// Any thread may set it, at any time; what is under way may still trace to the one before. The receiver is called by
/// the threads that start and stop video and by the streaming thread, with no lock of the driver held, never by two
/// threads of one driver at a time unless a host calls protected operations in threads of its own. It must not throw
/// and should return soon: the stream waits for it. It is destroyed when another is set or the driver ends.
///
/// False when memory is short; the trace then stays as it was.
VEXA_API bool SetTrace(CVexaCommon& driver, std::function<void(const char* line)> trace) noexcept;

}  // namespace vexa
