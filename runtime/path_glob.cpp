#include <dirent.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <new>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "runtime/base/glob_pattern.h"
#include "runtime/base/result.h"
#include "vexa/runtime.h"

namespace {

using ErrorCallback = int (*)(const char* path, int code);

constexpr std::size_t kFirstPasswordRoom = 1024;
constexpr std::size_t kLastPasswordRoom = std::size_t{1024} * 1024;

/// The home directory of `user`, or of the calling user when `user` is empty.
std::optional<std::string> home_in_password_database(const std::string& user) {
  for (std::size_t room = kFirstPasswordRoom; room <= kLastPasswordRoom; room *= 2) {
    std::vector<char> buffer(room);
    passwd entry{};
    passwd* found = nullptr;
    const int error = user.empty() ? getpwuid_r(getuid(), &entry, buffer.data(), room, &found)
                                   : getpwnam_r(user.c_str(), &entry, buffer.data(), room, &found);
    if (error == ERANGE) continue;
    if (found == nullptr) return std::nullopt;
    return std::string(found->pw_dir);
  }
  return std::nullopt;
}

std::optional<std::string> home_of(const std::string& user) {
  const char* home = user.empty() ? std::getenv("HOME") : nullptr;  // NOLINT(concurrency-mt-unsafe): read only
  if (home != nullptr) return std::string(home);
  return home_in_password_database(user);
}

/// `pattern` with the home directory in the place of a leading "~" or "~user". An unknown user stays as it is.
std::string expand_tilde(std::string_view pattern) {
  if (pattern.substr(0, 1) != "~") return std::string(pattern);
  const std::string_view user = pattern.substr(1, pattern.find('/') - 1);
  const std::optional<std::string> home = home_of(std::string(user));
  if (!home) return std::string(pattern);
  return *home + std::string(pattern.substr(1 + user.size()));
}

/// A piece of a pattern: a path taken as it is, and the component behind it whose names are to be found.
struct Step {
  std::string path;
  vexa::GlobPattern names;
};

struct CloseDirectory {
  void operator()(DIR* directory) const { closedir(directory); }
};

/// One search, along the components of its pattern.
class Search {
 public:
  Search(std::string_view pattern, int flags, ErrorCallback on_error) : flags_(flags), on_error_(on_error) {
    std::string path;
    while (!pattern.empty()) {
      const std::string_view component = pattern.substr(0, pattern.find('/'));
      pattern.remove_prefix(component.size());
      vexa::GlobPattern names(component);
      if (names.has_meta()) {
        steps_.push_back({std::exchange(path, {}), std::move(names)});
      } else {
        path += component;
      }
      const std::size_t slashes = std::min(pattern.find_first_not_of('/'), pattern.size());
      path += pattern.substr(0, slashes);
      pattern.remove_prefix(slashes);
    }
    tail_ = std::move(path);
  }

  /// Follows the pattern from `step` on, behind the path found so far. Returns 0 or PATHGLOB_ABORTED.
  int follow(const std::string& found, std::size_t step) {
    if (step == steps_.size()) {
      add_match(found + tail_);
      return 0;
    }
    const std::string folder = found + steps_[step].path;
    std::vector<std::string> names;
    if (!read_names(folder, step, names)) return PATHGLOB_ABORTED;
    for (const std::string& name : names) {
      if (const int result = follow(folder + name, step + 1); result != 0) return result;
    }
    return 0;
  }

  std::vector<std::string>& matches() { return matches_; }

 private:
  void add_match(std::string path) {
    struct stat64 status {};
    if (lstat64(path.c_str(), &status) != 0) return;
    if ((flags_ & PATHGLOB_MARK) != 0 && path.back() != '/' && stat64(path.c_str(), &status) == 0 &&
        S_ISDIR(status.st_mode)) {
      path += '/';
    }
    matches_.push_back(std::move(path));
  }

  /// Reads and closes the directory before the search goes down, so that depth costs no descriptors. False when the
  /// search is to end.
  bool read_names(const std::string& folder, std::size_t step, std::vector<std::string>& names) {
    const vexa::GlobPattern& pattern = steps_[step].names;
    const bool goes_deeper = step + 1 < steps_.size() || !tail_.empty();
    const char* path = folder.empty() ? "." : folder.c_str();
    const std::unique_ptr<DIR, CloseDirectory> directory(opendir(path));
    if (directory == nullptr) return errno == ENOTDIR || goes_on_after(path, errno);
    // NOLINTNEXTLINE(concurrency-mt-unsafe): the directory is this thread's alone
    while (const dirent64* entry = readdir64(directory.get())) {
      if (goes_deeper && entry->d_type == DT_REG) continue;  // nothing lies in a file
      if (pattern.matches(entry->d_name)) names.emplace_back(entry->d_name);
    }
    return true;
  }

  bool goes_on_after(const char* path, int error) const {
    if (on_error_ != nullptr && on_error_(path, error) != 0) return false;
    return (flags_ & PATHGLOB_ERR) == 0;
  }

  int flags_;
  ErrorCallback on_error_;
  std::vector<Step> steps_;
  std::string tail_;  // what is taken as it is behind the last step
  std::vector<std::string> matches_;
};

int compare_paths(const void* a, const void* b) {
  return strcoll(*static_cast<const char* const*>(a), *static_cast<const char* const*>(b));
}

/// Copies the matches to where the caller can own them. False when memory is short.
bool hand_out(const std::vector<std::string>& matches, pathglob_t& result) {
  result.paths = new (std::nothrow) char*[matches.size() + 1]();
  if (result.paths == nullptr) return false;
  for (const std::string& match : matches) {
    char* path = new (std::nothrow) char[match.size() + 1];
    if (path == nullptr) {
      pathglobfree(&result);
      return false;
    }
    std::memcpy(path, match.c_str(), match.size() + 1);
    result.paths[result.matchCount++] = path;
  }
  return true;
}

int search(std::string_view pattern, int flags, ErrorCallback on_error, pathglob_t& result) {
  Search walk(expand_tilde(pattern), flags, on_error);
  const int outcome = pattern.empty() ? 0 : walk.follow({}, 0);
  std::vector<std::string>& matches = walk.matches();
  if (outcome == 0 && matches.empty()) {
    if ((flags & PATHGLOB_NOCHECK) == 0) return PATHGLOB_NOMATCH;
    matches.emplace_back(pattern);
  }
  if (!hand_out(matches, result)) return PATHGLOB_NOSPACE;
  if ((flags & PATHGLOB_NOSORT) == 0) std::qsort(result.paths, result.matchCount, sizeof(char*), &compare_paths);
  return outcome;
}

}  // namespace

int pathglob(const char* pattern, int flags, int (*errfunc)(const char* path, int code), pathglob_t* result) {
  if (result == nullptr) return PATHGLOB_NOSPACE;
  *result = {};
  int outcome = PATHGLOB_NOSPACE;
  const bool fitted =
      vexa::within_memory([&] { outcome = search(pattern == nullptr ? "" : pattern, flags, errfunc, *result); });
  if (!fitted) outcome = PATHGLOB_NOSPACE;
  if (outcome == PATHGLOB_NOSPACE) errno = ENOMEM;
  return outcome;
}

void pathglobfree(pathglob_t* result) {
  if (result == nullptr) return;
  for (std::size_t i = 0; i < result->matchCount; ++i) delete[] result->paths[i];
  delete[] result->paths;
  *result = {};
}
