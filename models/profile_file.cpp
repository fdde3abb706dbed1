// SPDX-License-Identifier: Apache-2.0
// Profiles out of files and texts.
#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>
#include <new>
#include <string_view>
#include <system_error>
#include <utility>

#include "models/json_text.h"
#include "models/reading.h"
#include "models/schema.h"
#include "vexa/models.h"

namespace vexa {
namespace {

constexpr std::size_t kLargestFile = 1 << 20;
constexpr std::string_view kProfileExtension = ".json";
// So short that storing it takes no memory.
constexpr char kOutOfMemory[] = "out of memory";

class OpenFile {
 public:
  explicit OpenFile(const std::string& path) : descriptor_(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {}
  ~OpenFile() {
    if (descriptor_ >= 0) close(descriptor_);
  }
  OpenFile(const OpenFile&) = delete;
  OpenFile& operator=(const OpenFile&) = delete;

  // All of the file, as far as kLargestFile and a byte more; 0 or the system's error.
  int read_into(std::string& text) const {
    if (descriptor_ < 0) return errno;
    char piece[4096];
    while (text.size() <= kLargestFile) {
      const ssize_t got = read(descriptor_, piece, sizeof piece);
      if (got < 0 && errno == EINTR) continue;
      if (got < 0) return errno;
      if (got == 0) return 0;
      text.append(piece, static_cast<std::size_t>(got));
    }
    return 0;
  }

 private:
  const int descriptor_;
};

bool is_name(const std::string& file) {
  return file.find('/') == std::string::npos && !std::string_view(file).ends_with(kProfileExtension);
}

std::string stem_of(std::string_view file) {
  file.remove_prefix(file.rfind('/') + 1);
  if (file.ends_with(kProfileExtension)) file.remove_suffix(kProfileExtension.size());
  return std::string(file);
}

bool refuse(ProfileError& error, const std::string& file, models::Complaint complaint) {
  error = {file, complaint.line, std::move(complaint.key), std::move(complaint.text)};
  return false;
}

bool parse_profile(const std::string& text, const std::string& file, Profile& profile, ProfileError& error) {
  auto parsed = models::parse_json(text);
  if (auto* problem = std::get_if<models::JsonProblem>(&parsed)) {
    return refuse(error, file, {problem->line, problem->key, problem->text});
  }
  const auto& root = std::get<models::Node>(parsed);
  static const auto schema = std::get<models::Node>(models::parse_json(models::kSchemaText));
  if (auto complaint = models::check_against(schema, root)) return refuse(error, file, *std::move(complaint));
  auto read = models::read_profile(root);
  if (auto* complaint = std::get_if<models::Complaint>(&read)) return refuse(error, file, *complaint);
  profile = std::move(std::get<Profile>(read));
  profile.name = stem_of(file);
  return true;
}

bool load_profile(const std::string& file, Profile& profile, ProfileError& error) {
  std::string path = file;
  if (is_name(file)) {
    const std::string folder = ProfileFolder();
    if (folder.empty()) return refuse(error, file, {0, "", "the installed profiles are not where they should be"});
    path = folder + "/" + file + std::string(kProfileExtension);
  }
  std::string text;
  const int failure = OpenFile(path).read_into(text);
  if (failure != 0) {
    return refuse(error, path, {0, "", "cannot be read: " + std::generic_category().message(failure)});
  }
  if (text.size() > kLargestFile) return refuse(error, path, {0, "", "is larger than 1 MiB"});
  return parse_profile(text, path, profile, error);
}

}  // namespace

std::string ProfileError::Message() const {
  std::string message = file;
  if (line > 0) message += ":" + std::to_string(line);
  if (!key.empty()) message += ": " + key;
  return message + ": " + text;
}

bool LoadProfile(const std::string& file, Profile& profile, ProfileError& error) {
  try {
    return load_profile(file, profile, error);
  } catch (const std::bad_alloc&) {
    error = {};
    error.text = kOutOfMemory;
    return false;
  }
}

bool ParseProfile(const std::string& text, const std::string& name, Profile& profile, ProfileError& error) {
  try {
    return parse_profile(text, name, profile, error);
  } catch (const std::bad_alloc&) {
    error = {};
    error.text = kOutOfMemory;
    return false;
  }
}

}  // namespace vexa
