// SPDX-License-Identifier: Apache-2.0
#include "session/link_watch.h"

#include <gtest/gtest.h>
#include <linux/rtnetlink.h>
#include <net/if.h>

#include <cstring>
#include <string>

namespace vexa {
namespace {

std::string message(std::uint16_t type, unsigned flags = 0, std::size_t content = sizeof(ifinfomsg)) {
  nlmsghdr header{};
  header.nlmsg_type = type;
  header.nlmsg_len = static_cast<std::uint32_t>(NLMSG_LENGTH(content));
  ifinfomsg link{};
  link.ifi_flags = flags;
  std::string bytes(NLMSG_ALIGN(header.nlmsg_len), '\0');
  std::memcpy(&bytes[0], &header, sizeof header);
  std::memcpy(&bytes[NLMSG_HDRLEN], &link, std::min(content, sizeof link));
  return bytes;
}

bool reports(const std::string& messages) { return reports_a_link(messages.data(), messages.size()); }

TEST(LinkWatch, ALinkThatRunsAnAddressAndARouteAreReported) {
  const struct {
    const char* what;
    std::string messages;
    bool reported;
  } cases[] = {{"a link runs", message(RTM_NEWLINK, IFF_UP | IFF_RUNNING), true},
               {"a link without a carrier", message(RTM_NEWLINK, IFF_UP), false},
               {"a link is removed", message(RTM_DELLINK, IFF_UP | IFF_RUNNING), false},
               {"an address comes", message(RTM_NEWADDR), true},
               {"an address goes", message(RTM_DELADDR), false},
               {"a route comes", message(RTM_NEWROUTE), true},
               {"a route goes", message(RTM_DELROUTE), false},
               {"the second of two", message(RTM_DELROUTE) + message(RTM_NEWROUTE), true},
               {"after one of an odd length", message(RTM_DELROUTE, 0, 13) + message(RTM_NEWADDR), true},
               {"a link of too few bytes", message(RTM_NEWLINK, IFF_RUNNING, 8), false},
               {"nothing", "", false}};
  for (const auto& row : cases) EXPECT_EQ(reports(row.messages), row.reported) << row.what;
}

TEST(LinkWatch, AMessageThatIsCutOffOrLiesAboutItsLengthIsPassedOver) {
  const std::string whole = message(RTM_NEWROUTE);
  for (std::size_t length = 0; length < whole.size(); ++length) {
    const std::string cut(whole, 0, length);  // its own allocation, so that a read past it is found
    EXPECT_FALSE(reports(cut)) << length;
  }
  for (const std::uint32_t length : {0U, 1U, 15U, 0xffffffffU}) {
    std::string lying = message(RTM_DELROUTE) + whole;
    std::memcpy(&lying[0], &length, sizeof length);
    EXPECT_FALSE(reports(lying)) << length;
  }
}

TEST(LinkWatch, WithoutMessagesThereIsNoneToRead) {
  const LinkWatch watch;
  ASSERT_GE(watch.descriptor(), 0);
  while (watch.read_news()) {  // what the system may have to report by itself
  }
  EXPECT_FALSE(watch.read_news());
}

}  // namespace
}  // namespace vexa
