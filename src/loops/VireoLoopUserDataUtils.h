// The user data of an open audio file, as the loop chunks need them. A failure gives nothing, or false.
#pragma once

#include "loops/tagging/ChunkIDs.h"
#include "media/userdata/AudioFileService.h"
#include "platform/core/Bytes.h"

#include <optional>

/// Class operations only.
class KT_EXPORT VireoLoopUserDataUtils {
public:
    static std::uint32_t count(platform::AudioFile& file, FourCC type);
    /// The item's bytes, at most `limit` of them.
    static std::optional<Bytes> read(platform::AudioFile& file, FourCC type, std::uint32_t index,
                                     std::uint32_t limit = UINT32_MAX);
    /// Replaces the item, or adds one when `index` is the count. Further items stay, and keep their indices. Readers of
    /// loop chunks take the first one.
    static bool write(platform::AudioFile& file, FourCC type, std::uint32_t index, BytesView data);
    /// Leaves no item of the type behind; false when one could not be removed.
    static bool removeAll(platform::AudioFile& file, FourCC type);
};

/// The same for the "uuid" items of a CAF file, by UUID. Data are those behind the 16 bytes.
class KT_EXPORT VireoLoopUUIDUserDataUtils {
public:
    /// The index of the first item of the UUID.
    static std::optional<std::uint32_t> find(platform::AudioFile& file, const tagging::UUIDBytes& uuid);
    static std::optional<Bytes> read(platform::AudioFile& file, const tagging::UUIDBytes& uuid);
    /// Replaces the first item of the UUID, which is the one that readers take; adds one when there is none.
    static bool write(platform::AudioFile& file, const tagging::UUIDBytes& uuid, BytesView data);
    static bool removeAll(platform::AudioFile& file, const tagging::UUIDBytes& uuid);
};
