// Where items lie in a package.
#include "platform/Folders.h"
#include "platform/SystemCalls.h"
#include "project/ProjectLayout.h"

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <limits>

using platform::FileKind;
using platform::FileStatus;
using platform::String;
using platform::URLRef;

URLRef itemIn(const URLRef& folder, const char* name, bool isDirectory)
{
    return folder ? folder->appendingPathComponent(String::fromUTF8(name), isDirectory) : nullptr;
}

URLRef folderIn(const URLRef& folder, const char* name, CreateDirectories create)
{
    URLRef url = itemIn(folder, name, true);
    if (url && create == CreateDirectories::yes && (pathOf(url).empty() || !platform::createFolders(pathOf(url))))
        return nullptr;
    return url;
}

const std::string& pathOf(const URLRef& url)
{
    static const std::string none;
    return url && url->posixPath().starts_with('/') ? url->posixPath() : none;
}

bool itemExists(const std::string& path)
{
    FileStatus status;
    return !path.empty() && platform::systemCalls().pathStatus(path.c_str(), &status);
}

bool folderExists(const std::string& path)
{
    FileStatus status;
    return !path.empty() && platform::systemCalls().pathStatus(path.c_str(), &status) &&
           status.kind == FileKind::directory;
}

bool isSameItem(const std::string& a, const std::string& b)
{
    const platform::SystemCalls& calls = platform::systemCalls();
    FileStatus first, second;
    return !a.empty() && !b.empty() && calls.pathStatus(a.c_str(), &first) && calls.pathStatus(b.c_str(), &second) &&
           first.device == second.device && first.inode == second.inode;
}

bool hasLinkBelow(const std::string& folder, const std::string& path)
{
    std::size_t end = folder.size();
    while (end < path.size()) {
        end = std::min(path.find('/', end + 1), path.size());
        FileStatus status;
        if (platform::systemCalls().linkStatus(path.substr(0, end).c_str(), &status) &&
            status.kind == FileKind::symbolicLink)
            return true;
    }
    return false;
}

namespace {

/// "Alternatives/000"; empty if the number is no index.
std::string variantName(const char* generation, long index)
{
    if (index < 0 || index > long{std::numeric_limits<std::uint32_t>::max()})
        return {};
    char number[16];
    std::snprintf(number, sizeof number, "%03u", static_cast<unsigned>(index));
    return std::string(generation) + '/' + number;
}

/// A file of an alternative; `create` makes the folders around it.
URLRef fileOfVariant(const URLRef& bundleURL, long index, const char* name, CreateDirectories create)
{
    return itemIn(ProjectInformation::variantBaseURLForBundleURL(bundleURL, index, create), name, false);
}

} // namespace

URLRef ProjectInformation::URLForVariant(long index, const URLRef& baseURL, AcceptMissing acceptMissing)
{
    if (variantName("", index).empty())
        return nullptr;
    for (const char* generation : ProjectLayout::alternatives) {
        URLRef url = itemIn(baseURL, variantName(generation, index).c_str(), true);
        if (itemExists(pathOf(url)))
            return url;
    }
    if (acceptMissing == AcceptMissing::no)
        return nullptr;
    return itemIn(baseURL, variantName(ProjectLayout::alternatives.front(), index).c_str(), true);
}

std::optional<std::string> ProjectInformation::pathForVariant(long index, const URLRef& baseURL,
                                                              AcceptMissing acceptMissing)
{
    const URLRef url = URLForVariant(index, baseURL, acceptMissing);
    return pathOf(url).empty() ? std::nullopt : std::optional(pathOf(url));
}

std::optional<std::string> ProjectInformation::pathForVariant(long index, AcceptMissing acceptMissing) const
{
    return pathForVariant(index, projectURL_, acceptMissing);
}

URLRef ProjectInformation::URLForVariant(long index, AcceptMissing acceptMissing) const
{
    return URLForVariant(index, projectURL_, acceptMissing);
}

URLRef ProjectInformation::alternativesBaseURLForBundleURL(const URLRef& bundleURL, CreateDirectories create)
{
    return folderIn(bundleURL, ProjectLayout::alternatives.front(), create);
}

URLRef ProjectInformation::projectInformationURLForBundleURL(const URLRef& bundleURL, CreateDirectories create)
{
    return itemIn(folderIn(bundleURL, ProjectLayout::resources, create), ProjectLayout::projectInformation, false);
}

URLRef ProjectInformation::mediaURLForBundleURL(const URLRef& bundleURL, CreateDirectories create)
{
    return folderIn(bundleURL, ProjectLayout::media, create);
}

URLRef ProjectInformation::variantBaseURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                      CreateDirectories create)
{
    URLRef url = URLForVariant(variantIndex, bundleURL, AcceptMissing::yes);
    if (url && create == CreateDirectories::yes && (pathOf(url).empty() || !platform::createFolders(pathOf(url))))
        return nullptr;
    return url;
}

URLRef ProjectInformation::metaDataURLForBundleURL(const URLRef& bundleURL, long variantIndex, CreateDirectories create)
{
    return fileOfVariant(bundleURL, variantIndex, ProjectLayout::metaData, create);
}

URLRef ProjectInformation::windowImageURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                      CreateDirectories create)
{
    return fileOfVariant(bundleURL, variantIndex, ProjectLayout::windowImage, create);
}

URLRef ProjectInformation::oldDisplayStateURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                          CreateDirectories create)
{
    return fileOfVariant(bundleURL, variantIndex, ProjectLayout::oldDisplayState, create);
}

URLRef ProjectInformation::displayStateArchiveURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                              CreateDirectories create)
{
    return fileOfVariant(bundleURL, variantIndex, ProjectLayout::displayStateArchive, create);
}

URLRef ProjectInformation::displayStateMobileURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                             CreateDirectories create)
{
    return fileOfVariant(bundleURL, variantIndex, ProjectLayout::displayStateMobile, create);
}

URLRef ProjectInformation::projectDataURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                      CreateDirectories create)
{
    return fileOfVariant(bundleURL, variantIndex, ProjectLayout::projectData, create);
}

URLRef ProjectInformation::ARAFilesURLForBundleURL(const URLRef& bundleURL, long variantIndex, CreateDirectories create)
{
    const URLRef variant = variantBaseURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    return folderIn(variant, ProjectLayout::araFiles, create);
}

URLRef ProjectInformation::backupsBaseURLForBundleURL(const URLRef& bundleURL, long variantIndex,
                                                      CreateDirectories create)
{
    const URLRef variant = variantBaseURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    return folderIn(variant, ProjectLayout::backups, create);
}

std::optional<platform::Date> ProjectInformation::modificationDateForVariantIndex(long variantIndex,
                                                                                  const URLRef& bundleURL)
{
    const URLRef data = projectDataURLForBundleURL(bundleURL, variantIndex, CreateDirectories::no);
    return pathOf(data).empty() ? std::nullopt : platform::modificationDate(pathOf(data));
}
