// What a driver traces of its RTSP sessions, on standard error; and standard output kept for vexactl's results.
#ifndef HOST_ACCESS_DRIVER_TRACE_H_
#define HOST_ACCESS_DRIVER_TRACE_H_

#include <functional>

#include "host/access/redactor.h"
#include "host/base/unique_fd.h"
#include "host/console/terminal.h"

namespace vexa::host {

// Takes descriptor 1 away from the libraries, which then write to /dev/null, and returns what it was for the results of
// vexactl. Standard descriptors that are closed are opened on /dev/null first, so that no socket takes their numbers.
// Call it once, before anything is printed. Invalid when the system refuses, with errno set.
[[nodiscard]] UniqueFd take_standard_output();

// Shows a driver's trace on standard error, line by line, redacted. The terminal outlives the driver.
[[nodiscard]] std::function<void(const char*)> shown_trace(Terminal& terminal, Redactor redactor);

}  // namespace vexa::host

#endif  // HOST_ACCESS_DRIVER_TRACE_H_
