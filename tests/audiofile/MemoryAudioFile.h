// Audio files made of a few bytes, opened as memory files.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "files/CFileIO.h"
#include "platform/core/ByteWriter.h"

#include <algorithm>
#include <memory>
#include <string_view>

/// A memory file that holds a copy of the bytes.
class MemoryAudioFile : public CFileIO {
public:
    explicit MemoryAudioFile(BytesView content)
    {
        auto block = std::make_shared<KTMem>(content.size());
        std::copy(content.begin(), content.end(), block->data());
        SetCache(block);
        Open(CFileRef(), kFileIOMemory);
    }
};

/// The description of a file of these bytes; `status` may be null.
inline AudioFileInfo describe(BytesView content, std::int32_t* status = nullptr)
{
    MemoryAudioFile file(content);
    AudioFileInfo info;
    const std::int32_t result = GetAudioFileInfo(file, kFileIOMemory, info);
    if (status != nullptr)
        *status = result;
    return info;
}

/// A chunk of a container with sizes in `order`: any stored size, no pad byte.
inline Bytes chunk(std::string_view id, std::uint32_t storedSize, BytesView body,
                   std::endian order = std::endian::little)
{
    ByteWriter out(order);
    out.write(bytesOf(id));
    out.write(storedSize);
    out.write(body);
    return out.take();
}

inline Bytes joined(std::initializer_list<Bytes> parts)
{
    Bytes all;
    for (const Bytes& part : parts)
        all.insert(all.end(), part.begin(), part.end());
    return all;
}

/// The body of a "fmt " chunk of 16 bytes.
inline Bytes waveFormat(int tag, int channels, int rate, int blockAlign, int bits)
{
    ByteWriter out(std::endian::little);
    out.write(static_cast<std::uint16_t>(tag));
    out.write(static_cast<std::uint16_t>(channels));
    out.write(static_cast<std::uint32_t>(rate));
    out.write(static_cast<std::uint32_t>(rate * blockAlign));
    out.write(static_cast<std::uint16_t>(blockAlign));
    out.write(static_cast<std::uint16_t>(bits));
    return out.take();
}
