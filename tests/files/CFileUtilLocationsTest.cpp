#include "files/CFileUtilLocations.h"
#include "platform/Places.h"
#include "platform/Volumes.h"
#include "platform/posix/MountTable.h"

#include "support/References.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/statvfs.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace {

/// The desktop's folders inside a folder of the test.
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

TEST(Volumes, EscapesInTheMountTable)
{
    for (const auto& [written, folder] : {std::pair{"/ends\\040", "/ends "},
                                          {"/cut\\04", "/cut\\04"},
                                          {"/x\\", "/x\\"},
                                          {"/no\\08x", "/no\\08x"},
                                          {"/\\134040", "/\\040"}}) {
        const auto mount = platform::mountFromLine("36 35 98:0 / " + std::string(written) + " rw - ext4 /dev/x rw");
        ASSERT_TRUE(mount);
        EXPECT_EQ(mount->folder, folder);
    }
}

TEST(Volumes, FreeSpaceIsThatOfTheNearestFolder)
{
    const TemporaryFolder folder;
    struct statvfs status = {};
    ASSERT_EQ(::statvfs(folder.path().c_str(), &status), 0);
    const auto expected = static_cast<long long>(status.f_blocks * status.f_frsize);
    for (const std::string& path : {folder / "", folder.write("file", "x"), folder / "no/such/file"}) {
        long long total = -1;
        const long long free = CFileUtilFreeDiskSpaceAtPath(file(path), &total);
        EXPECT_TRUE(free > 0 && free < expected) << path;
        EXPECT_EQ(total, expected) << path;
        EXPECT_GT(CFileUtilFreeDiskSpaceAtPath(file(path), nullptr), 0);
    }
    long long total = -1;
    EXPECT_EQ(CFileUtilFreeDiskSpaceAtPath(CFileRef::None, &total), 0);
    EXPECT_EQ(total, 0);
}

TEST(Volumes, NetworkFileSystemsGoByTheirNames)
{
    for (const char* name : {"nfs", "nfs4", "cifs", "fuse.sshfs"})
        EXPECT_TRUE(platform::isNetworkFileSystem(name)) << name;
    for (const char* name : {"", "ext4", "fuse", "nfs3x", "overlay"})
        EXPECT_FALSE(platform::isNetworkFileSystem(name)) << name;
    const TemporaryFolder folder;
    EXPECT_FALSE(CFileUtilIsNetworkDrive(file(folder / "")));
    EXPECT_FALSE(CFileUtilIsNetworkDrive(CFileRef::None));
    EXPECT_FALSE(CFileUtilIsReadOnlyVolume(file(folder / "")));
    EXPECT_FALSE(CFileUtilIsReadOnlyVolume(file(folder / "missing")));
    EXPECT_FALSE(CFileUtilIsReadOnlyVolume(CFileRef::None));
}

// Uses its own mount table, which requires a separate process.
TEST(Volumes, MountsAreTakenForWhatTheyAre)
{
    struct statx root {};
    if (::statx(AT_FDCWD, "/", 0, STATX_MNT_ID, &root) == 0 && root.stx_mnt_id == 0)
        GTEST_SKIP() << "an emulator that tells no mount's id";
    const TemporaryFolder folder;
    for (const char* name : {"lower", "upper", "work", "merged", "bound"})
        fs::create_directory(folder / name);
    folder.write("lower/file", "x");
    const pid_t child = ::fork();
    if (child == 0) {
        if (::unshare(CLONE_NEWNS) != 0 || ::mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0 ||
            ::mount((folder / "lower").c_str(), (folder / "bound").c_str(), nullptr, MS_BIND, nullptr) != 0)
            ::_exit(99);
        ::mount("none", (folder / "bound").c_str(), nullptr, MS_BIND | MS_REMOUNT | MS_RDONLY, nullptr);
        int failed = 0;
        const auto expect = [&failed](int number, bool holds) { failed = failed == 0 && !holds ? number : failed; };
        const CFileRef lower = file(folder / "lower/file"), bound = file(folder / "bound/file");
        expect(1, CFileUtilIsReadOnlyVolume(bound) && !CFileUtilIsReadOnlyVolume(lower));
        expect(2, !CFileUtilItemsOnSameVolume(lower, bound)); // one device: a rename fails all the same
        expect(3, !bound.IsRoot());
        const std::string layers =
            "lowerdir=" + (folder / "lower") + ",upperdir=" + (folder / "upper") + ",workdir=" + (folder / "work");
        if (::mount("overlay", (folder / "merged").c_str(), "overlay", 0, layers.c_str()) == 0) {
            const CFileRef merged = file(folder / "merged/file");
            expect(4, !merged.IsRoot() && directory(folder / "merged").IsRoot());
            expect(5, std::string(merged.GetMountPoint()) == folder / "merged");
            expect(6, CFileUtilItemsOnSameVolume(merged, directory(folder / "merged")));
            ::umount((folder / "merged").c_str());
        }
        ::_exit(failed);
    }
    int status = 0;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    ASSERT_TRUE(WIFEXITED(status));
    if (WEXITSTATUS(status) == 99)
        GTEST_SKIP() << "no mounts of one's own here";
    EXPECT_EQ(WEXITSTATUS(status), 0) << "the number of the expectation";
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
        {"Sampler.appendix/x.wav", false, false, false},
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
    // A program outside an application bundle has its folder to itself.
    platform::places().executable = folder / "any/tool";
    EXPECT_TRUE(CFileUtilIsInAppBundle(file(folder / "any/x")));
    EXPECT_FALSE(CFileUtilIsInAppBundle(file(folder / "x")));
}
