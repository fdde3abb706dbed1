// SPDX-License-Identifier: Apache-2.0
// Who is let in: every request passes here before anything answers it, files and metrics included.
#ifndef HOST_SERVE_GATE_H_
#define HOST_SERVE_GATE_H_

#include <string>
#include <string_view>
#include <vector>

namespace vexa::host {

// What of a request decides. An empty text: the field is missing.
struct Visitor {
  std::string_view method;
  std::string_view path;  // without the query
  std::string_view host;
  std::string_view origin;
  std::string_view fetch_site;     // Sec-Fetch-Site
  std::string_view cookie;         // the whole field
  std::string_view authorization;  // the whole field
  std::string_view token;          // X-Vexa-Token
  std::string_view content_type;
};

enum class Admission {
  kEnter,
  kSignIn,        // the page that trades the token for a cookie, and its script: for anybody
  kTrade,         // the token is right: a cookie may be given
  kBadRequest,    // no Host: 400
  kMisdirected,   // another host's name, as after DNS rebinding: 421
  kForbidden,     // a page of another origin: 403
  kUnauthorized,  // no token, or a wrong one: 401
};

// The rules of one server; immutable. Any thread.
class Gate {
 public:
  // `names`: what a Host field may state besides this machine's own names, with or without a port. `token`: what
  // programs present. `cookie`: what browsers present that have traded the token.
  Gate(unsigned port, std::vector<std::string> names, std::string token, std::string cookie);

  [[nodiscard]] Admission admit(const Visitor& visitor) const;
  // The value of Set-Cookie.
  [[nodiscard]] std::string cookie_field() const;

 private:
  [[nodiscard]] bool knows_host(std::string_view host) const;
  [[nodiscard]] bool has_cookie(std::string_view field) const;

  const std::vector<std::string> hosts_;
  const std::vector<std::string> names_;
  const std::string token_;
  const std::string cookie_;
};

// 128 random bits in hexadecimal; empty when the system has none.
[[nodiscard]] std::string random_token();
// Whether two texts are the same, in a time that does not depend on where they differ.
[[nodiscard]] bool same_secret(std::string_view given, std::string_view expected);

}  // namespace vexa::host

#endif  // HOST_SERVE_GATE_H_
