/// What the commands that read print: a table for people, or a JSON document.
#ifndef VELMORCTL_OUTPUT_H
#define VELMORCTL_OUTPUT_H

#include <nlohmann/json.hpp>
#include <string>
#include <vector>

#include "command_line.h"

namespace velmorctl {

using Json = nlohmann::ordered_json;

/// Adds the flag --json.
void AddJsonFlag(CLI::App& command, bool& json);

/// Prints the document, whose first member is "schema", on standard output. Text that is not UTF-8 has
/// replacement characters.
void PrintJson(const Json& document);

/// Prints rows in columns that are as wide as their widest text, two blanks apart. Control characters are
/// printed as "?".
void PrintTable(const std::vector<std::vector<std::string>>& rows);

}  // namespace velmorctl

#endif  // VELMORCTL_OUTPUT_H
