// What the file system and its desktop know of an item: handles, names, volumes, packages, homes.
#pragma once

#include "platform/SystemCalls.h"
#include "platform/URL.h"
#include "platform/core/Value.h"

#include <array>
#include <optional>

namespace platform {

/// The opaque handle of an existing item: a fixed-size block that finds the item again, in the same session of the
/// system, after it was renamed in its folder. All zero means none.
struct FileHandle {
    std::array<std::byte, 4160> bytes{};
    friend bool operator==(const FileHandle&, const FileHandle&) = default;
};

/// The handle of the item at an absolute path; false, and `handle` zeroed, when there is none.
KT_EXPORT bool makeFileHandle(const char* path, FileHandle& handle);
/// A URL of the item, null when it is not found any more.
KT_EXPORT URLRef urlFromFileHandle(const FileHandle& handle);
/// The name under which the handle's item is found in its folder's catalog now; null when it is not.
KT_EXPORT String catalogName(const FileHandle& handle);

/// The home folder of a user; of the process's real user when `name` is empty. Null for an unknown user.
KT_EXPORT String homeDirectory(const std::string& name);

/// The name that a desktop shows for an item; null when the item does not exist. On Linux the "Name" of a folder's
/// ".directory" file or of a ".desktop" file in the user's language, else the name itself.
KT_EXPORT String displayName(const URL& url);

/// An opaque value, comparable for equality, that two items share exactly when they lie on one mounted volume; null on
/// failure. Means nothing once the volume is unmounted.
KT_EXPORT std::shared_ptr<const Bytes> volumeIdentifier(const URL& url);

/// Whether the item is a folder that is shown as one document: its extension is that of one of the suite's packages.
KT_EXPORT bool isFilePackage(const String& path);

/// Whether the process, with its effective user, may write to the item. Null asks for nothing and gives false.
KT_EXPORT bool isWritable(const char* path);

/// The URL with every symbolic link of its path resolved; null when the item does not exist.
KT_EXPORT URLRef resolvingSymbolicLinks(const URL& url);

/// The path with the symbolic links of the part that exists resolved, the rest kept as it is save for ".", ".." and
/// double slashes; null stays null, and a relative path is not touched.
KT_EXPORT String resolvingSymbolicLinksInPath(const String& path);

/// A URL that names the item (a symbolic link being one) by its absolute path; null when it does not exist.
KT_EXPORT URLRef filePathURL(const URLRef& url);

} // namespace platform
