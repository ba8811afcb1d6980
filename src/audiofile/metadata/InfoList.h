// LIST "INFO" of WAVE files: texts about the file, each under an id. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/ListChunk.h"

/// Published source: RIFF 1.0 of 1991, INFO List Chunk. Texts are bytes up to a NUL; the source says nothing about
/// their encoding.
class KT_EXPORT InfoList : public ListChunk {
public:
    static constexpr FourCC kForm = fourCC("INFO"); // of the LIST

    /// An empty list. In RIFX the order is big.
    explicit InfoList(std::endian order = std::endian::little) : ListChunk(kForm, order) {}
    /// Reads the body of a chunk "LIST"; null when its form is another.
    static std::optional<InfoList> read(BytesView body, std::endian order = std::endian::little);

    /// The first text of an id; null for none.
    std::optional<std::string> find(FourCC id) const;
    /// Replaces the first text of the id and removes its others; adds a text after the last item when there is none.
    void set(FourCC id, std::string_view text);
    /// Removes every text of the id; false when there is none.
    bool erase(FourCC id);

    // By the index of a text among those of its id; the others stay.

    /// Replaces a text; adds one after the last item when `index` is their number or more.
    void setAt(FourCC id, std::size_t index, std::string_view text);
    /// Removes a text; false when there is none.
    bool eraseAt(FourCC id, std::size_t index);

    /// The ids with a known meaning, in their order.
    static std::vector<FourCC> knownIds();
    /// What an id means, in words ("Artist" for "IART"); empty for an unknown id.
    static std::string_view words(FourCC id);

private:
    /// The number of items when there is no such text.
    std::size_t place(FourCC id, std::size_t index) const;
};
