// What is wrong with a file, on its way to Python, where it becomes ktfiles.Error.
#pragma once

#include "audiofile/ContainerProblem.h"
#include "files/FileProblem.h"
#include "platform/core/Error.h"
#include "platform/core/Status.h"

#include <pybind11/pybind11.h>

#include <cstdint>
#include <exception>
#include <string>

class Problem : public std::exception {
public:
    /// `systemError` 0: the one that the status stands for, where there is one.
    Problem(std::string path, std::int32_t status, std::string text, int systemError = 0);

    const std::string& path() const { return path_; }
    std::int32_t status() const { return status_; }
    int systemError() const { return systemError_; }
    const char* what() const noexcept override { return text_.c_str(); }

private:
    std::string path_;
    std::int32_t status_;
    std::string text_;
    int systemError_;
};

/// Throw the Problem of what is not 0, none or without an error.
void require(const std::string& path, std::int32_t status);
void require(const std::string& path, const FileProblem& problem);
void require(const std::string& path, const ContainerProblem& problem);
[[noreturn]] void throwProblem(const std::string& path, const platform::Error& error);
/// Of a call of the system that failed.
[[noreturn]] void throwSystemProblem(const std::string& path, int systemError);

/// The exception, not raised.
pybind11::object exceptionFrom(const Problem& problem);

/// Makes Python exceptions of Problems.
void bindProblems(pybind11::module_& module);
