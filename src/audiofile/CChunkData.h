// One chunk's id and bytes, passed between the chunk operations and their callers.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <cstdint>
#include <memory>

/// A chunk with its body, which it owns; a find operation releases the previous body before it fills the record.
struct CChunkData {
    std::unique_ptr<char[]> data; // null when empty
    std::int64_t size = 0;        // bytes of the body
    FourCC id = 0;                // of the chunk
    std::int64_t position = 0;    // file offset of the chunk's header
    std::int64_t next = 0;        // file offset of the following chunk, after any pad byte

    /// The body; empty without data.
    BytesView bytes() const { return std::as_bytes(std::span(data.get(), data ? static_cast<std::size_t>(size) : 0)); }
};
