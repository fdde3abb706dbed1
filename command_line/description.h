// A program's command line as data: manuals and completions are made from it, so that they hold what --help shows.
#ifndef COMMAND_LINE_DESCRIPTION_H_
#define COMMAND_LINE_DESCRIPTION_H_

#include <CLI/CLI.hpp>
#include <string>

namespace vexa::command_line {

/// JSON: the program with all its options, and its commands, which have the same form. The texts are those of --help.
std::string describe(const CLI::App& program);

/// Adds --help-json, which ends parsing as a version flag does: the text of CLI::CallForVersion is describe(program).
void add_help_json(CLI::App& program);

}  // namespace vexa::command_line

#endif  // COMMAND_LINE_DESCRIPTION_H_
