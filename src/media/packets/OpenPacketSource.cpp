#include "media/packets/PacketSource.h"

#include "media/packets/ADTSPackets.h"
#include "media/packets/CAFPackets.h"
#include "media/packets/M4APackets.h"
#include "media/packets/MP3Packets.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

std::unique_ptr<PacketSource> openPacketSource(const std::string& path, std::int32_t* status)
{
    FileStatus found;
    const int descriptor = systemCalls().openFile(path.c_str(), OpenFor::reading, &found);
    if (descriptor < 0) {
        *status = PosixErrorToOSErr();
        return nullptr;
    }
    auto file =
        std::make_unique<PacketFile>(descriptor, static_cast<std::uint64_t>(std::max<std::int64_t>(found.size, 0)));
    for (const auto open : {CAFPackets::open, M4APackets::open, ADTSPackets::open, MP3Packets::open}) {
        if (std::unique_ptr<PacketSource> source = open(file, *status))
            return source;
        if (*status != AudioHandle::kFormatNotSupported || !file) // a source that took the file over knows its kind
            break;
    }
    return nullptr;
}

} // namespace platform
