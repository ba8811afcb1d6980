// The audio-file service: audio files opened by location, whatever their container.
#pragma once

#include "platform/URL.h"
#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <memory>

namespace platform {

/// An open audio file; the destructor closes it. Operations return 0 or a negative status code (core/Status.h).
///
/// User data are the blocks that a container carries beside the samples, named by a four-character type and, where a
/// type occurs more than once, by their index in file order.
class KT_EXPORT AudioFile {
public:
    enum class Permission { read, readWrite };

    /// Null, with `*status`, when the file cannot be opened or is of no kind that the service knows. `typeHint` names
    /// the container to assume where the bytes leave it open; 0 for none.
    static std::unique_ptr<AudioFile> open(const URL& url, Permission permission, FourCC typeHint,
                                           std::int32_t* status);
    ~AudioFile();
    AudioFile(const AudioFile&) = delete;
    AudioFile& operator=(const AudioFile&) = delete;

    /// "WAVE" (RF64 and BW64 too), "AIFF", "AIFC" or "caff".
    FourCC fileType() const;

    std::int32_t countUserData(FourCC type, std::uint32_t& count);
    std::int32_t userDataSize(FourCC type, std::uint32_t index, std::uint32_t& size);
    /// Copies at most `size` bytes of the item to `data` and sets `size` to their number.
    std::int32_t userData(FourCC type, std::uint32_t index, std::uint32_t& size, void* data);
    /// Replaces an item, or appends one when `index` is the count of items of its type. An item as long as before is
    /// rewritten in place; otherwise the new one is written and committed before the old one goes, so that the file
    /// opens and holds the old item or the new one whenever the edit is cut short.
    std::int32_t setUserData(FourCC type, std::uint32_t index, std::uint32_t size, const void* data);
    std::int32_t removeUserData(FourCC type, std::uint32_t index);

private:
    struct Implementation;
    explicit AudioFile(std::unique_ptr<Implementation> implementation);
    std::unique_ptr<Implementation> implementation_;
};

} // namespace platform
