// File URLs (RFC 8089, RFC 3986): immutable, shared, with the path styles of three systems.
//
// A URL keeps the decoded path and a directory flag. Its text is made when asked for, always in one canonical form,
// so that two spellings of a location ("FILE://localhost/%41", "file:///A") make equal URLs.
#pragma once

#include "platform/String.h"

#include <memory>
#include <string>
#include <string_view>

namespace platform {

class URL;
/// A shared URL object; null means none. Copies share the object.
using URLRef = std::shared_ptr<const URL>;

/// How a path is written.
enum class PathStyle : int {
    posix = 0,   // /folder/file
    colon = 1,   // Volume:folder:file
    windows = 2, // `C:\folder\file`
};

/// An absolute or relative location. Whether it denotes a directory is part of its text: a trailing slash. Objects
/// are immutable and may be used from several threads.
///
/// Paths are kept as they are, "." and ".." included, save that slashes in a row are one slash. Only where a base is
/// applied are "." and ".." resolved by their text (RFC 3986, 5.2.4).
class KT_EXPORT URL {
public:
    /// A file URL from a path; null for a null or empty path, or one that no file URL can hold (a NUL in it). A path
    /// that is not absolute is kept relative to `base`. The slash at the end follows `isDirectory`, not the text; the
    /// root, "." and ".." are always directories.
    /// Windows style: "C:\a" is "/C:/a", "\\server\share\a" lies on that host and so has no POSIX path; both slashes
    /// separate. Null for a path relative to a drive's current folder ("C:a").
    /// Colon style: "Disk:Folder:File" is absolute with the volume first, and a leading colon makes it relative;
    /// the start-up volume ("/") has no name of its own, so that every volume stands below "/Volumes". A colon more
    /// means the folder above ("::x" is "../x"), and "/" in a name stands for ":". Null when it leads out of its
    /// volume, or for a name that is "." or "..".
    static URLRef createWithFileSystemPath(const String& path, PathStyle style, bool isDirectory,
                                           URLRef base = nullptr);
    /// A file URL from an absolute path as the file system has it, in bytes that need not be UTF-8. When they are
    /// not, the URL has no path as a String, no component and no extension, and its text does not read back; but
    /// posixPath() has the path, and the file can be opened. Null for a path that is not absolute or holds a NUL.
    static URLRef createWithFileSystemBytes(std::string_view path, bool isDirectory);
    /// From a URL's text, in which characters beyond ASCII may stand unescaped. Without a scheme it is relative to
    /// `base`, and without a base too a path. Query and fragment stay in the text and are no part of the path.
    /// Null when it is not a valid URI reference. For one that names a file also null when it has no path, or with the
    /// scheme one that is not absolute; when its escapes hide a slash or a NUL ("%2F", "%00") or are not UTF-8; when it
    /// has a port, a user or a host that is no name ("localhost" is none at all); and when `base` is of another scheme.
    static URLRef createWithString(std::string_view utf8, URLRef base = nullptr);

    ~URL();
    URL(const URL&) = delete;
    URL& operator=(const URL&) = delete;

    /// The text of the URL, percent-encoded; relative when it has a base.
    std::string string() const;
    /// The text with the base applied.
    std::string absoluteString() const;
    /// The URL that this one is relative to; null when it is absolute.
    URLRef baseURL() const;

    /// False for other schemes, and for a relative URL whose base does not make it one.
    bool isFileURL() const;
    /// Names a file by its file-system id ("file:///.file/id=…") rather than by path.
    bool isFileReferenceURL() const;
    /// Whether the URL denotes a directory: its text ends with a slash.
    bool hasDirectoryPath() const { return isDirectory_; }
    /// Whether the path, without its base, is absolute.
    bool hasAbsolutePath() const;

    /// The decoded path in a style, base applied, without a trailing slash except for a root ("/", "C:\", "Disk:");
    /// null when there is none: a URL of another scheme, a POSIX or colon path on another host, a colon path outside
    /// "/Volumes", or a path that the style would read back as another one (a name with "\" in Windows style).
    String copyFileSystemPath(PathStyle style) const;
    /// What copyFileSystemPath gives in POSIX style, without a copy and without a NUL; empty where there is no such
    /// path. Valid UTF-8, unless the URL was made from other bytes. It lives as long as the URL.
    const std::string& posixPath() const;
    /// The last component of the path, decoded; "/" for the root; null for a URL of another scheme.
    String copyLastPathComponent() const;
    /// The text after the last dot of the last component; null when there is no dot, when it starts or ends the
    /// name, or when the extension holds a space.
    String copyPathExtension() const;

    /// The URL without its last component, as a directory; the root stays the root; one relative component gives "./",
    /// and ".." is followed by another. Without query and fragment; null for a URL of another scheme.
    URLRef deletingLastPathComponent() const;
    /// Slashes in `component` separate. Null for a null or empty one, or one with a NUL, or a URL of another scheme.
    URLRef appendingPathComponent(const String& component, bool isDirectory) const;

    /// The same text and equal bases.
    friend KT_EXPORT bool operator==(const URL& a, const URL& b);
    /// Equal URLs have equal hashes.
    std::size_t hash() const;

private:
    struct Rest;
    struct Creation { // only members can name it, and so construct
        explicit Creation() = default;
    };

public:
    /// For the factories; use those.
    URL(Creation, std::string path, bool isDirectory, std::unique_ptr<const Rest> rest);

private:
    static URLRef create(std::string path, bool isDirectory, Rest rest);
    bool isOfOtherScheme() const;
    const std::string& ownPath() const;
    std::string textOfPath(const std::string& path) const;
    URLRef withPath(std::string path, bool isDirectory) const;

    std::string path_; // decoded, base applied, no trailing slash but the root's; empty for a URL of another scheme
    bool isDirectory_;
    std::unique_ptr<const Rest> rest_; // what the URL of a local path does not have, which is nearly every one
};

} // namespace platform
