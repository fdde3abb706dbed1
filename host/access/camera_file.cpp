// SPDX-License-Identifier: Apache-2.0
#include "host/access/camera_file.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <nlohmann/json.hpp>
#include <set>

#include "host/base/printable.h"
#include "host/base/unique_fd.h"
#include "models/counted_text.h"

namespace vexa::host {
namespace {

using Json = nlohmann::json;

constexpr std::size_t kLargestFile = std::size_t{4} << 20U;
constexpr std::size_t kLongestName = 64;
constexpr std::size_t kLongestShown = 32;
constexpr int kMostStreams = 16;
constexpr char kAdvice[] = R"(A file of cameras is {"cameras": [{"name": "gate", "address": "192.168.0.100"}]}.)";
constexpr char kKeys[] =
    "Its keys are name, address, profile, tileStream, credentials, userVariable and passwordVariable.";

Result<std::string> read_text(const std::string& path) {
  const UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
  if (!file.valid()) return fail(unreadable(path, errno));
  std::string text;
  std::array<char, 16384> piece{};
  for (;;) {
    const ssize_t count = read_some(file.get(), piece.data(), piece.size());
    if (count < 0) return fail(unreadable(path, errno));
    if (count == 0) return text;
    text.append(piece.data(), static_cast<std::size_t>(count));
    if (text.size() > kLargestFile) return fail(unreadable(path, EFBIG));
  }
}

bool is_name(const std::string& text) {
  return !text.empty() && text.size() <= kLongestName && printable(text) == text && text.front() != '-';
}

bool is_variable(const std::string& text) {
  return !text.empty() && text.find_first_of("=\0", 0, 2) == std::string::npos;
}

// Takes the cameras from the parser, value by value. Stops it at the first mistake.
class Reader final : public nlohmann::json_sax<Json> {
 public:
  Reader(const std::string& path, const int& line) : path_(path), line_(line) {
    folder_ = path.substr(0, path.rfind('/') + 1);  // npos + 1: none
  }

  [[nodiscard]] std::vector<FileCamera>& cameras() { return cameras_; }
  [[nodiscard]] std::optional<Problem>& problem() { return problem_; }
  [[nodiscard]] Problem at(int line, std::string_view text, std::string advice) const {
    return usage(fmt::format("{}, line {}: {}", path_, line, text), std::move(advice));
  }

  bool start_object(std::size_t /*count*/) override {
    if (place_ == Place::kBegin) return go_to(Place::kFile);
    if (place_ != Place::kCameras) return refuse_value();
    camera_ = {};
    camera_.line = line_;
    keys_.clear();
    return go_to(Place::kCamera);
  }
  bool end_object() override {
    if (place_ == Place::kFile) return go_to(Place::kEnd);
    key_.clear();
    place_ = Place::kCameras;
    return check_camera();
  }
  bool start_array(std::size_t /*count*/) override {
    return place_ == Place::kFile && !key_.empty() ? go_to(Place::kCameras) : refuse_value();
  }
  bool end_array() override {
    key_.clear();
    return go_to(Place::kFile);
  }
  bool key(std::string& name) override {
    key_ = name;
    key_line_ = line_;
    if (place_ == Place::kFile) {
      if (name == "cameras" && !has_cameras_) return has_cameras_ = true;
      return refuse_key(name == "cameras" ? "is there twice" : "is not a key of the file", kAdvice);
    }
    if (!keys_.insert(name).second) return refuse_key("is there twice", kKeys);
    if (name == "password" || name == "user") {
      return refuse_key("does not belong into this file",
                        "Name a file as credentials, or variables of the environment.");
    }
    const bool known = slot(name) != nullptr || name == "tileStream" || name == "address";
    return known || refuse_key("is not a key of a camera", kKeys);
  }
  bool string(std::string& text) override {
    if (place_ != Place::kCamera) return refuse_value();
    if (key_ == "address") return take_address(text);
    std::optional<std::string>* const into = slot(key_);
    if (into == nullptr) return refuse_value();
    if (key_ == "name" && !is_name(text)) {
      return refuse_key("is not a name", "A name has 1 to 64 printable characters and begins without a hyphen.");
    }
    if (text.empty() || text.find('\0') != std::string::npos)
      return refuse_key("is empty or holds a NUL character", kKeys);
    if (into == &camera_.user_variable || into == &camera_.password_variable) {
      if (!is_variable(text)) return refuse_key("is not a variable's name", "For instance: GATE_PASSWORD.");
    }
    *into = into == &camera_.credentials_file && text.front() != '/' ? folder_ + text : text;
    return true;
  }
  bool number_unsigned(std::uint64_t number) override {
    if (place_ != Place::kCamera || key_ != "tileStream") return refuse_value();
    if (number < 1 || number > kMostStreams) {
      return refuse_key(fmt::format("is not a number from 1 to {}", kMostStreams), "1 is the camera's first stream.");
    }
    camera_.tile_stream = static_cast<int>(number);
    return true;
  }
  bool number_integer(std::int64_t /*number*/) override { return refuse_value(); }
  bool number_float(double /*number*/, const std::string& /*text*/) override { return refuse_value(); }
  bool boolean(bool /*value*/) override { return refuse_value(); }
  bool null() override { return refuse_value(); }
  bool binary(Json::binary_t& /*value*/) override { return refuse_value(); }
  // Without the parser's text, which repeats what it has read.
  bool parse_error(std::size_t /*position*/, const std::string& /*token*/, const Json::exception& /*error*/) override {
    return stop(
        at(line_, key_.empty() ? "is not JSON" : fmt::format("is not JSON, after \"{}\"", shown(key_)), kAdvice));
  }

 private:
  enum class Place { kBegin, kFile, kCameras, kCamera, kEnd };

  static std::string shown(const std::string& key) { return printable(key.substr(0, kLongestShown)); }

  bool go_to(Place place) {
    place_ = place;
    return true;
  }
  bool stop(Problem problem) {
    problem_ = std::move(problem);
    return false;
  }
  bool refuse_key(const std::string& why, std::string advice) {
    return stop(at(key_line_, fmt::format("\"{}\" {}", shown(key_), why), std::move(advice)));
  }
  bool refuse_value() {
    if (key_.empty()) return stop(at(line_, "a value stands where it does not belong", kAdvice));
    if (place_ == Place::kCameras) return stop(at(line_, "what \"cameras\" lists is not a camera in braces", kAdvice));
    const char* const kind = key_ == "tileStream" ? "is not a whole number"
                             : key_ == "cameras"  ? "is not a list"
                                                  : "is not a text";
    return refuse_key(kind, kAdvice);
  }
  bool take_address(const std::string& text) {
    const Result<CameraAddress> address = parse_camera_address(text);
    if (!address) return refuse_key("cannot be used: " + address.error().text, address.error().advice);
    camera_.address = *address;
    return true;
  }
  // Where a text goes; null for a key whose value is no text, or that nobody knows.
  std::optional<std::string>* slot(const std::string& name) {
    if (name == "name") return &name_;
    if (name == "profile") return &camera_.profile;
    if (name == "credentials") return &camera_.credentials_file;
    if (name == "userVariable") return &camera_.user_variable;
    return name == "passwordVariable" ? &camera_.password_variable : nullptr;
  }
  bool check_camera() {
    for (const char* const needed : {"name", "address"}) {
      if (keys_.count(needed) == 0)
        return stop(at(camera_.line, fmt::format("a camera without \"{}\"", needed), kKeys));
    }
    camera_.name = *std::exchange(name_, std::nullopt);
    if (camera_.user_variable.has_value() != camera_.password_variable.has_value()) {
      return stop(at(camera_.line, "a camera with one of \"userVariable\" and \"passwordVariable\"", "Give both."));
    }
    if (camera_.credentials_file && camera_.user_variable) {
      return stop(at(camera_.line, "a camera with both \"credentials\" and \"userVariable\"", "Give one of them."));
    }
    if (!names_.insert(camera_.name).second) {
      return stop(at(camera_.line, fmt::format("a second camera with the \"name\" {}", camera_.name),
                     "Each camera has a name of its own."));
    }
    cameras_.push_back(std::exchange(camera_, {}));
    return true;
  }

  const std::string& path_;
  const int& line_;
  std::string folder_;
  Place place_ = Place::kBegin;
  bool has_cameras_ = false;
  std::string key_;
  int key_line_ = 0;
  FileCamera camera_;
  std::optional<std::string> name_;
  std::set<std::string> keys_;
  std::set<std::string> names_;
  std::vector<FileCamera> cameras_;
  std::optional<Problem> problem_;
};

Result<std::string> value_of(const std::string& variable, const char* const* environment) {
  for (; *environment != nullptr; ++environment) {
    if (auto value = variable_value(*environment, variable)) return *std::move(value);
  }
  return fail(usage(fmt::format("the environment has no variable {}", printable(variable)), "Set it and export it."));
}

}  // namespace

Result<CameraFile> CameraFile::read(const std::string& path) {
  const Result<std::string> text = read_text(path);
  if (!text) return fail(text.error());
  return parse(*text, path);
}

Result<CameraFile> CameraFile::parse(std::string_view text, const std::string& path) {
  int line = 1;
  Reader reader(path, line);
  const models::CountedText begin(text.data(), &line);
  const models::CountedText end(text.data() + text.size(), &line);
  const bool whole = Json::sax_parse(begin, end, &reader);
  if (reader.problem()) return fail(*std::move(reader.problem()));
  if (!whole || reader.cameras().empty()) return fail(reader.at(line, "the file lists no \"cameras\"", kAdvice));
  return CameraFile(path, std::move(reader.cameras()));
}

Result<FileCamera> CameraFile::find(std::string_view name) const {
  const auto found =
      std::find_if(cameras_.begin(), cameras_.end(), [&](const auto& camera) { return camera.name == name; });
  if (found != cameras_.end()) return *found;
  // What was typed may be a password at a wrong place, and stays unsaid.
  return fail(usage(fmt::format("{} has no camera of that name", path_),
                    fmt::format("It has {}, the first is {}.", cameras_.size(), cameras_.front().name)));
}

Result<Credentials> CameraFile::credentials_of(const FileCamera& camera, const CredentialSources& otherwise,
                                               const char* const* environment) const {
  const auto named = [&](Problem problem) {
    problem.text = fmt::format("{}, line {}, camera {}: {}", path_, camera.line, camera.name, problem.text);
    return fail(std::move(problem));
  };
  CredentialSources sources = otherwise;
  if (camera.credentials_file) sources = {.credentials_file = camera.credentials_file};
  if (camera.user_variable) {
    Result<std::string> user = value_of(*camera.user_variable, environment);
    if (!user) return named(std::move(user.error()));
    Result<std::string> password = value_of(*camera.password_variable, environment);
    if (!password) return named(std::move(password.error()));
    sources = {.environment_user = *std::move(user), .environment_password = *std::move(password)};
  }
  Result<Credentials> credentials = load_credentials(sources);
  if (!credentials) return named(std::move(credentials.error()));
  return credentials;
}

}  // namespace vexa::host
