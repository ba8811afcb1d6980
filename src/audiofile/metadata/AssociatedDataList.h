// LIST "adtl" of WAVE files: the names of the points of "cue ". Page: docs/formats/wave-metadata.md.
#pragma once

#include "audiofile/metadata/ListChunk.h"
#include "audiofile/metadata/Records.h"

#include <functional>
#include <set>

/// "labl", the name of a point, or "note", a remark on it. Texts are bytes up to a NUL, in the writer's encoding.
struct CueText {
    std::uint32_t cueId = 0; // of a point of "cue "
    std::string text;        // without the NUL
    friend bool operator==(const CueText&, const CueText&) = default;
};

/// "ltxt": makes a point a range, and may name it; these 20 bytes, then a text.
struct CueRangeFields {
    Packed<std::uint32_t> cueId;        //  0  of a point of "cue "
    Packed<std::uint32_t> sampleLength; //  4  in frames
    Packed<FourCC> purpose;             //  8  "rgn ", "mark", "beat", "scrp" (script), "capt" (caption) …
    Packed<std::uint16_t> country;      // 12  as a telephone's country code; 0 none
    Packed<std::uint16_t> language;     // 14  as RIFF numbers languages; 0 none
    Packed<std::uint16_t> dialect;      // 16  of that language
    Packed<std::uint16_t> codePage;     // 18  of the text

    /// Turns every number from `order` to the host's order, or back.
    void byteOrder(std::endian order)
    {
        turnFields(order, cueId, sampleLength, country, language, dialect, codePage);
        turnFields(std::endian::big, purpose);
    }
    friend bool operator==(const CueRangeFields&, const CueRangeFields&) = default;
};
static_assert(sizeof(CueRangeFields) == 20);

/// A range with its text.
struct CueRange : CueRangeFields {
    std::string text; // without the NUL; may be empty
    friend bool operator==(const CueRange&, const CueRange&) = default;
};

/// Published source: RIFF 1.0 of 1991, Associated Data Chunk. Items other than "labl", "note" and "ltxt" are kept.
class KT_EXPORT AssociatedDataList : public ListChunk {
public:
    static constexpr FourCC kForm = fourCC("adtl"); // of the LIST

    /// An empty list. In RIFX the order is big.
    explicit AssociatedDataList(std::endian order = std::endian::little) : ListChunk(kForm, order) {}
    /// Reads the body of a chunk "LIST"; null when its form is another.
    static std::optional<AssociatedDataList> read(BytesView body, std::endian order = std::endian::little);

    /// Each all items of its kind, in the order of the file; items that end within their fields are left out.
    std::vector<CueText> labels() const { return texts(fourCC("labl")); }
    std::vector<CueText> notes() const { return texts(fourCC("note")); }
    std::vector<CueRange> ranges() const;

    /// Each the first text of a point; null for none.
    std::optional<std::string> labelOf(std::uint32_t cueId) const { return textOf(fourCC("labl"), cueId); }
    std::optional<std::string> noteOf(std::uint32_t cueId) const { return textOf(fourCC("note"), cueId); }

    /// Each replaces the first of its kind of the point, or adds it after the last item.
    void setLabel(std::uint32_t cueId, std::string_view text) { setText(fourCC("labl"), cueId, text); }
    void setNote(std::uint32_t cueId, std::string_view text) { setText(fourCC("note"), cueId, text); }
    void setRange(const CueRange& range);
    /// Removes the first item of the id ("labl", "note" or "ltxt") of a point; false when there is none.
    bool eraseFirst(FourCC id, std::uint32_t cueId);
    /// Removes everything that is said about a point.
    void eraseCue(std::uint32_t cueId);

    // In one pass over lists of many points.

    /// Each adds a text after the last item, for a point that has no text of that kind.
    void addLabel(std::uint32_t cueId, std::string_view text) { addText(fourCC("labl"), cueId, text); }
    void addNote(std::uint32_t cueId, std::string_view text) { addText(fourCC("note"), cueId, text); }
    /// Changes the fields of every range; their texts stay to the byte.
    void changeRanges(const std::function<void(CueRangeFields& fields)>& change);
    /// Moves everything that is said about `from`, a file in the list ("file") too, to `to`.
    void renameCue(std::uint32_t from, std::uint32_t to);
    /// The points about which anything is said.
    std::set<std::uint32_t> cueIds() const;
    /// As eraseCue, of all points for which `isGone` returns true.
    void eraseCues(const std::function<bool(std::uint32_t cueId)>& isGone);

private:
    std::vector<CueText> texts(FourCC id) const;
    std::optional<std::string> textOf(FourCC id, std::uint32_t cueId) const;
    void setText(FourCC id, std::uint32_t cueId, std::string_view text);
    void addText(FourCC id, std::uint32_t cueId, std::string_view text);
    void put(FourCC id, std::uint32_t cueId, Bytes body);
};
