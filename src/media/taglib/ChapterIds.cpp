#include "media/taglib/ChapterIds.h"

#include <algorithm>
#include <utility>

namespace platform::taglib {

namespace {

/// Both ids have one length. Searches before it writes, because writing to a ByteVector copies it.
template <class Characters>
void replaceAll(Characters& characters, std::size_t size, std::string_view from, std::string_view to)
{
    const std::string_view view(std::as_const(characters).data(), size);
    for (std::size_t at = view.find(from); at != view.npos; at = view.find(from, at + from.size()))
        std::copy(to.begin(), to.end(), characters.data() + at);
}

} // namespace

void hideChapterIds(TagLib::ByteVector& bytes)
{
    for (const HiddenId& id : kHiddenIds)
        replaceAll(bytes, bytes.size(), id.stated, id.hidden);
}

void showChapterIds(std::string& text)
{
    for (const HiddenId& id : kHiddenIds)
        replaceAll(text, text.size(), id.hidden, id.stated);
}

} // namespace platform::taglib
