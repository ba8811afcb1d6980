// Paths, URL texts and file references from arbitrary bytes. The first byte chooses the road; what is made of the rest
// must stand every round trip.
#include "files/CFileRef.h"
#include "platform/TextEncoding.h"
#include "platform/URL.h"

#include <cstdint>
#include <cstdlib>
#include <string>

using platform::PathStyle;
using platform::String;
using platform::URL;
using platform::URLRef;

namespace {

void require(bool holds)
{
    if (!holds)
        std::abort();
}

/// What copyFileSystemPath gives must be read as the same location in the same style.
void checkStyle(const URL& url, PathStyle style)
{
    const String path = url.copyFileSystemPath(style);
    if (path.isNull())
        return;
    const URLRef again = URL::createWithFileSystemPath(path, style, url.hasDirectoryPath());
    require(again != nullptr && again->copyFileSystemPath(style) == path);
    if (style != PathStyle::colon) // which has nothing for "."
        require(again->posixPath() == url.posixPath());
}

void checkURL(const URLRef& url)
{
    if (!url)
        return;
    const URLRef again = URL::createWithString(url->string(), url->baseURL());
    require(again != nullptr && *again == *url && again->hash() == url->hash());
    const URLRef absolute = URL::createWithString(url->absoluteString());
    require(absolute != nullptr && absolute->posixPath() == url->posixPath());
    require(url->copyFileSystemPath(PathStyle::posix).utf8() == url->posixPath());
    require(url->posixPath().find("//") == std::string::npos);
    for (const PathStyle style : {PathStyle::posix, PathStyle::colon, PathStyle::windows})
        checkStyle(*url, style);

    const String name = url->copyLastPathComponent();
    const URLRef parent = url->deletingLastPathComponent();
    require(name.isNull() == !parent);
    url->copyPathExtension();
    if (!parent || name.utf8() == "/" || name.utf8() == "." || name.utf8() == "..")
        return;
    require(parent->hasDirectoryPath());
    const URLRef child = parent->appendingPathComponent(name, url->hasDirectoryPath());
    require(child != nullptr && child->copyLastPathComponent() == name);
    if (!url->baseURL() && !url->posixPath().starts_with("./"))
        require(child->posixPath() == url->posixPath());
}

void checkReference(CFileRef ref)
{
    if (!ref.IsValid()) {
        require(ref.GetPath() == nullptr);
        return;
    }
    const char* path = ref.GetPath();
    require(path == nullptr || (path[0] == '/' && ref.URL()->posixPath() == path));
    std::string extension;
    require(!ref.GetExtension(extension) || extension.size() > 19 || extension.empty() || ref.HasExtension(extension) ||
            extension.starts_with('.'));
    if (CFileRef other = ref; other.AddToPath("new.aif", false) && path != nullptr)
        require(other.HasExtension("AIF") && other.SetToParent() && std::string(other) == path);
    if (CFileRef other = ref; other.ReplaceExtensionBy("wav"))
        require(other.HasExtension(".wav"));
    ref.SetToParent();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size)
{
    if (size == 0)
        return 0;
    const std::string bytes(reinterpret_cast<const char*>(data + 1), size - 1);
    const bool isDirectory = (data[0] & 0x80) != 0;
    const String text = String::fromUTF8(bytes);
    const URLRef base = URL::createWithString("file:///base/folder/");
    switch (data[0] % 8) {
    case 0:
        return checkURL(URL::createWithFileSystemPath(text, PathStyle::posix, isDirectory)), 0;
    case 1:
        return checkURL(URL::createWithFileSystemPath(text, PathStyle::colon, isDirectory)), 0;
    case 2:
        return checkURL(URL::createWithFileSystemPath(text, PathStyle::windows, isDirectory)), 0;
    case 3:
        return checkURL(URL::createWithString(bytes)), 0;
    case 4:
        return checkURL(URL::createWithString(bytes, base)), 0;
    case 5:
        return checkURL(URL::createWithFileSystemPath(text, PathStyle::posix, isDirectory, base)), 0;
    case 6: {
        CFileRef ref(bytes.c_str(), isDirectory);
        checkReference(ref);
        ref.SetFromURLString(bytes);
        checkReference(ref);
        ref.SetFromColonPath(bytes.c_str(), isDirectory);
        checkReference(ref);
        return 0;
    }
    default:
        for (const platform::TextEncoding encoding : {0U, 256U, platform::kTextEncodingUTF8}) {
            const String decoded = platform::decodeText(bytes, encoding);
            require(decoded.isNull() ||
                    (String::fromUTF8(decoded.utf8()) == decoded && String::fromUTF16(decoded.utf16()) == decoded));
            require(encoding != 0 || !decoded.isNull());
        }
        return 0;
    }
}
