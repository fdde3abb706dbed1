// SPDX-License-Identifier: Apache-2.0
// The recordings on a camera's card, in words: when, of what codec, and as the name of a file.
#ifndef HOST_WORDS_STORED_RECORDINGS_H_
#define HOST_WORDS_STORED_RECORDINGS_H_

#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

#include "vexa/edge_storage_info.h"

namespace vexa::host {

using StoredRecordings = std::vector<SLibDEdgeStorageRecord>;

// The file name for a recording, `end` appended. Different recordings get different names, and none leads out of its
// folder.
[[nodiscard]] std::string file_name_of(const std::string& recording, const std::string& end);

[[nodiscard]] std::chrono::seconds start_of(const SLibDEdgeStorageRecord& record);
// Begins the recording's last second: pictures may come up to a second later.
[[nodiscard]] std::chrono::seconds end_of(const SLibDEdgeStorageRecord& record);

[[nodiscard]] std::string table_of(const StoredRecordings& records);
// An array with an object for each.
[[nodiscard]] std::string json_of(const StoredRecordings& records);

}  // namespace vexa::host

#endif  // HOST_WORDS_STORED_RECORDINGS_H_
