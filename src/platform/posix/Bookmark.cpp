#include "platform/Bookmark.h"

#include "platform/SmallFile.h"
#include "platform/core/ByteReader.h"
#include "platform/core/ByteWriter.h"
#include "platform/posix/AbsolutePath.h"
#include "platform/posix/ItemSearch.h"

#include <cerrno>
#include <climits>
#include <cstring>

namespace platform {

namespace {

constexpr FourCC kBookmarkMagic = fourCC("ktbm");
constexpr std::uint16_t kBookmarkVersion = 1;
constexpr std::uint16_t kFlagDirectory = 1;
constexpr std::uint16_t kFlagSymbolicLink = 2;

constexpr std::size_t kHeaderSize = 44;     // all that comes before the handle
constexpr std::size_t kMaxHandleSize = 128; // the kernel's own limit
constexpr std::size_t kMaxPathSize = PATH_MAX - 1;
constexpr std::size_t kMaxBookmarkSize = kHeaderSize + kMaxHandleSize + kMaxPathSize;
constexpr std::size_t kSearchLimit = 20000; // entries: 7 ms of CPU time while the folders are cached

struct Bookmark {
    ItemIdentity item;
    std::uint64_t fileSystem = 0;
    std::string path;
};

Bytes encode(const Bookmark& bookmark)
{
    const FileKind kind = bookmark.item.kind;
    ByteWriter writer;
    writer.writeFourCC(kBookmarkMagic);
    writer.write(kBookmarkVersion);
    writer.write(static_cast<std::uint16_t>(kind == FileKind::directory      ? kFlagDirectory
                                            : kind == FileKind::symbolicLink ? kFlagSymbolicLink
                                                                             : 0));
    writer.write(bookmark.fileSystem);
    writer.write(bookmark.item.inode);
    writer.write(bookmark.item.birthSeconds);
    writer.write(bookmark.item.birthNanoseconds);
    writer.write(bookmark.item.handleType);
    writer.write(static_cast<std::uint16_t>(bookmark.item.handle.size()));
    writer.write(static_cast<std::uint16_t>(bookmark.path.size()));
    writer.write(BytesView(bookmark.item.handle));
    writer.write(bytesOf(bookmark.path));
    return writer.take();
}

/// Null unless every field is in its range and the bytes end with the path.
std::optional<Bookmark> decode(BytesView bytes)
{
    ByteReader reader(bytes);
    if (!looksLikeBookmark(bytes))
        return std::nullopt;
    reader.skip(6);
    Bookmark bookmark;
    const auto flags = reader.read<std::uint16_t>();
    bookmark.item.kind = (flags & kFlagDirectory) != 0      ? FileKind::directory
                         : (flags & kFlagSymbolicLink) != 0 ? FileKind::symbolicLink
                                                            : FileKind::file;
    bookmark.fileSystem = reader.read<std::uint64_t>();
    bookmark.item.inode = reader.read<std::uint64_t>();
    bookmark.item.birthSeconds = reader.read<std::int64_t>();
    bookmark.item.birthNanoseconds = reader.read<std::uint32_t>();
    bookmark.item.handleType = reader.read<std::int32_t>();
    const auto handleSize = reader.read<std::uint16_t>();
    const auto pathSize = reader.read<std::uint16_t>();
    const BytesView handle = reader.take(handleSize);
    const std::string_view path = textOf(reader.take(pathSize));
    if (!reader.ok() || reader.remaining() != 0 || handleSize > kMaxHandleSize || pathSize > kMaxPathSize)
        return std::nullopt;
    if (!path.starts_with('/') || path.find('\0') != path.npos || String::fromUTF8(path).isNull())
        return std::nullopt;
    bookmark.item.handle.assign(handle.begin(), handle.end());
    bookmark.path = path;
    return bookmark;
}

/// A folder does not replace a file, nor a link either of them; FIFOs and devices count as files.
bool sameKind(FileKind a, FileKind b)
{
    const auto isPlain = [](FileKind kind) { return kind == FileKind::file || kind == FileKind::other; };
    return a == b || (isPlain(a) && isPlain(b));
}

std::string folderOf(const std::string& path)
{
    const std::size_t slash = path.rfind('/');
    return slash == 0 ? "/" : path.substr(0, slash);
}

/// The stored folder and its parent, if they lie on the bookmark's file system.
std::vector<std::string> foldersAround(const Bookmark& bookmark)
{
    std::vector<std::string> folders;
    std::string folder = folderOf(bookmark.path);
    for (int level = 0; level < 2; ++level) {
        if (fileSystemIdentifier(folder.c_str()) == bookmark.fileSystem)
            folders.push_back(folder);
        if (folder == "/")
            break;
        folder = folderOf(folder);
    }
    return folders;
}

URLRef urlOf(const std::string& path, bool isDirectory)
{
    return URL::createWithFileSystemPath(String::fromUTF8(path), PathStyle::posix, isDirectory);
}

std::nullopt_t failed(Error* error, int systemError, const std::string& what)
{
    fail(error, ErrorDomain::system, systemError, what + ": " + std::strerror(systemError));
    return std::nullopt;
}

} // namespace

std::optional<Bytes> makeBookmark(const URL& url, BookmarkCreationOptions options, Error* error)
{
    Bookmark bookmark;
    bookmark.path = absolutePath(url);
    if (options.securityScope)
        return failed(error, ENOTSUP, "a bookmark with a security scope");
    if (bookmark.path.empty() || bookmark.path.size() > kMaxPathSize)
        return failed(error, bookmark.path.empty() ? EINVAL : ENAMETOOLONG, "a bookmark of " + url.string());
    std::optional<ItemIdentity> item = itemIdentity(bookmark.path.c_str());
    if (!item)
        return failed(error, errno, bookmark.path);
    bookmark.item = std::move(*item);
    // A link's file system is that of its folder, because its target may lie elsewhere, or nowhere.
    const bool isLink = bookmark.item.kind == FileKind::symbolicLink;
    bookmark.fileSystem = fileSystemIdentifier(isLink ? folderOf(bookmark.path).c_str() : bookmark.path.c_str());
    return encode(bookmark);
}

ResolvedBookmark resolveBookmark(BytesView bytes, BookmarkResolutionOptions, Error* error)
{
    ResolvedBookmark resolved;
    const std::optional<Bookmark> bookmark = decode(bytes);
    if (!bookmark) {
        failed(error, EINVAL, "a bookmark that cannot be read");
        return resolved;
    }
    const std::optional<ItemIdentity> atPath = itemIdentity(bookmark->path.c_str());
    if (atPath && sameKind(atPath->kind, bookmark->item.kind)) {
        resolved.url = urlOf(bookmark->path, atPath->kind == FileKind::directory);
        resolved.isStale = contradict(*atPath, bookmark->item);
        return resolved;
    }
    const auto elsewhere =
        findItem(bookmark->item, foldersAround(*bookmark), SearchDepth::withSubfolders, kSearchLimit);
    if (!elsewhere) {
        failed(error, ENOENT, bookmark->path);
        return resolved;
    }
    resolved.url = urlOf(*elsewhere, bookmark->item.kind == FileKind::directory);
    resolved.isStale = true;
    return resolved;
}

BookmarkResources bookmarkResources(BytesView bytes)
{
    const std::optional<Bookmark> bookmark = decode(bytes);
    if (!bookmark)
        return {};
    return {String::fromUTF8(bookmark->path), bookmark->item.kind == FileKind::directory};
}

bool looksLikeBookmark(BytesView bytes)
{
    ByteReader reader(bytes);
    return reader.readFourCC() == kBookmarkMagic && reader.read<std::uint16_t>() == kBookmarkVersion;
}

std::optional<Bytes> bookmarkOfAliasFile(const URL& url)
{
    const std::string& path = absolutePath(url);
    FileStatus status;
    // The size distinguishes most files from aliases without opening them.
    if (path.empty() || !systemCalls().linkStatus(path.c_str(), &status) || status.kind != FileKind::file ||
        status.size < static_cast<std::int64_t>(kHeaderSize))
        return std::nullopt;
    std::optional<Bytes> content = readSmallFile(path.c_str(), kMaxBookmarkSize);
    return content && looksLikeBookmark(*content) ? std::move(content) : std::nullopt;
}

bool isAliasFile(const URL& url)
{
    return bookmarkOfAliasFile(url).has_value();
}

} // namespace platform
