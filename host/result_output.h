// How a command hands out its result.
#ifndef HOST_RESULT_OUTPUT_H_
#define HOST_RESULT_OUTPUT_H_

#include <nlohmann/json_fwd.hpp>
#include <string>
#include <string_view>

#include "host/exit_code.h"
#include "host/terminal.h"

namespace vexa::host {

// Indented, with a line end; bytes that are not UTF-8 become U+FFFD.
[[nodiscard]] std::string to_text(const nlohmann::ordered_json& json);

// Writes it to standard output and answers with the exit code.
[[nodiscard]] ExitCode write_result(Terminal& terminal, std::string_view text);

}  // namespace vexa::host

#endif  // HOST_RESULT_OUTPUT_H_
