// The packet readers on any bytes, with the file in memory: whatever opens has a table that its packets bear out, and
// packets that lie in the file, which read the same in any order. The readers of files by their ends, too.
#include "MemoryDisk.h"

#include "media/packets/FileEnds.h"
#include "media/packets/PacketSource.h"

namespace {

using namespace platform;

constexpr std::uint64_t kMostRead = 300; // packets

void check(bool isTrue)
{
    if (!isTrue)
        std::abort();
}

void checkTable(const PacketSource& source)
{
    const PacketTable& table = source.table();
    const StreamDescription& format = source.format();
    check(table.validFrames >= 0 && table.primingFrames >= 0 && table.remainderFrames >= 0);
    if (source.cookie().empty() && format.formatId != fourCC(".mp3") && format.formatId != fourCC("ima4"))
        return; // a coding that is only named
    check(format.framesPerPacket > 0 && format.sampleRate > 0 && format.channelsPerFrame > 0);
    const std::uint64_t frames = source.packetCount() * format.framesPerPacket;
    check(static_cast<std::uint64_t>(table.validFrames) <= frames);
    if (table.validFrames > 0)
        check(static_cast<std::uint64_t>(table.validFrames + table.primingFrames + table.remainderFrames) == frames);
}

void readEnds()
{
    CompressedAudio audio;
    for (const FourCC type : {fourCC("ogg "), fourCC("wvpk"), fourCC("tta "), fourCC("MPG2"), fourCC("ac-3")})
        if (describeByEnds("/file", type, audio) == 0)
            check(audio.frames > 0 && audio.format.sampleRate > 0 && audio.format.channelsPerFrame > 0);
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size > kLargestFile)
        return 0;
    useMemory();
    fileBytes.assign(data, data + size);
    readEnds();
    std::int32_t status = 0;
    const std::unique_ptr<PacketSource> source = openPacketSource("/file", &status);
    if (!source) {
        check(status != 0);
        return 0;
    }
    checkTable(*source);
    const std::uint64_t count = source->packetCount();
    Bytes packet, again;
    std::vector<Bytes> forwards;
    std::uint64_t bytes = 0;
    for (std::uint64_t i = 0; i < std::min(count, kMostRead); ++i) {
        const std::int32_t read = source->read(i, packet);
        if (read != 0)
            packet.clear();
        check(packet.size() <= size);
        forwards.push_back(packet);
        bytes += packet.size();
        if (bytes > 4 * kLargestFile) // packets that lie over one another
            break;
    }
    for (std::uint64_t i = forwards.size(); i-- > 0;) {
        check(source->preRoll(i) <= i);
        if (source->read(i, again) != 0)
            again.clear();
        check(again == forwards[i]);
    }
    if (count > 0) {
        check(source->preRoll(count - 1) <= count - 1);
        source->read(count - 1, packet);
    }
    check(source->read(count, packet) != 0);
    return 0;
}
