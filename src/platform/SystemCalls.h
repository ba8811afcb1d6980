// The seam to the system: the calls by which the bytes of files travel. Tests replace an entry to make it fail.
#pragma once

#include "platform/core/Export.h"

#include <cstddef>
#include <cstdint>

namespace platform {

/// What an item is; other: FIFO, socket, device.
enum class FileKind { file, directory, symbolicLink, other };

/// What the system says of an item.
struct FileStatus {
    std::uint64_t device = 0;        // file-system number; equal for items on one file system
    std::uint64_t inode = 0;         // number on that file system; reused after a removal
    std::int64_t size = 0;           // in bytes
    FileKind kind = FileKind::other; // what the item is
    std::uint32_t permissions = 0;   // the low 12 mode bits
    std::int64_t changed = 0;        // when content or attributes last changed, in nanoseconds since 1970
    std::uint64_t links = 0;         // how many names the item has

    /// Whether both are one and the same file.
    bool isSameItem(const FileStatus& other) const { return device == other.device && inode == other.inode; }
};

/// The access that a descriptor gives.
enum class OpenFor { reading, readingAndWriting };

/// Each entry behaves as the system's call of that name: -1 (or false) on failure, with errno. Offsets and lengths
/// are in bytes.
struct SystemCalls {
    /// Opens a regular file and nothing else, and fills `status` unless it is null. EISDIR for a directory; ENXIO for
    /// a FIFO, socket or device, without waiting for it. Waits for a lease that another process holds on the file.
    /// Other programs do not inherit the descriptor.
    int (*openFile)(const char* path, OpenFor access, FileStatus* status);
    /// As openFile, but ELOOP when any component of the path is a symbolic link, ENOSYS where the system cannot tell.
    /// A path that is named like a recording takes two calls when it succeeds for reading; a FIFO of such a name is
    /// opened, without waiting, and closed again. Any other path is examined before it is opened.
    int (*openFileWithoutLinks)(const char* path, OpenFor access, FileStatus* status);
    /// Creates a file for writing (O_CREAT | O_EXCL) with the permissions less the process's mask.
    int (*createFile)(const char* path, std::uint32_t permissions);
    /// Releases a descriptor.
    int (*close)(int descriptor);
    /// Reads at an offset; the bytes read, 0 at the end.
    std::int64_t (*pread)(int descriptor, void* buffer, std::size_t count, std::int64_t offset);
    /// Writes at an offset; the bytes written.
    std::int64_t (*pwrite)(int descriptor, const void* buffer, std::size_t count, std::int64_t offset);
    /// Cuts the file, or extends it with zeros.
    int (*ftruncate)(int descriptor, std::int64_t length);
    /// Commits content and length to storage.
    int (*fsync)(int descriptor);
    /// Commits the names in a folder to storage; succeeds where the file system makes no such promise.
    int (*syncFolder)(const char* path);
    /// Reserves space past the physical end of the file without changing its length.
    int (*preallocate)(int descriptor, std::int64_t offset, std::int64_t length);
    /// Hints that what is read is not read again soon; never slows repeated reads.
    int (*adviseNoReuse)(int descriptor);
    /// The status of an open file.
    bool (*status)(int descriptor, FileStatus* status);
    bool (*pathStatus)(const char* path, FileStatus* status); // follows links
    bool (*linkStatus)(const char* path, FileStatus* status); // does not follow them

    // Names. A symbolic link at the end of a path is the item itself.
    /// Creates a folder with the permissions less the process's mask.
    int (*createFolder)(const char* path, std::uint32_t permissions);
    /// Fails with EEXIST when something has the name `to`; with EXDEV on another file system.
    int (*renameWithoutReplacing)(const char* from, const char* to);
    /// Exchanges the names of two existing items in one step that is never half done. EINVAL or ENOSYS where the file
    /// system cannot.
    int (*exchangeNames)(const char* a, const char* b);
    /// Removes a name of a file.
    int (*removeFile)(const char* path);
    int (*removeFolder)(const char* path); // must be empty
    /// Gives the file a second name. EEXIST when something has it.
    int (*linkFile)(const char* path, const char* name);

    // Names in a folder that is open, wherever its path leads meanwhile. A symbolic link is the item itself.
    /// Opens a folder. Write permission is enough; fsync then fails with EBADF.
    int (*openFolder)(const char* path);
    /// Creates a file for reading and writing (O_CREAT | O_EXCL).
    int (*createFileIn)(int folder, const char* name, std::uint32_t permissions);
    /// Opens for reading and writing, without waiting. It need not be a regular file.
    int (*openFileIn)(int folder, const char* name);
    /// The status of the item of that name.
    bool (*statusIn)(int folder, const char* name, FileStatus* status);
    /// Removes a name of a file.
    int (*removeFileIn)(int folder, const char* name);
    /// Renames, and replaces what has the name `to`.
    int (*renameIn)(int folder, const char* from, const char* to);
    /// Renames. EEXIST when something has the name `to`, in one step wherever the file system has such a step.
    int (*renameInWithoutReplacing)(int folder, const char* from, const char* to);

    // Copies of an open file.
    /// Makes the content of `to` that of `from` without copying it; fails where the file system cannot.
    int (*shareContent)(int from, int to);
    /// Copies inside the system, at the same offset of both files; the bytes copied, 0 at the end of `from`. Fails
    /// where the system cannot.
    std::int64_t (*copyRange)(int from, int to, std::int64_t offset, std::size_t count);
    /// The next range [begin, end) from `offset` on that is not a hole; false with ENXIO when only a hole is left.
    bool (*nextData)(int descriptor, std::int64_t offset, std::int64_t* begin, std::int64_t* end);
    /// Changes user and group; needs privileges for most.
    int (*setOwner)(int descriptor, std::uint32_t owner, std::uint32_t group);
};

/// The calls in force in this process. Only tests assign to them.
KT_EXPORT SystemCalls& systemCalls();

} // namespace platform
