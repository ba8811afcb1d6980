// LIST "adtl" of WAVE files: what the points of "cue " are called. Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/ListChunk.h"
#include "audiofile/metadata/Records.h"

#include <functional>
#include <set>

/// "labl", the name of a point, or "note", a remark on it. Texts are bytes up to a NUL, in the encoding of the writer.
struct CueText {
    std::uint32_t cueId = 0;
    std::string text;
    friend bool operator==(const CueText&, const CueText&) = default;
};

/// "ltxt": makes of a point a range, and may name it; these 20 bytes, then a text.
struct CueRangeFields {
    Packed<std::uint32_t> cueId;        //  0
    Packed<std::uint32_t> sampleLength; //  4  in frames
    Packed<FourCC> purpose;             //  8  "rgn ", "mark", "beat", "scrp" (script), "capt" (caption) …
    Packed<std::uint16_t> country;      // 12  as a telephone's country code; 0 none
    Packed<std::uint16_t> language;     // 14
    Packed<std::uint16_t> dialect;      // 16
    Packed<std::uint16_t> codePage;     // 18  of the text

    void byteOrder(std::endian order)
    {
        turnFields(order, cueId, sampleLength, country, language, dialect, codePage);
        turnFields(std::endian::big, purpose);
    }
    friend bool operator==(const CueRangeFields&, const CueRangeFields&) = default;
};
static_assert(sizeof(CueRangeFields) == 20);

struct CueRange : CueRangeFields {
    std::string text;
    friend bool operator==(const CueRange&, const CueRange&) = default;
};

/// Published source: RIFF 1.0 of 1991, Associated Data Chunk. Items that
/// are none of "labl", "note" and "ltxt" are kept.
class KT_EXPORT AssociatedDataList : public ListChunk {
public:
    static constexpr FourCC kForm = fourCC("adtl");

    /// Empty. Of RIFX the order is big.
    explicit AssociatedDataList(std::endian order = std::endian::little) : ListChunk(kForm, order) {}
    /// From the body of a chunk "LIST"; none when its form is another.
    static std::optional<AssociatedDataList> read(BytesView body, std::endian order = std::endian::little);

    /// In the order of the file; items that end within their fields are left out.
    std::vector<CueText> labels() const { return texts(fourCC("labl")); }
    std::vector<CueText> notes() const { return texts(fourCC("note")); }
    std::vector<CueRange> ranges() const;

    /// The first of a point.
    std::optional<std::string> labelOf(std::uint32_t cueId) const { return textOf(fourCC("labl"), cueId); }
    std::optional<std::string> noteOf(std::uint32_t cueId) const { return textOf(fourCC("note"), cueId); }

    /// In the place of the point's first, or behind the last item.
    void setLabel(std::uint32_t cueId, std::string_view text) { setText(fourCC("labl"), cueId, text); }
    void setNote(std::uint32_t cueId, std::string_view text) { setText(fourCC("note"), cueId, text); }
    void setRange(const CueRange& range);
    /// The first item of the id ("labl", "note" or "ltxt") of a point; false when there is none.
    bool eraseFirst(FourCC id, std::uint32_t cueId);
    /// All that is said of a point.
    void eraseCue(std::uint32_t cueId);

    // In one pass over lists of many points.

    /// Behind the last item, of points of which nothing of the kind is said yet.
    void addLabel(std::uint32_t cueId, std::string_view text) { addText(fourCC("labl"), cueId, text); }
    void addNote(std::uint32_t cueId, std::string_view text) { addText(fourCC("note"), cueId, text); }
    /// Of every range, whose text stays to the byte.
    void changeRanges(const std::function<void(CueRangeFields& fields)>& change);
    /// What is said of `from`, a file in the list ("file") too, is said of `to`.
    void renameCue(std::uint32_t from, std::uint32_t to);
    /// Of which points anything is said.
    std::set<std::uint32_t> cueIds() const;
    /// As eraseCue, of all points that `isGone` says yes to.
    void eraseCues(const std::function<bool(std::uint32_t cueId)>& isGone);

private:
    std::vector<CueText> texts(FourCC id) const;
    std::optional<std::string> textOf(FourCC id, std::uint32_t cueId) const;
    void setText(FourCC id, std::uint32_t cueId, std::string_view text);
    void addText(FourCC id, std::uint32_t cueId, std::string_view text);
    void put(FourCC id, std::uint32_t cueId, Bytes body);
};
