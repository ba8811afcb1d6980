// Texts about a file that WAVE, AIFF and CAF all have a place for: title, artist, copyright and others.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <bit>
#include <string>
#include <utility>
#include <vector>

/// A chunk and its content.
struct HeldChunk {
    FourCC id = 0;
    Bytes body;
};

/// The texts of one file in UTF-8, once per key; keys are those of CAF's "info" ("title", "recorded date").
struct PortableTexts {
    std::vector<std::pair<std::string, std::string>> texts;
    /// Names, in their file, of texts without a key ("ISFT", "tempo").
    std::vector<std::string> others;

    /// From a LIST "INFO"; the order is big-endian for RIFX.
    void addFromWAVE(BytesView list, std::endian order);
    /// From NAME, AUTH, "(c) " or ANNO; ignores other chunks.
    void addFromAIFF(FourCC id, BytesView body);
    /// From a "COMT": the remarks that belong to no marker. Returns whether there are others.
    bool addComments(BytesView comments);
    void addFromCAF(BytesView info);

    /// The chunks for these texts in a file of the type (WAVE, AIFF or CAF), and the keys for which it has no place.
    std::vector<HeldChunk> chunksFor(FourCC fileType, std::vector<std::string>& left) const;

private:
    void add(std::string_view key, std::string text);
};

/// Whether the key of CAF's "info" describes one coding of the sound only, such as its bit rate.
bool isOfOneCoding(std::string_view infoKey);
