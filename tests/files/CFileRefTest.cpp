#include "files/CFileRef.h"
#include "files/CFileUtilLocations.h"
#include "platform/FileCoordination.h"
#include "platform/PropertyList.h"
#include "support/FaultInjection.h"
#include "support/References.h"
#include "support/TemporaryFolder.h"
#include "support/URLs.h"

#include <gtest/gtest.h>

#include <cstring>
#include <fstream>

namespace fs = std::filesystem;
using platform::String;

namespace {

/// The path, with a trailing slash for a directory; empty if there is none.
std::string shown(const CFileRef& ref)
{
    const std::string path(ref);
    return path.empty() || !ref.URL()->hasDirectoryPath() ? path : path + '/';
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

    // Kept: a request for the colon style returns the Windows form.
    EXPECT_EQ(file("/a").CopyFileSystemPath(kPOSIXPathStyle).utf8(), "/a");
    EXPECT_EQ(file("/a").CopyFileSystemPath(kColonPathStyle), file("/a").CopyFileSystemPath(kWindowsPathStyle));

    char buffer[5];
    EXPECT_TRUE(file("/abc").GetPath(buffer, sizeof buffer));
    EXPECT_STREQ(buffer, "/abc");
    EXPECT_FALSE(file("/abcd").GetPath(buffer, sizeof buffer));
    EXPECT_STREQ(buffer, "");
}

// Text of odd length that is not UTF-8 falls through to a two-byte encoding, where a single zero ends it.
TEST(CFileRef, ColonPathsAreNotReadBeyondTheirZero)
{
    CFileRef::mLocalEncoding = platform::kTextEncodingUTF8;
    for (const std::string_view path : {"Disk:\xFF\xFE", "\xFF", "Disk:a\xC3"})
        for (const bool isDirectory : {false, true}) {
            // On the heap without spare bytes, so that a sanitizer detects reads beyond it.
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
}

// An operation that succeeded has a result, up to the longest name that a reference accepts.
TEST(CFileRef, ReplacedExtensionsFitTheName)
{
    for (const std::size_t length : {1019U, 1020U, 1023U}) {
        CFileRef ref = file("/" + std::string(length, 'x'));
        EXPECT_EQ(ref.ReplaceExtensionBy("wav"), length == 1019) << length;
        EXPECT_EQ(ref.HasExtension("wav"), length == 1019);
        EXPECT_EQ(ref.IsValid(), length == 1019);
    }
}

TEST(CFileRef, TheLastComponentOfAnotherIsAdded)
{
    CFileRef ref = directory("/Music");
    EXPECT_TRUE(ref.AddToPath(directory("/other/Loops")));
    EXPECT_EQ(shown(ref), "/Music/Loops/");
    EXPECT_TRUE(ref.AddToPath(file("/elsewhere/one.wav")));
    EXPECT_EQ(shown(ref), "/Music/Loops/one.wav");
}

// On an overlay a file and its folder have different devices, although nothing is mounted on the file.
TEST(CFileRef, TheFilesOfAnOverlayAreNoRoots)
{
    const TemporaryFolder folder;
    const CFileRef plain = file(folder.write("file", ""));
    folder.write(".hidden", "file\n");
    const SystemCallGuard guard;
    static decltype(platform::SystemCalls::linkStatus) real;
    real = guard.real().linkStatus;
    platform::systemCalls().linkStatus = [](const char* path, platform::FileStatus* status) {
        const bool found = real(path, status);
        status->device += status->kind == platform::FileKind::directory ? 0 : 1'000'000;
        return found;
    };
    EXPECT_FALSE(plain.IsRoot());
    EXPECT_STRNE(plain.GetMountPoint().GetPath(), plain.GetPath());
    EXPECT_TRUE(CFileUtilIsHiddenOrInHiddenFolder(plain));
    EXPECT_TRUE(directory("/proc").IsRoot());
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
    EXPECT_EQ(*plain.GetVolumeID(), *package.GetVolumeID());
    EXPECT_TRUE(directory("/").IsRoot() && directory("/proc").IsRoot());
    EXPECT_FALSE(plain.IsRoot() || CFileRef::None.IsRoot() || file(folder / "missing").IsRoot());
    EXPECT_STREQ(file("/proc/self/status").GetMountPoint().GetPath(), "/proc");
    EXPECT_TRUE(plain.GetMountPoint().IsRoot());
    EXPECT_FALSE(file("/no/such/item").GetMountPoint().IsValid());

    // If the root's status cannot be read, the search must not loop for ever.
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
        {"/Users/a", "/users/A/b", true},  {"/Users/a", "/Users/ab", false},
        {"/Users/a/b", "/Users/a", false}, {"/", "/volumes/X/y", false},
        {"/\u00C4", "/\u00E4/x", false},   {"/", "/", true} // the root contains no path but itself
    };
    for (const Case& c : cases)
        EXPECT_EQ(directory(c.outer).PathContains(file(c.inner)), c.expected) << c.outer << " " << c.inner;
    EXPECT_FALSE(CFileRef::None.PathContains(file("/a")) || file("/a").PathContains(CFileRef::None));
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

TEST(CFileRef, FilesWhoseNamesAreNoTextAreReachedByURLsOfTheirBytes)
{
    const TemporaryFolder folder;
    const auto ref = [&](const std::string& name) {
        return CFileRef(platform::URL::createWithFileSystemBytes(folder / name, false));
    };
    const CFileRef a = ref("\xE4.wav"), b = ref("\xE5.wav");
    std::ofstream(a.GetPath()) << "x";
    EXPECT_TRUE(a.IsFile() && !b.Exists());
    EXPECT_TRUE(a == ref("\xE4.wav") && a != b && (a < b) != (b < a));
    EXPECT_NE(platform::CoordinatedItem(a.URL()).key(), platform::CoordinatedItem(b.URL()).key());
    std::string extension;
    EXPECT_TRUE(a.GetExtension(extension) && extension == "wav");
}

TEST(CFileRef, PropertyListsHoldBookmarkAndURL)
{
    const TemporaryFolder folder;
    const CFileRef original = file(folder.write("a b.wav", "x"));
    const auto plist = [&](unsigned type) {
        return *original.CreatePList(static_cast<tCFileRefPListCreationType>(type));
    };
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

    // Renamed: found. Gone: its former path. An unreadable bookmark: the URL.
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
