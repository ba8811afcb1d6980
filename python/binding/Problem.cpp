#include "binding/Problem.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <utility>

namespace py = pybind11;

namespace {

constexpr std::array<std::pair<std::int32_t, int>, 13> kSystemErrors{{
    {kStatusInterrupted, EINTR},
    {kStatusDiskFull, ENOSPC},
    {kStatusIOError, EIO},
    {kStatusOutOfMemory, ENOMEM},
    {kStatusTooManyOpenFiles, EMFILE},
    {kStatusFileNotFound, ENOENT},
    {kStatusFileBusy, EBUSY},
    {kStatusDuplicateName, EEXIST},
    {kStatusWritePermission, EROFS},
    {kStatusFileTooBig, EFBIG},
    {kStatusNotAFolder, ENOTDIR},
    {kStatusQuotaExceeded, EDQUOT},
    {kStatusAccessDenied, EACCES},
}};

int systemErrorOf(std::int32_t status)
{
    for (const auto& [known, error] : kSystemErrors)
        if (known == status)
            return error;
    return 0;
}

} // namespace

Problem::Problem(std::string path, std::int32_t status, std::string text, int systemError)
    : path_(std::move(path)),
      status_(status),
      text_(std::move(text)),
      systemError_(systemError != 0 ? systemError : systemErrorOf(status))
{
}

void require(const std::string& path, std::int32_t status)
{
    if (status != kStatusOK)
        throw Problem(path, status, StatusText(status));
}

void require(const std::string& path, const FileProblem& problem)
{
    if (problem)
        throw Problem(path, problem.Status(), problem.Description(), problem.systemError);
}

void require(const std::string& path, const ContainerProblem& problem)
{
    if (problem)
        throw Problem(path, problem.Status(), problem.Description(), problem.systemError);
}

void throwProblem(const std::string& path, const platform::Error& error)
{
    const bool isSystem = error.domain == platform::ErrorDomain::system;
    throw Problem(path, NSErrorToOSErr(&error), error.description, isSystem ? static_cast<int>(error.code) : 0);
}

void throwSystemProblem(const std::string& path, int systemError)
{
    throw Problem(path, PosixErrorToOSErr(systemError), std::strerror(systemError), systemError);
}

py::object exceptionFrom(const Problem& problem)
{
    const py::object make = py::module_::import("ktfiles._errors").attr("make");
    return make(problem.status(), problem.systemError(), py::str(problem.what()), py::bytes(problem.path()));
}

void bindProblems(py::module_&)
{
    py::register_local_exception_translator([](std::exception_ptr pointer) {
        try {
            std::rethrow_exception(std::move(pointer));
        } catch (const Problem& problem) {
            const py::object made = exceptionFrom(problem);
            PyErr_SetObject(py::type::handle_of(made).ptr(), made.ptr());
        }
    });
}
