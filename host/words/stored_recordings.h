// The recordings on a camera's card, in words: when, of what codec, and as the name of a file.
#ifndef HOST_WORDS_STORED_RECORDINGS_H_
#define HOST_WORDS_STORED_RECORDINGS_H_

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "vexa/edge_storage_info.h"

namespace vexa::host {

using StoredRecordings = std::vector<SLibDEdgeStorageRecord>;

// The name that a recording gives its file, with `end` behind it: no two names give the same one, and none leads out of
// its folder.
[[nodiscard]] std::string file_name_of(const std::string& recording, const std::string& end);

// "2024-01-31T23:59:59Z".
[[nodiscard]] std::string utc_text(std::chrono::seconds since_1970);
// The same text as seconds since 1970, also without its "Z"; nothing for any other text and for days that do not exist.
[[nodiscard]] std::optional<std::chrono::seconds> utc_moment(const std::string& text);

[[nodiscard]] std::chrono::seconds start_of(const SLibDEdgeStorageRecord& record);
// Begins the recording's last second: pictures may come up to a second later.
[[nodiscard]] std::chrono::seconds end_of(const SLibDEdgeStorageRecord& record);

[[nodiscard]] std::string table_of(const StoredRecordings& records);
// An array with an object for each.
[[nodiscard]] std::string json_of(const StoredRecordings& records);

}  // namespace vexa::host

#endif  // HOST_WORDS_STORED_RECORDINGS_H_
