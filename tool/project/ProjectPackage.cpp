#include "tool/project/ProjectPackage.h"

#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <sys/stat.h>

std::string resolvedFolder(const std::string& path)
{
    const std::unique_ptr<char, decltype(&std::free)> resolved(::realpath(path.c_str(), nullptr), &std::free);
    struct stat status = {};
    if (!resolved || ::stat(resolved.get(), &status) != 0)
        throw Failure(SystemErrorText(errno));
    if (!S_ISDIR(status.st_mode))
        throw Failure("is no folder");
    return resolved.get();
}

CFileRef projectFolder(const std::string& path)
{
    const auto text = platform::String::fromUTF8(resolvedFolder(path));
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

std::string backupName(const InterruptedProjectExchange& interrupted, const ProjectInformation& project,
                       long alternative)
{
    if (!interrupted.backupURL)
        return {};
    const auto base =
        ProjectInformation::backupsBaseURLForBundleURL(project.projectURL(), alternative, CreateDirectories::no);
    const std::filesystem::path backup = interrupted.backupURL->posixPath();
    return base && backup.parent_path() == std::filesystem::path(base->posixPath()) ? backup.filename().string()
                                                                                    : backup.string();
}

void requireNoLink(const std::string& package, const std::string& folder)
{
    namespace fs = std::filesystem;
    fs::path path = package;
    for (const fs::path& component : fs::path(folder).lexically_relative(package)) {
        path /= component;
        std::error_code error;
        if (fs::is_symlink(fs::symlink_status(path, error)))
            throw Failure(component.string() + " is a link to somewhere else; nothing is done through it");
    }
}
