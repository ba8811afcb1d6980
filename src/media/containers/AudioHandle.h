// What C callers hold of audio: an opaque pointer to one of these, which knows its own kind, so that a service can tell
// whether a handle that it was given is one of its own.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>

namespace platform {

/// Properties are asked for by four-character id, and travel as bytes in host order. Sizes are in bytes.
class KT_EXPORT AudioHandle {
public:
    enum class Kind : FourCC { file = fourCC("file"), reader = fourCC("read") };

    static constexpr auto kBadPropertySize = static_cast<std::int32_t>(fourCC("!siz"));
    static constexpr auto kFormatNotSupported = static_cast<std::int32_t>(fourCC("fmt?"));

    virtual ~AudioHandle() = default;
    AudioHandle(const AudioHandle&) = delete;
    AudioHandle& operator=(const AudioHandle&) = delete;
    Kind kind() const { return kind_; }
    /// Whether it is part of another handle, which gives it out and ends it.
    bool isLent() const { return isLent_; }
    /// Said by the owner before anybody else sees it.
    void lend() { isLent_ = true; }

    /// The size of a property's value, and whether it can be set.
    virtual std::int32_t propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable) = 0;
    /// Copies the value to `data`, which has room for `size` bytes, and sets `size` to that of the value;
    /// kBadPropertySize when it does not fit.
    virtual std::int32_t property(FourCC id, std::uint32_t& size, void* data) = 0;
    virtual std::int32_t setProperty(FourCC id, std::uint32_t size, const void* data) = 0;

protected:
    explicit AudioHandle(Kind kind) : kind_(kind) {}
    /// For implementations of property(): hands out `value`.
    static std::int32_t give(const void* value, std::uint32_t valueSize, std::uint32_t& size, void* data);

private:
    const Kind kind_;
    bool isLent_ = false;
};

/// The object behind a handle (which must have been made from an `AudioHandle*`), when it is of the kind; else null.
inline AudioHandle* audioHandle(void* handle, AudioHandle::Kind kind)
{
    auto* object = static_cast<AudioHandle*>(handle);
    return object != nullptr && object->kind() == kind ? object : nullptr;
}

} // namespace platform
