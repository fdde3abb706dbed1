// SPDX-License-Identifier: Apache-2.0
#include "tests/support/exchange_file.h"

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <optional>
#include <set>
#include <sstream>
#include <stdexcept>
#include <string_view>
#include <utility>

namespace vexa_test {
namespace {

std::string unescaped(std::string_view line) {
  std::string bytes;
  for (std::size_t at = 0; at < line.size(); ++at) {
    if (line[at] != '\\') {
      bytes += line[at];
      continue;
    }
    const char letter = ++at < line.size() ? line[at] : '\0';
    if (letter == 'r') {
      bytes += '\r';
    } else if (letter == 'n') {
      bytes += '\n';
    } else if (letter == '\\') {
      bytes += '\\';
    } else if (letter == 'x' && at + 2 < line.size()) {
      bytes += static_cast<char>(std::stoi(std::string(line.substr(at + 1, 2)), nullptr, 16));
      at += 2;
    } else {
      throw std::runtime_error("unknown escape in <" + std::string(line) + ">");
    }
  }
  return bytes;
}

Then then_of(const std::string& word) {
  if (word == "close") return Then::kClose;
  if (word == "stay") return Then::kStay;
  if (word == "reset") return Then::kReset;
  throw std::runtime_error("unknown end <" + word + ">");
}

void take_options(const std::string& options, ScriptStep& step) {
  std::istringstream words(options);
  for (std::string word; words >> word;) {
    const std::string value = word.substr(word.find('=') + 1);
    if (word.starts_with("piece=")) {
      step.piece = static_cast<std::size_t>(std::stoul(value));
    } else if (word.starts_with("pause=")) {
      step.pause = std::stoi(value);
    } else if (word.starts_with("then=")) {
      step.then = then_of(value);
    } else {
      throw std::runtime_error("unknown option <" + word + ">");
    }
  }
}

std::pair<std::string, std::string> key_and_value(const std::string& line) {
  const std::size_t blank = line.find(' ');
  if (blank == std::string::npos) return {line, ""};
  return {line.substr(0, blank), unescaped(std::string_view(line).substr(blank + 1))};
}

constexpr std::string_view kKnownConditions[] = {"call", "timeout", "playback", "scale", "no_teardown"};
constexpr std::string_view kKnownResults[] = {"result",  "answer",  "code",   "text", "cseq",
                                              "session", "seconds", "micros", "rate"};

/// A line that no test looks at would promise what nobody holds.
template <std::size_t kCount>
void take_entry(const std::string& line, const std::string_view (&known)[kCount], std::set<std::string>& taken,
                std::map<std::string, std::string>& entries) {
  if (line.empty()) return;
  const auto entry = key_and_value(line);
  if (std::find(std::begin(known), std::end(known), entry.first) == std::end(known)) {
    throw std::runtime_error("unknown key <" + entry.first + ">");
  }
  if (!taken.insert(entry.first).second) throw std::runtime_error("<" + entry.first + "> twice");
  entries[entry.first] = entry.second;
}

class Reader {
 public:
  explicit Reader(std::filesystem::path folder) : folder_(std::move(folder)) {}

  ExchangeFile read(std::istream& file) {
    for (std::string line; std::getline(file, line);) {
      if (!line.starts_with('#')) take(line);
    }
    if (section_ != Section::kResults) throw std::runtime_error("no results");
    return std::move(exchange_);
  }

 private:
  enum class Section { kBefore, kExpected, kAnswer, kResults };

  void take(const std::string& line) {
    if (section_ == Section::kBefore && line.starts_with("after ")) {
      take_beginning(line);
    } else if (line.starts_with(">>>")) {
      section_ = Section::kExpected;
      const auto model = model_of(line);
      const std::size_t place = exchange_.script.size();
      exchange_.script.emplace_back().new_connection = line == ">>> another";
      if (model) exchange_.script.back().expected = model->script.at(place).expected;
    } else if (line.starts_with("<<<")) {
      section_ = Section::kAnswer;
      const auto model = model_of(line);
      ScriptStep& step = exchange_.script.at(exchange_.script.size() - 1);
      if (!model) return take_options(line.substr(3), step);
      const std::string expected = std::exchange(step, model->script.at(exchange_.script.size() - 1)).expected;
      step.expected = expected;
    } else if (line.starts_with("===")) {
      section_ = Section::kResults;
      if (const auto model = model_of(line)) exchange_.results = model->results;
    } else {
      take_content(line);
    }
  }

  ExchangeFile named(const std::string& name) const { return read_exchange(folder_ / (name + ".txt")); }

  /// The exchange that a line names after three marks and "as"; none for any other line.
  std::optional<ExchangeFile> model_of(const std::string& line) const {
    constexpr std::string_view kAs = " as ";
    if (line.compare(3, kAs.size(), kAs) != 0) return std::nullopt;
    return named(line.substr(3 + kAs.size()));
  }

  void take_beginning(const std::string& line) {
    std::istringstream words(line.substr(line.find(' ')));
    std::string name;
    std::ptrdiff_t count = 0;
    if (!(words >> name >> count)) throw std::runtime_error("no name and number in <" + line + ">");
    const Script other = named(name).script;
    if (count < 1 || count > std::ssize(other)) throw std::runtime_error("<" + name + "> has fewer requests");
    exchange_.script.assign(other.begin(), other.begin() + count);
  }

  void take_content(const std::string& line) {
    switch (section_) {
      case Section::kBefore:
        return take_entry(line, kKnownConditions, taken_, exchange_.before);
      case Section::kExpected:
        exchange_.script.back().expected += unescaped(line);
        return;
      case Section::kAnswer:
        exchange_.script.back().answer += unescaped(line);
        return;
      case Section::kResults:
        return take_entry(line, kKnownResults, taken_, exchange_.results);
    }
  }

  const std::filesystem::path folder_;
  Section section_ = Section::kBefore;
  std::set<std::string> taken_;
  ExchangeFile exchange_;
};

}  // namespace

ExchangeFile read_exchange(const std::string& path) {
  std::ifstream file(path);
  if (!file) throw std::runtime_error("cannot read " + path);
  try {
    return Reader(std::filesystem::path(path).parent_path()).read(file);
  } catch (const std::exception& error) {
    throw std::runtime_error(path + ": " + error.what());
  }
}

std::vector<std::string> exchange_names(const std::string& folder) {
  std::vector<std::string> names;
  for (const auto& entry : std::filesystem::directory_iterator(folder)) {
    if (entry.path().extension() == ".txt") names.push_back(entry.path().stem());
  }
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace vexa_test
