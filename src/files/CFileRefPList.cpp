// The property-list form of a reference: docs/formats/file-reference-plist.md.
#include "files/CFileRef.h"

#include "platform/PropertyList.h"

using platform::String;
using platform::URLRef;

namespace {

constexpr const char* kBookmarkKey = "CFileRef_Bookmark";
constexpr const char* kURLKey = "CFileRef_URL";

} // namespace

std::optional<platform::Dictionary> CFileRef::CreatePList(tCFileRefPListCreationType type) const
{
    const URLRef url = platform::filePathURL(url_);
    if (!url)
        return std::nullopt;
    platform::Dictionary plist;
    if ((type & kCFileRefPListBookmark) != 0) {
        // The scope lets a sandboxed host reopen the file later.
        auto bookmark = platform::makeBookmark(*url, {.securityScope = true});
        if (!bookmark)
            bookmark = platform::makeBookmark(*url, {});
        if (bookmark) {
            plist.emplace(kBookmarkKey, std::move(*bookmark));
            if ((type & kCFileRefPListURL) == 0)
                return plist;
        }
    }
    plist.emplace(kURLKey, url->string());
    return plist;
}

std::optional<Bytes> CFileRef::CreateBinaryPList(tCFileRefPListCreationType type) const
{
    std::optional<platform::Dictionary> plist = CreatePList(type);
    return plist ? platform::writePropertyList(std::move(*plist), platform::PropertyListFormat::binary) : std::nullopt;
}

bool CFileRef::SetFromPList(const platform::Value* plist, bool allowUserInteraction)
{
    ReInit();
    const auto* dictionary = plist != nullptr ? plist->get<platform::Dictionary>() : nullptr;
    if (dictionary == nullptr)
        return false;
    if (const Bytes* bookmark = platform::find<Bytes>(*dictionary, kBookmarkKey)) {
        const platform::BookmarkResolutionOptions options{.withoutUserInterface = !allowUserInteraction,
                                                          .withoutMounting = !allowUserInteraction};
        if (Set(platform::resolveBookmark(*bookmark, options).url))
            return true;
        // Not found: where it was, so that the host can say what is missing.
        const platform::BookmarkResources resources = platform::bookmarkResources(*bookmark);
        if (!resources.path.isNull() && Set(resources.path, kPOSIXPathStyle, resources.isDirectory))
            return true;
    }
    if (const std::string* text = platform::find<std::string>(*dictionary, kURLKey)) {
        URLRef url = platform::URL::createWithString(*text);
        return url && !url->isFileReferenceURL() && Set(std::move(url));
    }
    return false;
}

bool CFileRef::SetFromBinaryPList(BytesView data, bool allowUserInteraction)
{
    ReInit();
    const std::optional<platform::Value> plist = platform::readPropertyList(data);
    return plist && SetFromPList(&*plist, allowUserInteraction);
}
