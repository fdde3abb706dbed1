// SPDX-License-Identifier: Apache-2.0
// vexactl tour: a camera's tours, each a row of presets that it visits in turn.
#include <fmt/format.h>

#include <CLI/CLI.hpp>
#include <algorithm>
#include <nlohmann/json.hpp>

#include "host/base/number_text.h"
#include "host/base/printable.h"
#include "host/commands/action_group.h"
#include "host/console/terminal.h"
#include "host/words/setting_words.h"
#include "host/words/tour_words.h"

namespace vexa::host {
namespace {

using Json = nlohmann::ordered_json;

constexpr int kLongestStay = 9999;  // seconds
constexpr std::size_t kFewestPresets = 2;

std::optional<Problem> check_tours(const ModelCamera& camera) {
  if (camera.profile().control.tourCount > 0) return std::nullopt;
  return model_lacks(camera, "tours");
}

std::string presets_text(const std::vector<int>& presets) { return fmt::format("{}", fmt::join(presets, ",")); }

class ShowToursAction final : public CameraAction {
 public:
  CLI::App* declare(CLI::App& group) override { return group.add_subcommand("show", "Show the camera's tours"); }

  ExitCode run(const ModelCamera& camera, Terminal& terminal) override {
    SLibDCameraTourInfo info;
    const ELibDReturnCode result = camera.device().GetCameraTourInfo(info);
    if (result != LIBD_OK) return terminal.report(camera.explain(result));
    return write_result(terminal, json() ? to_text(json_of(info)) : table_of(info));
  }

 private:
  static std::string table_of(const SLibDCameraTourInfo& info) {
    std::string text = fmt::format("Tours are {}; {}\n", switch_word(info.enabled), resume_text(info.resumeTime));
    for (const auto& [number, tour] : info.tours) {
      text += fmt::format("{}  {:<3}  {:>4} s each  speed {:>3}  presets {}\n", number, switch_word(tour.enabled),
                          tour.stayTime, tour.speed, tour.sequence.empty() ? "-" : presets_text(tour.sequence));
    }
    return text;
  }

  static Json json_of(const SLibDCameraTourInfo& info) {
    Json tours = Json::array();
    for (const auto& [number, tour] : info.tours) {
      tours.push_back({{"tour", number},
                       {"enabled", tour.enabled},
                       {"presets", tour.sequence},
                       {"staySeconds", tour.stayTime},
                       {"speed", tour.speed}});
    }
    return {{"enabled", info.enabled},
            {"resumeSeconds", info.resumeTime > 0 ? Json(info.resumeTime) : Json(nullptr)},
            {"tours", tours}};
  }
};

// The driver sends all tours at once, and none without presets: tours that have none get those of one that has.
bool complete(SLibDCameraTourInfo& info, const std::vector<int>& presets) {
  for (auto& [number, tour] : info.tours) {
    if (tour.sequence.empty()) tour.sequence = presets;
    if (tour.sequence.empty()) return false;
  }
  return true;
}

// An action that changes the tours as the camera reports them.
class ChangeToursAction : public CameraAction {
 public:
  ExitCode run(const ModelCamera& camera, Terminal& terminal) final {
    SLibDCameraTourInfo info;
    const ELibDReturnCode read = camera.device().GetCameraTourInfo(info);
    if (read != LIBD_OK) return terminal.report(camera.explain(read));
    if (const auto problem = change(camera, info)) return terminal.report(*problem);
    return report_change(camera, terminal, "tours", camera.device().SetCameraTourInfo(info));
  }

 protected:
  virtual std::optional<Problem> change(const ModelCamera& camera, SLibDCameraTourInfo& info) = 0;
};

Problem no_such_tour(int number, const SLibDCameraTourInfo& info) {
  return usage(fmt::format("the camera has no tour {}", number),
               fmt::format("It has tours 1 to {}.", info.tours.size()));
}

std::optional<Problem> check_tour_number(int number) {
  if (number >= 1) return std::nullopt;
  return usage("tours are counted from 1", "vexactl tour CAMERA show shows them.");
}

// "1,2,3"; none for anything else.
std::optional<std::vector<int>> presets_in(const std::string& text) {
  std::vector<int> presets;
  for (std::string_view rest = text;; rest.remove_prefix(1)) {
    const std::optional<int> number = take_number<int>(rest);
    if (!number || *number < 1) return std::nullopt;
    presets.push_back(*number);
    if (rest.empty()) return presets;
    if (rest.front() != ',') return std::nullopt;
  }
}

class SetTourAction final : public ChangeToursAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("set", "Set which presets a tour visits");
    action->add_option("number", number_, "of the tour, counted from 1")->required()->type_name("");
    action->add_option("presets", text_, "numbers of the presets in turn, such as 1,2,3")->required()->type_name("");
    action->add_option("--stay", stay_, "seconds at each preset")->check(CLI::Range(1, kLongestStay));
    action->add_option("--speed", speed_, "of the turns, in the camera's units")->check(CLI::PositiveNumber);
    action->add_option("--resume", resume_, "seconds after a move by hand until tours resume; 0: never")
        ->check(CLI::Range(0, kLongestResume));
    action->footer("Settings left out stay as they are. Tours without presets get the same presets, and stay off.");
    return action;
  }

  std::optional<Problem> check() override {
    const auto presets = presets_in(text_);
    if (!presets || presets->size() < kFewestPresets) {
      return usage("a tour is the numbers of two presets or more, with commas between them",
                   "For instance: vexactl tour CAMERA set 1 1,2,3.");
    }
    presets_ = *presets;
    return check_tour_number(number_);
  }

 private:
  std::optional<Problem> change(const ModelCamera& camera, SLibDCameraTourInfo& info) override {
    const auto tour = info.tours.find(number_);
    if (tour == info.tours.end()) return no_such_tour(number_, info);
    const SLibDFixedPTZControlInfo& limits = camera.profile().control;
    if (*std::max_element(presets_.begin(), presets_.end()) > limits.presetCount) {
      return usage("a preset of the tour is not one of the camera's",
                   fmt::format("It has presets 1 to {}.", limits.presetCount));
    }
    const int fastest = std::min(limits.panTilt.panMaxSpeed, limits.panTilt.tiltMaxSpeed);
    if (speed_ && *speed_ > fastest) {
      return usage("the camera does not turn that fast", fmt::format("Its speeds are 1 to {}.", fastest));
    }
    tour->second.sequence = presets_;
    if (stay_) tour->second.stayTime = *stay_;
    if (speed_) tour->second.speed = *speed_;
    if (resume_) info.resumeTime = *resume_;
    complete(info, presets_);
    return std::nullopt;
  }

  int number_ = 0;
  std::string text_;
  std::vector<int> presets_;
  std::optional<int> stay_;
  std::optional<int> speed_;
  std::optional<int> resume_;
};

class StartTourAction final : public ChangeToursAction {
 public:
  CLI::App* declare(CLI::App& group) override {
    CLI::App* action = group.add_subcommand("start", "Start a tour, and stop any other");
    action->add_option("number", number_, "of the tour, counted from 1")->required()->type_name("");
    return action;
  }
  std::optional<Problem> check() override { return check_tour_number(number_); }

 private:
  std::optional<Problem> change(const ModelCamera&, SLibDCameraTourInfo& info) override {
    const auto chosen = info.tours.find(number_);
    if (chosen == info.tours.end()) return no_such_tour(number_, info);
    if (chosen->second.sequence.empty()) {
      return usage(fmt::format("tour {} has no presets", number_),
                   fmt::format("Give it some: vexactl tour CAMERA set {} 1,2,3.", number_));
    }
    info.enabled = true;
    for (auto& [number, tour] : info.tours) tour.enabled = number == number_;
    complete(info, chosen->second.sequence);
    return std::nullopt;
  }

  int number_ = 0;
};

class StopTourAction final : public ChangeToursAction {
 public:
  CLI::App* declare(CLI::App& group) override { return group.add_subcommand("stop", "End the running tour"); }

 private:
  std::optional<Problem> change(const ModelCamera&, SLibDCameraTourInfo& info) override {
    info.enabled = false;
    std::vector<int> presets;
    for (auto& [number, tour] : info.tours) {
      tour.enabled = false;
      if (presets.empty()) presets = tour.sequence;
    }
    if (complete(info, presets)) return std::nullopt;
    return usage("no tour has presets, so none is running", "vexactl tour CAMERA set gives a tour its presets.");
  }
};

}  // namespace

std::unique_ptr<Command> make_tour_command() {
  std::vector<std::unique_ptr<CameraAction>> actions;
  actions.push_back(std::make_unique<ShowToursAction>());
  actions.push_back(std::make_unique<SetTourAction>());
  actions.push_back(std::make_unique<StartTourAction>());
  actions.push_back(std::make_unique<StopTourAction>());
  constexpr ActionGroupText kText{"tour", "Show, set, start and stop a camera's tours of its presets",
                                  "For instance:\n  vexactl tour 192.168.0.100 set 1 1,2,3 --stay 15\n"
                                  "  vexactl tour 192.168.0.100 start 1"};
  return std::make_unique<ActionGroup>(kText, check_tours, std::move(actions));
}

}  // namespace vexa::host
