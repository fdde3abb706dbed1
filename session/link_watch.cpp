// SPDX-License-Identifier: Apache-2.0
#include "session/link_watch.h"

#include <linux/netlink.h>
#include <linux/rtnetlink.h>
#include <net/if.h>
#include <sys/socket.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace vexa {
namespace {

int open_netlink() {
  const int made = socket(AF_NETLINK, SOCK_RAW | SOCK_CLOEXEC | SOCK_NONBLOCK, NETLINK_ROUTE);
  if (made < 0) return -1;
  sockaddr_nl address{};
  address.nl_family = AF_NETLINK;
  address.nl_groups = RTMGRP_LINK | RTMGRP_IPV4_IFADDR | RTMGRP_IPV6_IFADDR | RTMGRP_IPV4_ROUTE | RTMGRP_IPV6_ROUTE;
  if (bind(made, reinterpret_cast<const sockaddr*>(&address), sizeof address) == 0) return made;
  close(made);
  return -1;
}

bool is_good_news(const nlmsghdr& message, const char* content) {
  if (message.nlmsg_type == RTM_NEWROUTE || message.nlmsg_type == RTM_NEWADDR) return true;
  if (message.nlmsg_type != RTM_NEWLINK || message.nlmsg_len < NLMSG_LENGTH(sizeof(ifinfomsg))) return false;
  ifinfomsg link;
  std::memcpy(&link, content, sizeof link);
  return (link.ifi_flags & IFF_RUNNING) != 0;
}

}  // namespace

bool reports_a_link(const char* messages, std::size_t length) {
  while (length >= sizeof(nlmsghdr)) {
    nlmsghdr header;
    std::memcpy(&header, messages, sizeof header);
    if (header.nlmsg_len < sizeof header || header.nlmsg_len > length) return false;
    if (is_good_news(header, messages + NLMSG_HDRLEN)) return true;
    const std::size_t step = NLMSG_ALIGN(header.nlmsg_len);
    if (step >= length) return false;
    messages += step;
    length -= step;
  }
  return false;
}

LinkWatch::LinkWatch() : socket_(open_netlink()) {}

LinkWatch::~LinkWatch() {
  if (socket_ >= 0) close(socket_);
}

bool LinkWatch::read_news() const {
  bool good = false;
  char news[8192];
  for (;;) {
    const ssize_t length = recv(socket_, news, sizeof news, 0);
    if (length < 0 && errno == EINTR) continue;
    // News that was lost for want of room may have been good.
    if (length < 0 && errno == ENOBUFS) {
      good = true;
      continue;
    }
    if (length <= 0) return good;
    good = good || reports_a_link(news, static_cast<std::size_t>(length));
  }
}

}  // namespace vexa
