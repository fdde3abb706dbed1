#include "host/console/result_output.h"

#include <fmt/format.h>

#include <system_error>

namespace vexa::host {

ExitCode write_result(Terminal& terminal, std::string_view text) {
  terminal.clear_progress();
  const int error = terminal.write_result(text);
  if (error == 0) return ExitCode::kOk;
  return terminal.report({ExitCode::kCannotWrite,
                          fmt::format("cannot write standard output: {}", std::generic_category().message(error)),
                          "Check where it is redirected to."});
}

}  // namespace vexa::host
