// SPDX-License-Identifier: Apache-2.0
#include "host/access/camera_address.h"

#include <fmt/format.h>
#include <netdb.h>

#include <algorithm>
#include <memory>

#include "host/base/number_text.h"

namespace vexa::host {
namespace {

constexpr std::size_t kLongestHost = 253;  // RFC 1035, 2.3.4, without the final dot

bool is_host_character(char c) {
  return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || (c >= '0' && c <= '9') || c == '.' || c == '-' || c == '_';
}

bool is_host(std::string_view text) {
  return !text.empty() && text.size() <= kLongestHost && std::all_of(text.begin(), text.end(), is_host_character);
}

}  // namespace

Result<CameraAddress> parse_camera_address(std::string_view text) {
  if (text.find('@') != std::string_view::npos || text.find('/') != std::string_view::npos) {
    return fail(usage("the camera's address is HOST or HOST:PORT, not a URL",
                      "User name and password have options of their own: --user, --password-file, --credentials."));
  }
  const std::size_t colon = text.find(':');
  if (colon != std::string_view::npos && text.find(':', colon + 1) != std::string_view::npos) {
    return fail(usage("IPv6 addresses are not supported", "Give the camera's IPv4 address or its name."));
  }
  CameraAddress address{std::string(text.substr(0, colon))};
  if (!is_host(address.host)) {
    return fail(
        usage("the camera's address is not a host name or IPv4 address", "For instance: 192.168.0.100 or cam1:8080."));
  }
  if (colon == std::string_view::npos) return address;
  const std::optional<int> port = number_text(text.substr(colon + 1), 1, 65535);
  if (!port)
    return fail(usage("the port in the camera's address is not a number from 1 to 65535", "For instance: cam1:80."));
  address.port = *port;
  return address;
}

std::string to_string(const CameraAddress& address) { return fmt::format("{}:{}", address.host, address.port); }

std::optional<Problem> check_name(const CameraAddress& address) {
  addrinfo hints{};
  hints.ai_family = AF_INET;
  hints.ai_socktype = SOCK_STREAM;
  addrinfo* found = nullptr;
  const int error = getaddrinfo(address.host.c_str(), nullptr, &hints, &found);
  const std::unique_ptr<addrinfo, void (*)(addrinfo*)> owner(found, freeaddrinfo);
  if (error == 0) return std::nullopt;
  return Problem{ExitCode::kUnreachable,
                 fmt::format("cannot find the camera {}: {}", address.host, gai_strerror(error)),
                 "Check the spelling, or give the camera's IPv4 address."};
}

}  // namespace vexa::host
