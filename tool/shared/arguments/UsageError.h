// Mistakes on the command line: exit status 2.
#pragma once

#include <stdexcept>
#include <string>

/// What is wrong with the arguments, in words for people. Whoever throws it has changed nothing yet.
class UsageError : public std::runtime_error {
public:
    using std::runtime_error::runtime_error;
};

/// An argument that must be given is not.
class MissingArgument : public UsageError {
public:
    explicit MissingArgument(const std::string& name) : UsageError(name + " is required") {}
};
