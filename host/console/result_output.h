// Writing a command's result.
#ifndef HOST_CONSOLE_RESULT_OUTPUT_H_
#define HOST_CONSOLE_RESULT_OUTPUT_H_

#include <string_view>

#include "host/base/exit_code.h"
#include "host/console/terminal.h"

namespace vexa::host {

// Writes it to standard output; reports a failure and returns its exit code.
[[nodiscard]] ExitCode write_result(Terminal& terminal, std::string_view text);

}  // namespace vexa::host

#endif  // HOST_CONSOLE_RESULT_OUTPUT_H_
