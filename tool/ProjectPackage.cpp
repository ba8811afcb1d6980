#include "ProjectPackage.h"

#include "Failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <filesystem>
#include <sys/stat.h>

CFileRef projectFolder(const std::string& path)
{
    struct stat status = {};
    if (::stat(path.c_str(), &status) != 0)
        throw Failure(systemErrorText(errno));
    if (!S_ISDIR(status.st_mode))
        throw Failure("is no folder");
    std::error_code error;
    const std::string absolute = std::filesystem::absolute(path, error).lexically_normal().string();
    const auto text = error ? platform::String() : platform::String::fromUTF8(absolute);
    if (text.isNull())
        throw Failure("its path is not valid UTF-8");
    return CFileRef(platform::URL::createWithFileSystemPath(text, platform::PathStyle::posix, true));
}

std::unique_ptr<ProjectInformation> openProject(const std::string& path)
{
    auto project = ProjectInformation::initWithProjectURL(projectFolder(path).URL());
    if (!project)
        throw Failure("is no project package: Resources/ProjectInformation.plist cannot be read");
    return project;
}

long alternativeOf(const ProjectInformation& project, std::optional<long> given)
{
    const long index = given.value_or(project.lastActiveVariation());
    if (!project.pathForVariant(index, AcceptMissing::no))
        throw Failure(fmt::format("has no alternative {}", index));
    return index;
}

std::string backupName(const platform::URLRef& url)
{
    return std::filesystem::path(url->posixPath()).filename().string();
}
