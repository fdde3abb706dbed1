#include "virtual_camera/model/cgi.h"

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
