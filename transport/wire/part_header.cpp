#include "transport/wire/part_header.h"

#include "runtime/base/text.h"

namespace vexa {

std::optional<int> announced_length(std::string_view part_header) {
  auto text = text_after(part_header, "DataLen:");
  const auto length = text ? take_int(*text) : std::nullopt;
  return length >= 0 ? length : std::nullopt;
}

}  // namespace vexa
