// The window through which an open CFileIO is walked and described.
#pragma once

#include "files/CFileIO.h"
#include "media/containers/HeaderWindow.h"

#include <algorithm>

/// The bytes of a CFileIO, which it does not own; the bytes in its write cache included.
class CFileBytes final : public platform::ByteSource {
    /// Borrows the file.
public:
    explicit CFileBytes(CFileIO& file) : file_(file) {}

    std::int32_t readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const override
    {
        long actual = 0;
        const std::int32_t status =
            file_.Read(to, static_cast<std::int64_t>(position), static_cast<long>(count), &actual);
        got = static_cast<std::size_t>(std::max(actual, 0L));
        return status == kStatusEndOfFile ? std::int32_t{kStatusOK} : status;
    }

private:
    CFileIO& file_;
};

/// Constructed ahead of the window, which keeps a reference to it.
struct FileWindowBytes { // see CFileBytes
    CFileBytes bytes;
};

/// A HeaderWindow on a CFileIO, which it does not own.
class FileWindow : private FileWindowBytes, public platform::HeaderWindow {
public:
    /// `length` is that of the file, in bytes.
    FileWindow(CFileIO& file, std::int64_t length)
        : FileWindowBytes{CFileBytes(file)},
          HeaderWindow(bytes, static_cast<std::uint64_t>(std::max<std::int64_t>(length, 0)))
    {
    }
    FileWindow(const FileWindow&) = delete;
    FileWindow& operator=(const FileWindow&) = delete;

    /// The length that the window was made with.
    std::int64_t fileLength() const { return static_cast<std::int64_t>(length()); }
};
