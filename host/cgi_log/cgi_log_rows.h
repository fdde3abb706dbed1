// How an exchange of the CGI log is shown.
#ifndef HOST_CGI_LOG_CGI_LOG_ROWS_H_
#define HOST_CGI_LOG_CGI_LOG_ROWS_H_

#include <string>

#include "host/access/redactor.h"
#include "host/cgi_log/cgi_log.h"

namespace vexa::host {

[[nodiscard]] std::string table_head();
// One line, with its end. The camera's own words come last, so that they can pass for no other column.
[[nodiscard]] std::string table_row(const CgiExchange& exchange, const Redactor& redactor);
// One line of JSON, with its end; null for what is missing. It is in ASCII, all control characters escaped.
[[nodiscard]] std::string json_row(const CgiExchange& exchange, const Redactor& redactor);

}  // namespace vexa::host

#endif  // HOST_CGI_LOG_CGI_LOG_ROWS_H_
