// SPDX-License-Identifier: Apache-2.0
// Where the profiles lie: in a place relative to this library, so that the package can be kept anywhere.
#include <dlfcn.h>

#include <algorithm>
#include <filesystem>
#include <system_error>

#include "vexa/models.h"

namespace vexa {
namespace {

namespace fs = std::filesystem;

constexpr char kExtension[] = ".json";

fs::path folder_of_this_library() {
  Dl_info info = {};
  if (dladdr(reinterpret_cast<const void*>(&ProfileFolder), &info) == 0 || info.dli_fname == nullptr) return {};
  std::error_code error;
  const fs::path file = fs::canonical(info.dli_fname, error);
  return error ? fs::path() : file.parent_path();
}

std::string find_folder() {
  const fs::path library = folder_of_this_library();
  if (library.empty()) return {};
  // As installed, and as in a build.
  for (const char* way : {VEXA_PROFILES_FROM_LIBRARY, "../share/vexa/profiles"}) {
    std::error_code error;
    const fs::path folder = (library / way).lexically_normal();
    if (fs::is_directory(folder, error)) return folder.string();
  }
  return {};
}

std::vector<std::string> find_names() {
  std::vector<std::string> names;
  std::error_code error;
  const fs::path folder = ProfileFolder();
  if (folder.empty()) return names;
  for (fs::directory_iterator file(folder, error), end; !error && file != end; file.increment(error)) {
    if (file->path().extension() == kExtension) names.push_back(file->path().stem().string());
  }
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace

std::string ProfileFolder() {
  try {
    return find_folder();
  } catch (const std::exception&) {  // of the path's making: memory is short
    return {};
  }
}

std::vector<std::string> ProfileNames() {
  try {
    return find_names();
  } catch (const std::exception&) {
    return {};
  }
}

}  // namespace vexa
