#include "project/ProjectMediaPaths.h"

#include "platform/core/ASCIICase.h"

namespace {

constexpr std::string_view kPackageMark = ".fuguex/";
constexpr std::string_view kMediaPrefix = "Media/";

/// Where the first package mark ends; npos if there is none.
std::size_t endOfPackageMark(std::string_view path)
{
    for (std::size_t dot = path.find('.'); dot != path.npos; dot = path.find('.', dot + 1))
        if (equalIgnoringASCIICase(path.substr(dot, kPackageMark.size()), kPackageMark))
            return dot + kPackageMark.size();
    return path.npos;
}

/// Whether standardizing the part behind a slash would change nothing: it has no empty component and none that begins
/// with a dot, which is true of nearly every path. Hidden names take the long road too.
bool isStandardized(std::string_view path)
{
    if (path.empty() || path.front() == '.' || path.front() == '/' || path.back() == '/')
        return false;
    for (std::size_t slash = path.find('/'); slash != path.npos; slash = path.find('/', slash + 1))
        if (path[slash + 1] == '/' || path[slash + 1] == '.')
            return false;
    return true;
}

} // namespace

std::string standardizedPath(std::string_view path)
{
    std::string result;
    while (!path.empty()) {
        const std::size_t slash = path.find('/');
        const std::string_view component = path.substr(0, slash);
        path.remove_prefix(slash == path.npos ? path.size() : slash + 1);
        if (component.empty() || component == ".")
            continue;
        if (component == "..")
            result.resize(result.empty() ? 0 : result.rfind('/'));
        else
            (result += '/') += component;
    }
    return result.empty() ? "/" : result;
}

ProjectMediaPaths::ProjectMediaPaths(std::string packagePath, bool hasProjectFolder)
    : package_(std::move(packagePath)),
      hasProjectFolder_(hasProjectFolder)
{
    package_ += '/';
    mediaBase_ = hasProjectFolder_ ? package_.substr(0, package_.rfind('/', package_.size() - 2) + 1) : package_;
}

bool ProjectMediaPaths::makeAbsolute(std::string_view stored, std::string& result) const
{
    if (stored.empty() || stored.find('\0') != stored.npos)
        return false;
    const std::size_t inside = endOfPackageMark(stored);
    const bool isInside = inside != stored.npos;
    if (isInside) {
        stored.remove_prefix(inside);
        result = package_;
    } else if (stored.front() == '/') {
        result = stored; // unchanged: standardized as text it could lead past a link to another file
        return true;
    } else {
        result = mediaBase_;
        const bool hasPrefix = stored.starts_with(kMediaPrefix);
        if (hasPrefix && hasProjectFolder_)
            stored.remove_prefix(kMediaPrefix.size());
        else if (!hasPrefix && !hasProjectFolder_)
            result += kMediaPrefix;
    }
    result += stored;
    if (!isStandardized(stored))
        result = standardizedPath(result);
    return !isInside || result.starts_with(package_);
}
