#include "platform/FileSystem.h"

#include "platform/posix/AbsolutePath.h"

#include <cerrno>
#include <climits>
#include <cstdlib>
#include <memory>

#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/syscall.h>
#include <unistd.h>

namespace platform {

namespace {

/// Whether an absolute path is unchanged by resolving, links aside.
bool isNormal(std::string_view path)
{
    while (!path.empty()) {
        const std::size_t slash = path.find('/', 1);
        const std::string_view component = path.substr(1, slash == path.npos ? slash : slash - 1);
        if (component.empty() || component == "." || component == "..")
            return false;
        path.remove_prefix(slash == path.npos ? path.size() : slash);
    }
    return true;
}

enum class Walked { found, missing, unknown };

/// Looks for an item in one call, which fails at a link, where `realpath` takes a call per component. Results are not
/// cached, because a folder may be renamed at any time.
Walked walkWithoutLinks(const char* path)
{
    open_how how = {};
    how.flags = O_PATH | O_CLOEXEC;
    how.resolve = RESOLVE_NO_SYMLINKS;
    const int item = static_cast<int>(::syscall(SYS_openat2, AT_FDCWD, path, &how, sizeof how));
    if (item < 0)
        return errno == ENOENT ? Walked::missing : Walked::unknown;
    ::close(item);
    return Walked::found;
}

/// False if no such item exists.
bool resolve(const char* path, std::string& resolved)
{
    if (isNormal(path)) {
        const Walked walked = walkWithoutLinks(path);
        if (walked == Walked::found)
            resolved = path;
        if (walked != Walked::unknown)
            return walked == Walked::found;
    }
    char buffer[PATH_MAX];
    if (::realpath(path, buffer) == nullptr)
        return false;
    resolved = buffer;
    return true;
}

/// Appends the components of `rest` to `path` by their text alone.
void appendComponents(std::string& path, std::string_view rest)
{
    while (!rest.empty()) {
        const std::size_t slash = rest.find('/');
        const std::string_view component = rest.substr(0, slash);
        rest.remove_prefix(slash == rest.npos ? rest.size() : slash + 1);
        if (component.empty() || component == ".")
            continue;
        if (component == "..") {
            path.erase(path.rfind('/'));
        } else {
            if (path != "/")
                path += '/';
            path += component;
        }
        if (path.empty())
            path = "/";
    }
}

} // namespace

URLRef resolvingSymbolicLinks(const URL& url)
{
    const std::string& path = absolutePath(url);
    std::string resolved;
    FileStatus status;
    if (path.empty() || !resolve(path.c_str(), resolved) || !systemCalls().pathStatus(resolved.c_str(), &status))
        return nullptr;
    const bool isDirectory = status.kind == FileKind::directory;
    return String::fromUTF8(path).isNull()
               ? URL::createWithFileSystemBytes(resolved, isDirectory)
               : URL::createWithFileSystemPath(String::fromUTF8(resolved), PathStyle::posix, isDirectory);
}

String resolvingSymbolicLinksInPath(const String& path)
{
    const std::string& whole = path.utf8();
    if (!whole.starts_with('/'))
        return path;
    std::string resolved;
    if (!resolve(whole.c_str(), resolved)) {
        // Shorten the path until the rest exists; "/" always does. A link without a target stays as it is.
        std::size_t end = whole.size();
        do
            end = whole.rfind('/', end - 1);
        while (end > 0 && !resolve(whole.substr(0, end).c_str(), resolved));
        if (end == 0)
            resolved = "/";
        appendComponents(resolved, std::string_view(whole).substr(end));
    }
    String text = String::fromUTF8(resolved);
    return text.isNull() ? path : text; // a link may lead into a folder whose name is not UTF-8
}

URLRef filePathURL(const URLRef& url)
{
    if (!url)
        return nullptr;
    const std::string& path = absolutePath(*url);
    FileStatus status;
    if (path.empty() || !systemCalls().linkStatus(path.c_str(), &status))
        return nullptr;
    if (url->baseURL() == nullptr && url->isFileURL())
        return url;
    return URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, url->hasDirectoryPath());
}

} // namespace platform
