// Bookmarks: bytes that find a file again after it was renamed or moved (docs/formats/bookmark.md), and alias files,
// whose content is a bookmark.
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

/// Finds the item. One of the same kind at the stored path wins, whatever its inode, since a safe save changes the
/// inode; otherwise the same item is looked for in the stored folder and the folder around that, and in their
/// subfolders, level by level, through at most 20,000 entries of the file system that the bookmark names. Found means
/// proven: inode numbers are used again, so birth time or kernel handle must agree too. No option changes this:
/// nothing here asks the user, and nothing is mounted.
KT_EXPORT ResolvedBookmark resolveBookmark(BytesView bookmark, BookmarkResolutionOptions options,
                                           Error* error = nullptr);

KT_EXPORT BookmarkResources bookmarkResources(BytesView bookmark);

/// Whether the bytes begin as a bookmark does.
KT_EXPORT bool looksLikeBookmark(BytesView bytes);

/// Whether the item is an alias file: one whose content is bookmark data. Linux desktops have none of their own.
KT_EXPORT bool isAliasFile(const URL& url);
/// The bookmark in an alias file; null when the item is no such file.
KT_EXPORT std::optional<Bytes> bookmarkOfAliasFile(const URL& url);

} // namespace platform
