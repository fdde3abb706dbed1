#include "virtual_camera/card/card_cgi.h"

#include <string>
#include <string_view>

#include "virtual_camera/wire/percent_text.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kDeleteByName = "DeletebyName=";

Answer search(std::string_view query, const Card& card) {
  if (query != "Order=oldest" && query != "Order=newest") return http_answer("400 Bad Request", "");
  const std::optional<std::string> lines =
      card.search(query == "Order=oldest" ? Card::Order::kOldest : Card::Order::kNewest);
  return lines ? http_answer("200 OK", *lines) : http_answer("503 Service Unavailable", "");
}

Answer deleted(bool done) { return done ? no_content() : http_answer("400 Bad Request", ""); }

}  // namespace

std::optional<Answer> answer_card(const RequestHead& request, Card& card) {
  if (request.method != "GET") return std::nullopt;
  if (request.path == "/command/search") return search(request.query, card);
  if (request.path != "/command/edgestorage.cgi") return std::nullopt;
  const std::string_view query = request.query;
  if (query == "delete=all") return deleted(card.erase_all());
  if (!query.starts_with(kDeleteByName)) return std::nullopt;
  const std::optional<std::string> name = percent_decoded(query.substr(kDeleteByName.size()));
  return deleted(name && card.erase(*name));
}

}  // namespace vexa::camera
