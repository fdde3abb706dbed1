#include "command_line/description.h"

#include <nlohmann/json.hpp>

namespace vexa::command_line {
namespace {

using Json = nlohmann::ordered_json;

std::string trimmed(std::string text) {
  const std::size_t first = text.find_first_not_of(" \n");
  if (first == std::string::npos) return {};
  return text.substr(first, text.find_last_not_of(" \n") + 1 - first);
}

// Through the formatter, so that manuals show what --help does.
Json described(const CLI::Option& option) {
  const CLI::Formatter formatter;
  Json names = Json::array();
  for (const std::string& name : option.get_snames()) names.push_back("-" + name);
  for (const std::string& name : option.get_lnames()) names.push_back("--" + name);
  return {{"names", names},
          {"positional", option.get_positional() ? formatter.make_option_name(&option, true) : ""},
          {"value", trimmed(formatter.make_option_opts(&option))},
          {"values", option.get_items_expected_max()},
          {"required", option.get_required()},
          {"group", option.get_group()},
          {"description", formatter.make_option_desc(&option)}};
}

Json described(const CLI::App& app) {
  Json options = Json::array();
  for (const CLI::Option* option : app.get_options()) {
    if (!option->get_group().empty()) options.push_back(described(*option));  // no group: hidden from --help
  }
  Json commands = Json::array();
  for (const CLI::App* command : app.get_subcommands({})) {
    commands.push_back(described(*command));
  }
  return {{"name", app.get_name()},
          {"description", app.get_description()},
          {"options", options},
          {"commands", commands},
          {"footer", trimmed(app.get_footer())}};
}

}  // namespace

std::string describe(const CLI::App& program) { return described(program).dump(1); }

void add_help_json(CLI::App& program) {
  program.add_flag_callback(
      "--help-json", [&program] { throw CLI::CallForVersion(describe(program), 0); },
      "print all commands and options as JSON, for manuals and completions");
}

}  // namespace vexa::command_line
