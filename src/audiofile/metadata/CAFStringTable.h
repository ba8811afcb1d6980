// The chunk "strg" of CAF files: the texts of markers, regions and instruments. Page: docs/formats/caf.md.
#pragma once

#include "audiofile/metadata/Records.h"
#include "platform/core/Export.h"

/// The position of a text; 12 bytes.
struct CAFStringEntry {
    Packed<std::uint32_t> id;    // 0  by which markers, regions and instruments name the text
    Packed<std::int64_t> offset; // 4  of its first byte, behind the last entry

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order) { turnFields(order, id, offset); }
    friend bool operator==(const CAFStringEntry&, const CAFStringEntry&) = default;
};
static_assert(sizeof(CAFStringEntry) == 12);

/// Published source: the published format description, version 1.0, Strings chunk. Big-endian: a count of 4 bytes,
/// entries, and their texts in UTF-8, each up to a NUL.
struct KT_EXPORT CAFStringTable {
    /// Null for fewer than 4 bytes.
    static std::optional<CAFStringTable> read(BytesView body);
    /// The body of the chunk: what was read, with the changes since.
    Bytes write() const;
    /// The text of an entry, up to a NUL or the end of the chunk; none when it begins outside.
    std::optional<std::string> textOf(const CAFStringEntry& entry) const;
    /// The text of the first entry of an id.
    std::optional<std::string> find(std::uint32_t id) const;
    friend bool operator==(const CAFStringTable&, const CAFStringTable&) = default;

    std::vector<CAFStringEntry> entries; // those that are there
    std::uint32_t missingEntries = 0;    // stated, and not there: write() states them again
    Bytes texts;                         // what follows the entries
};
