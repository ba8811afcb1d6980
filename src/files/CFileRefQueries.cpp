// What the file system knows about a reference's item, and the comparison of references.
#include "files/CFileRef.h"

#include "files/CFileUtilLocations.h"
#include "platform/core/ASCIICase.h"

#include <cstdio>
#include <string_view>

using platform::FileKind;
using platform::FileStatus;
using platform::String;
using platform::URLRef;

namespace {

bool linkStatusOf(const CFileRef& ref, FileStatus& status)
{
    const char* path = ref.GetPath();
    return path != nullptr && platform::systemCalls().linkStatus(path, &status);
}

bool targetStatusOf(const CFileRef& ref, FileStatus& status)
{
    const char* path = ref.GetPath();
    return path != nullptr && platform::systemCalls().pathStatus(path, &status);
}

/// The text that references are compared by: the resolved path, or the URL's text if it has no path that the file
/// system could resolve.
String resolvedPath(const CFileRef& ref)
{
    const String path = ref.CopyFileSystemPath(kPOSIXPathStyle);
    if (path.isNull() && ref.IsValid())
        return String::fromUTF8(ref.URL()->absoluteString());
    return platform::resolvingSymbolicLinksInPath(path);
}

} // namespace

String CFileRef::GetDisplayName() const
{
    if (!valid_)
        return nullptr;
    String name = platform::displayName(*url_);
    return name.isNull() ? CopyFileName() : name;
}

String CFileRef::CopyDisplayName() const
{
    return GetDisplayName();
}

std::shared_ptr<const Bytes> CFileRef::GetVolumeID() const
{
    return valid_ ? platform::volumeIdentifier(*url_) : nullptr;
}

CFileRef CFileRef::GetMountPoint() const
{
    if (!Exists())
        return None;
    CFileRef folder = *this;
    while (!folder.IsRoot()) {
        // The root has no parent, so the loop ends there even if the root's status cannot be read.
        if (std::string_view(folder.GetPath()) == "/" || !folder.SetToParent())
            return None;
    }
    return folder;
}

bool CFileRef::IsRoot() const
{
    CFileRef parent = *this;
    FileStatus own;
    FileStatus above;
    if (!parent.SetToParent() || !linkStatusOf(*this, own) || !linkStatusOf(parent, above))
        return false;
    if (own.device == above.device)
        return own.inode == above.inode;
    // In an overlay, files have other device numbers than the folder that holds them, on the same mount.
    return own.kind == FileKind::directory || !CFileUtilItemsOnSameVolume(*this, parent);
}

bool CFileRef::Exists() const
{
    FileStatus status;
    if (!linkStatusOf(*this, status))
        return false;
    return status.kind != FileKind::symbolicLink || targetStatusOf(*this, status);
}

bool CFileRef::IsFile() const
{
    FileStatus status;
    return targetStatusOf(*this, status) && status.kind != FileKind::directory;
}

bool CFileRef::IsFolder() const
{
    FileStatus status;
    return targetStatusOf(*this, status) && status.kind == FileKind::directory;
}

bool CFileRef::IsExistingPackage() const
{
    return platform::isFilePackage(String::fromFileSystemRepresentation(GetPath()));
}

bool CFileRef::IsWritable() const
{
    return platform::isWritable(GetPath());
}

bool CFileRef::PathContains(const CFileRef& other) const
{
    if (GetPath() == nullptr || other.GetPath() == nullptr)
        return false;
    constexpr std::string_view volumes = "/Volumes/";
    const std::string_view outer = GetPath();
    const std::string_view inner = other.GetPath();
    // Items on other mounted volumes are not inside the root.
    if (outer == "/" && equalIgnoringASCIICase(inner.substr(0, volumes.size()), volumes))
        return false;
    if (!equalIgnoringASCIICase(outer, inner.substr(0, outer.size())))
        return false;
    // Kept: therefore the root contains no path but itself.
    return outer.size() == inner.size() || inner[outer.size()] == '/';
}

bool CFileRef::ResolveAlias(bool allowUserInteraction)
{
    if (!valid_)
        return false;
    if (const auto bookmark = platform::bookmarkOfAliasFile(*url_)) {
        const auto resolved = platform::resolveBookmark(*bookmark, {.withoutUserInterface = !allowUserInteraction});
        // Kept: the target of a stale bookmark is not trusted.
        const URLRef target = resolved.isStale ? nullptr : platform::filePathURL(resolved.url);
        if (target) {
            if (*target != *url_)
                Set(target);
            return true;
        }
    }
    FileStatus status;
    if (!linkStatusOf(*this, status))
        return false;
    const URLRef target = platform::resolvingSymbolicLinks(*url_);
    if (!target || target->posixPath() == url_->posixPath())
        return false;
    return Set(target);
}

bool CFileRef::GetFSRef(platform::FileHandle* handle) const
{
    const char* path = GetPath();
    if (handle == nullptr || path == nullptr || path[0] == '.')
        return false;
    return platform::makeFileHandle(path, *handle);
}

bool CFileRef::UpdateInternalFSRef()
{
    auto handle = std::make_unique<platform::FileHandle>();
    if (!GetFSRef(handle.get()))
        handle.reset();
    fileHandle_ = std::move(handle);
    return fileHandle_ != nullptr;
}

bool operator==(const CFileRef& a, const CFileRef& b)
{
    if (!a.valid_ || !b.valid_)
        return a.valid_ == b.valid_;
    const std::string& path = a.url_->posixPath();
    if (!path.empty() && path == b.url_->posixPath())
        return true; // equal texts lead to the same item
    return resolvedPath(a) == resolvedPath(b);
}

bool operator<(const CFileRef& a, const CFileRef& b)
{
    if (!a.valid_ || !b.valid_)
        return a.valid_;
    return resolvedPath(a) < resolvedPath(b);
}

std::size_t CFileRef::hash() const
{
    return resolvedPath(*this).hash();
}

void CFileRef::Trace() const
{
    if (!valid_)
        std::puts("(invalid)");
    else
        std::printf("%s (state: %s)\n", url_->posixPath().c_str(), Exists() ? "existing" : "not existing");
}
