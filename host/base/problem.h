// A failure as the user sees it.
#ifndef HOST_BASE_PROBLEM_H_
#define HOST_BASE_PROBLEM_H_

#include <string>
#include <tl/expected.hpp>
#include <utility>

#include "host/base/exit_code.h"

namespace vexa::host {

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
