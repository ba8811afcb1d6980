#include "files/CFileUtilLocations.h"
#include "platform/Places.h"
#include "platform/Volumes.h"
#include "platform/posix/MountTable.h"

#include "support/References.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace fs = std::filesystem;

namespace {

/// The desktop's folders below a folder of the test.
class PlacesBelow {
public:
    explicit PlacesBelow(const TemporaryFolder& folder) : before_(platform::places())
    {
        platform::places() = {folder / "home", folder / "home/.local/share", folder / "root",
                              folder / "Sampler.app/bin/sampler", 987'654'321};
    }
    ~PlacesBelow() { platform::places() = before_; }
    PlacesBelow(const PlacesBelow&) = delete;
    PlacesBelow& operator=(const PlacesBelow&) = delete;

private:
    platform::Places before_;
};

} // namespace

TEST(Volumes, LinesOfTheMountTable)
{
    const auto mount = platform::mountFromLine(
        "36 35 98:0 /mnt1 /mnt/two\\040words\\134x rw,noatime master:1 shared:7 - fuse.sshfs user@host:/ rw");
    ASSERT_TRUE(mount);
    EXPECT_EQ(mount->id, 36U);
    EXPECT_EQ(mount->folder, "/mnt/two words\\x");
    EXPECT_EQ(mount->fileSystem, "fuse.sshfs");
    for (const char* none :
         {"", "36", "x 35 98:0 / / rw - ext4 /dev/x rw", "36 35 98:0 / / rw -", "36 35 98:0 / / rw x"})
        EXPECT_FALSE(platform::mountFromLine(none)) << none;
}

TEST(Locations, Trash)
{
    const TemporaryFolder folder;
    const PlacesBelow places(folder);
    const std::string trash = folder / "home/.local/share/Trash";
    fs::create_directories(trash + "/files/Song");
    fs::create_directories(trash + "/info");
    fs::create_directory_symlink(trash + "/files/Song", folder / "way");
    fs::create_symlink("/nowhere", trash + "/files/link");
    for (const std::string& path : {trash + "/files/x.wav", trash + "/files/Song", trash + "/files/Song/x.wav",
                                    folder / "way/x.wav", trash + "/files/link"})
        EXPECT_TRUE(CFileUtilIsInTrash(file(path))) << path;
    for (const std::string& path : {trash, trash + "/files", trash + "/info/x.trashinfo", trash + "/files2/x.wav",
                                    folder / "x.wav", std::string()})
        EXPECT_FALSE(CFileUtilIsInTrash(file(path))) << path;
}

TEST(Locations, HiddenItems)
{
    const TemporaryFolder folder;
    fs::create_directories(folder / "listed/in");
    folder.write(".hidden", "other\nlisted\n");
    EXPECT_TRUE(CFileUtilIsHiddenOrInHiddenFolder(file("/no/.such/folder/x.wav"))); // by the path alone
    EXPECT_TRUE(CFileUtilIsHiddenOrInHiddenFolder(file(folder / ".x.wav")));
    EXPECT_TRUE(CFileUtilIsHiddenOrInHiddenFolder(file(folder / "listed")));
    EXPECT_TRUE(CFileUtilIsHiddenOrInHiddenFolder(file(folder / "listed/in/x.wav")));
    EXPECT_FALSE(CFileUtilIsHiddenOrInHiddenFolder(file(folder / "list")));
    EXPECT_FALSE(CFileUtilIsHiddenOrInHiddenFolder(file("/no/such/folder/x.wav")));
    EXPECT_FALSE(CFileUtilIsHiddenOrInHiddenFolder(file("/")));
    EXPECT_FALSE(CFileUtilIsHiddenOrInHiddenFolder(CFileRef::None));
}

TEST(Locations, LibrariesCloudAndApplication)
{
    const TemporaryFolder folder;
    const PlacesBelow places(folder);
    struct Case {
        const char* path; // made in the folder
        bool isInCloud, isInLibrary, isInBundle;
    };
    const Case cases[] = {
        {"home/Library/Mobile Documents/Song/x.wav", true, false, false},
        {"root/Network/Library/Mobile Documents/x.wav", true, false, false},
        {"root/Library/Application Support/Fugue/x.wav", false, true, false},
        {"home/Library/Application Support/Hayloft/deep/x.wav", false, true, false},
        {"root/Library/Application Support/Fugues/x.wav", false, false, false},
        {"any/Library.bundle/x.wav", false, true, false},
        {"any/org.ktfiles.installed.content/x.wav", false, true, false},
        {"Sampler.app/sounds/x.wav", false, false, true},
        {"Sampler.apple/x.wav", false, false, false},
    };
    for (const Case& each : cases) {
        SCOPED_TRACE(each.path);
        fs::create_directories(fs::path(folder / each.path).parent_path());
        folder.write(each.path, "x");
        fs::remove(folder / "link");
        fs::create_symlink(folder / each.path, folder / "link");
        for (const CFileRef& item : {file(folder / each.path), file(folder / "link")}) {
            EXPECT_EQ(CFileUtilIsInCloudDocs(item), each.isInCloud);
            EXPECT_EQ(CFileUtilIsInLibraryFolder(item), each.isInLibrary);
            EXPECT_EQ(CFileUtilIsInAppBundle(item), each.isInBundle);
        }
    }
    EXPECT_FALSE(CFileUtilIsInLibraryFolder(file(folder / "any/Library.bundle/missing.wav")));
    fs::create_symlink(folder / "any/Library.bundle/missing.wav", folder / "any/Library.bundle/dangling");
    EXPECT_FALSE(CFileUtilIsInLibraryFolder(file(folder / "any/Library.bundle/dangling")));
    // A program outside an application has its own folder for one.
    platform::places().executable = folder / "any/tool";
    EXPECT_TRUE(CFileUtilIsInAppBundle(file(folder / "any/x")));
    EXPECT_FALSE(CFileUtilIsInAppBundle(file(folder / "x")));
}
