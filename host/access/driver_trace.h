// The driver traces its RTSP requests, credentials included, on standard output. vexactl's own output must hold
// neither.
#ifndef HOST_ACCESS_DRIVER_TRACE_H_
#define HOST_ACCESS_DRIVER_TRACE_H_

#include <memory>
#include <optional>
#include <thread>

#include "host/access/redactor.h"
#include "host/base/unique_fd.h"
#include "host/console/terminal.h"

namespace vexa::host {

// Takes descriptor 1 away from the driver, which then writes to /dev/null, and returns what it was for the results of
// vexactl. Standard descriptors that are closed are opened on /dev/null first, so that no socket takes their numbers.
// Call it once, before anything is printed. Invalid when the system refuses, with errno set.
[[nodiscard]] UniqueFd take_standard_output();

// While it lives, the driver's trace is shown on standard error, line by line, redacted. One a process, owned by the
// command; reads on a thread of its own and outlives the drivers.
class DriverTrace {
 public:
  // Null when the system refuses, with errno set.
  [[nodiscard]] static std::unique_ptr<DriverTrace> start(Terminal& terminal, Redactor redactor);
  ~DriverTrace();
  DriverTrace(const DriverTrace&) = delete;
  DriverTrace& operator=(const DriverTrace&) = delete;

 private:
  DriverTrace(UniqueFd lines, Terminal& terminal, Redactor redactor);
  void show_lines();

  UniqueFd lines_;
  Terminal& terminal_;
  const Redactor redactor_;
  std::thread thread_;
};

}  // namespace vexa::host

#endif  // HOST_ACCESS_DRIVER_TRACE_H_
