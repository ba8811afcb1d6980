// LIST "INFO" of WAVE files: texts about the file, each under an id. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/ListChunk.h"

/// Published source: RIFF 1.0 of 1991, INFO List Chunk. Texts are bytes up
/// to a NUL; the source says nothing of their encoding.
class KT_EXPORT InfoList : public ListChunk {
public:
    static constexpr FourCC kForm = fourCC("INFO");

    /// Empty. Of RIFX the order is big.
    explicit InfoList(std::endian order = std::endian::little) : ListChunk(kForm, order) {}
    /// From the body of a chunk "LIST"; none when its form is another.
    static std::optional<InfoList> read(BytesView body, std::endian order = std::endian::little);

    /// The first text of an id.
    std::optional<std::string> find(FourCC id) const;
    /// In the place of the first text of the id, of which no other stays; behind the last item when there is none.
    void set(FourCC id, std::string_view text);
    /// False when there is none.
    bool erase(FourCC id);

    // By the index of a text among those of its id, of which the others stay:

    /// Behind the last item when `index` is their number or more.
    void setAt(FourCC id, std::size_t index, std::string_view text);
    bool eraseAt(FourCC id, std::size_t index);

    /// The ids that stand for something, in their order.
    static std::vector<FourCC> knownIds();
    /// What an id stands for, in words ("Artist" of "IART"); empty of an id that is in no list of them.
    static std::string_view words(FourCC id);

private:
    /// The number of items when there is no such text.
    std::size_t place(FourCC id, std::size_t index) const;
};
