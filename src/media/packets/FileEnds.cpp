#include "media/packets/FileEnds.h"

#include "media/containers/AudioHandle.h"
#include "media/packets/OggInfo.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

struct Kind {
    FourCC fileType;
    std::int32_t (*read)(PacketFile& file, CompressedAudio& audio);
};
constexpr Kind kKinds[] = {
    {fourCC("ogg "), readOggInfo},
};

} // namespace

std::int32_t describeByEnds(const std::string& path, FourCC fileType, CompressedAudio& audio)
{
    const auto* const kind = std::ranges::find(kKinds, fileType, &Kind::fileType);
    if (kind == std::end(kKinds))
        return AudioHandle::kFormatNotSupported;
    FileStatus found;
    const int descriptor = systemCalls().openFile(path.c_str(), OpenFor::reading, &found);
    if (descriptor < 0)
        return PosixErrorToOSErr();
    PacketFile file(descriptor, static_cast<std::uint64_t>(std::max<std::int64_t>(found.size, 0)));
    return kind->read(file, audio);
}

} // namespace platform
