// The audio-file service on any bytes, with the file in memory: three bytes choose an edit and the call at which the
// disk fails, the rest is the file. Whatever happens, the file opens afterwards and its samples are what they were.
#include "MemoryDisk.h"

#include <algorithm>

namespace {

using namespace platform;

void edit(AudioFile& opened, std::uint8_t choice, std::uint8_t length)
{
    const FourCC types[] = {fourCC("uuid"), fourCC("note"), fourCC("info")};
    const FourCC type = types[choice % 3];
    std::uint32_t count = 0;
    if (opened.countUserData(type, count) != 0)
        return;
    for (std::uint32_t i = 0; i < std::min(count, 4u); ++i) {
        std::uint32_t size = 0;
        if (opened.userDataSize(type, i, size) != 0 || size > fileBytes.size())
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
    fileBytes.assign(data + 3, data + size);
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
