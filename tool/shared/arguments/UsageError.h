// Mistakes on the command line: exit status 2.
#pragma once

#include <stdexcept>
#include <string>

/// The text says what is wrong with the arguments. Nothing has been changed when it is thrown.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// A required argument is missing.
class MissingArgument : public UsageError {
public:
    explicit MissingArgument(const std::string& name) : UsageError(name + " is required") {}
};
