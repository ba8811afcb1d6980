// The seam to the system: the calls through which the bytes of files travel. Tests replace an entry to make it fail.
#pragma once

#include "platform/core/Export.h"

#include <cstddef>
#include <cstdint>

namespace platform {

enum class FileKind { file, directory, symbolicLink, other }; // other: FIFO, socket, device

struct FileStatus {
    std::uint64_t device = 0;
    std::uint64_t inode = 0;
    std::int64_t size = 0;
    FileKind kind = FileKind::other;
    std::uint32_t permissions = 0; // the low 12 mode bits
    std::int64_t changed = 0;      // when content or attributes changed last, in nanoseconds since 1970
    std::uint64_t links = 0;       // names that the item has

    bool isSameItem(const FileStatus& other) const { return device == other.device && inode == other.inode; }
};

enum class OpenFor { reading, readingAndWriting };

/// Each entry behaves as the system's call of that name: -1 (or false) on failure, with errno saying why. Offsets and
/// lengths are in bytes.
struct SystemCalls {
    /// Opens a regular file, with its status unless `status` is null, and nothing else: a directory fails with EISDIR;
    /// a FIFO, socket or device with ENXIO, and never by waiting. A file on which another process holds a lease is
    /// waited for. Descriptors are not inherited by other programs.
    int (*openFile)(const char* path, OpenFor access, FileStatus* status);
    /// As openFile, but fails with ELOOP when any component of the path is a symbolic link, and with ENOSYS where the
    /// system cannot tell. Two calls when it succeeds for reading what is named like a recording; a FIFO by such a name
    /// is opened, without waiting for it, and closed again. Of any other name it looks first.
    int (*openFileWithoutLinks)(const char* path, OpenFor access, FileStatus* status);
    /// O_CREAT | O_EXCL, for writing; the permissions are those given less the process's mask.
    int (*createFile)(const char* path, std::uint32_t permissions);
    int (*close)(int descriptor);
    std::int64_t (*pread)(int descriptor, void* buffer, std::size_t count, std::int64_t offset);
    std::int64_t (*pwrite)(int descriptor, const void* buffer, std::size_t count, std::int64_t offset);
    int (*ftruncate)(int descriptor, std::int64_t length);
    int (*fsync)(int descriptor);
    /// Commits the names in a folder to storage; success where the file system keeps no such promise.
    int (*syncFolder)(const char* path);
    /// Reserves space behind the physical end of the file without changing its length.
    int (*preallocate)(int descriptor, std::int64_t offset, std::int64_t length);
    /// A hint that what is read will not be read again soon; never makes repeated reads slow.
    int (*adviseNoReuse)(int descriptor);
    bool (*status)(int descriptor, FileStatus* status);
    bool (*pathStatus)(const char* path, FileStatus* status); // follows links
    bool (*linkStatus)(const char* path, FileStatus* status); // does not

    // Names. A symbolic link at the end of a path is the item itself.
    int (*createFolder)(const char* path, std::uint32_t permissions);
    /// Fails with EEXIST when something has the name `to`; with EXDEV on another file system.
    int (*renameWithoutReplacing)(const char* from, const char* to);
    /// Two items that exist take each other's names, in one step that is never half done. EINVAL or ENOSYS where the
    /// file system cannot.
    int (*exchangeNames)(const char* a, const char* b);
    int (*removeFile)(const char* path);
    int (*removeFolder)(const char* path); // an empty one
    /// A second name; EEXIST when something has it.
    int (*linkFile)(const char* path, const char* name);

    // Names in a folder that is open, wherever its path leads meanwhile. A symbolic link is the item itself.
    /// A folder that may be written but not read serves too; fsync fails with EBADF then.
    int (*openFolder)(const char* path);
    /// O_CREAT | O_EXCL, for reading and writing.
    int (*createFileIn)(int folder, const char* name, std::uint32_t permissions);
    /// For reading and writing, without waiting. What else than a regular file has the name is opened too.
    int (*openFileIn)(int folder, const char* name);
    bool (*statusIn)(int folder, const char* name, FileStatus* status);
    int (*removeFileIn)(int folder, const char* name);
    /// In the place of what has the name `to`.
    int (*renameIn)(int folder, const char* from, const char* to);
    /// EEXIST when something has the name `to`, in one step wherever the file system has such a step.
    int (*renameInWithoutReplacing)(int folder, const char* from, const char* to);

    // Copies of an open file.
    /// Makes the content of `to` that of `from` without copying it; fails where the file system cannot.
    int (*shareContent)(int from, int to);
    /// Copies inside the system, from one offset of both files on; the bytes copied, 0 at the end of `from`. Fails
    /// where the system cannot.
    std::int64_t (*copyRange)(int from, int to, std::int64_t offset, std::size_t count);
    /// The next bytes from `offset` on that are no hole, as [begin, end); false with ENXIO when only a hole is left.
    bool (*nextData)(int descriptor, std::int64_t offset, std::int64_t* begin, std::int64_t* end);
    int (*setOwner)(int descriptor, std::uint32_t owner, std::uint32_t group);
};

/// The calls in force in this process. Only tests assign to it.
KT_EXPORT SystemCalls& systemCalls();

} // namespace platform
