// Looking a host name up without standing still in the system's resolver.
#pragma once

#include "transport/tcp_connect.h"

namespace vexa {

/// The most lookups that run beside their callers at a time, those whose callers have left among them. Further ones
/// wait for a place.
inline constexpr int kMostLookups = 16;

/// Looks a name up in a thread of its own, so that `cancels` can end the wait: then there is no address, the error is
/// that of a resolver to be asked again, and what the thread finds is thrown away. Without the means for a thread the
/// caller asks the resolver itself.
ResolvedHost look_up_beside(const std::string& host, int port, Cancels cancels);

/// Asks the system's resolver, which takes as long as it takes.
ResolvedHost look_up(const std::string& host, int port);

}  // namespace vexa
