// When a session is kept alive.
#pragma once

#include <ctime>

namespace vexa {

/// Seconds between two keep-alives of a session that the camera ends after `session_timeout` idle seconds.
int keep_alive_interval(int session_timeout);

/// Whether one is due at `now`; `last` is 0 before the first, and one from the future does not count.
bool keep_alive_due(std::time_t now, std::time_t last, int interval);

}  // namespace vexa
