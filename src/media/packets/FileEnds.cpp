#include "media/packets/FileEnds.h"

#include "media/containers/AudioHandle.h"
#include "media/packets/AC3Info.h"
#include "media/packets/LayerIIInfo.h"
#include "media/packets/OggInfo.h"
#include "media/packets/TTAInfo.h"
#include "media/packets/WavPackInfo.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <algorithm>

namespace platform {

namespace {

struct EndKind {
    FourCC fileType;
    std::int32_t (*read)(PacketFile& file, CompressedAudio& audio);
};
constexpr EndKind kKinds[] = {
    {fourCC("ogg "), readOggInfo}, {fourCC("ac-3"), readAC3Info},     {fourCC("MPG2"), readLayerIIInfo},
    {fourCC("tta "), readTTAInfo}, {fourCC("wvpk"), readWavPackInfo},
};

std::int32_t describe(const EndKind& kind, const std::string& path, CompressedAudio& audio)
{
    FileStatus found;
    const int descriptor = systemCalls().openFile(path.c_str(), OpenFor::reading, &found);
    if (descriptor < 0)
        return PosixErrorToOSErr();
    PacketFile file(descriptor, static_cast<std::uint64_t>(std::max<std::int64_t>(found.size, 0)));
    const std::int32_t status = kind.read(file, audio);
    return status == kStatusOK ? file.takeStatus() : status; // a tag may be where nothing could be read
}

/// Whether the correction file beside a lossy one is equally whole, if there is one: a broken one may spoil the sound.
bool isCorrected(const EndKind& kind, const std::string& path, std::uint64_t frames)
{
    CompressedAudio corrections;
    const std::int32_t status =
        path.ends_with(".wv") ? describe(kind, path + "c", corrections) : std::int32_t{kStatusFileNotFound};
    return status == kStatusFileNotFound || (status == kStatusOK && corrections.frames == frames);
}

} // namespace

std::int32_t describeByEnds(const std::string& path, FourCC fileType, CompressedAudio& audio)
{
    const auto* const kind = std::ranges::find(kKinds, fileType, &EndKind::fileType);
    if (kind == std::end(kKinds))
        return AudioHandle::kFormatNotSupported;
    const std::int32_t status = describe(*kind, path, audio);
    const bool isKnown = status != kStatusOK || fileType != fourCC("wvpk") || isCorrected(*kind, path, audio.frames);
    return isKnown ? status : std::int32_t{AudioHandle::kFormatNotSupported};
}

} // namespace platform
