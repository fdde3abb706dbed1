// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/fleet/fleet_file.h"

#include <fmt/format.h>

#include <algorithm>
#include <cctype>
#include <cstdint>
#include <fstream>
#include <iterator>
#include <optional>
#include <set>

#include "models/json_text.h"
#include "vexa/models.h"
#include "virtual_camera/camera_host.h"
#include "virtual_camera/model/camera_profile.h"
#include "virtual_camera/model/setting_rules.h"
#include "virtual_camera/values/fault_words.h"
#include "virtual_camera/values/number_text.h"

namespace vexa::camera {
namespace {

using models::Member;
using models::Node;
using Kind = Node::Kind;

constexpr std::size_t kLargestFile = std::size_t{1} << 20U;
constexpr std::size_t kLongestName = 64;

// What a camera of the file takes besides its own texts and numbers.
constexpr std::string_view kKeys[] = {"name",         "profile",       "count",    "address",    "httpPort",
                                      "rtspPort",     "user",          "password", "maxViewers", "cardMegabytes",
                                      "packetFaults", "requestFaults", "settings", "network"};

std::string lower(std::string_view text) {
  std::string small(text);
  std::transform(small.begin(), small.end(), small.begin(),
                 [](char c) { return static_cast<char>(std::tolower(static_cast<unsigned char>(c))); });
  return small;
}

bool is_name(std::string_view text) {
  const auto letter = [](char c) { return std::isalnum(static_cast<unsigned char>(c)) != 0 || c == '-' || c == '_'; };
  return !text.empty() && text.size() <= kLongestName && lower(text) != "all" &&
         std::all_of(text.begin(), text.end(), letter);
}

// The text of a name, a file and a model reduced to what a name may hold.
std::string name_from(std::string_view text) {
  text.remove_prefix(std::min(text.find_last_of('/') + 1, text.size()));
  if (text.ends_with(".json")) text.remove_suffix(5);
  std::string name = lower(text.substr(0, 40));
  std::replace_if(
      name.begin(), name.end(), [](char c) { return !is_name(std::string_view(&c, 1)); }, '-');
  return name.empty() ? "camera" : name;
}

bool is_loopback(std::string_view address) {
  return address.starts_with("127.") && !address_after(std::string(address), 0).empty();
}

// Profiles are read once, however many cameras are of them.
class Profiles {
 public:
  // Empty on success, else why there is no such profile.
  std::string set(const std::string& profile, CameraOptions& options) {
    auto& rules = loaded_[profile];
    if (!rules) {
      auto read = load_camera_profile(profile);
      if (auto* error = std::get_if<std::string>(&read)) return std::move(*error);
      rules = std::make_shared<const SettingRules>(std::get<CameraProfile>(std::move(read)));
    }
    options.profile_path = profile;
    options.profile = rules;
    return {};
  }

 private:
  std::map<std::string, std::shared_ptr<const SettingRules>> loaded_;
};

// Reads the cameras of a file one after the other. The first mistake is kept, and all that follows is not read.
class FleetReader {
 public:
  FleetReader(const std::string& file, const CameraOptions& common) : file_(file), common_(common) {
    next_address_ = common.address;
  }

  FleetResult read(std::string_view text) {
    auto parsed = models::parse_json(text);
    if (const auto* problem = std::get_if<models::JsonProblem>(&parsed)) {
      refuse(problem->line, problem->key, problem->text);
    } else {
      read_file(std::get<Node>(parsed));
    }
    if (!error_.empty()) return error_;
    return std::move(cameras_);
  }

 private:
  void refuse(int line, std::string_view key, std::string_view text) {
    if (!error_.empty()) return;
    const std::string named = key.empty() ? "" : fmt::format("{}: ", key);
    error_ = fmt::format("{}:{}: {}{}", file_, line, named, text);
  }
  [[nodiscard]] bool good() const { return error_.empty(); }

  void read_file(const Node& root) {
    const Node* list = root.find("cameras");
    if (root.kind != Kind::kObject || list == nullptr || list->kind != Kind::kArray || list->items.empty()) {
      return refuse(root.line, "cameras", "must be a list of cameras");
    }
    for (const Member& member : root.members) {
      if (member.key != "cameras") refuse(member.value.line, member.key, "is no key of a fleet");
    }
    for (const Node& camera : list->items) {
      if (good()) read_camera(camera);
    }
  }

  void read_camera(const Node& node) {
    if (node.kind != Kind::kObject) return refuse(node.line, "cameras", "must hold objects");
    for (const Member& member : node.members) {
      if (std::find(std::begin(kKeys), std::end(kKeys), member.key) != std::end(kKeys)) continue;
      refuse(member.value.line, member.key.substr(0, kLongestName), "is no key of a camera");
    }
    FleetCamera camera;
    camera.options = common_;
    read_profile(node, camera);
    read_access(node, camera.options);
    read_faults(node, camera.options);
    read_state(node, camera);
    const std::int64_t count = number(node, "count", 1, kMostCameras).value_or(1);
    const std::optional<std::string> name = text(node, "name");
    if (name && !is_name(*name)) {
      refuse(node.find("name")->line, "name", "must have 1 to 64 of a-z, A-Z, 0-9, \"-\" and \"_\"");
    }
    if (good()) add(std::move(camera), name, static_cast<std::size_t>(count), node);
  }

  void read_profile(const Node& node, FleetCamera& camera) {
    camera.profile = text(node, "profile").value_or(common_.profile_path);
    if (!good() || camera.profile.empty()) return;
    const std::string problem = profiles_.set(camera.profile, camera.options);
    const Node* stated = node.find("profile");
    if (!problem.empty()) refuse(stated == nullptr ? node.line : stated->line, "profile", problem);
  }

  void read_access(const Node& node, CameraOptions& options) {
    if (const auto address = text(node, "address")) {
      if (!is_loopback(*address)) refuse(node.find("address")->line, "address", "must be an address of 127.0.0.0/8");
      next_address_ = *address;
    }
    const auto port = [&](const char* key, std::uint16_t& into) {
      if (const auto value = number(node, key, 0, 65535)) into = static_cast<std::uint16_t>(*value);
    };
    port("httpPort", options.http_port);
    port("rtspPort", options.rtsp_port);
    options.user = text(node, "user").value_or(options.user);
    options.password = text(node, "password").value_or(options.password);
    if (options.user.find(':') != std::string::npos) refuse(node.line, "user", "cannot hold a colon");
  }

  void read_faults(const Node& node, CameraOptions& options) {
    if (const Node* faults = member(node, "packetFaults", Kind::kObject, "must be an object")) {
      for (const Member& fault : faults->members) {
        const Node& value = fault.value;
        const std::string text = value.kind == Kind::kInteger ? fmt::format("{}", value.number) : value.text;
        const bool is_number = value.kind == Kind::kInteger || value.kind == Kind::kFraction;
        if (is_number && set_packet_fault(options.packet_faults, fault.key, text)) continue;
        refuse(value.line, "packetFaults." + fault.key, "is no fault of packets, or has a value out of its range");
      }
    }
    if (const Node* faults = member(node, "requestFaults", Kind::kArray, "must be a list")) {
      for (const Node& fault : faults->items) add_request_fault(fault, options);
    }
  }

  void add_request_fault(const Node& node, CameraOptions& options) {
    std::string parts[3];
    constexpr std::string_view kParts[] = {"fault", "match", "value"};
    bool known = node.kind == Kind::kObject;
    for (const Member& part : node.members) {
      const auto at = std::find(std::begin(kParts), std::end(kParts), part.key);
      const bool number = part.value.kind == Kind::kInteger && part.key == "value";
      known = known && at != std::end(kParts) && (number || part.value.kind == Kind::kString);
      if (known) parts[at - kParts] = number ? fmt::format("{}", part.value.number) : part.value.text;
    }
    std::optional<RequestFault> fault = known ? request_fault(parts[0], parts[1], parts[2]) : std::nullopt;
    if (!fault) return refuse(node.line, "requestFaults", "must hold objects of \"fault\", \"match\" and \"value\"");
    options.request_faults.push_back(*std::move(fault));
  }

  void read_state(const Node& node, FleetCamera& camera) {
    if (const auto viewers = number(node, "maxViewers", 1, 256)) {
      camera.options.max_viewers = static_cast<std::size_t>(*viewers);
    }
    if (const auto card = number(node, "cardMegabytes", 0, 1 << 20)) {
      camera.options.card_bytes = static_cast<std::uint64_t>(*card) << 20U;
    }
    if (const auto network = text(node, "network")) {
      camera.plugged = *network == "plugged";
      if (*network != "plugged" && *network != "unplugged") {
        refuse(node.find("network")->line, "network", R"(must be "plugged" or "unplugged")");
      }
    }
    const Node* sections = member(node, "settings", Kind::kObject, "must be an object");
    if (sections == nullptr) return;
    for (const Member& section : sections->members) {
      if (section.value.kind != Kind::kObject) refuse(section.value.line, "settings", "must hold objects");
      for (const Member& setting : section.value.members) {
        const bool is_text = setting.value.kind == Kind::kString;
        if (!is_text) refuse(setting.value.line, "settings." + section.key + "." + setting.key, "must be a text");
        camera.settings.push_back({section.key, {setting.key, setting.value.text}});
      }
    }
  }

  void add(FleetCamera camera, const std::optional<std::string>& name, std::size_t count, const Node& node) {
    if (cameras_.size() + count > kMostCameras) {
      return refuse(node.line, "count", fmt::format("a fleet has at most {} cameras", kMostCameras));
    }
    for (std::size_t i = 1; i <= count; ++i) {
      FleetCamera one = camera;
      const std::string stem = name ? *name : name_from(camera.profile);
      one.name = name && count == 1 ? stem : next_name(stem, name ? i : 1);
      one.options.address = next_address_;
      one.options.seed = common_.seed + cameras_.size();
      if (!is_name(one.name) || !names_.insert(lower(one.name)).second) {
        return refuse(node.line, "name", fmt::format("{} is too long, or another camera's", one.name));
      }
      if (!is_loopback(one.options.address)) return refuse(node.line, "address", "leaves 127.0.0.0/8");
      next_address_ = address_after(next_address_, 1);
      cameras_.push_back(std::move(one));
    }
  }

  // The stem and a number: the first that is free from `least` on.
  [[nodiscard]] std::string next_name(const std::string& stem, std::size_t least) const {
    std::size_t number = least;
    while (names_.count(fmt::format("{}-{}", lower(stem), number)) != 0) ++number;
    return fmt::format("{}-{}", stem, number);
  }

  // Null where the object has no such member, or one of another kind, which is refused.
  const Node* member(const Node& object, const char* key, Kind kind, std::string_view otherwise) {
    const Node* found = object.find(key);
    if (found == nullptr || found->kind == kind) return found;
    refuse(found->line, key, otherwise);
    return nullptr;
  }
  std::optional<std::string> text(const Node& object, const char* key) {
    const Node* found = member(object, key, Kind::kString, "must be a text");
    return found == nullptr ? std::nullopt : std::optional(found->text);
  }
  std::optional<std::int64_t> number(const Node& object, const char* key, std::int64_t least, std::int64_t most) {
    const std::string range = fmt::format("must be a whole number from {} to {}", least, most);
    const Node* found = member(object, key, Kind::kInteger, range);
    if (found == nullptr) return std::nullopt;
    if (found->number < least || found->number > most) refuse(found->line, key, range);
    return found->number;
  }

  const std::string& file_;
  const CameraOptions& common_;
  Profiles profiles_;
  std::string next_address_;
  std::set<std::string> names_;
  std::vector<FleetCamera> cameras_;
  std::string error_;
};

}  // namespace

FleetResult load_fleet(const std::string& path, const CameraOptions& common) {
  std::ifstream file(path, std::ios::binary);
  if (!file) return fmt::format("cannot read {}", path);
  std::string text(kLargestFile + 1, '\0');
  file.read(text.data(), static_cast<std::streamsize>(text.size()));
  text.resize(static_cast<std::size_t>(file.gcount()));
  if (text.size() > kLargestFile) return fmt::format("{}: a fleet's file has at most 1 MiB", path);
  return parse_fleet(text, path, common);
}

FleetResult parse_fleet(std::string_view text, const std::string& file, const CameraOptions& common) {
  return FleetReader(file, common).read(text);
}

FleetResult make_fleet(std::size_t cameras, const CameraOptions& common) {
  std::vector<std::string> names = ProfileNames();
  if (!common.profile_path.empty()) names = {common.profile_path};
  if (names.empty()) return "no camera profiles are installed; --profile names one";
  Profiles profiles;
  std::vector<FleetCamera> fleet(cameras);
  for (std::size_t i = 0; i < cameras; ++i) {
    FleetCamera& camera = fleet[i];
    camera.profile = names[i % names.size()];
    camera.name = fmt::format("{}-{}", name_from(camera.profile), i + 1);
    camera.options = common;
    if (std::string problem = profiles.set(camera.profile, camera.options); !problem.empty()) return problem;
    camera.options.address = address_after(common.address, i);
    camera.options.seed = common.seed + i;
    if (!is_loopback(camera.options.address)) return "a fleet's addresses are those of 127.0.0.0/8";
  }
  return fleet;
}

}  // namespace vexa::camera
