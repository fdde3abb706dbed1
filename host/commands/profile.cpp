// SPDX-License-Identifier: Apache-2.0
// vexactl profile: the profiles of camera models.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <array>
#include <nlohmann/json.hpp>
#include <utility>

#include "host/base/printable.h"
#include "host/camera/model_camera.h"
#include "host/commands/command.h"
#include "host/console/terminal.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr std::array<std::pair<DriverClass, const char*>, 5> kDrivers{{{DriverClass::kCommon, "common"},
                                                                       {DriverClass::kHeron, "heron"},
                                                                       {DriverClass::kMarlin, "marlin"},
                                                                       {DriverClass::kSimpleHD, "simple-hd"},
                                                                       {DriverClass::kSimplePTZ, "simple-ptz"}}};

constexpr std::array<std::pair<CameraTypeBits, const char*>, 8> kTypes{{{kFixedCamera, "fixed"},
                                                                        {kPtzCamera, "ptz"},
                                                                        {kSdCamera, "sd"},
                                                                        {kHdCamera, "hd"},
                                                                        {kAudioCamera, "audio"},
                                                                        {kEdgeStorageCamera, "edge-storage"},
                                                                        {kAnalogOutputCamera, "analog-output"},
                                                                        {kLodDetectionCamera, "lod-detection"}}};

const char* name_of(DriverClass driver) {
  for (const auto& [value, name] : kDrivers) {
    if (value == driver) return name;
  }
  return "";
}

Json types_of(const Profile& profile) {
  Json types = Json::array();
  for (const auto& [bit, name] : kTypes) {
    if ((profile.cameraTypes & bit) != 0) types.push_back(name);
  }
  return types;
}

Json codecs_of(const Profile& profile) {
  Json codecs = Json::array();
  for (const SLibDVideoCodecInfo& codec : profile.camera.codecs) {
    codecs.push_back(fmt::format("{} to {}", codec.name, codec.resolutions.front().text));
  }
  return codecs;
}

Json exposures_of(const Profile& profile) {
  Json modes = Json::array();
  for (const SLibDBrightModeInfo& mode : profile.control.brightModes) modes.push_back(mode.name);
  return modes;
}

Json to_json(const Profile& profile) {
  const bool ptz = (profile.cameraTypes & kPtzCamera) != 0;
  Json json = {{"name", profile.name},
               {"description", profile.description},
               {"model", profile.model},
               {"driver", name_of(profile.driver)},
               {"camera-types", types_of(profile)},
               {"streams", profile.streams.size()},
               {"codecs", codecs_of(profile)},
               {"exposure", exposures_of(profile)}};
  json["ptz"] = ptz ? Json(profile.continuousPtz ? "continuous" : "move") : Json(nullptr);
  json["presets"] = profile.control.presetCount;
  json["alarm-inputs"] = profile.ioBox.inputCount;
  json["alarm-outputs"] = profile.ioBox.outputCount;
  json["edge-storage"] = profile.edgeStorage;
  return json;
}

std::string text_of(const Json& value) {
  if (value.is_string()) return value.get<std::string>();
  if (value.is_null()) return "-";
  if (value.is_boolean()) return value.get<bool>() ? "yes" : "no";
  if (!value.is_array()) return value.dump();
  std::string text;
  for (const Json& item : value) text += (text.empty() ? "" : ", ") + item.get<std::string>();
  return text.empty() ? "-" : text;
}

class ProfileCommand final : public Command {
 public:
  CLI::App* declare(CLI::App& program, const char* const*) override {
    CLI::App* command = program.add_subcommand("profile", "List, show and check profiles of camera models");
    command->require_subcommand(1);
    list_ = command->add_subcommand("list", "List the installed profiles");
    list_->add_flag("--json", json_, "print the result as JSON");
    show_ = command->add_subcommand("show", "Show what a profile defines");
    show_->add_option("profile", profile_, "name of an installed profile, or a file")->required()->type_name("");
    show_->add_flag("--json", json_, "print the result as JSON");
    check_ = command->add_subcommand("check", "Check profile files; names file, line and key of the first mistake");
    check_->add_option("files", files_, "profile files")->required()->type_name("");
    command->footer("For instance:\n  vexactl profile show LMX-P200\n  vexactl profile check my-camera.json");
    return command;
  }

  ExitCode run(Terminal& terminal) override {
    if (list_->parsed()) return list(terminal);
    if (show_->parsed()) return show(terminal);
    return check(terminal);
  }

 private:
  ExitCode list(Terminal& terminal) const {
    Json json = Json::array();
    std::string table;
    for (const std::string& name : ProfileNames()) {
      Profile profile;
      ProfileError error;
      if (!LoadProfile(name, profile, error)) return terminal.report(wrong_profile(error));
      json.push_back({{"name", name}, {"description", profile.description}});
      table += fmt::format("{:<12}{}\n", name, profile.description);
    }
    if (table.empty()) {
      return terminal.report({ExitCode::kUsage, "there are no installed profiles",
                              "Give profiles as files, or install the package whole."});
    }
    if (json_) return write_result(terminal, to_text(json));
    return write_table(terminal, fmt::format("{:<12}{}\n", "profile", "description"), table);
  }

  ExitCode show(Terminal& terminal) const {
    Profile profile;
    ProfileError error;
    if (!LoadProfile(profile_, profile, error)) return terminal.report(wrong_profile(error));
    const Json json = to_json(profile);
    if (json_) return write_result(terminal, to_text(with_json_names(json)));
    std::string table;
    for (const auto& [key, value] : json.items()) table += fmt::format("{:<15}{}\n", key, text_of(value));
    return write_result(terminal, table);
  }

  ExitCode check(Terminal& terminal) const {
    std::string table;
    for (const std::string& file : files_) {
      Profile profile;
      ProfileError error;
      if (!LoadProfile(file, profile, error)) return terminal.report(wrong_profile(error));
      table += fmt::format("{}: valid\n", file);
    }
    return write_result(terminal, table);
  }

  CLI::App* list_ = nullptr;
  CLI::App* show_ = nullptr;
  CLI::App* check_ = nullptr;
  bool json_ = false;
  std::string profile_;
  std::vector<std::string> files_;
};

}  // namespace

std::unique_ptr<Command> make_profile_command() { return std::make_unique<ProfileCommand>(); }

}  // namespace vexa::host
