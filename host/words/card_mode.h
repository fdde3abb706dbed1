// SPDX-License-Identifier: Apache-2.0
// How a camera is set to record on its card, read from the camera's answer.
#ifndef HOST_WORDS_CARD_MODE_H_
#define HOST_WORDS_CARD_MODE_H_

#include <string_view>

#include "vexa/edge_storage_info.h"

namespace vexa::host {

// Reads the answer to the inquiry "edgestorage": pairs `key=value`, joined by "&". A key that is missing leaves its
// field at the default: off, stream 1, no seconds before and after, no address.
[[nodiscard]] SLibDEdgeStorageMode read_card_mode(std::string_view answer);

}  // namespace vexa::host

#endif  // HOST_WORDS_CARD_MODE_H_
