// The audio-file service on any bytes, with the file in memory: three bytes choose an edit and the call at which the
// disk fails, the rest is the file. Whatever happens, the file opens afterwards and its samples are what they were.
#include "platform/AudioFileService.h"
#include "platform/SystemCalls.h"

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace {

using namespace platform;

constexpr std::size_t kLargestFile = 1 << 20;
std::vector<std::uint8_t> file;
int callsLeft; // until every write fails

bool diskFails()
{
    errno = ENOSPC;
    return callsLeft-- <= 0;
}

void useMemory()
{
    SystemCalls& calls = systemCalls();
    calls.openFile = [](const char*, OpenFor, FileStatus*) { return 1; };
    calls.close = [](int) { return 0; };
    calls.fsync = [](int) { return 0; };
    calls.status = [](int, FileStatus* status) {
        *status = {.size = static_cast<std::int64_t>(file.size()), .kind = FileKind::file};
        return true;
    };
    calls.pread = [](int, void* to, std::size_t count, std::int64_t position) -> std::int64_t {
        const std::size_t start = std::min(file.size(), static_cast<std::size_t>(position));
        count = std::min(count, file.size() - start);
        std::copy_n(file.begin() + static_cast<std::ptrdiff_t>(start), count, static_cast<std::uint8_t*>(to));
        return static_cast<std::int64_t>(count);
    };
    calls.ftruncate = [](int, std::int64_t length) {
        if (diskFails() || static_cast<std::size_t>(length) > kLargestFile)
            return -1;
        file.resize(static_cast<std::size_t>(length));
        return 0;
    };
    calls.pwrite = [](int, const void* from, std::size_t count, std::int64_t position) -> std::int64_t {
        const std::size_t end = static_cast<std::size_t>(position) + count;
        if (diskFails() || end > kLargestFile)
            return -1;
        file.resize(std::max(file.size(), end));
        std::memcpy(file.data() + position, from, count);
        return static_cast<std::int64_t>(count);
    };
}

struct Audio {
    StreamDescription format;
    std::vector<std::uint8_t> samples;
    bool operator==(const Audio&) const = default;
};

Audio audioOf(AudioFile& opened)
{
    Audio audio;
    std::uint64_t count = 0;
    if (opened.dataFormat(audio.format) != 0 || opened.audioDataByteCount(count) != 0)
        return audio;
    if (count > file.size())
        std::abort();
    audio.samples.resize(static_cast<std::size_t>(count));
    auto bytes = static_cast<std::uint32_t>(count);
    if (opened.readBytes(0, bytes, audio.samples.data()) != 0 || bytes != count)
        std::abort();
    return audio;
}

std::unique_ptr<AudioFile> open()
{
    static const URLRef url = URL::createWithFileSystemPath(String::fromUTF8("/file"), PathStyle::posix, false);
    return AudioFile::open(*url, AudioFile::Permission::readWrite, 0, nullptr);
}

void edit(AudioFile& opened, std::uint8_t choice, std::uint8_t length)
{
    const FourCC types[] = {fourCC("uuid"), fourCC("note"), fourCC("info")};
    const FourCC type = types[choice % 3];
    std::uint32_t count = 0;
    if (opened.countUserData(type, count) != 0)
        return;
    for (std::uint32_t i = 0; i < std::min(count, 4u); ++i) {
        std::uint32_t size = 0;
        if (opened.userDataSize(type, i, size) != 0 || size > file.size())
            std::abort();
        std::vector<std::uint8_t> body(size);
        if (opened.userData(type, i, size, body.data()) != 0 || size != body.size())
            std::abort();
    }
    const std::uint32_t index = choice / 12 % (count + 1);
    const std::vector<std::uint8_t> body(std::size_t{length} * (choice % 2 ? 1 : 20), 'n');
    Dictionary information;
    switch (choice / 3 % 4) {
    case 0:
        opened.removeUserData(type, index);
        break;
    case 1:
        opened.information(information), opened.setInformation(information);
        break;
    default:
        opened.setUserData(type, index, static_cast<std::uint32_t>(body.size()), body.data());
    }
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size < 3)
        return 0;
    useMemory();
    file.assign(data + 3, data + size);
    auto opened = open();
    if (!opened)
        return 0;
    const Audio before = audioOf(*opened);
    callsLeft = data[2] < 32 ? data[2] : 1 << 20;
    edit(*opened, data[0], data[1]);
    edit(*opened, data[1], data[0]);
    opened = open();
    if (!opened || audioOf(*opened) != before)
        std::abort();
    return 0;
}
