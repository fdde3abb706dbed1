// What hosts ask of the card over HTTP.
#ifndef VIRTUAL_CAMERA_CARD_CARD_CGI_H_
#define VIRTUAL_CAMERA_CARD_CARD_CGI_H_

#include <optional>

#include "virtual_camera/card/card.h"
#include "virtual_camera/wire/answer.h"
#include "virtual_camera/wire/message.h"

namespace vexa::camera {

// "/command/search?Order=oldest", and "/command/edgestorage.cgi?delete=all" or "?DeletebyName=NAME"; none for any
// other request.
[[nodiscard]] std::optional<Answer> answer_card(const RequestHead& request, Card& card);

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_CARD_CARD_CGI_H_
