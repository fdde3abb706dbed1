// SPDX-License-Identifier: Apache-2.0
// Recordings as the camera lists them.
#pragma once

#include <string_view>
#include <vector>

#include "vexa/edge_storage_info.h"

namespace vexa {

/// The recordings of a search answer, in its order, up to the first one that cannot be read.
std::vector<SLibDEdgeStorageRecord> read_recordings(std::string_view answer);

/// The free space of the card in kilobytes; 0 when the answer names none.
int free_kilobytes(std::string_view answer);

}  // namespace vexa
