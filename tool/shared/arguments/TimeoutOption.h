// The option --timeout, as every verb that waits for others has it.
#pragma once

#include <CLI/CLI.hpp>

#include <optional>
#include <string>

/// Seconds, 0 to three years; anything else, "nan" and "inf" too, is a mistake on the command line.
void addTimeout(CLI::App& verb, std::optional<double>& seconds,
                const std::string& description = "Give up when others are in the way for that long: exit status 1");
