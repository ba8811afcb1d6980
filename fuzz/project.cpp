// A package's dictionaries from arbitrary bytes: everything that can be asked of them, and an exchange of project data
// by whatever record they make. The files lie in memory; renaming is only watched.
#include "platform/Log.h"
#include "platform/SystemCalls.h"
#include "project/ProjectInformation.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

using namespace platform;

namespace {

constexpr std::string_view kPackage = "/p/Song.fuguex";
std::string_view parts[3]; // the information dictionary, the metadata, the record of an exchange

void require(bool condition)
{
    if (!condition)
        std::abort();
}

std::string_view contentOf(std::string_view path)
{
    if (path.ends_with("/ProjectInformation.plist"))
        return parts[0];
    if (path.ends_with("/MetaData.plist"))
        return parts[1];
    return path.ends_with("/.exchange.dummy") ? parts[2] : std::string_view();
}

std::string_view opened;

bool status(const char* path, FileStatus* status)
{
    const std::string_view name = path;
    const bool isList = name.ends_with(".plist") || name.ends_with(".dummy");
    *status = {.inode = 1 + name.size(), .kind = isList ? FileKind::file : FileKind::directory};
    const bool isThere = !name.ends_with(".bak") && !name.ends_with("ta.dummy") && name.size() % 7 != 0;
    if (!isThere)
        errno = ENOENT;
    return isThere;
}

int move(const char* from, const char* to)
{
    // Nothing outside the package, whatever a record says.
    require(std::string_view(from).starts_with(kPackage) && std::string_view(to).starts_with(kPackage));
    require(std::strstr(from, "/../") == nullptr && std::strstr(to, "/../") == nullptr);
    errno = EACCES;
    return -1;
}

void useMemory()
{
    SystemCalls& calls = systemCalls();
    calls.openFile = [](const char* path, OpenFor, FileStatus* status) {
        opened = contentOf(path);
        *status = {.size = static_cast<std::int64_t>(opened.size()), .kind = FileKind::file};
        return 1;
    };
    calls.pread = [](int, void* to, std::size_t count, std::int64_t position) -> std::int64_t {
        const std::size_t start = std::min(opened.size(), static_cast<std::size_t>(position));
        return static_cast<std::int64_t>(opened.copy(static_cast<char*>(to), count, start));
    };
    calls.close = [](int) { return 0; };
    calls.pathStatus = calls.linkStatus = status;
    calls.renameWithoutReplacing = calls.exchangeNames = move;
    calls.removeFile = calls.removeFolder = [](const char* path) { return move(path, path); };
    calls.createFile = [](const char* path, std::uint32_t) { return move(path, path); };
    calls.syncFolder = [](const char*) { return 0; };
}

void requireAbsolute(const ProjectFileSet& files)
{
    for (const std::string_view file : files)
        require(file.starts_with('/') && file.find('\0') == file.npos);
}

/// One that is stored as an absolute path is used as it is, whatever it holds; what was made absolute is standardized.
void requireStandardized(const ProjectFileSet& files, const std::vector<std::string>& stored)
{
    for (const std::string_view file : files)
        require(std::find(stored.begin(), stored.end(), file) != stored.end() ||
                (file.find("//") == file.npos && file.find("/../") == file.npos && !file.ends_with("/..")));
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    setLogHandler(nullptr);
    useMemory();
    // Two separators cut the bytes into three lists.
    std::string_view rest(reinterpret_cast<const char*>(data), size);
    for (std::string_view& part : parts) {
        const std::size_t end = rest.find("\n====\n");
        part = rest.substr(0, end);
        rest.remove_prefix(end == rest.npos ? rest.size() : end + 6);
    }
    const URLRef url = URL::createWithFileSystemPath(String::fromUTF8(kPackage), PathStyle::posix, true);
    if (const auto project = ProjectInformation::initWithProjectURL(url)) {
        for (const std::string& key : project->variationIndexesSorted())
            require(project->alternativeNames().contains(key));
        for (const long index : {-1L, 0L, 7L, project->lastActiveVariation()}) {
            project->variationNameForIndex(index);
            for (const ProjectMediaList& list : kProjectMediaLists) {
                const ProjectFileSet files = project->filesUsedByVariantIndex(list.kind, index);
                requireAbsolute(files);
                requireStandardized(files, project->relativeFilepathsUsedByVariantIndex(list.kind, index));
            }
            project->beatsPerMinute(index);
            project->sampleRate(index);
            project->songKeyAsNonLocalizedString(index);
        }
        requireAbsolute(project->allUsedFilesByAnyVariant());
        project->maxMetaDataVersionOfAnyVariant();
        ProjectInformation::infoDictionaryForProjectBundleURL(project->projectInfo(), url);
    }
    ProjectInformation::interruptedExchangeForBundleURL(url, 0);
    const auto base = ProjectInformation::backupsBaseURLForBundleURL(url, 0, CreateDirectories::no);
    ProjectInformation::settleInterruptedExchangeForBundleURL(url, 0, SettleExchange::undo);
    ProjectInformation::exchangeDataOfProjectAtURL(url, 0, base->appendingPathComponent(String::fromUTF8("00"), true));
    return 0;
}
