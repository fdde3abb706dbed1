#include "virtual_camera/model/cgi.h"

#include <fmt/format.h>

#include <charconv>
#include <optional>

namespace vexa::camera {
namespace {

constexpr std::string_view kFolder = "/command/";
constexpr std::string_view kExtension = ".cgi";

Answer answer_inquiry(std::string_view query, const SettingsStore& settings) {
  constexpr std::string_view kKey = "inq=";
  if (!query.starts_with(kKey) || query.size() == kKey.size()) return http_answer("400 Bad Request", "");
  const std::optional<std::string> text = settings.answer(query.substr(kKey.size()));
  return text ? http_answer("200 OK", *text) : http_answer("404 Not Found", "");
}

}  // namespace

Answer http_answer(std::string_view status, std::string_view body) {
  Answer answer;
  std::from_chars(status.data(), status.data() + status.size(), answer.status);
  const std::string_view challenge = answer.status == 401 ? "WWW-Authenticate: Basic realm=\"camera\"\r\n" : "";
  answer.bytes = fmt::format("HTTP/1.0 {}\r\n{}Content-Type: text/plain\r\nContent-Length: {}\r\n\r\n{}", status,
                             challenge, body.size(), body);
  return answer;
}

Answer no_content() { return {204, "HTTP/1.0 204 No Content\r\n\r\n"}; }

Answer answer_command(const RequestHead& request, SettingsStore& settings) {
  if (!request.version.starts_with("HTTP/")) return http_answer("400 Bad Request", "");
  if (request.method != "GET") return http_answer("501 Not Implemented", "");
  std::string_view name = request.path;
  if (!name.starts_with(kFolder) || !name.ends_with(kExtension)) return http_answer("404 Not Found", "");
  name.remove_prefix(kFolder.size());
  name.remove_suffix(kExtension.size());
  if (name.empty() || name.find('/') != std::string_view::npos) return http_answer("404 Not Found", "");
  if (name == "inquiry") return answer_inquiry(request.query, settings);
  if (request.query.find('=') == std::string::npos) return http_answer("400 Bad Request", "");
  if (!settings.apply(name, request.query)) return http_answer("400 Bad Request", "");
  return no_content();
}

}  // namespace vexa::camera
