// Bookmarks: bytes that find a file again after it was renamed or moved.
#pragma once

#include "platform/URL.h"
#include "platform/core/Bytes.h"
#include "platform/core/Error.h"

#include <optional>

namespace platform {

struct BookmarkCreationOptions {
    bool securityScope = false; // let a sandboxed host reopen the file later; not to be had on Linux
};

struct BookmarkResolutionOptions {
    bool withoutUserInterface = false;
    bool withoutMounting = false;
};

struct ResolvedBookmark {
    URLRef url;           // null when the file was not found
    bool isStale = false; // found, but elsewhere or as another inode than the bookmark says: make a new one
};

/// The resource values that every bookmark carries.
struct BookmarkResources {
    String path; // null when the bytes are no bookmark
    bool isDirectory = false;
};

/// A bookmark of an existing item: its path, whether it is a directory, file-system id, inode, birth time and handle
/// bytes. Null, with `error`, when the item does not exist or an option cannot be met.
KT_EXPORT std::optional<Bytes> makeBookmark(const URL& url, BookmarkCreationOptions options, Error* error = nullptr);

/// Finds the item. One that exists at the stored path wins, whatever its inode, since a safe save changes the inode;
/// otherwise the same inode is looked for in the stored folder, then in the folders around it, by a walk that is
/// bounded and stays on its file system.
KT_EXPORT ResolvedBookmark resolveBookmark(BytesView bookmark, BookmarkResolutionOptions options,
                                           Error* error = nullptr);

KT_EXPORT BookmarkResources bookmarkResources(BytesView bookmark);

/// Whether the bytes begin as a bookmark does.
KT_EXPORT bool looksLikeBookmark(BytesView bytes);

} // namespace platform
