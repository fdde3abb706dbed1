#ifndef HOST_BASE_PRINTABLE_H_
#define HOST_BASE_PRINTABLE_H_

#include <string>
#include <string_view>

namespace vexa::host {

// A camera's text made safe for a terminal and for one line: control characters become "\x1b" and the like, everything
// else stays as it is.
[[nodiscard]] std::string printable(std::string_view text);

}  // namespace vexa::host

#endif  // HOST_BASE_PRINTABLE_H_
