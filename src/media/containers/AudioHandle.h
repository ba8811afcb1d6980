// What C callers hold of audio: an opaque pointer to one of these, which knows its own kind, so that a service can
// tell its own handles.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>

namespace platform {

/// Base of what a handle can be. Properties are named by four-character ids and travel as bytes in host order. Sizes
/// are in bytes.
class KT_EXPORT AudioHandle {
public:
    /// The kinds.
    enum class Kind : FourCC { file = fourCC("file"), reader = fourCC("read") };

    /// a status: the value does not fit, or has another size
    static constexpr auto kBadPropertySize = static_cast<std::int32_t>(fourCC("!siz"));
    /// a status: nothing here decodes the data, or not to that format
    static constexpr auto kFormatNotSupported = static_cast<std::int32_t>(fourCC("fmt?"));

    virtual ~AudioHandle() = default;
    AudioHandle(const AudioHandle&) = delete;
    AudioHandle& operator=(const AudioHandle&) = delete;
    /// The kind of the object.
    Kind kind() const { return kind_; }
    /// Whether it belongs to another handle, which lends it out and ends it.
    bool isLent() const { return isLent_; }
    /// Marks it as lent; the owner does so before anybody else sees it.
    void lend() { isLent_ = true; }

    /// The size of a property's value, and whether it can be set.
    virtual std::int32_t propertyInfo(FourCC id, std::uint32_t& size, bool& isWritable) = 0;
    /// Copies the value to `data`, which has room for `size` bytes, and sets `size` to the value's; kBadPropertySize
    /// when it does not fit.
    virtual std::int32_t property(FourCC id, std::uint32_t& size, void* data) = 0;
    /// Sets the value from `size` bytes at `data`.
    virtual std::int32_t setProperty(FourCC id, std::uint32_t size, const void* data) = 0;

protected:
    /// For derived classes.
    explicit AudioHandle(Kind kind) : kind_(kind) {}
    /// For implementations of property(): copies `value` as property() does.
    static std::int32_t give(const void* value, std::uint32_t valueSize, std::uint32_t& size, void* data);

private:
    const Kind kind_;
    bool isLent_ = false;
};

/// The object behind a handle (which must come from an `AudioHandle*`) when it is of that kind; else null.
inline AudioHandle* audioHandle(void* handle, AudioHandle::Kind kind)
{
    auto* object = static_cast<AudioHandle*>(handle);
    return object != nullptr && object->kind() == kind ? object : nullptr;
}

} // namespace platform
