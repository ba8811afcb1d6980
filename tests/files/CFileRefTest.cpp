#include "files/CFileRef.h"
#include "platform/PropertyList.h"
#include "support/FaultInjection.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <cstring>

namespace fs = std::filesystem;
using platform::String;

namespace {

String text(const std::string& utf8)
{
    return String::fromUTF8(utf8);
}

CFileRef file(const std::string& path)
{
    return CFileRef(path.c_str(), false);
}

CFileRef directory(const std::string& path)
{
    return CFileRef(path.c_str(), true);
}

/// The path with a slash at the end when the reference denotes a directory; empty when there is none.
std::string shown(const CFileRef& ref)
{
    const std::string path(ref);
    return path.empty() || !ref.URL()->hasDirectoryPath() ? path : path + '/';
}

std::u16string catalogName(const CFileRef& ref)
{
    UnicodeName name;
    return ref.UnicodeFileName(&name) ? std::u16string(name.unicode, name.length) : u"(none)";
}

const std::string home = platform::homeDirectory("").utf8();

} // namespace

TEST(CFileRef, StartsInvalidAndBecomesSoByAnyFailure)
{
    CFileRef ref;
    EXPECT_FALSE(ref.IsValid());
    const char* none = nullptr;
    const std::function<bool()> failures[] = {
        [&] { return ref.Set(none, false); },
        [&] { return ref.Set("", false); },
        [&] { return ref.Set("/not\xFFtext", false); },
        [&] { return ref.Set("~no-such-user/x", false); },
        [&] { return ref.Set(text("/x:y"), kColonPathStyle, false); },
        [&] { return ref.Set(text("/x"), static_cast<tPathStyle>(3), false); },
        [&] { return ref.Set(String(), text("name")); },
        [&] { return ref.Set(platform::URLRef()); },
        [&] { return ref.Set(CFileRef::None, true); },
        [&] { return ref.Set(static_cast<const platform::FileHandle*>(nullptr)); },
        [&] { return ref.SetFromColonPath(nullptr, false); },
        [&] { return ref.SetFromURLString("file:///a%2Fb"); },
        [&] { return ref.SetFromPList(nullptr, false); },
        [&] { return ref.SetFromBinaryPList(bytesOf("no property list"), false); },
        [&] { return ref.AddToPath(none, false); },
        [&] { return ref.AddToPath(CFileRef::None); },
        [&] { return ref.ReplaceName(none, false); },
        [&] { return ref.ReplaceName("", true); },
        [&] { return ref.ReplaceName(CFileRef::None); },
    };
    for (const auto& failure : failures) {
        ASSERT_TRUE(ref.Set("/old/value", false));
        EXPECT_FALSE(failure()) << &failure - failures;
        EXPECT_FALSE(ref.IsValid()) << &failure - failures;
        EXPECT_EQ(ref.GetPath(), nullptr);
    }
}

TEST(CFileRef, PathsAreAsTheyWereSet)
{
    struct Case {
        CFileRef ref;
        std::string expected;
    };
    CFileRef url;
    url.SetFromURLString("file:///a%20b/c/");
    CFileRef colon;
    EXPECT_TRUE(colon.SetFromColonPath("Disk:Folder:File", false));
    const Case cases[] = {
        {file("/a/b/"), "/a/b"},
        {directory("/a/b"), "/a/b/"},
        {CFileRef("~", false), home + "/"},
        {CFileRef("~/", false), home + "/"},
        {CFileRef("~/Music", false), home + "/Music"},
        {CFileRef("~root/x", true), "/root/x/"},
        {CFileRef(text("/a"), text("b")), "/a/b"},
        {CFileRef(text("/a"), nullptr), "/a/"},
        {CFileRef(text(""), text("/b")), "/b"},
        {CFileRef(text("C:\\a b\\c"), kWindowsPathStyle, false), "/C:/a b/c"},
        {url, "/a b/c/"},
        {colon, "/Volumes/Disk/Folder/File"},
    };
    for (const Case& c : cases)
        EXPECT_EQ(shown(c.ref), c.expected);
    EXPECT_STREQ(directory("/").GetPath(), "/");
    EXPECT_STREQ(file("/" + std::string(3000, 'x')).GetPath(), ("/" + std::string(3000, 'x')).c_str());

    const CFileRef relative("a/b", false);
    EXPECT_TRUE(relative.IsValid());
    EXPECT_EQ(relative.GetPath(), nullptr);
    EXPECT_FALSE(relative.Exists() || relative.IsFile() || relative.IsRoot() || relative.GetMountPoint().IsValid());

    // Kept: the colon style is answered in the Windows form.
    EXPECT_EQ(file("/a").CopyFileSystemPath(kPOSIXPathStyle).utf8(), "/a");
    EXPECT_EQ(file("/a").CopyFileSystemPath(kColonPathStyle), file("/a").CopyFileSystemPath(kWindowsPathStyle));

    char buffer[5];
    EXPECT_TRUE(file("/abc").GetPath(buffer, sizeof buffer));
    EXPECT_STREQ(buffer, "/abc");
    EXPECT_FALSE(file("/abcd").GetPath(buffer, sizeof buffer));
    EXPECT_STREQ(buffer, "");
}

TEST(CFileRef, ColonPathsAreReadInTheLocalEncoding)
{
    CFileRef ref;
    ASSERT_TRUE(ref.SetFromColonPath("Disk:\x8A", false));
    EXPECT_STREQ(ref.GetPath(), "/Volumes/Disk/\u00E4");
    CFileRef::mLocalEncoding = 0xFFFFFFFF; // unknown: the system's encoding is next
    ASSERT_TRUE(ref.SetFromColonPath("Disk:\u00FC", true));
    EXPECT_EQ(shown(ref), "/Volumes/Disk/\u00FC/");
    CFileRef::mLocalEncoding = platform::kTextEncodingWestern;
}

// Text that is not UTF-8, of an odd number of bytes, falls through to an encoding of two bytes each: one zero ends it.
TEST(CFileRef, ColonPathsAreNotReadBeyondTheirZero)
{
    CFileRef::mLocalEncoding = platform::kTextEncodingUTF8;
    for (const std::string_view path : {"Disk:\xFF\xFE", "\xFF", "Disk:a\xC3"})
        for (const bool isDirectory : {false, true}) {
            // On the heap, and no byte longer, so that a sanitizer sees what is read behind it.
            const std::unique_ptr<char[]> exact(new char[path.size() + 1]);
            *std::copy(path.begin(), path.end(), exact.get()) = '\0';
            std::string behind(path);
            behind += std::string("\0:elsewhere", 11);
            CFileRef alone("/x", false), followed("/x", false);
            EXPECT_EQ(alone.SetFromColonPath(exact.get(), isDirectory),
                      followed.SetFromColonPath(behind.c_str(), isDirectory));
            EXPECT_EQ(shown(alone), shown(followed)) << "what stands behind the zero counts";
        }
    CFileRef::mLocalEncoding = platform::kTextEncodingWestern;
}

TEST(CFileRef, IsBuiltFromItsOwnParts)
{
    CFileRef ref("/a/b", false);
    EXPECT_TRUE(ref.Set(ref.GetPath(), true));
    EXPECT_TRUE(ref.Set(ref, false));
    EXPECT_TRUE(ref.Set(ref.URL(), true));
    EXPECT_EQ(shown(ref), "/a/b/");
    EXPECT_TRUE(ref.AddToPath(ref));
    EXPECT_EQ(shown(ref), "/a/b/b/");
    CFileRef copy = ref;
    EXPECT_EQ(copy.URL(), ref.URL());
    const CFileRef& self = copy;
    copy = self;
    EXPECT_EQ(shown(copy), "/a/b/b/");
}

TEST(CFileRef, BuildsPaths)
{
    CFileRef ref;
    EXPECT_TRUE(ref.AddToPath("~/x", true)); // of an invalid reference the component is the whole path
    EXPECT_EQ(shown(ref), home + "/x/");
    EXPECT_TRUE(ref.AddToPath("y.aif", false));
    EXPECT_EQ(shown(ref), home + "/x/y.aif");
    ref.Set("/", true);
    EXPECT_TRUE(ref.AddToPath("z", false));
    EXPECT_EQ(shown(ref), "/z");

    EXPECT_TRUE(ref.SetToParent());
    EXPECT_EQ(shown(ref), "//"); // the root, and a directory
    EXPECT_TRUE(ref.SetToParent());
    EXPECT_STREQ(ref.GetPath(), "/");
    ref.Set("a", false);
    EXPECT_FALSE(ref.SetToParent());
    EXPECT_FALSE(ref.IsValid() || ref.SetToParent());

    EXPECT_FALSE(ref.ReplaceName("x", true));
    EXPECT_TRUE(ref.ReplaceName("/a/b", false));
    EXPECT_TRUE(ref.ReplaceName("c d%", true));
    EXPECT_EQ(shown(ref), "/a/c d%/");
    EXPECT_TRUE(ref.ReplaceName(file("/x/y.z")));
    EXPECT_EQ(shown(ref), "/a/y.z");
}

TEST(CFileRef, ExtensionsFollowTheLastDot)
{
    struct Case {
        const char* name;
        const char* extension; // null: none
        const char* removed;
        const char* replaced; // by "wav"
    };
    const Case cases[] = {
        {"song.aif", "aif", "/song", "/song.wav"}, {"song", nullptr, "/song", "/song.wav"},
        {"a.b.c", "c", "/a.b", "/a.b.wav"},        {"dot.", "", "/dot", "/dot.wav"},
        {".hidden", "hidden", "", "/.wav"}, // without its extension it has no name left: no reference
    };
    for (const Case& c : cases) {
        CFileRef ref = directory("/" + std::string(c.name));
        std::string extension = "old";
        char buffer[7] = "";
        EXPECT_EQ(ref.GetExtension(extension), c.extension != nullptr) << c.name;
        EXPECT_EQ(extension, c.extension != nullptr ? c.extension : "old");
        EXPECT_EQ(ref.GetExtension(buffer, sizeof buffer), c.extension != nullptr);
        EXPECT_EQ(ref.GetExtension(buffer, std::strlen(buffer)), false) << "no room for the terminator";
        for (const char* wav : {"wav", ".wav"}) {
            CFileRef copy = ref;
            EXPECT_TRUE(copy.ReplaceExtensionBy(wav));
            EXPECT_EQ(shown(copy), c.replaced);
        }
        EXPECT_EQ(ref.ReplaceExtensionBy(""), *c.removed != '\0');
        EXPECT_EQ(shown(ref), c.removed);
    }
    EXPECT_TRUE(file("/x.aif").HasExtension("AIF") && file("/x.aif").HasExtension(".Aif"));
    EXPECT_TRUE(file("/x.").HasExtension("."));
    EXPECT_FALSE(file("/x.aif").HasExtension("") || file("/x.aif").HasExtension("ai") || file("/x").HasExtension("x"));
    const std::string nineteen(19, 'e');
    EXPECT_TRUE(file("/x." + nineteen).HasExtension(nineteen));
    EXPECT_FALSE(file("/x." + nineteen + "e").HasExtension(nineteen + "e"));
    EXPECT_EQ(file("/x.aif").CopyFileExtension().utf8(), "aif");
    EXPECT_TRUE(CFileRef::None.CopyFileExtension().isNull());
}

TEST(CFileRef, NamesHaveLimits)
{
    EXPECT_TRUE(file("/" + std::string(1023, 'n')).HasValidName());
    EXPECT_FALSE(file("/" + std::string(1024, 'n')).HasValidName() || CFileRef::None.HasValidName());
    char buffer[4] = "old";
    EXPECT_TRUE(file("/abc").GetFileName(buffer, sizeof buffer));
    EXPECT_FALSE(file("/abcd").GetFileName(buffer, sizeof buffer) || file("/a").GetFileName(nullptr, 4));
    EXPECT_STREQ(buffer, "");

    EXPECT_EQ(catalogName(file("/\U0001F3B5")), u"\U0001F3B5");
    EXPECT_EQ(catalogName(file("/" + std::string(255, 'n'))), std::u16string(255, 'n'));
    EXPECT_EQ(catalogName(file("/" + std::string(256, 'n'))), u"(none)");
    EXPECT_EQ(catalogName(CFileRef::None), u"(none)");

    // The catalog's name comes first, once there is a handle.
    const TemporaryFolder folder;
    CFileRef ref = file(folder.write("before", ""));
    EXPECT_TRUE(ref.UpdateInternalFSRef());
    fs::rename(folder / "before", folder / "after");
    EXPECT_TRUE(ref.Set(ref.URL())); // the very object: nothing is reset
    EXPECT_EQ(catalogName(ref), u"after");
    EXPECT_EQ(catalogName(CFileRef(ref)), u"before"); // a copy has no handle
    EXPECT_FALSE(ref.UpdateInternalFSRef());
    EXPECT_EQ(catalogName(ref), u"before");
    platform::FileHandle handle;
    EXPECT_TRUE(file(folder / "after").GetFSRef(&handle) && ref.Set(&handle));
    EXPECT_EQ(shown(ref), folder / "after");
    EXPECT_FALSE(CFileRef("./x", false).GetFSRef(&handle) || CFileRef::None.GetFSRef(&handle));
}

TEST(CFileRef, QueriesAskTheFileSystem)
{
    const TemporaryFolder folder;
    const CFileRef plain = file(folder.write("file", ""));
    fs::create_symlink("file", folder / "link");
    fs::create_symlink("gone", folder / "dangling");
    fs::create_directory(folder / "Song.fuguex");
    const CFileRef dangling = file(folder / "dangling");
    const CFileRef package = directory(folder / "Song.fuguex");

    EXPECT_TRUE(plain.Exists() && plain.IsFile() && !plain.IsFolder() && plain.IsWritable());
    EXPECT_TRUE(file(folder / "link").Exists() && file(folder / "link").IsFile());
    EXPECT_FALSE(dangling.Exists() || dangling.IsFile() || dangling.IsFolder() || dangling.GetMountPoint().IsValid());
    EXPECT_TRUE(package.Exists() && package.IsFolder() && !package.IsFile() && package.IsExistingPackage());
    EXPECT_FALSE(CFileRef::None.Exists() || CFileRef::None.IsWritable() || CFileRef::None.IsExistingPackage());
    EXPECT_FALSE(file(folder / "missing").IsWritable());
    EXPECT_EQ(*plain.GetVolumeID(), *package.GetVolumeID());
    EXPECT_EQ(dangling.GetDisplayName().utf8(), "dangling");
    EXPECT_EQ(file("/no/item.x").CopyDisplayName().utf8(), "item.x");
    EXPECT_TRUE(CFileRef::None.GetDisplayName().isNull() && CFileRef::None.GetVolumeID() == nullptr);

    EXPECT_TRUE(directory("/").IsRoot() && directory("/proc").IsRoot());
    EXPECT_FALSE(plain.IsRoot() || CFileRef::None.IsRoot() || file(folder / "missing").IsRoot());
    EXPECT_STREQ(file("/proc/self/status").GetMountPoint().GetPath(), "/proc");
    EXPECT_TRUE(plain.GetMountPoint().IsRoot());
    EXPECT_FALSE(file("/no/such/item").GetMountPoint().IsValid());

    // A root whose status is not to be had must not be looked for for ever.
    SystemCallGuard guard;
    static int calls;
    calls = 0;
    platform::systemCalls().linkStatus = [](const char*, platform::FileStatus*) { return calls++ == 0; };
    EXPECT_FALSE(plain.GetMountPoint().IsValid());
}

TEST(CFileRef, PathContainsWithoutRegardToCase)
{
    struct Case {
        const char* outer;
        const char* inner;
        bool expected;
    };
    const Case cases[] = {
        {"/Users/a", "/users/A/b", true},
        {"/Users/a", "/Users/a", true},
        {"/Users/a", "/Users/ab", false},
        {"/Users/a/b", "/Users/a", false},
        {"/Users/a", "/Users/b/a", false},
        {"/", "/volumes/X/y", false},
        {"/", "/x", false},
        {"/\u00C4", "/\u00E4/x", false},
        {"/", "/", true} // the root contains no path but itself
    };
    for (const Case& c : cases)
        EXPECT_EQ(directory(c.outer).PathContains(file(c.inner)), c.expected) << c.outer << " " << c.inner;
    EXPECT_FALSE(CFileRef::None.PathContains(file("/a")) || file("/a").PathContains(CFileRef::None));
}

TEST(CFileRef, ComparesByResolvedPath)
{
    const TemporaryFolder folder;
    fs::create_directory(folder / "a");
    fs::create_directory_symlink("a", folder / "link");
    const CFileRef direct = file(folder / "a/x");
    const CFileRef linked = file(folder / "link/x");
    const CFileRef later = file(folder / "b");
    EXPECT_TRUE(direct == linked && !(direct != linked) && direct.hash() == linked.hash());
    EXPECT_TRUE(direct != file(folder / "A/x") && direct != CFileRef::None && CFileRef::None == CFileRef());
    EXPECT_TRUE(linked < later && later > linked && linked <= direct && linked >= direct && !(linked < direct));
    EXPECT_TRUE(later < CFileRef::None && !(CFileRef::None < later) && !(CFileRef::None < CFileRef::None));
    EXPECT_EQ(CFileRef::None.hash(), String().hash());
    CFileRef here, there; // no path to compare by
    EXPECT_TRUE(here.SetFromURLString("file://host/x") && there.SetFromURLString("file://other/x"));
    EXPECT_TRUE(here != there && here == CFileRef(here) && here.GetPath() == nullptr);

    // The conversions to text do not stand in each other's way.
    const std::string path(direct);
    const char* same = direct;
    EXPECT_EQ(path, same);
    EXPECT_TRUE(direct && !CFileRef::None);
    static_assert(!std::is_constructible_v<CFileRef, const char*, const char*>);
}

TEST(CFileRef, ResolvesLinksAndAliasFiles)
{
    const TemporaryFolder folder;
    const std::string target = folder.write("target", "x");
    fs::create_symlink("target", folder / "link");
    fs::create_symlink("gone", folder / "dangling");
    fs::create_directory_symlink(".", folder / "here");

    for (const char* name : {"link", "here/target"}) {
        CFileRef ref = file(folder / name);
        EXPECT_TRUE(ref.ResolveAlias(false)) << name;
        EXPECT_EQ(shown(ref), target);
    }
    for (const char* name : {"target", "dangling", "missing"}) {
        CFileRef ref = file(folder / name);
        EXPECT_FALSE(ref.ResolveAlias(true)) << name;
        EXPECT_EQ(shown(ref), folder / name);
    }
    EXPECT_FALSE(CFileRef().ResolveAlias(true));

    const auto bookmark = platform::makeBookmark(*file(target).URL(), {});
    ASSERT_TRUE(bookmark);
    CFileRef alias = file(folder.write("alias", *bookmark));
    EXPECT_TRUE(alias.ResolveAlias(false));
    EXPECT_EQ(shown(alias), target);
    fs::rename(target, folder / "moved"); // the bookmark is stale now
    alias = file(folder / "alias");
    EXPECT_FALSE(alias.ResolveAlias(false));
    EXPECT_EQ(shown(alias), folder / "alias");
}

TEST(CFileRef, PropertyListsHoldBookmarkAndURL)
{
    const TemporaryFolder folder;
    const CFileRef original = file(folder.write("a b.wav", "x"));
    const auto plist = [&](unsigned type) {
        return *original.CreatePList(static_cast<tCFileRefPListCreationType>(type));
    };
    const auto keys = [&](unsigned type) {
        std::string joined;
        for (const auto& [key, value] : plist(type))
            joined += key + ' ';
        return joined;
    };
    EXPECT_EQ(keys(0), "CFileRef_URL ");
    EXPECT_EQ(keys(1), "CFileRef_Bookmark ");
    EXPECT_EQ(keys(2), "CFileRef_URL ");
    EXPECT_EQ(keys(3), "CFileRef_Bookmark CFileRef_URL ");
    EXPECT_FALSE(file(folder / "missing").CreatePList(kCFileRefPListURL) || CFileRef::None.CreatePList({}));

    const auto binary = original.CreateBinaryPList(kCFileRefPListBookmark);
    ASSERT_TRUE(binary);
    EXPECT_EQ(textOf(*binary).substr(0, 8), "bplist00");
    CFileRef ref;
    EXPECT_TRUE(ref.SetFromBinaryPList(*binary, false));
    EXPECT_EQ(ref, original);
    const auto xml = platform::writePropertyList(plist(2), platform::PropertyListFormat::xml);
    EXPECT_TRUE(xml && ref.SetFromBinaryPList(*xml, true));
    EXPECT_EQ(ref, original);

    // Renamed: found. Gone: where it was. No bookmark that can be read: the URL.
    fs::rename(folder / "a b.wav", folder / "c.wav");
    EXPECT_TRUE(ref.SetFromBinaryPList(*binary, false));
    EXPECT_EQ(shown(ref), folder / "c.wav");
    fs::remove(folder / "c.wav");
    EXPECT_TRUE(ref.SetFromBinaryPList(*binary, false));
    EXPECT_EQ(shown(ref), folder / "a b.wav");
    const auto fromURL = [&](const char* url) {
        const platform::Value value(platform::Dictionary{{"CFileRef_Bookmark", Bytes(50)}, {"CFileRef_URL", url}});
        return ref.SetFromPList(&value, false);
    };
    EXPECT_TRUE(fromURL("file:///x/y"));
    EXPECT_EQ(shown(ref), "/x/y");
    EXPECT_FALSE(fromURL("file:///.file/id=6571367.2"));
    EXPECT_FALSE(ref.IsValid() || fromURL("%"));
    const platform::Value noDictionary("text");
    EXPECT_FALSE(ref.SetFromPList(&noDictionary, false));
}

TEST(CFileRef, TraceSaysWhetherTheItemExists)
{
    ::testing::internal::CaptureStdout();
    directory("/").Trace();
    file("/no/such/item").Trace();
    CFileRef::None.Trace();
    EXPECT_EQ(::testing::internal::GetCapturedStdout(),
              "/ (state: existing)\n/no/such/item (state: not existing)\n(invalid)\n");
}
