// The small header before each picture of a multipart stream.
#pragma once

#include <optional>
#include <string_view>

namespace vexa {

/// The bytes that follow, as "DataLen:" announces them; nullopt when it does not, or announces a negative number.
std::optional<int> announced_length(std::string_view part_header);

}  // namespace vexa
