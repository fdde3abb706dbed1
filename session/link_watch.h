// SPDX-License-Identifier: Apache-2.0
// The system's news of links and routes.
#pragma once

#include <cstddef>

namespace vexa {

/// Whether messages of the system report that a link runs, or that an address or a route has come. What
/// is cut off or of another kind is passed over.
[[nodiscard]] bool reports_a_link(const char* messages, std::size_t length);

/// A netlink socket. Where the system refuses one there is no news, and sessions go by their plan alone.
class LinkWatch {
 public:
  LinkWatch();
  ~LinkWatch();
  LinkWatch(const LinkWatch&) = delete;
  LinkWatch& operator=(const LinkWatch&) = delete;

  /// Readable when there is news; -1 when there is no socket.
  [[nodiscard]] int descriptor() const { return socket_; }
  /// Reads all news: whether a link, an address or a route has come.
  [[nodiscard]] bool read_news() const;

 private:
  int socket_;
};

}  // namespace vexa
