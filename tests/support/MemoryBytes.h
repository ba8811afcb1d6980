// A file in memory.
#pragma once

#include "media/containers/ByteSource.h"
#include "platform/core/Bytes.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <cstring>
#include <utility>

/// Reads beyond `readable` fail.
class MemoryBytes final : public platform::ByteSource {
public:
    explicit MemoryBytes(Bytes bytes, std::uint64_t readable = UINT64_MAX)
        : bytes_(std::move(bytes)),
          readable_(readable)
    {
    }

    std::int32_t readSome(std::uint64_t position, void* to, std::size_t count, std::size_t& got) const override
    {
        got = 0;
        if (position + count > readable_)
            return kStatusIOError;
        got = std::min<std::size_t>(count, bytes_.size() - std::min<std::uint64_t>(position, bytes_.size()));
        if (got > 0)
            std::memcpy(to, bytes_.data() + position, got);
        return kStatusOK;
    }
    std::uint64_t length() const { return bytes_.size(); }

private:
    Bytes bytes_;
    std::uint64_t readable_;
};
