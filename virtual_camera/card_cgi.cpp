#include "virtual_camera/card_cgi.h"

#include <charconv>
#include <string>
#include <string_view>

namespace vexa::camera {
namespace {

constexpr std::string_view kDeleteByName = "DeletebyName=";

std::string percent_decoded(std::string_view text) {
  std::string plain;
  for (std::size_t i = 0; i < text.size(); ++i) {
    unsigned byte = 0;
    const std::string_view digits = text.substr(i + 1, 2);
    const auto read = std::from_chars(digits.data(), digits.data() + digits.size(), byte, 16);
    const bool encoded = text[i] == '%' && digits.size() == 2 && read.ptr == digits.data() + digits.size();
    plain += encoded ? static_cast<char>(byte) : text[i];
    if (encoded) i += digits.size();
  }
  return plain;
}

Answer search(std::string_view query, const Card& card) {
  if (query != "Order=oldest" && query != "Order=newest") return http_answer("400 Bad Request", "");
  const std::optional<std::string> lines =
      card.search(query == "Order=oldest" ? Card::Order::kOldest : Card::Order::kNewest);
  return lines ? http_answer("200 OK", *lines) : http_answer("503 Service Unavailable", "");
}

Answer deleted(bool done) {
  return done ? Answer{204, "HTTP/1.0 204 No Content\r\n\r\n"} : http_answer("400 Bad Request", "");
}

}  // namespace

std::optional<Answer> answer_card(const RequestHead& request, Card& card) {
  if (request.method != "GET") return std::nullopt;
  if (request.path == "/command/search") return search(request.query, card);
  if (request.path != "/command/edgestorage.cgi") return std::nullopt;
  const std::string_view query = request.query;
  if (query == "delete=all") return deleted(card.erase_all());
  if (!query.starts_with(kDeleteByName)) return std::nullopt;
  return deleted(card.erase(percent_decoded(query.substr(kDeleteByName.size()))));
}

}  // namespace vexa::camera
