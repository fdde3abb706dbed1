// SPDX-License-Identifier: Apache-2.0
// The files of the page, and the description of the programs' interface.
#ifndef HOST_SERVE_PAGES_H_
#define HOST_SERVE_PAGES_H_

#include <string_view>

namespace vexa::host {

struct PageFile {
  std::string_view path;
  std::string_view type;
  std::string_view text;
};

// Null when there is none at this path.
[[nodiscard]] const PageFile* find_page_file(std::string_view path);
// The page that trades the token of its address for a cookie; it holds nothing of the cameras.
[[nodiscard]] const PageFile& sign_in_page();

}  // namespace vexa::host

#endif  // HOST_SERVE_PAGES_H_
