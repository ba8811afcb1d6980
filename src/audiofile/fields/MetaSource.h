// The chunks that fields are made of.
#pragma once

#include "audiofile/fields/MetaField.h"
#include "platform/core/Export.h"

#include <bit>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <vector>

/// All chunks of a file that may be metadata, in their order.
struct KT_EXPORT MetaSource {
    std::vector<MetaChunk> chunks;        // in the order of the file
    std::endian order = std::endian::big; // of the numbers in them

    /// The first held chunk of an id; null when there is none.
    const MetaChunk* find(FourCC id) const;

    // What chunks refer to in others, read once however often it is asked for:

    /// The index of each point in "cue ", by its id.
    const std::map<std::uint32_t, std::size_t>& cueIndices() const;
    /// The positions in frames of the markers of "MARK", by their ids.
    const std::map<std::int16_t, std::uint32_t>& markerPositions() const;
    /// The texts of "strg", by their ids; in all no more bytes than the chunk has, since texts may overlap.
    const std::map<std::uint32_t, std::string>& texts() const;

private:
    mutable std::optional<std::map<std::uint32_t, std::size_t>> cueIndices_;
    mutable std::optional<std::map<std::int16_t, std::uint32_t>> markerPositions_;
    mutable std::optional<std::map<std::uint32_t, std::string>> texts_;
};
