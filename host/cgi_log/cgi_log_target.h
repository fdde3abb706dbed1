// The file that --cgi-log names.
#ifndef HOST_CGI_LOG_CGI_LOG_TARGET_H_
#define HOST_CGI_LOG_CGI_LOG_TARGET_H_

#include <optional>
#include <string>

#include "host/base/problem.h"

namespace vexa::host {

// The driver does not report a log that it cannot write, so this does. Creates the file.
[[nodiscard]] std::optional<Problem> check_cgi_log_target(const std::string& path);

}  // namespace vexa::host

#endif  // HOST_CGI_LOG_CGI_LOG_TARGET_H_
