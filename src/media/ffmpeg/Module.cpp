// The module's entry point.
#include "media/decoding/DecoderModule.h"
#include "media/ffmpeg/FileDecoder.h"
#include "media/ffmpeg/PacketDecoder.h"
#include "media/ffmpeg/RateConverter.h"
#include "platform/core/Export.h"
#include "platform/core/Status.h"

#include <new>

namespace {

using namespace platform;

/// Keeps exceptions from crossing the module's border.
template <typename Make>
auto guarded(std::int32_t* status, Make make) -> decltype(make().release())
{
    try {
        return make().release();
    } catch (const std::bad_alloc&) {
        *status = kStatusOutOfMemory;
    } catch (...) {
        *status = kStatusIOError;
    }
    return nullptr;
}

AudioDecoder* openPackets(PacketSource* source, std::int32_t* status)
{
    return guarded(status, [&] { return ffmpeg::openPackets(std::unique_ptr<PacketSource>(source), *status); });
}

AudioDecoder* openFile(const char* path, std::int32_t* status)
{
    return guarded(status, [&] { return ffmpeg::openFile(path, *status); });
}

Resampler* makeResampler(std::uint32_t channels, std::uint32_t fromRate, std::uint32_t toRate, std::int32_t* status)
{
    return guarded(status, [&] { return ffmpeg::makeRateConverter(channels, fromRate, toRate, *status); });
}

} // namespace

extern "C" KT_EXPORT const platform::DecoderModule ktfiles_decoderModule;
const platform::DecoderModule ktfiles_decoderModule = {
    .version = platform::DecoderModule::currentVersion,
    .openPackets = openPackets,
    .openFile = openFile,
    .makeResampler = makeResampler,
};
