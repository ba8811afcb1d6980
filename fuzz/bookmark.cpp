// Bookmarks from arbitrary bytes: what is not refused names an absolute path. Nothing is looked for in the file system.
#include "platform/Bookmark.h"

#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    const BytesView bytes = std::as_bytes(std::span(data, size));
    const platform::BookmarkResources resources = platform::bookmarkResources(bytes);
    if (resources.path.isNull())
        return 0;
    const std::string& path = resources.path.utf8();
    const bool isPath = path.starts_with('/') && path.size() < 4096 && path.find('\0') == path.npos;
    if (!isPath || !platform::looksLikeBookmark(bytes))
        std::abort();
    return 0;
}
