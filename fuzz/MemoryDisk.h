// A disk of one file in memory, for fuzz targets that open audio files, and the audio that must survive every edit.
#pragma once

#include "media/userdata/AudioFileService.h"
#include "platform/SystemCalls.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <vector>

inline constexpr std::size_t kLargestFile = 1 << 20;
inline std::vector<std::uint8_t> fileBytes;
inline int callsLeft; // until every write fails

inline bool diskFails()
{
    errno = ENOSPC;
    return callsLeft-- <= 0;
}

inline void useMemory()
{
    using namespace platform;
    SystemCalls& calls = systemCalls();
    calls.openFile = calls.openFileWithoutLinks = [](const char*, OpenFor, FileStatus* status) {
        *status = {.size = static_cast<std::int64_t>(fileBytes.size()), .kind = FileKind::file};
        return 1;
    };
    calls.close = [](int) { return 0; };
    calls.fsync = [](int) { return 0; };
    calls.status = [](int, FileStatus* status) {
        *status = {.size = static_cast<std::int64_t>(fileBytes.size()), .kind = FileKind::file};
        return true;
    };
    calls.pread = [](int, void* to, std::size_t count, std::int64_t position) -> std::int64_t {
        const std::size_t start = std::min(fileBytes.size(), static_cast<std::size_t>(position));
        count = std::min(count, fileBytes.size() - start);
        std::copy_n(fileBytes.begin() + static_cast<std::ptrdiff_t>(start), count, static_cast<std::uint8_t*>(to));
        return static_cast<std::int64_t>(count);
    };
    calls.ftruncate = [](int, std::int64_t length) {
        if (diskFails() || static_cast<std::size_t>(length) > kLargestFile)
            return -1;
        fileBytes.resize(static_cast<std::size_t>(length));
        return 0;
    };
    calls.pwrite = [](int, const void* from, std::size_t count, std::int64_t position) -> std::int64_t {
        const std::size_t end = static_cast<std::size_t>(position) + count;
        if (diskFails() || end > kLargestFile)
            return -1;
        fileBytes.resize(std::max(fileBytes.size(), end));
        std::memcpy(fileBytes.data() + position, from, count);
        return static_cast<std::int64_t>(count);
    };
}

struct Audio {
    platform::StreamDescription format;
    std::vector<std::uint8_t> samples;
    bool operator==(const Audio&) const = default;
};

inline Audio audioOf(platform::AudioFile& opened)
{
    Audio audio;
    std::uint64_t count = 0;
    if (opened.dataFormat(audio.format) != 0 || opened.audioDataByteCount(count) != 0)
        return audio;
    if (count > fileBytes.size())
        std::abort();
    audio.samples.resize(static_cast<std::size_t>(count));
    auto bytes = static_cast<std::uint32_t>(count);
    if (opened.readBytes(0, bytes, audio.samples.data()) != 0 || bytes != count)
        std::abort();
    return audio;
}

inline platform::URLRef fileURL()
{
    using namespace platform;
    static const URLRef url = URL::createWithFileSystemPath(String::fromUTF8("/file"), PathStyle::posix, false);
    return url;
}

inline std::unique_ptr<platform::AudioFile> open()
{
    return platform::AudioFile::open(*fileURL(), platform::AudioFile::Permission::readWrite, 0, nullptr);
}
