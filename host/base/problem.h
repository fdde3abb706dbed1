// SPDX-License-Identifier: Apache-2.0
// A failure as the user sees it, and the exit codes of vexactl.
#ifndef HOST_BASE_PROBLEM_H_
#define HOST_BASE_PROBLEM_H_

#include <string>
#include <tl/expected.hpp>
#include <utility>

namespace vexa::host {

enum class ExitCode : int {
  kOk = 0,
  kUsage = 1,         // the command line, or a file it names, cannot be used
  kUnreachable = 2,   // the camera cannot be reached, does not answer, or refuses the request
  kUnauthorized = 3,  // the camera refuses user name and password
  kNoVideo = 4,       // the camera sends no picture, or has stopped sending
  kCannotWrite = 5,   // a result cannot be written
  kIncomplete = 6,    // --strict: pictures of a recording were lost
  kInterrupted = 130  // ended by Ctrl-C or a signal; what was recorded until then is kept
};

struct Problem {
  ExitCode code;
  std::string text;    // what went wrong, without a full stop
  std::string advice;  // what to do next, a sentence
};

// A mistake in what was typed.
[[nodiscard]] Problem usage(std::string text, std::string advice);

// A value, or why there is none.
template <typename Value>
using Result = tl::expected<Value, Problem>;

// What a function that returns a Result<> returns on failure.
[[nodiscard]] inline tl::unexpected<Problem> fail(Problem problem) { return tl::unexpected(std::move(problem)); }

// A file that was named on the command line and cannot be read; `error` is the system's number.
[[nodiscard]] Problem unreadable(const std::string& path, int error);

}  // namespace vexa::host

#endif  // HOST_BASE_PROBLEM_H_
