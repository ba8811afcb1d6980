#include "files/CFileUtilLocations.h"

#include "platform/Places.h"
#include "platform/Volumes.h"

#include <string_view>

using platform::String;

namespace {

/// A folder of this name holds what the suite installs.
constexpr std::string_view kContentFolder = "/org.ktfiles.installed.content/";
constexpr std::string_view kLibraryBundle = "/Library.bundle/";
constexpr const char* kApplicationSupport[] = {"Application Support/Fugue", "Application Support/Hayloft"};

CFileRef resolved(const CFileRef& item)
{
    return CFileRef(platform::resolvingSymbolicLinksInPath(item.CopyFileSystemPath(kPOSIXPathStyle)), kPOSIXPathStyle,
                    false);
}

/// Whether an item, whose links are resolved, lies in a folder of that name in any domain.
bool isInLibrary(const CFileRef& resolvedItem, const char* name)
{
    for (const std::string& library : platform::libraryFolders()) {
        const CFileRef folder((library + '/' + name).c_str(), true);
        if (folder.Exists() && resolved(folder).PathContains(resolvedItem))
            return true;
    }
    return false;
}

} // namespace

bool CFileUtilIsReadOnlyVolume(const CFileRef& item)
{
    const char* path = item.GetPath();
    return path != nullptr && platform::volumeIsReadOnly(path).value_or(false);
}

bool CFileUtilIsNetworkDrive(const CFileRef& item)
{
    const char* path = item.GetPath();
    return path != nullptr && !platform::volumeIsLocal(path).value_or(true);
}

bool CFileUtilItemsOnSameVolume(const CFileRef& a, const CFileRef& b)
{
    const auto first = a.GetVolumeID();
    const auto second = b.GetVolumeID();
    return first != nullptr && second != nullptr && *first == *second;
}

long long CFileUtilFreeDiskSpaceAtPath(const CFileRef& item, long long* totalSize)
{
    if (totalSize != nullptr)
        *totalSize = 0;
    CFileRef folder = item;
    while (!folder.IsFolder()) {
        const char* path = folder.GetPath();
        if (path == nullptr || std::string_view(path) == "/" || !folder.SetToParent())
            return 0;
    }
    const auto space = platform::volumeSpace(folder.GetPath());
    if (!space)
        return 0;
    if (totalSize != nullptr)
        *totalSize = space->total;
    return space->free;
}

bool CFileUtilIsInTrash(const CFileRef& item)
{
    return platform::isInTrash(item.CopyFileSystemPath(kPOSIXPathStyle));
}

bool CFileUtilIsHiddenOrInHiddenFolder(const CFileRef& item)
{
    CFileRef level = item;
    const char* path = level.SetToParent() ? level.GetPath() : nullptr;
    if (path == nullptr)
        return false;
    if (std::string_view(path).find("/.") != std::string_view::npos)
        return true;
    for (level = item; level.GetPath() != nullptr && std::string_view(level.GetPath()) != "/" && !level.IsRoot();
         level.SetToParent())
        if (platform::isInvisible(level.CopyFileSystemPath(kPOSIXPathStyle)))
            return true;
    return false;
}

bool CFileUtilIsPathFromMobileDevice(const CFileRef& item)
{
    const std::string path(item);
    return path.starts_with("/var/mobile") || path.starts_with("/private/var/mobile");
}

bool CFileUtilIsInAppBundle(const CFileRef& item)
{
    const std::string bundle = platform::applicationBundle();
    return !bundle.empty() && CFileRef(bundle.c_str(), true).PathContains(resolved(item));
}

bool CFileUtilIsInCloudDocs(const CFileRef& item)
{
    return isInLibrary(resolved(item), "Mobile Documents");
}

bool CFileUtilIsInLibraryFolder(const CFileRef& item)
{
    if (!item.Exists())
        return false;
    const CFileRef target = resolved(item);
    const std::string path(target);
    if (path.find(kLibraryBundle) != path.npos || path.find(kContentFolder) != path.npos)
        return true;
    for (const char* folder : kApplicationSupport)
        if (isInLibrary(target, folder))
            return true;
    return false;
}
