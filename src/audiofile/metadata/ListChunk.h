// The chunk "LIST" of WAVE files: chunks in a chunk. InfoList and AssociatedDataList say what those are. Page:
// docs/formats/wave-metadata.md.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <bit>
#include <optional>
#include <string>
#include <vector>

/// One chunk of a list: an id, a size of 4 bytes, the body, and a byte more when that is of odd size.
struct ListItem {
    FourCC id = 0;             // of the item
    Bytes body;                // as far as it is there
    std::uint32_t missing = 0; // bytes that the size states beyond the end of the list; of the last item only
    std::byte pad{0};          // behind a body of odd size
    bool isPadded = true;      // false where the writer left that byte out
    friend bool operator==(const ListItem&, const ListItem&) = default;
};

/// Published source: RIFF 1.0 of 1991, LIST Chunk. Items that are not changed are written as they were read; an edit
/// adds pad bytes where the writer left them out.
class KT_EXPORT ListChunk {
public:
    /// All items in order, those with unknown ids too.
    const std::vector<ListItem>& items() const { return items_; }
    /// The form: "INFO", "adtl".
    FourCC form() const { return form_; }

    /// The body, in the byte order of the list.
    Bytes write() const;
    friend bool operator==(const ListChunk&, const ListChunk&) = default;

protected:
    /// An empty list.
    ListChunk(FourCC form, std::endian order) : form_(form), order_(order) {}
    /// Reads a body; false when it does not begin with the form.
    bool readItems(BytesView body);
    /// The byte order of the numbers.
    std::endian order() const { return order_; }
    /// Replaces the body of an item.
    void replaceBody(std::size_t index, Bytes body);
    /// Inserts an item ahead of the one at `index`.
    void insert(std::size_t index, FourCC id, Bytes body);
    /// Removes an item.
    void erase(std::size_t index);
    /// Removes the items for which `condition` is true.
    template <class Condition>
    void eraseIf(Condition condition)
    {
        std::erase_if(items_, condition);
    }

private:
    void settlePadding();

    FourCC form_;
    std::endian order_; // of its numbers
    std::vector<ListItem> items_;
    Bytes behind_; // fewer bytes than an item has
};

/// `text` up to its first NUL, which not every writer puts there.
KT_EXPORT std::string textUpToNUL(BytesView text);
/// `text` and a NUL.
KT_EXPORT Bytes textAndNUL(std::string_view text);
