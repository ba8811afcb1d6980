// What a file says of itself in texts that WAVE, AIFF and CAF have a place for: title, artist, copyright and others.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/FourCC.h"

#include <bit>
#include <string>
#include <utility>
#include <vector>

/// A chunk and what is in it.
struct HeldChunk {
    FourCC id = 0;
    Bytes body;
};

/// The texts of one file, in UTF-8, each once by its key; keys are those of CAF's "info" ("title", "recorded date").
struct PortableTexts {
    std::vector<std::pair<std::string, std::string>> texts;
    /// What was there and has no key, as it is called in its file ("ISFT", "tempo").
    std::vector<std::string> others;

    /// From a LIST "INFO"; of RIFX the order is big.
    void addFromWAVE(BytesView list, std::endian order);
    /// From NAME, AUTH, "(c) " or ANNO; other chunks say nothing.
    void addFromAIFF(FourCC id, BytesView body);
    /// A "COMT": the remarks that belong to no marker. Whether there are others.
    bool addComments(BytesView comments);
    void addFromCAF(BytesView info);

    /// The chunks that hold them in a file of the type (WAVE, AIFF or CAF), and the keys that it has no place for.
    std::vector<HeldChunk> chunksFor(FourCC fileType, std::vector<std::string>& left) const;

private:
    void add(std::string_view key, std::string text);
};

/// Whether CAF's "info" has the key for what is true of one file only, such as its bit rate.
bool isOfOneCoding(std::string_view infoKey);
