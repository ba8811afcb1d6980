// Bookmarks: bytes that find a file again after it was renamed or moved (docs/formats/bookmark.md), and alias files,
// whose content is a bookmark.
#pragma once

#include "platform/URL.h"
#include "platform/core/Bytes.h"
#include "platform/core/Error.h"

#include <optional>

namespace platform {

/// What a bookmark is to hold.
struct BookmarkCreationOptions {
    bool securityScope = false; // let a sandboxed host reopen the file later; never possible on Linux
};

/// What resolving may do; nothing here asks or mounts, so both are accepted and change nothing.
struct BookmarkResolutionOptions {
    bool withoutUserInterface = false; // do not ask the user
    bool withoutMounting = false;      // do not mount a volume
};

/// The item that a bookmark leads to.
struct ResolvedBookmark {
    URLRef url;           // null when the file was not found
    bool isStale = false; // it lies elsewhere, or has another inode, than the bookmark says: make a new bookmark
};

/// The values that every bookmark carries.
struct BookmarkResources {
    String path;              // null when the bytes are no bookmark
    bool isDirectory = false; // whether the item was a folder
};                            // as of the moment when the bookmark was made

/// A bookmark of an existing item: its path, whether it is a directory, file-system id, inode, birth time and handle
/// bytes. Null, with `error`, when the item does not exist or an option cannot be met.
KT_EXPORT std::optional<Bytes> makeBookmark(const URL& url, BookmarkCreationOptions options, Error* error = nullptr);

/// Finds the item. An item of the same kind at the stored path wins, whatever its inode, since a safe save changes
/// the inode. Otherwise the item is looked for in the stored folder, the folder above it, and their subfolders, level
/// by level, through at most 20,000 entries of the bookmark's file system. A match has to be proven: inode numbers
/// are reused, so birth time or kernel handle must agree too. The URL is null, with `error`, when nothing is found or
/// the bytes are no bookmark.
KT_EXPORT ResolvedBookmark resolveBookmark(BytesView bookmark, BookmarkResolutionOptions options,
                                           Error* error = nullptr);

/// The values in a bookmark, without looking for the item.
KT_EXPORT BookmarkResources bookmarkResources(BytesView bookmark);

/// Whether the bytes begin as a bookmark does.
KT_EXPORT bool looksLikeBookmark(BytesView bytes);

/// Whether the item is an alias file: one whose content is a bookmark. Linux desktops have no alias files of their
/// own.
KT_EXPORT bool isAliasFile(const URL& url);
/// The bookmark in an alias file; null when the item is no such file.
KT_EXPORT std::optional<Bytes> bookmarkOfAliasFile(const URL& url);

} // namespace platform
