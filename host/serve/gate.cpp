// SPDX-License-Identifier: Apache-2.0
#include "host/serve/gate.h"

#include <fmt/format.h>
#include <sys/random.h>

#include <algorithm>
#include <array>
#include <cctype>
#include <cstddef>
#include <utility>

namespace vexa::host {
namespace {

constexpr std::string_view kBearer = "Bearer ";
constexpr std::string_view kCookie = "vexa=";

std::string lower(std::string_view text) {
  std::string small(text);
  std::transform(small.begin(), small.end(), small.begin(),
                 [](char c) { return static_cast<char>(std::tolower(static_cast<unsigned char>(c))); });
  return small;
}

std::vector<std::string> own_hosts(unsigned port) {
  std::vector<std::string> hosts;
  for (const char* name : {"localhost", "localhost.", "127.0.0.1", "[::1]"}) {
    hosts.push_back(fmt::format("{}:{}", name, port));
    if (port == 80) hosts.emplace_back(name);
  }
  return hosts;
}

bool is_public(const Visitor& visitor) {
  const bool reads = visitor.method == "GET" || visitor.method == "HEAD";
  return reads && (visitor.path == "/" || visitor.path == "/sign-in.js");
}

// An origin is a scheme and the host that its page came from: here the one that the request goes to.
bool is_own_origin(std::string_view origin, std::string_view host) {
  for (const std::string_view scheme : {"http://", "https://"}) {
    if (origin.starts_with(scheme)) return lower(origin.substr(scheme.size())) == lower(host);
  }
  return false;
}

}  // namespace

Gate::Gate(unsigned port, std::vector<std::string> names, std::string token, std::string cookie)
    : hosts_(own_hosts(port)), names_(std::move(names)), token_(std::move(token)), cookie_(std::move(cookie)) {}

bool Gate::knows_host(std::string_view host) const {
  const std::string asked = lower(host);
  if (std::find(hosts_.begin(), hosts_.end(), asked) != hosts_.end()) return true;
  const auto is_named = [&](const std::string& name) {
    const std::string known = lower(name);
    const bool has_port = known.find(':') != std::string::npos;
    return asked == known || (!has_port && asked.substr(0, asked.find(':')) == known);
  };
  return std::any_of(names_.begin(), names_.end(), is_named);
}

bool Gate::has_cookie(std::string_view field) const {
  while (!field.empty()) {
    const std::size_t end = std::min(field.find(';'), field.size());
    std::string_view pair = field.substr(0, end);
    field.remove_prefix(std::min(end + 1, field.size()));
    pair.remove_prefix(std::min(pair.find_first_not_of(' '), pair.size()));
    if (pair.starts_with(kCookie) && same_secret(pair.substr(kCookie.size()), cookie_)) return true;
  }
  return false;
}

Admission Gate::admit(const Visitor& visitor) const {
  if (visitor.host.empty()) return Admission::kBadRequest;
  if (!knows_host(visitor.host)) return Admission::kMisdirected;
  const std::string_view site = visitor.fetch_site;
  if (!site.empty() && site != "same-origin" && site != "none") return Admission::kForbidden;
  if (!visitor.origin.empty() && !is_own_origin(visitor.origin, visitor.host)) return Admission::kForbidden;
  const bool bearer =
      visitor.authorization.starts_with(kBearer) && same_secret(visitor.authorization.substr(kBearer.size()), token_);
  if (visitor.method == "POST" && visitor.path == "/session") {
    const bool right = same_secret(visitor.token, token_) && visitor.content_type == "application/json";
    return right ? Admission::kTrade : Admission::kUnauthorized;
  }
  if (bearer || has_cookie(visitor.cookie)) return Admission::kEnter;
  return is_public(visitor) ? Admission::kSignIn : Admission::kUnauthorized;
}

std::string Gate::cookie_field() const {
  return fmt::format("{}{}; HttpOnly; SameSite=Strict; Path=/", kCookie, cookie_);
}

std::string random_token() {
  std::array<unsigned char, 16> bytes{};
  if (getrandom(bytes.data(), bytes.size(), 0) != static_cast<ssize_t>(bytes.size())) return {};
  std::string text;
  for (const unsigned char byte : bytes) text += fmt::format("{:02x}", byte);
  return text;
}

bool same_secret(std::string_view given, std::string_view expected) {
  if (given.size() != expected.size() || expected.empty()) return false;
  unsigned differing = 0;
  for (std::size_t i = 0; i < given.size(); ++i) {
    differing |= static_cast<unsigned>(static_cast<unsigned char>(given[i]) ^ static_cast<unsigned char>(expected[i]));
  }
  return differing == 0;
}

}  // namespace vexa::host
