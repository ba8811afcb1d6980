// File URLs (RFC 8089, RFC 3986): immutable, shared, with the path styles of three systems.
#pragma once

#include "platform/String.h"

#include <memory>

namespace platform {

class URL;
/// A retained URL object; null means none. Copies share the object.
using URLRef = std::shared_ptr<const URL>;

enum class PathStyle : int {
    posix = 0,   // /folder/file
    colon = 1,   // Volume:folder:file
    windows = 2, // C:\folder\file
};

/// An absolute or relative location. Whether it denotes a directory is part of its text: a trailing slash. Objects
/// are immutable and may be used from several threads.
class KT_EXPORT URL {
public:
    /// A file URL from a path; null for a null or empty path, or one that no file URL can hold (a NUL in it). A path
    /// that is not absolute is kept relative to `base`. The slash at the end follows `isDirectory`, not the text.
    /// Colon style: "Disk:Folder:File" is absolute with the volume first, and a leading colon makes it relative;
    /// the start-up volume ("/") has no name of its own, so that every volume stands below "/Volumes".
    static URLRef createWithFileSystemPath(const String& path, PathStyle style, bool isDirectory,
                                           URLRef base = nullptr);
    /// From a URL's text; null when it is not a valid URI reference, or when its escapes hide a slash or a NUL
    /// ("%2F", "%00"). "file://localhost/x" and "file:///x" are the same location.
    static URLRef createWithString(std::string_view utf8, URLRef base = nullptr);

    ~URL();

    /// The text of the URL, percent-encoded; relative when it has a base.
    std::string string() const;
    /// The text with the base applied.
    std::string absoluteString() const;
    URLRef baseURL() const;

    bool isFileURL() const;
    /// Names a file by its file-system id ("file:///.file/id=…") rather than by path.
    bool isFileReferenceURL() const;
    bool hasDirectoryPath() const;
    /// Whether the path, without its base, is absolute.
    bool hasAbsolutePath() const;

    /// The decoded path in a style, base applied, without a trailing slash except for the root; null when there is
    /// none (a URL of another scheme).
    String copyFileSystemPath(PathStyle style) const;
    /// The last component of the path, decoded; "/" for the root.
    String copyLastPathComponent() const;
    /// The text after the last dot of the last component; null when there is no dot, when it starts or ends the
    /// name, or when the extension holds a space or a slash.
    String copyPathExtension() const;

    /// The URL without its last component, as a directory; the root stays the root; one relative component gives "./".
    URLRef deletingLastPathComponent() const;
    URLRef appendingPathComponent(const String& component, bool isDirectory) const;

    /// The same text and equal bases.
    friend KT_EXPORT bool operator==(const URL& a, const URL& b);

private:
    struct Parts;
    explicit URL(std::unique_ptr<const Parts> parts);
    std::unique_ptr<const Parts> parts_;
};

} // namespace platform
