#include "binding/Location.h"

#include "binding/Problem.h"

#include <cerrno>
#include <filesystem>

platform::URLRef locationOf(const std::string& path)
{
    if (path.empty())
        throwSystemProblem(path, ENOENT);
    std::error_code error;
    const std::string absolute = path.front() == '/' ? path : (std::filesystem::current_path(error) / path).string();
    if (error)
        throwSystemProblem(path, error.value());
    platform::URLRef url = platform::URL::createWithFileSystemBytes(absolute, false);
    if (!url)
        throwSystemProblem(path, EINVAL);
    return url;
}

CFileRef referenceTo(const std::string& path)
{
    return CFileRef(locationOf(path));
}
