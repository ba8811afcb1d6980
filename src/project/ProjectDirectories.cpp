#include "project/ProjectDirectories.h"

#include "platform/Folders.h"
#include "platform/SystemCalls.h"
#include "platform/core/ASCIICase.h"
#include "project/ProjectInformation.h"
#include "project/ProjectLayout.h"
#include "project/ProjectMediaPaths.h"

#include <array>

using platform::String;
using platform::URLRef;

namespace {

enum class In { nothing, media, alternative };

/// A folder of the package kinds. `folder` is its name in a project folder; empty means the project folder itself.
struct PackageDirectory {
    In in = In::nothing;
    const char* inside = ""; // relative to "Media" or to the alternative's folder
    const char* folder = "";
};

constexpr std::array<PackageDirectory, 20> kPackageDirectories{{
    {}, //  0
    {In::alternative, "Previews", ""},
    {In::media, "Impulse Responses", "Impulse Responses"},
    {In::media, "Gestiniop Samples", "Gestiniop Samples"},
    {In::media, "Bounces", "Bounces"},
    {In::media, "Sampler Instruments", "Sampler Instruments"}, //  5
    {In::media, "Samples", "Samples"},
    {In::media, "Audio Files", "Audio Files"},
    {In::media, "Playback", "Playback"},
    {In::media, "ReCycle Audio", "ReCycle Audio"},
    {In::alternative, "Undo Data.nosync", ""}, // 10
    {In::media, "Movie Files", "Movie Files"},
    {In::media, "Fade Files.nosync", "Fade Files"}, // Kept: no suffix in a project folder, here and below
    {In::media, "Freeze Files.nosync", "Freeze Files"},
    {In::media, "", ""},
    {In::alternative, "ARA Files", ""}, // 15
    {},
    {},
    {In::media, "Alchemy Samples", "Alchemy Samples"},
    {In::media, "Samples/Quick Sampler", "Samples/Quick Sampler"},
}};

/// A folder of the older kinds, directly under the base; null if a kind has none. "band" and "mwand" rarely differ from
/// the others.
struct OlderDirectory {
    const char* plain; // types 1 and 6
    const char* band;  // type 2
    const char* mwand; // type 4
};

constexpr std::array<OlderDirectory, 20> kOlderDirectories{{
    {nullptr, nullptr, nullptr}, //  0
    {nullptr, nullptr, nullptr},
    {"Impulse Responses", "Impulse Responses", "Impulse Responses"},
    {"Gestiniop Samples", nullptr, nullptr},
    {"Bounces", "Bounces", "Bounces"},
    {nullptr, "Sampler", nullptr}, //  5
    {nullptr, "Sampler/Sampler Files", nullptr},
    {"Audio Files", nullptr, nullptr},
    {"Playback", "Playback", "Playback"},
    {"ReCycle Audio", "ReCycle Audio", "ReCycle Audio"},
    {"Undo Data", "Undo Data", "Undo Data"}, // 10
    {"Movie Files", "Movie Files", "Movie Files"},
    {"Fade Files", "Fade Files", "Fade Files"},
    {"Freeze Files", "Freeze Files", "Freeze Files"},
    {nullptr, nullptr, nullptr},
    {"ARA Plug-In Files", "ARA Plug-In Files", "ARA Plug-In Files"}, // 15
    {nullptr, nullptr, nullptr},
    {nullptr, nullptr, nullptr},
    {"Alchemy Samples", "Alchemy Samples", "Alchemy Samples"},
    {nullptr, nullptr, nullptr},
}};

bool isPackageKind(ProjectDirectoryType type)
{
    return type == kProjectDirectoryPackage || type == kProjectDirectoryBand || type == kProjectDirectoryGrid ||
           type == kProjectDirectoryConcert;
}

std::string pathIn(const CFileRef& folder, const char* name)
{
    const char* path = folder.GetPath();
    return path != nullptr ? std::string(path) + '/' + name : "";
}

const char* olderName(ProjectDirectoryType type, std::size_t wanted)
{
    if (wanted >= kOlderDirectories.size())
        return nullptr;
    const OlderDirectory& names = kOlderDirectories[wanted];
    return type == kProjectDirectoryOldBand ? names.band : type == kProjectDirectoryMwand ? names.mwand : names.plain;
}

URLRef parentOf(const URLRef& url)
{
    return url ? url->deletingLastPathComponent() : nullptr;
}

/// Whether the name exists, even as a dangling link.
bool entryExists(const std::string& path)
{
    platform::FileStatus status;
    return !path.empty() && platform::systemCalls().linkStatus(path.c_str(), &status);
}

/// `name` may be empty, which means the folder itself.
URLRef below(const URLRef& folder, const char* name)
{
    return *name == '\0' ? folder : itemIn(folder, name, true);
}

bool createFolder(const URLRef& url)
{
    return !pathOf(url).empty() && platform::createFolders(pathOf(url));
}

URLRef nearestPackage(const URLRef& url)
{
    std::string path = pathOf(url).empty() ? "" : standardizedPath(pathOf(url)); // "x.band/../y" is not in a package
    while (path.size() > 1) {
        if (platform::isFilePackage(String::fromUTF8(path)))
            return platform::URL::createWithFileSystemPath(String::fromUTF8(path), platform::PathStyle::posix, true);
        path.resize(path.rfind('/'));
    }
    return nullptr;
}

} // namespace

ProjectDirectoryType GetProjectDirectoryType(const CFileRef& project)
{
    const std::string extension = project.CopyFileExtension().utf8();
    if (equalIgnoringASCIICase(extension, "fuguex"))
        return kProjectDirectoryPackage;
    if (equalIgnoringASCIICase(extension, "band"))
        return project.Exists() && !folderExists(pathIn(project, ProjectLayout::alternatives.front()))
                   ? kProjectDirectoryOldBand
                   : kProjectDirectoryBand;
    if (equalIgnoringASCIICase(extension, "mwand"))
        return kProjectDirectoryMwand;
    if (equalIgnoringASCIICase(extension, "grid"))
        return kProjectDirectoryGrid;
    if (equalIgnoringASCIICase(extension, "concert"))
        return entryExists(pathIn(project, "isProject")) ? kProjectDirectoryConcertProject : kProjectDirectoryConcert;
    return kProjectDirectoryPlain;
}

fugueXProjectType_t GetProjectLayout(const CFileRef& base)
{
    if (GetProjectDirectoryType(base) != kProjectDirectoryPackage)
        return kProjectTypeMediaInside;
    const auto project = ProjectInformation::initWithProjectURL(base.URL());
    return project && project->hasProjectFolder() ? kProjectTypeProjectFolder : kProjectTypeMediaInside;
}

CFileRef GetProjectDirectoryRefForBase(const CFileRef& base, TTypeDir_Prj type, bool create, fugueXProjectType_t layout,
                                       long alternativeIndex)
{
    const ProjectDirectoryType kind = GetProjectDirectoryType(base);
    const auto wanted = static_cast<std::size_t>(type);
    if (base.GetPath() == nullptr || layout < kProjectTypeFromProject || layout > kProjectTypeProjectFolder)
        return CFileRef();
    const URLRef package = platform::URL::createWithFileSystemPath(String::fromFileSystemRepresentation(base.GetPath()),
                                                                   platform::PathStyle::posix, true);

    URLRef root = package, directory;
    bool isInMedia = false;
    if (!isPackageKind(kind)) {
        const char* name = olderName(kind, wanted);
        directory = name != nullptr ? below(package, name) : nullptr;
    } else {
        const PackageDirectory names =
            wanted < kPackageDirectories.size() ? kPackageDirectories[wanted] : PackageDirectory();
        if (layout == kProjectTypeFromProject)
            layout = GetProjectLayout(base);
        if (layout == kProjectTypeProjectFolder)
            root = parentOf(package);
        isInMedia = layout == kProjectTypeMediaInside;
        if (names.in == In::alternative)
            directory =
                below(ProjectInformation::URLForVariant(alternativeIndex, package, AcceptMissing::yes), names.inside);
        else if (names.in == In::media)
            directory = isInMedia ? below(itemIn(package, ProjectLayout::media, true), names.inside)
                                  : below(root, names.folder);
    }
    // Kept: the base is created even for a type without a folder
    if ((create && !createFolder(root)) || !directory)
        return CFileRef();
    if (create &&
        !((!isInMedia || createFolder(itemIn(package, ProjectLayout::media, true))) && createFolder(directory)))
        return CFileRef();
    return CFileRef(directory);
}

URLRef GetProjectBundleURL(const URLRef& location)
{
    return nearestPackage(location);
}

CFileRef CFileUtilEnclosingProjectBundle(const CFileRef& item)
{
    const URLRef bundle = nearestPackage(item.URL());
    return bundle ? CFileRef(bundle) : CFileRef();
}

bool CFileUtilIsInDocumentBundle(const CFileRef& item)
{
    CFileRef folder = item;
    return folder.SetToParent() && nearestPackage(folder.URL()) != nullptr;
}
