#include "audiofile/AudioDigest.h"

#include "files/CFileIO.h"
#include "platform/core/Packed.h"

#include <algorithm>
#include <array>

std::int32_t DigestAudio(CFileIO& file, const AudioFileInfo& info, std::span<platform::Digest* const> digests,
                         const std::function<bool()>& goesOn)
{
    constexpr std::int64_t blockSize = 1 << 20;
    if (info.dataOffset <= 0 || info.dataSize <= 0)
        return kStatusParameterError;
    Bytes block(static_cast<std::size_t>(std::min(blockSize, info.dataSize)));
    for (std::int64_t done = 0; done < info.dataSize;) {
        if (goesOn && !goesOn())
            return kStatusUserCancelled;
        const auto count = static_cast<long>(std::min(blockSize, info.dataSize - done));
        long got = 0;
        const std::int32_t status = file.Read(block.data(), info.dataOffset + done, count, &got);
        if (status != kStatusOK)
            return status;
        for (platform::Digest* const digest : digests)
            digest->add(BytesView(block).first(static_cast<std::size_t>(got)));
        done += got;
    }
    return kStatusOK;
}

Bytes StatedMD5(CFileIO& file)
{
    constexpr std::size_t digestAt = 26, digestSize = 16; // in STREAMINFO, which comes first
    std::array<std::byte, digestAt + digestSize> start;
    if (file.Read(start.data(), 0, static_cast<long>(start.size()), nullptr) != kStatusOK ||
        loadBE<FourCC>(start.data()) != fourCC("fLaC") || (start[4] & std::byte{0x7F}) != std::byte{0})
        return {};
    const auto digest = BytesView(start).subspan(digestAt);
    const bool isStated = std::ranges::any_of(digest, [](std::byte byte) { return byte != std::byte{0}; });
    return isStated ? Bytes(digest.begin(), digest.end()) : Bytes{};
}
