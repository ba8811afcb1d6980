// What the file system and the desktop know of an item: handles, names, volumes, packages, homes.
#pragma once

#include "platform/SystemCalls.h"
#include "platform/URL.h"
#include "platform/core/Value.h"

#include <array>
#include <optional>

namespace platform {

/// The opaque handle of an existing item, of fixed size. It finds the item again, until the system restarts, after it
/// was renamed in its folder. All zeros mean none.
struct FileHandle {
    std::array<std::byte, 4160> bytes{}; // opaque
    friend bool operator==(const FileHandle&, const FileHandle&) = default;
};

/// The handle of the item at an absolute path; false, and `handle` zeroed, when there is none.
KT_EXPORT bool makeFileHandle(const char* path, FileHandle& handle);
/// The URL of the item now; null when it is not found any more.
KT_EXPORT URLRef urlFromFileHandle(const FileHandle& handle);
/// The name under which the item's folder lists it now; null when it is not found.
KT_EXPORT String catalogName(const FileHandle& handle);

/// The home folder of a user; of the process's real user when `name` is empty. Null for an unknown user.
KT_EXPORT String homeDirectory(const std::string& name);

/// The name that a desktop shows for an item; null when the item does not exist. On Linux, "Name" of a folder's
/// ".directory" file or of a ".desktop" file, in the user's language; for other items the name itself.
KT_EXPORT String displayName(const URL& url);

/// An opaque value that is equal for items on one mounted volume; null on failure. It means nothing once the volume
/// is unmounted.
KT_EXPORT std::shared_ptr<const Bytes> volumeIdentifier(const URL& url);

/// Whether the item is a folder that is shown as one document: its extension is that of one of the suite's packages.
KT_EXPORT bool isFilePackage(const String& path);

/// Whether the process, with its effective user, may write to the item. False for null.
KT_EXPORT bool isWritable(const char* path);

/// The URL with every symbolic link of its path resolved; null when the item does not exist.
KT_EXPORT URLRef resolvingSymbolicLinks(const URL& url);

/// The path with the symbolic links of its existing part resolved; the rest keeps its names, without ".", ".." and
/// double slashes. Null stays null, and a relative path is not changed.
KT_EXPORT String resolvingSymbolicLinksInPath(const String& path);

/// The URL of the item by its absolute path, a symbolic link not followed; null when it does not exist.
KT_EXPORT URLRef filePathURL(const URLRef& url);

} // namespace platform
