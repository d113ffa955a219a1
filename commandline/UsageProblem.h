#pragma once

#include <CLI/App.hpp>
#include <optional>
#include <string>

namespace accounts {

/// What is wrong with arguments that the library could not parse, in this program's own words: the
/// library's tell of its types. A check of a value gives its reason in words that begin with
/// "must"; the reasons of any other check are not told.
std::string usageProblem(const CLI::App& program, const CLI::Error& error);

/// That a subcommand is missing, and which there are; none when one is there or the program has
/// none.
std::optional<std::string> missingSubcommand(const CLI::App& program);

}  // namespace accounts
