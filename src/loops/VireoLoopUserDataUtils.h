// The user data of an open audio file, as the loop chunks need them. A failure gives null or false.
#pragma once

#include "loops/tagging/ChunkIDs.h"
#include "media/userdata/AudioFileService.h"
#include "platform/core/Bytes.h"

#include <optional>

/// Items by type; static functions only.
class KT_EXPORT VireoLoopUserDataUtils {
public:
    /// How many items of the type there are; 0 on failure.
    static std::uint32_t count(platform::AudioFile& file, FourCC type);
    /// The bytes of an item, at most `limit`.
    static std::optional<Bytes> read(platform::AudioFile& file, FourCC type, std::uint32_t index,
                                     std::uint32_t limit = UINT32_MAX);
    /// Replaces an item, or adds one when `index` is the count. Other items stay and keep their indices. Readers of
    /// loop chunks take the first one.
    static bool write(platform::AudioFile& file, FourCC type, std::uint32_t index, BytesView data);
    /// Removes every item of the type; false when one could not be removed.
    static bool removeAll(platform::AudioFile& file, FourCC type);
};

/// The same for the "uuid" items of a CAF file, by UUID. Data are the bytes after the UUID.
class KT_EXPORT VireoLoopUUIDUserDataUtils {
public:
    /// The index of the first item of the UUID; null for none.
    static std::optional<std::uint32_t> find(platform::AudioFile& file, const tagging::UUIDBytes& uuid);
    /// The data of the first item of the UUID.
    static std::optional<Bytes> read(platform::AudioFile& file, const tagging::UUIDBytes& uuid);
    /// Replaces the first item of the UUID, which readers take; adds one when there is none.
    static bool write(platform::AudioFile& file, const tagging::UUIDBytes& uuid, BytesView data);
    /// Removes every item of the UUID; false when one could not be removed.
    static bool removeAll(platform::AudioFile& file, const tagging::UUIDBytes& uuid);
};
